// Copying parts of an image.
#include "serialize/quality_sample.h"

#include <algorithm>
#include <cstring>

#include "serialize/quality_payload.h"

namespace zq {

namespace {

struct SampleShape {
    std::int32_t width, height, strips;
};
constexpr SampleShape kJpegSample = {1024, 32, 4};
constexpr SampleShape kWaveletSample = {256, 256, 1};
constexpr std::int32_t kBlock = 8;  // JPEG blocks come out the same wherever they stand

}  // namespace

QualitySample::QualitySample(const Image& image, std::int64_t most_whole)
    : image_(image), part_(Variant::kPrivate, {}) {
    const ImageRecord& record = image.record();
    if (pixels_of(image) <= most_whole) return;
    const SampleShape& shape = is_jpeg_type(image.type()) ? kJpegSample : kWaveletSample;
    const std::int32_t width = std::min(record.width, shape.width);
    const std::int32_t height = std::min(record.height / kBlock * kBlock, shape.height);
    if (height == 0) return;
    is_whole_ = false;
    strips_ = height == shape.height ? shape.strips : 1;
    strip_height_ = height / strips_;
    part_.reinitialise({.type = record.type, .width = width, .height = height, .border = 0});
    copy();
}

std::uint64_t QualitySample::index_of(std::int32_t x, std::int32_t y) const {
    const auto width = static_cast<std::uint64_t>(image_.record().width);
    if (is_whole_) return static_cast<std::uint64_t>(y) * width + static_cast<std::uint64_t>(x);
    const Corner corner = corner_of(y / strip_height_);
    return static_cast<std::uint64_t>(corner.y + y % strip_height_) * width +
           static_cast<std::uint64_t>(corner.x + x);
}

QualitySample::Corner QualitySample::corner_of(std::int32_t strip) const {
    const auto at = [&](std::int32_t room) {
        const std::int64_t middle = std::int64_t{room} * (2 * strip + 1) / (2 * strips_);
        return static_cast<std::int32_t>(middle / kBlock * kBlock);
    };
    return {at(image_.record().width - part_.record().width),
            at(image_.record().height - strip_height_)};
}

void QualitySample::copy() const {
    const std::ptrdiff_t pixel = bytes_per_pixel(image_.type());
    const auto line = static_cast<std::size_t>(part_.record().width * pixel);
    for (std::int32_t y = 0; y < part_.record().height; ++y) {
        const Corner corner = corner_of(y / strip_height_);
        std::memcpy(part_.row(y), image_.row(corner.y + y % strip_height_) + corner.x * pixel,
                    line);
    }
}

}  // namespace zq
