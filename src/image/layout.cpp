// Row layout and placement rules.
#include "image/layout.h"

#include <limits>

namespace zq {

namespace {

constexpr std::int64_t round_up(std::int64_t value) {
    return (value + kRowAlignment - 1) / kRowAlignment * kRowAlignment;
}

}  // namespace

std::int32_t row_pixels_for(const Extent& extent) {
    const std::int64_t pixel_bytes = bytes_per_pixel(extent.type);
    const std::int64_t pixels = std::int64_t{extent.width} + 2 * std::int64_t{extent.border};
    const std::int64_t row_pixels = round_up(pixels * pixel_bytes) / pixel_bytes;
    if (row_pixels > std::numeric_limits<std::int32_t>::max()) {
        throw kNotEnoughMemory;
    }
    return static_cast<std::int32_t>(row_pixels);
}

Layout lay_out(const Extent& extent) {
    const std::int32_t row_pixels = row_pixels_for(extent);
    const double rows =
        static_cast<double>(extent.height) + 2.0 * static_cast<double>(extent.border);
    const double bytes =
        static_cast<double>(bytes_per_pixel(extent.type)) * static_cast<double>(row_pixels) * rows +
        static_cast<double>(kPlacementSlack);
    if (bytes > static_cast<double>(kLargestBuffer)) {
        throw kNotEnoughMemory;
    }
    return {row_pixels, static_cast<std::size_t>(bytes)};
}

std::uint8_t* place_first_pixel(std::uint8_t* buffer, const Extent& extent,
                                std::int32_t row_pixels) {
    const auto misaligned =
        static_cast<std::int64_t>(reinterpret_cast<std::uintptr_t>(buffer) % kRowAlignment);
    const std::int64_t pad = misaligned == 0 ? 0 : kRowAlignment - misaligned;
    const std::int64_t pixel_bytes = bytes_per_pixel(extent.type);
    const std::int64_t border_bytes = extent.border * pixel_bytes;
    std::int64_t start = pad;
    if (border_bytes > pad) {
        start += round_up(border_bytes - pad);
    }
    return buffer + start + row_pixels * border_bytes;
}

}  // namespace zq
