// The different blocks of pictures that repeat themselves, as drawn ones do.
#pragma once

#include <cstdint>
#include <vector>

#include "image/image.h"

namespace zq {

// JPEG codes squares of that side, each by itself.
constexpr std::int64_t kBlockSide = 8;

// One of those that are equal. The image's edge may cut it.
struct JpegBlock {
    std::int32_t x, y, width, height;
    std::int64_t count;
};

// In the order in which they come, row by row, each once that is not equal (by a 64-bit hash) to
// one before; up to 16 times while there are less than 512. None where more than half of all blocks
// are different, or more than 2^14.
std::vector<JpegBlock> different_blocks(const Image& image);

// From all over an image that has at least so many.
std::vector<JpegBlock> spread_blocks(const Image& image, std::int64_t count);

// Whether the pixels have no more different bytes than drawn pictures, text or labels do.
bool has_few_values(const Image& image);

}  // namespace zq
