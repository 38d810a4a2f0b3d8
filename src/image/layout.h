// Where rows and pixels lie in an image's buffer. Lengths are in bytes unless named pixels.
#pragma once

#include <cstddef>
#include <cstdint>

#include "image/pixel_type.h"

namespace zq {

inline constexpr std::int64_t kRowAlignment = 32;
inline constexpr std::int64_t kPlacementSlack =
    64;  // room to move the first pixel onto an aligned address
inline constexpr std::int64_t kLargestBuffer = 2147483647;  // bytes, slack included

struct Extent {
    PixelType type;
    std::int32_t width;   // pixels, without border
    std::int32_t height;  // rows, without border
    std::int32_t border;  // pixels on each side

    bool operator==(const Extent&) const = default;
};

// Pixels from one row to the next and the bytes to ask for.
struct Layout {
    std::int32_t row_pixels;
    std::size_t buffer_bytes;
};

// Pixels from one row to the next: border and image, rounded up to whole 32 bytes. Throws
// kNotEnoughMemory when the count does not fit 32 bits.
std::int32_t row_pixels_for(const Extent& extent);

// The library's own layout. Throws kNotEnoughMemory when the buffer would exceed kLargestBuffer.
Layout lay_out(const Extent& extent);

// Address of pixel (0, 0) in a buffer of the library's own layout: x = 0 of every row lies on a
// 32-byte boundary.
std::uint8_t* place_first_pixel(std::uint8_t* buffer, const Extent& extent,
                                std::int32_t row_pixels);

}  // namespace zq
