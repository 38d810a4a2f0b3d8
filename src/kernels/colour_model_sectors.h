// How red, green and blue depend on hue before the luminance scales them.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace zq {

// A channel before scaling: slope * saturation + kUnsaturated, the slope given by the hue. A third
// of the circle is a sector; there one channel leads, the next follows, and the third falls.
inline constexpr std::uint32_t kUnsaturated = 255 * 8192;
inline constexpr std::int32_t kFallingSlope = -8192;

inline constexpr std::array<std::int16_t, 86> kLeadingSlopes = {
    16384, 15716, 15099, 14528, 13996, 13500, 13035, 12598, 12186, 11796, 11427, 11075, 10741,
    10421, 10115, 9822,  9540,  9268,  9006,  8753,  8508,  8270,  8039,  7814,  7595,  7381,
    7172,  6967,  6766,  6569,  6375,  6185,  5997,  5812,  5628,  5447,  5267,  5089,  4912,
    4736,  4561,  4386,  4212,  4038,  3864,  3689,  3514,  3339,  3162,  2984,  2805,  2624,
    2442,  2257,  2070,  1880,  1688,  1492,  1292,  1089,  882,   669,   452,   229,   0,
    -235,  -477,  -728,  -987,  -1255, -1534, -1823, -2125, -2440, -2769, -3115, -3478, -3860,
    -4265, -4693, -5149, -5634, -6154, -6711, -7312, -7962};

inline constexpr std::array<std::int16_t, 86> kFollowingSlopes = {
    -8191, -7523, -6906, -6335, -5803, -5307, -4842, -4405, -3993, -3603, -3234, -2882, -2548,
    -2228, -1922, -1629, -1347, -1075, -813,  -560,  -315,  -77,   153,   378,   597,   811,
    1020,  1225,  1426,  1623,  1817,  2007,  2195,  2380,  2564,  2745,  2925,  3103,  3280,
    3456,  3631,  3806,  3980,  4154,  4328,  4503,  4678,  4853,  5030,  5208,  5387,  5568,
    5750,  5935,  6122,  6312,  6504,  6700,  6900,  7103,  7310,  7523,  7740,  7963,  8192,
    8428,  8670,  8921,  9180,  9448,  9727,  10016, 10318, 10633, 10962, 11308, 11671, 12053,
    12458, 12886, 13342, 13827, 14347, 14904, 15505, 16155};

// An entry of kHueSlopes: the slopes of red and, from bit kGreenShift on, of green, both less
// kFallingSlope; and from bit kSumShift on what the three slopes, so reckoned, are more than
// kLeastSum together.
inline constexpr int kGreenShift = 15;
inline constexpr int kSumShift = 30;
inline constexpr std::uint32_t kSlopeMask = (1U << kGreenShift) - 1;
inline constexpr std::uint32_t kLeastSum = 24576;

inline constexpr std::array<std::uint32_t, 256> kHueSlopes = [] {
    constexpr std::size_t kFirstHues[] = {0, 86, 171};  // of the sectors of red, green and blue
    std::array<std::uint32_t, 256> slopes{};
    for (std::size_t hue = 0; hue < slopes.size(); ++hue) {
        const std::size_t sector = hue < kFirstHues[1] ? 0 : hue < kFirstHues[2] ? 1 : 2;
        const std::size_t index = hue - kFirstHues[sector];
        std::uint32_t channels[3] = {};
        channels[sector] = static_cast<std::uint32_t>(kLeadingSlopes[index] - kFallingSlope);
        channels[(sector + 1) % 3] =
            static_cast<std::uint32_t>(kFollowingSlopes[index] - kFallingSlope);
        const std::uint32_t sum = channels[0] + channels[1] + channels[2] - kLeastSum;
        slopes[hue] = channels[0] | channels[1] << kGreenShift | sum << kSumShift;
    }
    return slopes;
}();

}  // namespace zq
