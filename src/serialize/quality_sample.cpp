// Copying parts of an image.
#include "serialize/quality_sample.h"

#include <algorithm>
#include <cstring>
#include <string_view>

#include "serialize/quality_blocks.h"
#include "serialize/quality_payload.h"
#include "serialize/quality_samples.h"

namespace zq {

namespace {

struct SampleShape {
    std::int32_t width, height, strips;
};
constexpr std::int32_t kSampledTiles = 4;
constexpr std::int64_t kLatticeBlocks = std::int64_t{1} << 12;
constexpr double kOfStrips = 0.98;
constexpr double kOfMany = 0.998;
constexpr SampleShape kJpegSample = {1024, 32, 4};
constexpr SampleShape kWaveletSample = {256, 256, 1};
constexpr auto kSide = static_cast<std::int32_t>(kBlockSide);
constexpr std::int32_t kBlockColumns = 128;

std::unique_ptr<Image> blank(std::int32_t type, std::int32_t width, std::int32_t height) {
    auto image = std::make_unique<Image>(Variant::kPrivate, std::string_view());
    image->reinitialise({.type = type, .width = width, .height = height, .border = 0});
    return image;
}

struct Corner {
    std::int32_t x, y;
    std::uint64_t index_in(const Image& image) const {
        const auto width = static_cast<std::uint64_t>(image.record().width);
        return static_cast<std::uint64_t>(y) * width + static_cast<std::uint64_t>(x);
    }
};

void copy(const Image& image, const Corner& corner, const Image& picture, const SamplePart& part) {
    const std::ptrdiff_t pixel = bytes_per_pixel(image.type());
    const auto line = static_cast<std::size_t>(part.width * pixel);
    for (std::int32_t y = 0; y < part.height; ++y) {
        std::memcpy(picture.row(part.y + y) + part.x * pixel,
                    image.row(corner.y + y) + corner.x * pixel, line);
    }
}

// Repeats the last column and row of a block that the image's edge cuts, as JPEG does.
void complete_block(const Image& picture, const SamplePart& part) {
    const std::ptrdiff_t pixel = bytes_per_pixel(picture.type());
    for (std::int32_t y = 0; y < part.height; ++y) {
        std::uint8_t* row = picture.row(part.y + y) + part.x * pixel;
        for (std::ptrdiff_t x = part.width; x < kSide; ++x) {
            std::memcpy(row + x * pixel, row + (part.width - 1) * pixel,
                        static_cast<std::size_t>(pixel));
        }
    }
    const std::uint8_t* last = picture.row(part.y + part.height - 1) + part.x * pixel;
    for (std::int32_t y = part.height; y < kSide; ++y) {
        std::memcpy(picture.row(part.y + y) + part.x * pixel, last,
                    static_cast<std::size_t>(kSide * pixel));
    }
}

}  // namespace

QualitySample QualitySample::whole_of(const Image& image) {
    const ImageRecord& record = image.record();
    return {image, nullptr, {{0, 0, record.width, record.height, 0, 1}}, 1};
}

QualitySample QualitySample::strips_of(const Image& image) {
    const ImageRecord& record = image.record();
    const SampleShape& shape = is_jpeg_type(image.type()) ? kJpegSample : kWaveletSample;
    const std::int32_t width = std::min(record.width, shape.width);
    const std::int32_t whole_blocks = record.height / kSide * kSide;
    const std::int32_t height =
        whole_blocks == 0 ? record.height : std::min(whole_blocks, shape.height);
    // Strips must not overlap, or a pixel would be told twice.
    const bool has_room = record.height - shape.height / shape.strips >= shape.strips * kSide;
    const std::int32_t strips = has_room ? shape.strips : 1;
    const std::int32_t strip = height / strips;
    auto picture = blank(record.type, width, height);
    std::vector<SamplePart> parts;
    for (std::int32_t i = 0; i < strips; ++i) {
        const auto at = [&](std::int32_t room) {
            const std::int64_t middle = std::int64_t{room} * (2 * i + 1) / (2 * strips);
            return static_cast<std::int32_t>(middle / kSide * kSide);
        };
        const Corner corner = {at(record.width - width), at(record.height - strip)};
        parts.push_back({0, i * strip, width, strip, corner.index_in(image), 1});
        copy(image, corner, *picture, parts.back());
    }
    return {image, std::move(picture), std::move(parts), kOfStrips};
}

QualitySample QualitySample::mosaic(const Image& image, std::span<const JpegBlock> blocks,
                                    double confidence) {
    const auto count = static_cast<std::int32_t>(blocks.size());
    const std::int32_t rows = (count + kBlockColumns - 1) / kBlockColumns;
    auto picture = blank(image.record().type, kBlockColumns * kSide, rows * kSide);
    std::vector<SamplePart> parts;
    // What is left of the last row gets the last block, and counts for nothing.
    for (std::int32_t i = 0; i < rows * kBlockColumns; ++i) {
        const JpegBlock& block = blocks[static_cast<std::size_t>(std::min(i, count - 1))];
        const SamplePart part = {i % kBlockColumns * kSide,
                                 i / kBlockColumns * kSide,
                                 block.width,
                                 block.height,
                                 block.index,
                                 static_cast<double>(block.count),
                                 block.others};
        copy(image, {block.x, block.y}, *picture, part);
        complete_block(*picture, part);
        if (i < count) parts.push_back(part);
    }
    return {image, std::move(picture), std::move(parts), confidence};
}

std::optional<QualitySample> QualitySample::tiles_of(const Image& image) {
    const ImageRecord& record = image.record();
    const std::int64_t across = record.width / kTileSide;
    const std::int64_t tiles = across * (record.height / kTileSide);
    if (tiles < kSampledTiles) return std::nullopt;
    auto picture = blank(record.type, kTileSide, kSampledTiles * kTileSide);
    std::vector<SamplePart> parts;
    for (std::int32_t i = 0; i < kSampledTiles; ++i) {
        const std::int64_t at = tiles * (2 * i + 1) / (2 * kSampledTiles);
        const Corner corner = {static_cast<std::int32_t>(at % across) * kTileSide,
                               static_cast<std::int32_t>(at / across) * kTileSide};
        parts.push_back({0, i * kTileSide, kTileSide, kTileSide, corner.index_in(image), 1});
        copy(image, corner, *picture, parts.back());
    }
    return QualitySample(image, std::move(picture), std::move(parts), kOfMany);
}

std::optional<QualitySample> QualitySample::blocks_of(const Image& image) {
    const std::vector<JpegBlock> blocks = different_blocks(image);
    if (blocks.empty()) return std::nullopt;
    return mosaic(image, blocks, 1);
}

QualitySample QualitySample::lattice_of(const Image& image) {
    return mosaic(image, spread_blocks(image, kLatticeBlocks), kOfMany);
}

}  // namespace zq
