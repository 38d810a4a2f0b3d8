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

}  // namespace zq::scalar
