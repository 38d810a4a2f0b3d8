// Writing and reading a PNG file with all that hangs on its image.
#pragma once

#include <cstdint>
#include <span>

#include "files/handler.h"
#include "files/png_vision.h"
#include "files/write_job.h"
#include "image/image.h"

namespace zq {

// `vision` holds the settings, and parts that take the place of what the image would give. HSL goes
// through an RGB image. Throws what write_file() throws.
void write_vision_file(const char* path, Image& image, const WriteOptions& options,
                       std::span<const std::uint32_t> colour_table, PngVision vision);

// Returns what the file holds; the image then has the objects and the custom data of the file and
// nothing else hangs on it. Throws what read_file() throws, kUnsupportedFileType for a file that is
// no PNG.
PngVision read_vision_file(const char* path, Image& image, const Accept& accept);

}  // namespace zq
