// Single pixels that are told exactly, so that of two qualities with the same steps the higher one
// is still truer.
#pragma once

#include <cstdint>
#include <span>

#include "image/image.h"
#include "serialize/quality_stream.h"

namespace zq {

struct PixelError {
    std::uint64_t index;  // y * width + x
    double squared;       // summed over the samples of the pixel
};
double total_of(std::span<const PixelError> errors);

// The part of the squared error, of `total` in so many pixels, that a quality's touches take away,
// or a little less; 0 to 1.
double touched_part(double total, std::size_t pixels, PixelType type, int quality);

// The pixels that a quality tells exactly; they are moved to the front of `errors`.
std::span<PixelError> choose_touches(std::span<PixelError> errors, PixelType type, int quality);

// Writes a section of pixels that take a part of the squared error away. The part grows with the
// quality (1 to 100). `errors` is used up.
void put_touches(Bytes& out, const Image& image, std::span<PixelError> errors, int quality);

// The next section, checked; throws kInitializationError.
std::span<const std::uint8_t> read_touches(StreamReader& reader, const Image& image);
void apply_touches(std::span<const std::uint8_t> touches, const Image& image);

}  // namespace zq
