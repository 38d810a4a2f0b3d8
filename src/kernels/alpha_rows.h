// The alpha of rows of 32-bit pixels.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

// Pixels 0xAARRGGBB: the alpha of all becomes `alpha`. The rows must not overlap; any alignment of
// 4 bytes.
void copy_with_alpha(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                     std::uint8_t alpha, Stores stores);

// What the pixels seen so far have in common: bits that are set in all, and in any of them.
struct CommonBits {
    std::uint32_t all = 0xFFFFFFFF;
    std::uint32_t any = 0;
};
void gather_bits(const std::uint32_t* pixels, std::size_t count, CommonBits& bits);

}  // namespace zq
