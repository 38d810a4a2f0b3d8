// Conversion of whole images.
#pragma once

#include <cstdint>
#include <span>

#include "image/image.h"

namespace zq {

// Gives the destination the source's size, border and picture in the destination's own type; the
// same type means a copy, of the border's pixels too, the same image nothing. A complex picture
// becomes RGB as a spectrum: brightness is the magnitude times 128 over the number of pixels, and
// the quadrants are exchanged crosswise, so that the origin lies in the centre (of an odd size the
// last column or row stays where it is). Throws as Image::resize does; the destination is then as
// it was.
void convert_image(Image& source, Image& destination);

// The same for palette indices (U8): each pixel of the RGB destination becomes its entry,
// 0xAARRGGBB. `table` has 256 entries. Throws kIncompatibleImageType for other types.
void apply_colour_table(const Image& source, std::span<const std::uint32_t> table,
                        Image& destination);

}  // namespace zq
