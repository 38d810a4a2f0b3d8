// References to images in 32 bits, as records carry them. Threads: safe.
#pragma once

#include <cstdint>

#include "image/image.h"

namespace zq {

// In a 32-bit process the handle itself. In wider ones a token that belongs to the image until it
// is disposed; tokens count up from a number of the process's own, and none is used again before
// all have been. The image must be locked. Throws std::bad_alloc.
std::uint32_t reference_of(Image& image);

// The live image that a reference means, or null; any number will do.
ImageHandle find_reference(std::uint32_t reference);

}  // namespace zq
