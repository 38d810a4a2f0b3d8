// Copying rectangles of pixels, and when a picture is written past the cache.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

// Pictures larger than a core's share of the last cache: what is written first would be driven out
// before anyone reads it, and writing past the cache saves fetching it beforehand.
inline constexpr std::size_t kStreamedBytes = std::size_t{8} << 20;

constexpr Stores stores_for(std::size_t bytes) {
    return bytes >= kStreamedBytes ? Stores::kStreamed : Stores::kCached;
}

// Rows of bytes, `stride` from one to the next.
struct ConstRows {
    const std::uint8_t* first;
    std::ptrdiff_t stride;
};
struct Rows {
    std::uint8_t* first;
    std::ptrdiff_t stride;
};

// memcpy for blocks of any size; large ones are written past the cache.
void copy_block(void* to, const void* from, std::size_t bytes);

// Copies `bytes` of each of `rows` rows; the two do not overlap.
void copy_rows(ConstRows from, Rows to, std::size_t rows, std::size_t bytes);

}  // namespace zq
