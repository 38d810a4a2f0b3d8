// Rows of bytes to wider pixels. Any alignment, any number of pixels; nothing beyond a row is
// touched; source and destination do not overlap.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

void u8_to_i16(const std::uint8_t* from, std::int16_t* to, std::size_t pixels, Stores stores);
void u8_to_f32(const std::uint8_t* from, float* to, std::size_t pixels, Stores stores);
// The value in the lowest byte, the others 0.
void u8_to_u32(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels, Stores stores);
// The value in the lower three bytes, the highest 0: a grey RGB pixel.
void u8_to_grey32(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels, Stores stores);
// The value in the lower three 16-bit words, the highest 0: a grey RGBU64 pixel.
void u8_to_grey64(const std::uint8_t* from, std::uint64_t* to, std::size_t pixels, Stores stores);

}  // namespace zq
