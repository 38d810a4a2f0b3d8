// How far pixels that come back are from what they were.
#pragma once

#include <cstddef>
#include <cstdint>

#include "image/image.h"

namespace zq {

struct Errors {
    double total = 0;        // squared, summed over the samples of the pixels
    std::size_t pixels = 0;  // those that have any
};

// For pixels of one type, by what is lossy in them: not alpha, nor floats that are not finite.
struct ErrorMeasure {
    // Of one pixel.
    double (*squared)(const std::uint8_t* pixel, const std::uint8_t* back);
    // Adds those of a row.
    void (*add_row)(const std::uint8_t* row, const std::uint8_t* back, std::int32_t pixels,
                    Errors& errors);
};
ErrorMeasure error_measure_of(PixelType type);

}  // namespace zq
