// Rows of a canvas out of rows of pixels: shrunk, enlarged, and without their highest byte. Any
// alignment, any number of pixels; nothing beyond a row is touched; source and destination do not
// overlap.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// The highest byte becomes 0.
void bgra_to_bgr0(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels);

// Pixels 0, 2, 4 and so on, of 2 * pixels - 1 that are read; colours without their highest byte.
void every_second_u8(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);
void every_second_bgr(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels);
void every_second_bgra(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels);

// Each of `pixels` so many times.
void repeat_u32(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                std::size_t times);

}  // namespace zq
