// Rows of colour pixels between the layouts of files and of images.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// Red, green, blue bytes to blue, green, red and an alpha of 0. Reads 3 and writes 4 bytes a pixel
// and nothing beyond; any alignment; source and destination do not overlap.
void rgb_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels);

}  // namespace zq
