// Conversions between red, green, blue and luminance, saturation, hue, exact to the last bit.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// Both read and write 4 bytes a pixel and nothing beyond, at any alignment; the fourth byte is
// copied. The destination is the source itself or does not overlap it.

// Blue, green, red, alpha to luminance, saturation, hue, alpha: the bytes that the double-precision
// formula gives.
void rgb_to_hsl(const std::uint8_t* bgra, std::uint8_t* lsha, std::size_t pixels);

// Luminance, saturation, hue, alpha to blue, green, red, alpha: the bytes of the fixed-point
// formula with its quotient in double precision.
void hsl_to_rgb(const std::uint8_t* lsha, std::uint8_t* bgra, std::size_t pixels);

}  // namespace zq
