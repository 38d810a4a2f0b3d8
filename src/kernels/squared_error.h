// How far rows of bytes are from each other.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

struct SquaredError {
    std::uint64_t total;  // of squares, over all samples
    std::size_t pixels;   // that differ
};

// Single bytes, or pixels of blue, green, red and a fourth byte that does not count. Nothing is
// read beyond the rows; any alignment.
SquaredError squared_error_u8(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels);
SquaredError squared_error_bgrx(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels);

}  // namespace zq
