// Run-length coded BMP pixels.
#pragma once

#include <cstdint>

#include "files/bmp_header.h"
#include "files/input_file.h"
#include "image/image.h"

namespace zq {

// Refuses a picture that would need much more memory than the file's runs could fill: throws
// kUnableToReadData.
void check_bmp_rle_plausible(const BmpHeader& header, const InputFile& file);

// The file stands at the pixels; the image has the header's size. Pixels that the file skips become
// index 0; what it has beyond the picture's edges is dropped. Throws kUnableToReadData for a stream
// that is cut short.
void read_bmp_rle(InputFile& file, const BmpHeader& header, Image& image);

}  // namespace zq
