// The quality codec's way with 16-bit, float and HSL pixels: wavelets over the range of values that
// the image has.
#pragma once

#include "image/image.h"
#include "serialize/quality_stream.h"

namespace zq {

// Images with pixels of any type but U8 and RGB. The range of values is that of `whole`, which
// the image is a part of.
void put_planes_of(Bytes& out, const Image& image, int quality, const Image& whole);

// Throws kInitializationError, kNotEnoughMemory, std::bad_alloc; the image is unchanged then.
void read_planes_of(StreamReader& reader, Image& image);

}  // namespace zq
