// Pixels of any type as bytes: JPEG or wavelets, as the type asks for.
#pragma once

#include "image/image.h"
#include "serialize/pixel_memory.h"
#include "serialize/quality_stream.h"

namespace zq {

inline bool is_jpeg_type(PixelType type) {
    return type == PixelType::kU8 || type == PixelType::kRgb;
}

// The image has pixels; quality is 1 to 100. `whole` is what it is a part of, for the range of its
// values.
void put_payload(Bytes& out, const Image& image, int quality, const Image& whole);
inline void put_payload(Bytes& out, const Image& image, int quality) {
    put_payload(out, image, quality, image);
}
// Reads up to the end. Throws kInitializationError or kNotEnoughMemory before any pixel changes.
void read_payload(StreamReader& reader, Image& image, PixelMemory memory);

}  // namespace zq
