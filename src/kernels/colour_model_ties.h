// Saturations that end in exactly one half before they are rounded.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace zq {

// Whether a saturation of exactly n - 0.5 becomes n - 1, because the double-precision formula,
// (1 - 3 * least / sum) * 255 + 0.5, misses n. Such a tie has but one quotient,
// 3 * least / sum = (511 - 2n) / 510, hence one result whatever the colour.
constexpr bool is_tie_rounded_down(int n) {
    const double quotient = (511 - 2 * n) / 510.0;
    const double saturation = (1 - quotient) * 255 + 0.5;
    return n > 0 && saturation < n;  // none is negative, so there is no tie at 0
}

// The answers for 128 saturations from `first` on: of first + 16 * c + r as bit c of byte r.
constexpr std::array<std::uint8_t, 16> ties_rounded_down(int first) {
    std::array<std::uint8_t, 16> rows{};
    for (std::size_t row = 0; row < rows.size(); ++row) {
        for (int column = 0; column < 8; ++column) {
            const int n = first + 16 * column + static_cast<int>(row);
            if (is_tie_rounded_down(n))
                rows[row] = static_cast<std::uint8_t>(rows[row] | 1 << column);
        }
    }
    return rows;
}

alignas(16) inline constexpr std::array<std::uint8_t, 16> kTiesRoundedDown = ties_rounded_down(0);
alignas(16) inline constexpr std::array<std::uint8_t, 16> kTiesRoundedDownFrom128 =
    ties_rounded_down(128);

}  // namespace zq
