// Rows of samples to 8 bits by their range: the least becomes black, the largest white. Any
// alignment, any number of pixels; nothing beyond a row is touched; source and destination do not
// overlap.
#pragma once

#include <cstddef>
#include <cstdint>
#include <limits>

namespace zq {

struct IntegerRange {
    std::int32_t least = std::numeric_limits<std::int16_t>::max();
    std::int32_t largest = std::numeric_limits<std::int16_t>::min();
};

// The largest value starts at the smallest normal number, so that of negative values stays there.
struct FloatRange {
    float least = std::numeric_limits<float>::max();
    float largest = std::numeric_limits<float>::min();
};

// Widens a range by rows of so many pixels, `stride` apart. NaN takes no part.
void widen_range(const std::int16_t* first, std::size_t pixels, std::size_t rows,
                 std::ptrdiff_t stride, IntegerRange& range);
void widen_range(const float* first, std::size_t pixels, std::size_t rows, std::ptrdiff_t stride,
                 FloatRange& range);

// (sample - least) * 255 / (largest - least) of samples within the range, rounded down; 0 for a
// range of one value.
void i16_to_u8_in_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                        IntegerRange range);

// How a picture's values become bytes.
struct FloatScale {
    float least;
    float span;               // largest - least
    float high = 0;           // the reciprocal of the span: its upper bits
    float low = 0;            // and the rest
    bool multiplies = false;  // with the reciprocal, as that gives the same bytes
};

// Looks for the faster way where so many pixels are worth it.
FloatScale scale_of(FloatRange range, std::size_t pixels);

// (value - least) * 255 / (largest - least) in single precision, cut towards zero, of values within
// the range; 0 where the quotient is no number below 256 (a range of one value, NaN, overflow).
void f32_to_u8_scaled(const float* from, std::uint8_t* to, std::size_t pixels,
                      const FloatScale& scale);

}  // namespace zq
