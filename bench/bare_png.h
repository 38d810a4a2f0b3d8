// The least that can be done with libpng: its own files, and its own transformations between
// samples and pixels.
#pragma once

#include <string>

#include "photo_file.h"

namespace zqbench {

// How a file holds its pixels; the numbers are the format's.
struct PngShape {
    int colour_type, depth;
    bool interlaced = false;
};

struct PngStrength {
    int level = 6;
    int filters = 0xF8;  // libpng's bits; all
};

// The image's pixels, as such a file has them: of fewer than 8 bits the lowest of each. Palettes
// are made up.
void bare_png_write(const std::string& path, const Image& image, const PngShape& shape,
                    const PngStrength& strength = {});
// As an image has them: grey spread over 8 bits, grey with alpha as colour, indices as they are.
Rows bare_png_read(const std::string& path);

}  // namespace zqbench
