// Saturations that end in exactly one half before they are rounded.
#pragma once

#include <array>
#include <cstdint>

namespace zq {

// Bit n tells that a saturation of exactly n - 0.5 becomes n - 1, because the double-precision
// formula, (1 - 3 * least / sum) * 255 + 0.5, misses n. Such a tie has but one quotient,
// 3 * least / sum = (511 - 2n) / 510, hence one result whatever the colour.
alignas(16) inline constexpr std::array<std::uint8_t, 32> kTiesRoundedDown = [] {
    std::array<std::uint8_t, 32> bits{};
    for (int n = 0; n < 256; ++n) {
        const double quotient = (511 - 2 * n) / 510.0;
        if (static_cast<int>((1 - quotient) * 255 + 0.5) == n) continue;
        const std::size_t byte = static_cast<std::size_t>(n) / 8;
        bits[byte] = static_cast<std::uint8_t>(bits[byte] | 1 << n % 8);
    }
    return bits;
}();

}  // namespace zq
