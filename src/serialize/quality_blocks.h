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
    std::uint64_t index;  // of its first pixel in the image: y * width + x
    std::int64_t count;
    std::vector<std::uint64_t> others;  // indexes of some that are equal
};

// In the order in which they come, row by row, each that is not equal (by a 64-bit hash) to one
// before; of the first 512 up to 255 others are told. None where more than half of all blocks are
// different, or more than 2^14.
std::vector<JpegBlock> different_blocks(const Image& image);

// One at random out of each of up to `most` equal stretches of the image, at most half of its
// blocks.
std::vector<JpegBlock> spread_blocks(const Image& image, std::int64_t most);

}  // namespace zq
