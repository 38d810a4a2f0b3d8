// The quality codec's way with 8-bit types: JPEG streams, and RGB's alpha beside them.
#pragma once

#include <cstdint>
#include <span>

#include "image/image.h"
#include "serialize/pixel_memory.h"
#include "serialize/quality_stream.h"

namespace zq {

// U8 and RGB images with pixels.
void put_jpeg(Bytes& out, const Image& image, int quality);

// Throws kInitializationError, kNotEnoughMemory, std::bad_alloc; the image is unchanged then.
void read_jpeg(StreamReader& reader, Image& image, PixelMemory memory);

}  // namespace zq
