// Conversion of whole images.
#pragma once

#include <cstdint>
#include <span>

#include "image/image.h"

namespace zq {

// Gives the destination the source's size, border and picture in the destination's own type; the
// same type means a copy, the same image nothing. Throws kIncompatibleImageType for a pair without
// conversion, and as Image::resize does; the destination is then as it was.
void convert_image(Image& source, Image& destination);

// The same for palette indices (U8): each pixel of the RGB destination becomes its entry,
// 0xAARRGGBB. `table` has 256 entries. Throws kIncompatibleImageType for other types.
void apply_colour_table(const Image& source, std::span<const std::uint32_t> table,
                        Image& destination);

}  // namespace zq
