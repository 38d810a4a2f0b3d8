// The obvious loops: what the fast ones must equal.
#pragma once

#include "kernels/grey_range.h"

namespace zq::scalar {

template <class Sample, class Range>
void widen_range(const Sample* first, std::size_t pixels, std::size_t rows, std::ptrdiff_t stride,
                 Range& range) {
    for (std::size_t row = 0; row < rows; ++row) {
        const Sample* from = first + static_cast<std::ptrdiff_t>(row) * stride;
        for (std::size_t i = 0; i < pixels; ++i) {
            if (from[i] < range.least) range.least = from[i];
            if (from[i] > range.largest) range.largest = from[i];
        }
    }
}

inline std::uint8_t in_range(std::int16_t sample, IntegerRange range) {
    const std::int32_t span = range.largest - range.least;
    return span < 1 ? std::uint8_t{0}
                    : static_cast<std::uint8_t>((sample - range.least) * 255 / span);
}

inline std::uint8_t in_range(float value, FloatRange range) {
    const float quotient = (value - range.least) * 255.0F / (range.largest - range.least);
    return quotient < 256 ? static_cast<std::uint8_t>(quotient) : std::uint8_t{0};
}

}  // namespace zq::scalar
