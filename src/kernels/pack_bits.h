// Rows of bytes to rows of bits and back; the first pixel is the least significant bit. Any
// alignment, any number of pixels; nothing beyond a row is touched; source and destination do not
// overlap. A row of bits is ceil(pixels / 8) bytes.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// A bit is set where the byte is not 0; those past the last pixel are 0.
void pack_bits(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);
// 255 for a bit that is set, else 0.
void unpack_bits(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);

}  // namespace zq
