// The colour model against its formulas in plain double and integer arithmetic, for every colour
// and every target that this processor runs.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <cstdint>
#include <vector>

#include "kernels/colour_model.h"
#include "support/simd_targets.h"
#include "support/thoroughness.h"

namespace zq {
namespace {

using Pixel = std::array<std::uint8_t, 4>;
using Pixels = std::vector<Pixel>;

std::uint8_t truncated(double value) {
    return static_cast<std::uint8_t>(static_cast<int>(value));
}

double hue_of(double red, double green, double blue) {
    const double x = (green - blue) * 1.732050807569, y = 2 * red - green - blue;
    double angle = 0;
    if (y != 0) {
        angle = std::atan(x / y);
    } else if (x != 0) {
        angle = x < 0 ? -1.570796326795 : 1.570796326795;
    }
    if (x >= 0 && y < 0) angle += 3.14159265359;
    if (x < 0 && y >= 0) angle += 6.28318530718;
    if (x < 0 && y < 0) angle += 3.14159265359;
    return angle * 40.743666543153 + 0.5;
}

Pixel reference_hsl(const Pixel& bgra) {
    const double blue = 257 * bgra[0], green = 257 * bgra[1], red = 257 * bgra[2];
    const double luminance =
        ((0.299 * red + 0.587 * green + 0.114 * blue + 0.5) + 128) * 0.0038910505836575876;
    double saturation = 0;
    if (red != 0 || green != 0 || blue != 0) {
        saturation = (1 - 3 * std::min({red, green, blue}) / (red + green + blue)) * 255 + 0.5;
    }
    const double hue = saturation < 0 ? 0.5 : hue_of(red, green, blue);
    return {truncated(luminance), truncated(saturation), truncated(std::min(hue, 255.0)), bgra[3]};
}

constexpr int kLeading[] = {
    16384, 15716, 15099, 14528, 13996, 13500, 13035, 12598, 12186, 11796, 11427, 11075, 10741,
    10421, 10115, 9822,  9540,  9268,  9006,  8753,  8508,  8270,  8039,  7814,  7595,  7381,
    7172,  6967,  6766,  6569,  6375,  6185,  5997,  5812,  5628,  5447,  5267,  5089,  4912,
    4736,  4561,  4386,  4212,  4038,  3864,  3689,  3514,  3339,  3162,  2984,  2805,  2624,
    2442,  2257,  2070,  1880,  1688,  1492,  1292,  1089,  882,   669,   452,   229,   0,
    -235,  -477,  -728,  -987,  -1255, -1534, -1823, -2125, -2440, -2769, -3115, -3478, -3860,
    -4265, -4693, -5149, -5634, -6154, -6711, -7312, -7962};

// The channel that follows rises as the leading one falls: their sum is 8193, or 8192 in the
// middle.
int following(int index) {
    return (index >= 22 && index <= 64 ? 8192 : 8193) - kLeading[index];
}

Pixel reference_rgb(const Pixel& lsha) {
    const int luminance = lsha[0], saturation = lsha[1], hue = lsha[2];
    const int sector = hue < 86 ? 0 : hue < 171 ? 1 : 2;
    const int index = hue - std::array{0, 86, 171}[static_cast<std::size_t>(sector)];
    constexpr int kBase = 255 * 8192;
    const int leads = (kLeading[index] * saturation + kBase) >> 10;
    const int follows = (following(index) * saturation + kBase) >> 10;
    const int falls = (kBase - 8192 * saturation) >> 10;
    const int red = std::array{leads, falls, follows}[static_cast<std::size_t>(sector)];
    const int green = std::array{follows, leads, falls}[static_cast<std::size_t>(sector)];
    const int blue = std::array{falls, follows, leads}[static_cast<std::size_t>(sector)];
    const int weight = 612 * red + 1202 * green + 233 * blue;
    EXPECT_GT(weight, 0);
    const int scale = static_cast<int>(std::lround(static_cast<double>(luminance << 22) / weight))
                      << 5;
    const auto scaled = [&](int channel) {
        return static_cast<std::uint8_t>(std::min((scale * channel) >> 16, 255));
    };
    return {scaled(blue), scaled(green), scaled(red), lsha[3]};
}

using Kernel = void (*)(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels);
using Reference = Pixel (*)(const Pixel& source);

struct Direction {
    const char* name;
    Kernel kernel;
    Reference reference;
};

constexpr Direction kDirections[] = {{"RGB to HSL", rgb_to_hsl, reference_hsl},
                                     {"HSL to RGB", hsl_to_rgb, reference_rgb}};

// Every combination of the first three bytes, or one in 509; the fourth varies.
Pixels all_colours() {
    constexpr std::uint32_t kStep = zqtest::kThorough ? 1 : 509;
    Pixels pixels;
    pixels.reserve((1U << 24) / kStep + 1);
    for (std::uint32_t colour = 0; colour < 1U << 24; colour += kStep) {
        pixels.push_back({static_cast<std::uint8_t>(colour), static_cast<std::uint8_t>(colour >> 8),
                          static_cast<std::uint8_t>(colour >> 16),
                          static_cast<std::uint8_t>(colour * 29)});
    }
    return pixels;
}

TEST(ColourModel, EveryColourIsThatOfTheFormulaOnEveryTarget) {
    const Pixels source = all_colours();
    for (const Direction& direction : kDirections) {
        SCOPED_TRACE(direction.name);
        Pixels expected(source.size()), actual(source.size());
        std::transform(source.begin(), source.end(), expected.begin(), direction.reference);
        zqtest::on_every_simd_target([&] {
            direction.kernel(source[0].data(), actual[0].data(), source.size());
            const auto wrong = std::mismatch(actual.begin(), actual.end(), expected.begin());
            if (wrong.first == actual.end()) return;
            const Pixel& colour = source[static_cast<std::size_t>(wrong.first - actual.begin())];
            ASSERT_EQ(*wrong.first, *wrong.second) << testing::PrintToString(colour);
        });
    }
}

TEST(ColourModel, KnownColours) {
    struct Case {
        const char* name;
        Pixel bgra, lsha;
    };
    const Case cases[] = {
        {"black", {0, 0, 0, 9}, {0, 0, 0, 9}},       {"white", {255, 255, 255, 0}, {255, 0, 0, 0}},
        {"red", {0, 0, 255, 0}, {76, 255, 0, 0}},    {"green", {0, 255, 0, 0}, {150, 255, 85, 0}},
        {"blue", {255, 0, 0, 1}, {29, 255, 171, 1}}, {"cyan", {255, 255, 0, 0}, {179, 255, 128, 0}},
    };
    for (const Case& c : cases) EXPECT_EQ(reference_hsl(c.bgra), c.lsha) << c.name;
}

// Any number of pixels at any address, in place too, and nothing beside them.
TEST(ColourModel, AnyCountAndAlignmentStaysInside) {
    constexpr std::size_t kCounts = 70, kMargin = 64;
    Pixels source(600);
    std::uint32_t random = 1;
    for (Pixel& pixel : source) {
        for (std::uint8_t& byte : pixel) {
            random = random * 1664525U + 1013904223U;
            byte = static_cast<std::uint8_t>(random >> 24);
        }
    }
    const std::uint8_t* bytes = source[0].data();
    const auto check = [&](const Direction& direction, std::size_t count, std::size_t offset) {
        std::vector<std::uint8_t> expected(offset + 4 * count + kMargin, 0xA5);
        std::vector<std::uint8_t> apart = expected, in_place = expected;
        for (std::size_t i = 0; i < count; ++i) {
            const Pixel pixel = direction.reference(source[i]);
            std::copy(pixel.begin(), pixel.end(), expected.data() + offset + 4 * i);
        }
        // Exactly as many bytes as there are pixels, so that a sanitizer sees a longer read.
        const std::vector<std::uint8_t> alone(bytes, bytes + 4 * count);
        direction.kernel(alone.data(), apart.data() + offset, count);
        std::copy(alone.begin(), alone.end(), in_place.data() + offset);
        direction.kernel(in_place.data() + offset, in_place.data() + offset, count);
        ASSERT_EQ(apart, expected) << count << " pixels at " << offset;
        ASSERT_EQ(in_place, expected) << count << " pixels in place at " << offset;
    };
    zqtest::on_every_simd_target([&] {
        for (const Direction& direction : kDirections) {
            SCOPED_TRACE(direction.name);
            for (std::size_t count = 0; count <= kCounts; ++count) {
                check(direction, count, count % 5);
            }
            check(direction, source.size(), 3);
        }
    });
}

}  // namespace
}  // namespace zq
