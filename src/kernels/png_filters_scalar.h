// The filters byte by byte, as the standard defines them: what the fast ones must equal, and the
// ends of rows.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>

namespace zq::scalar {

// From the bytes to the left, above, and above to the left.
inline std::uint8_t png_prediction(int filter, std::uint8_t left, std::uint8_t above,
                                   std::uint8_t corner) {
    switch (filter) {
        case 1:
            return left;
        case 2:
            return above;
        case 3:
            return static_cast<std::uint8_t>((left + above) / 2);
        case 4: {
            const int to_left = std::abs(above - corner), to_above = std::abs(left - corner);
            const int to_corner = std::abs(left + above - 2 * corner);
            const std::uint8_t behind = to_above <= to_corner ? above : corner;
            return to_left <= to_above && to_left <= to_corner ? left : behind;
        }
        default:
            return 0;
    }
}

// Both rows have `step` bytes in front of them.
inline std::uint64_t png_filter(int filter, const std::uint8_t* row, const std::uint8_t* above,
                                std::size_t step, std::uint8_t* to, std::size_t count) {
    std::uint64_t sum = 0;
    for (std::size_t i = 0; i < count; ++i) {
        const std::uint8_t* left = row + i - step;
        const std::uint8_t* corner = above + i - step;
        to[i] =
            static_cast<std::uint8_t>(row[i] - png_prediction(filter, *left, above[i], *corner));
        sum += to[i] < 128 ? to[i] : 256U - to[i];
    }
    return sum;
}

// From byte `first` on.
inline void png_unfilter(int filter, const std::uint8_t* from, const std::uint8_t* above,
                         std::size_t step, std::uint8_t* to, std::size_t first, std::size_t count) {
    for (std::size_t i = first; i < count; ++i) {
        const bool starts = i < step;
        const std::uint8_t left = starts ? std::uint8_t{0} : to[i - step];
        const std::uint8_t corner = starts ? std::uint8_t{0} : above[i - step];
        to[i] = static_cast<std::uint8_t>(from[i] + png_prediction(filter, left, above[i], corner));
    }
}

}  // namespace zq::scalar
