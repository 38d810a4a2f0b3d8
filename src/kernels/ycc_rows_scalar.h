// JPEG's colours pixel by pixel: what the fast rows must equal, and the ends of rows.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>

#include "kernels/ycc_rows.h"

namespace zq::scalar {

// Parts of 65536, rounded half up.
inline int rounded_part(int parts) {
    return (parts + 32768) >> 16;
}

inline std::uint32_t clamped_sample(int sum) {
    return static_cast<std::uint32_t>(std::clamp(sum, 0, 255));
}

inline void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i) {
        const int y = from.y[i], cb = from.cb[i] - 128, cr = from.cr[i] - 128;
        const std::uint32_t red = clamped_sample(y + rounded_part(91881 * cr));
        const std::uint32_t green = clamped_sample(y + rounded_part(-22554 * cb - 46802 * cr));
        const std::uint32_t blue = clamped_sample(y + rounded_part(116130 * cb));
        to[i] = blue | green << 8 | red << 16 | std::uint32_t{from.alpha[i]} << 24;
    }
}

// Weights in parts of 65536; of each sample's three they add up to 65536 or 0.
inline void bgra_to_ycc(const std::uint32_t* from, const YccTarget& to, std::size_t pixels,
                        CommonBits& bits) {
    constexpr int kHalf = 32768;
    constexpr int kMiddle = 128 << 16;
    for (std::size_t i = 0; i < pixels; ++i) {
        const std::uint32_t pixel = from[i];
        const auto blue = static_cast<int>(pixel & 255), green = static_cast<int>(pixel >> 8 & 255),
                   red = static_cast<int>(pixel >> 16 & 255);
        const int y = 19595 * red + 38470 * green + 7471 * blue + kHalf;
        const int cb = -11059 * red - 21709 * green + 32768 * blue + kMiddle + kHalf - 1;
        const int cr = 32768 * red - 27439 * green - 5329 * blue + kMiddle + kHalf - 1;
        to.y[i] = static_cast<std::uint8_t>(y >> 16);
        to.cb[i] = static_cast<std::uint8_t>(cb >> 16);
        to.cr[i] = static_cast<std::uint8_t>(cr >> 16);
        bits.all &= pixel;
        bits.any |= pixel;
    }
}

}  // namespace zq::scalar
