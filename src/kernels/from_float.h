// Rows of floating-point pixels to other pixels. Any alignment, any number of pixels; nothing
// beyond a row is touched; source and destination do not overlap.
//
// To integers: below the lower bound gives that bound, at or above the upper bound the upper one,
// anything else is cut towards zero; NaN gives the lower bound.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

void f32_to_u8(const float* from, std::uint8_t* to, std::size_t pixels);
void f32_to_i16(const float* from, std::int16_t* to, std::size_t pixels);
void f32_to_u16(const float* from, std::uint16_t* to, std::size_t pixels);
// The pixel as real part, 0 as imaginary part.
void f32_to_complex(const float* from, float* to, std::size_t pixels, Stores stores);

// sqrt(re * re + im * im) * scale in double precision of pixels of two floats, as the number it is
// made for below.
void magnitude_to_u8(const float* from, std::uint8_t* to, std::size_t pixels, double scale);
void magnitude_to_i16(const float* from, std::int16_t* to, std::size_t pixels);
void magnitude_to_u16(const float* from, std::uint16_t* to, std::size_t pixels);
// Rounded to the nearest float.
void magnitude_to_f32(const float* from, float* to, std::size_t pixels);

}  // namespace zq
