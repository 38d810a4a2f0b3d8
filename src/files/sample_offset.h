// 16-bit samples that are unsigned in a file.
#pragma once

#include "image/image.h"

namespace zq {

// Moves all samples of an I16 image, which are unsigned so far, down by 32768 when one of them is
// too large for a signed pixel; the image remembers the offset.
void move_unsigned_samples(Image& image);

}  // namespace zq
