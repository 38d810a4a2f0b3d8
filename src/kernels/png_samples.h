// Rows of 8- and 16-bit samples between the layout of images and that of PNG. Any alignment; source
// and destination do not overlap. Colours of images are blue, green, red and a fourth.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// Big-endian on one side, the machine's order on the other.
void swap_bytes_16(const std::uint8_t* from, std::uint8_t* to, std::size_t samples);
// Red and blue change places; four bytes a pixel, and three.
void swap_red_blue(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);
void bgr_to_rgb(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);
// The first for four big-endian 16-bit samples a pixel on one side.
void swap_red_blue_16(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);
// Three big-endian 16-bit samples, and four of the image's, the fourth 0.
void rgb16_to_bgra16(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);
void bgra16_to_rgb16(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels);

}  // namespace zq
