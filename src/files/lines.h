// Plain pixel lines: as many bytes a line as the image holds, top line first, nothing between
// lines.
#pragma once

#include <cstddef>

#include "files/input_file.h"
#include "files/output_file.h"
#include "files/pixel_view.h"
#include "image/image.h"

namespace zq {

// `line` is the bytes of one line in the file, at most what a row of the image holds. Throws
// kUnableToReadData on a short read.
void read_lines(InputFile& file, Image& image, std::size_t line);

// Throws the mapped error number on a short write.
void write_lines(OutputFile& file, const PixelView& pixels, std::size_t line);

}  // namespace zq
