// Pixels of an image as a two-dimensional host array.
#pragma once

#include <zqvissvc/types.h>

#include <cstdint>
#include <limits>
#include <span>

#include "image/image.h"

namespace zq {

// As callers give it: right and bottom are exclusive, corners may be exchanged, and all of it may
// lie outside an image.
struct Rectangle {
    std::int32_t left = 0;
    std::int32_t top = 0;
    std::int32_t right = std::numeric_limits<std::int32_t>::max();
    std::int32_t bottom = std::numeric_limits<std::int32_t>::max();
};

// From left, top, right, bottom; elements that are not there leave the default, the whole image.
Rectangle to_rectangle(std::span<const std::int32_t> elements);

// How an output array takes its size: resized to it, or within the block that it has.
enum class ArraySize { kGrowable, kBounded };

// What the array is when the rectangle has no pixels, or when there is no room for them: of the
// rectangle's rows and columns (one or both are 0) and unchanged, or 0 x 0.
enum class ArrayStart { kUnchanged, kEmptied };

// Makes the array the pixels of the image inside the rectangle, unchanged and as stored: one
// element a pixel. Throws what host::resize_array2d and host::fit_array2d throw, and
// kInvalidImageType for a complex image.
void image_to_array(const Image& image, const Rectangle& rectangle, ArrayStart start,
                    ArraySize size, ZqHandle* array);

}  // namespace zq
