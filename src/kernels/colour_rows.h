// Rows of colour pixels between the layouts of files and of images.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// All of them: 3 bytes a pixel on the file's side, 4 on the image's, nothing read or written
// beyond; any alignment; source and destination do not overlap.

// Red, green, blue bytes to blue, green, red and an alpha of 0.
void rgb_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels);
// The same for bytes that already are in the image's order.
void bgr_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels);
// Drops the alpha.
void bgra_to_bgr(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels);
void bgra_to_rgb(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels);

}  // namespace zq
