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

}  // namespace zq
