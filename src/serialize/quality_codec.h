// The quality codec of flattened images: pixels in far fewer bytes, the truer the higher the
// quality. docs/quality-codec.md describes the stream.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "image/image.h"
#include "serialize/pixel_memory.h"

namespace zq {

// A block has at least one byte for so many bytes of the image's buffer, border included: it is
// filled up with zeros where the pixels need less. A reader can refuse what announces more.
inline constexpr std::uint64_t kMostExpansion = 900;

// The image proper of any type and size; `quality` is 1 to 100. Fidelity rises with the
// quality; docs/quality-codec.md says where it may fall by a little. Throws kNotEnoughMemory,
// std::bad_alloc.
std::vector<std::uint8_t> compress_pixels(const Image& image, int quality);

// Writes the image's pixels, and its border as copies of the nearest pixel of the image proper.
// Throws kInitializationError for a block that is damaged or that is not one of an image of this
// type and size, kNotEnoughMemory, std::bad_alloc; the image is unchanged then.
void decompress_pixels(Image& image, std::span<const std::uint8_t> block,
                       PixelMemory memory = PixelMemory::kUsed);

}  // namespace zq
