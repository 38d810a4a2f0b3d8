// 16-bit grey of files, whose samples are unsigned, in images, whose pixels are signed.
#pragma once

#include <cstddef>
#include <cstdint>

#include "image/image.h"

namespace zq {

// What is added to samples of which some are too large for a pixel.
inline constexpr std::int32_t kWholeRangeOffset = -32768;

// Whether any of the unsigned samples of a row is above 32767; the row is aligned for them.
bool any_above_signed(const std::uint8_t* row, std::size_t bytes);

// Turns the samples that an I16 image holds into pixels: sample + offset, saturated.
void shift_unsigned_samples(Image& image, std::int32_t offset);

}  // namespace zq
