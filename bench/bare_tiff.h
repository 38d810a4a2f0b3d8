// The least that can be done with libtiff: its own files, a buffer for a strip, and a plain loop
// between samples and pixels.
#pragma once

#include <cstdint>
#include <string>

#include "photo_file.h"

namespace zqbench {

// Strips of the image's samples, `strip_rows` rows each.
void bare_tiff_write(const std::string& path, const Image& image, std::uint16_t compression,
                     std::uint32_t strip_rows);
Rows bare_tiff_read(const std::string& path);

}  // namespace zqbench
