// Whether colour pixels have an alpha worth a channel in a file.
#pragma once

#include "files/pixel_view.h"

namespace zq {

// True for RGB and RGB (U64) pixels of which some has an alpha other than 0.
bool has_alpha(const PixelView& pixels);

}  // namespace zq
