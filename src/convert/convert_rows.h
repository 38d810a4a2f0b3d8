// Conversions between pixel types, one row at a time.
#pragma once

#include <cstdint>

#include "image/pixel_type.h"

namespace zq {

// Converts `width` pixels; source and destination are aligned for their types and do not overlap.
// `bit_depth` is the source image's, 0 when not set.
using ConvertRow = void (*)(const void* source, void* destination, std::int32_t width,
                            std::int32_t bit_depth);

// Null for a pair that has no conversion, and for a type to itself.
ConvertRow find_row_conversion(PixelType from, PixelType to);

// A 16-bit sample in 8 bits: clamped without a bit depth; with one, the upper 8 of its bits,
// rounded half up, and 255 for a sample with bits above its depth.
constexpr std::uint8_t reduce_to_8_bits(std::int32_t sample, std::int32_t bit_depth) {
    if (sample < 0) return 0;
    if (bit_depth == 0) return static_cast<std::uint8_t>(sample > 255 ? 255 : sample);
    if ((sample & (0xFFFF << bit_depth) & 0xFFFF) != 0) return 255;
    const std::int32_t value = sample >> (bit_depth - 8);
    const bool round_up = (sample & (256 >> (17 - bit_depth))) != 0;
    return static_cast<std::uint8_t>(value + (round_up && value != 255 ? 1 : 0));
}

}  // namespace zq
