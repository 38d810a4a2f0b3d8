// What a look over a whole image tells: ranges of samples, and what has to be kept exactly.
#include "serialize/quality_samples.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstring>
#include <limits>

#include "serialize/quality_steps.h"

namespace zq {

namespace {

// Widens `range` by `count` samples, each so many bytes behind the one before.
template <class Sample>
void widen(SampleRange& range, const std::uint8_t* first, std::int32_t count,
           std::ptrdiff_t pixel) {
    float low = range.low;
    float high = range.high;
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        Sample sample;
        std::memcpy(&sample, first + x * pixel, sizeof(sample));
        const auto value = static_cast<float>(sample);
        // Neither comparison holds for NaN.
        if (value < low && value >= -std::numeric_limits<float>::max()) low = value;
        if (value > high && value <= std::numeric_limits<float>::max()) high = value;
    }
    range = {low, high};
}

template <class Sample>
SampleRange range_of(const Image& image, std::size_t offset) {
    const std::ptrdiff_t pixel = bytes_per_pixel(image.type());
    constexpr float kInfinity = std::numeric_limits<float>::infinity();
    SampleRange range{kInfinity, -kInfinity};
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        widen<Sample>(range, image.row(y) + offset, image.record().width, pixel);
    }
    return range.low > range.high ? SampleRange{} : range;
}

std::uint16_t class_of(const std::uint8_t* sample) {
    float value;
    std::memcpy(&value, sample, sizeof(value));
    if (std::isfinite(value)) return 0;
    return std::isnan(value) ? 1 : value > 0 ? 2 : 3;
}

std::uint16_t exact_part(PixelType type, const std::uint8_t* pixel) {
    switch (type) {
        case PixelType::kSgl:
            return class_of(pixel);
        case PixelType::kComplex:
            return static_cast<std::uint16_t>(class_of(pixel) | class_of(pixel + 4) << 2);
        case PixelType::kHsl:
            return pixel[3];
        case PixelType::kRgbU64:
            return static_cast<std::uint16_t>(pixel[6] | pixel[7] << 8);
        default:
            return 0;
    }
}

bool is_exact_part_constant(const Image& image, std::uint16_t value) {
    const PixelType type = image.type();
    const std::ptrdiff_t pixel = bytes_per_pixel(type);
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        const std::uint8_t* row = image.row(y);
        for (std::ptrdiff_t x = 0; x < image.record().width; ++x) {
            if (exact_part(type, row + x * pixel) != value) return false;
        }
    }
    return true;
}

BytePlanes exact_planes(const Image& image, std::size_t count) {
    const PixelType type = image.type();
    const auto pixel = static_cast<std::size_t>(bytes_per_pixel(type));
    BytePlanes planes(static_cast<std::size_t>(image.record().width),
                      static_cast<std::size_t>(image.record().height), count);
    for (std::size_t y = 0; y < planes.height; ++y) {
        const std::uint8_t* row = image.row(static_cast<std::int32_t>(y));
        for (std::size_t x = 0; x < planes.width; ++x) {
            const std::uint16_t value = exact_part(type, row + x * pixel);
            for (std::size_t plane = 0; plane < count; ++plane) {
                planes.row(plane, y)[x] = static_cast<std::uint8_t>(value >> (8 * plane));
            }
        }
    }
    return planes;
}

int bits_of(const SampleRange& range) {
    return static_cast<int>(std::bit_width(static_cast<std::uint32_t>(range.high - range.low)));
}

}  // namespace

PlaneLayout plane_layout(PixelType type) {
    switch (type) {
        case PixelType::kI16:
            return {1, 1, 0, false, -32768, 32767};
        case PixelType::kHsl:
            return {3, 3, 1, false, 0, 255};
        case PixelType::kRgbU64:
            return {3, 1, 2, false, 0, 65535};
        case PixelType::kComplex:
            return {2, 2, 1, true, 0, 0};
        default:
            return {1, 1, 1, true, 0, 0};
    }
}

SampleScale scale_of(const SampleRange& range, const PlaneLayout& layout) {
    const double low = range.low;
    const double high = range.high;
    if (!layout.is_float) {
        return {std::floor((low + high) / 2), std::ldexp(1.0, kNominalBits - bits_of(range))};
    }
    if (low == high) return {low, 1};
    return {(low + high) / 2, std::ldexp(1.0, kNominalBits) / (high - low)};
}

int finest_step(const SampleRange& range, const PlaneLayout& layout) {
    return layout.is_float ? kFinestStep : kNominalBits - 1 - bits_of(range);
}

SampleRanges measure(const Image& image, const PlaneLayout& layout) {
    SampleRanges ranges{};
    switch (image.type()) {
        case PixelType::kI16:
            ranges[0] = range_of<std::int16_t>(image, 0);
            break;
        case PixelType::kHsl:
            for (std::size_t i = 0; i < 3; ++i) ranges[i] = range_of<std::uint8_t>(image, i);
            // A circle has no lowest and highest.
            if (!ranges[2].is_constant()) ranges[2] = {layout.least, layout.most};
            break;
        case PixelType::kRgbU64:
            ranges[0] = range_of<std::uint16_t>(image, 0);
            for (std::size_t i = 1; i < 3; ++i) {
                const SampleRange other = range_of<std::uint16_t>(image, 2 * i);
                ranges[0] = {std::min(ranges[0].low, other.low),
                             std::max(ranges[0].high, other.high)};
            }
            break;
        default:
            for (std::size_t i = 0; i < layout.ranges; ++i) {
                ranges[i] = range_of<float>(image, 4 * i);
            }
    }
    if (layout.ranges == 1) ranges.fill(ranges[0]);
    return ranges;
}

void put_lossless(Bytes& out, const Image& image) {
    const std::uint16_t first = exact_part(image.type(), image.row(0));
    const std::size_t count = plane_layout(image.type()).lossless_planes;
    if (count == 0 || is_exact_part_constant(image, first)) {
        put_constant(out, first);
        return;
    }
    BytePlanes planes = exact_planes(image, count);
    put_planes(out, planes);
}

}  // namespace zq
