// Helpers of the C environment: rectangles by size or by corners, and plain memory copied into host
// arrays.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>

namespace zq::host {

// Sizes and corners saturate at the ends of the 32-bit range.
ZqRect to_rect(const ZqCoordinates& corners);
ZqCoordinates to_coordinates(const ZqRect& rect);

// A host array of rows * columns elements (1D: of `count`), each element_size bytes, copied from
// plain memory and put behind its dimension counts. Throws kNullPointer, kInvalidParameter
// (negative count, element size below 1) or kNotEnoughMemory; the array then is what it was.
void copy_to_array_1d(const void* source, std::int32_t element_size, std::int32_t count,
                      ZqHandle* array);
void copy_to_array_2d(const void* source, std::int32_t element_size, std::int32_t rows,
                      std::int32_t columns, ZqHandle* array);

}  // namespace zq::host
