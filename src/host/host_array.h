// Host arrays: dimension counts of 32 bits, then the elements; made and resized by the host's own
// service.
#pragma once

#include <zqvissvc/types.h>

#include <cstddef>
#include <cstdint>
#include <span>

#include "host/services.h"

namespace zq::host {

// Gives the array room for the elements behind their counts and returns its block; a null handle is
// given one. Contents up to the smaller size are kept, the counts are the caller's to store. Throws
// kNotEnoughMemory; the array then is what it was.
std::uint8_t* resize_array(ElementType type, std::int32_t dimensions, ZqHandle* array,
                           std::size_t elements);

// The elements; empty for a null handle and for a count that cannot be. Valid until the next host
// call.
std::span<const std::uint32_t> view(ZqArrayU32Handle array);
std::span<const std::int32_t> view(ZqArrayI32Handle array);

// Makes *target (a null handle is given a block) hold the elements, which must not lie in host
// memory. Throws kNullPointer for a null target and kNotEnoughMemory; the array then is what it
// was.
void set_array(ZqArrayU32Handle* target, std::span<const std::uint32_t> elements);

// A two-dimensional array: counts of rows and columns, then the elements, row by row.
struct Array2dShape {
    ElementType type;
    std::size_t element_bytes;
    std::int32_t rows;
    std::int32_t columns;
};

// Gives the array exactly that shape and returns its first element, valid until the next host call.
// A null handle is given a block. Throws kMemoryError for a null array and kNotEnoughMemory; the
// array then is what it was.
std::uint8_t* resize_array2d(ZqHandle* array, const Array2dShape& shape);

// The same within the block that the array has, which stays where it is. Throws kMemoryError for a
// null array or handle and kOutputArrayTooSmall.
std::uint8_t* fit_array2d(ZqHandle* array, const Array2dShape& shape);

}  // namespace zq::host
