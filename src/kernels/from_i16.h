// Rows of 16-bit samples to other pixels. Any alignment, any number of pixels; nothing beyond a row
// is touched; source and destination do not overlap.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

// How samples of a bit depth become 8 bits: (sample + half) >> shift, rounding half up, and 255 for
// what does not fit, negative samples as 0. A depth that is not set (0) clamps to 0 to 255.
struct Reduction {
    explicit constexpr Reduction(std::int32_t bit_depth)
        : shift(bit_depth > 8 ? bit_depth - 8 : 0), half(shift > 0 ? 1 << (shift - 1) : 0) {}
    std::int32_t shift;
    std::int32_t half;
};

void i16_to_u8(const std::int16_t* from, std::uint8_t* to, std::size_t pixels, Reduction reduction);
void i16_to_f32(const std::int16_t* from, float* to, std::size_t pixels, Stores stores);
// Negative samples as 0.
void i16_to_u16(const std::int16_t* from, std::uint16_t* to, std::size_t pixels);

void u16_to_u8(const std::uint16_t* from, std::uint8_t* to, std::size_t samples,
               Reduction reduction);
// The value in the lower three 16-bit words, the highest 0: a grey RGBU64 pixel.
void u16_to_grey64(const std::uint16_t* from, std::uint64_t* to, std::size_t pixels, Stores stores);

}  // namespace zq
