// Rows of colour pixels to other pixels, a pixel being one integer: blue (or luminance) in the
// lowest byte or 16-bit word, then green (saturation), red (hue) and alpha. Any alignment, any
// number of pixels; nothing beyond a row is touched; source and destination do not overlap.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

// (blue + green + red) / 3, rounded down.
void rgb_to_mean_u8(const std::uint32_t* from, std::uint8_t* to, std::size_t pixels);
// (blue + green + red) * (1 / 3.0) in double precision, rounded to the nearest float.
void rgb_to_mean_f32(const std::uint32_t* from, float* to, std::size_t pixels);
// Each byte in 16 bits.
void rgb_to_rgbu64(const std::uint32_t* from, std::uint64_t* to, std::size_t pixels, Stores stores);
// The lowest byte.
void hsl_to_luminance(const std::uint32_t* from, std::uint8_t* to, std::size_t pixels);

// (blue + green + red) / 3, rounded down, at most 32767.
void rgbu64_to_mean_i16(const std::uint64_t* from, std::int16_t* to, std::size_t pixels);
void rgbu64_to_mean_f32(const std::uint64_t* from, float* to, std::size_t pixels);

}  // namespace zq
