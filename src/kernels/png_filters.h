// The row filters of PNG (its clause 9), 1 Sub to 4 Paeth, there and back. `step` is the bytes of a
// whole pixel, 1 to 8.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

inline constexpr int kPngFilters = 5;  // with 0, None
inline constexpr std::size_t kPngMostStep = 8;

// Filters `count` bytes; `row` and `above` have `step` zeros in front of them. Returns the sum of
// the results' magnitudes, as signed bytes. None copies. Nothing overlaps.
std::uint64_t png_filter(int filter, const std::uint8_t* row, const std::uint8_t* above,
                         std::size_t step, std::uint8_t* to, std::size_t count);

// The inverse. `above` may not be null; nothing outside of `count` bytes is read or written, and
// nothing overlaps.
void png_unfilter(int filter, const std::uint8_t* from, const std::uint8_t* above, std::size_t step,
                  std::uint8_t* to, std::size_t count);

}  // namespace zq
