// What the parameters of a headerless file mean.
#pragma once

#include <zqvissvc/files.h>

#include <cstddef>
#include <cstdint>

#include "files/pixel_format.h"
#include "image/pixel_type.h"

namespace zq {

// How a file without a header holds its pixels.
struct RawLayout {
    PixelFormat format = PixelFormat::kGrey8;
    PixelType type = PixelType::kU8;
    std::int32_t bits_per_pixel = 8;
    std::int32_t swapped_bytes = 1;  // of a sample whose bytes change places; 1: nothing to swap
    bool is_planar = false;          // three planes: red, green, blue
    std::int32_t offset = 0;         // of the first line, in bytes
    std::int32_t line_stride = 0;    // bytes from one line to the next; 0: no gap
    bool is_bottom_up = false;
};

// Throws kInvalidFileHeader for a format number that does not exist, kInvalidParameter for a
// negative stride, kUnableToReadData for a negative offset, where no file has bytes.
RawLayout raw_layout(const ZqRawParameters& parameters);

}  // namespace zq
