// Display by range against the obvious loops, for every target that this processor runs.
#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <random>
#include <vector>

#include "kernels/grey_range_scalar.h"
#include "support/simd_targets.h"
#include "support/thoroughness.h"

namespace zq {
namespace {

template <class Sample, class Range, class Kernel>
void compare(const std::vector<Sample>& source, Range range, Kernel kernel) {
    std::vector<std::uint8_t> expected(source.size() + 1, 0xA5), actual = expected;
    for (std::size_t i = 0; i < source.size(); ++i)
        expected[i] = scalar::in_range(source[i], range);
    kernel(source.data(), actual.data(), source.size(), range);
    ASSERT_EQ(actual, expected) << range.least << " to " << range.largest;
}

TEST(GreyRange, SamplesOfEveryValueAndRange) {
    const std::int32_t ends[][2] = {{-32768, 32767}, {0, 4095},     {-5, 250}, {-1, 254}, {7, 7},
                                    {0, 1},          {-3000, 4007}, {0, 65},   {100, 356}};
    zqtest::on_every_simd_target([&] {
        for (const auto& [least, largest] : ends) {
            std::vector<std::int16_t> all;
            for (std::int32_t v = least; v <= largest; ++v) {
                all.push_back(static_cast<std::int16_t>(v));
            }
            compare(all, IntegerRange{least, largest}, i16_to_u8_in_range);
        }
        // Every quotient that is just below a whole number, and the next one, for every length of a
        // range.
        for (std::int32_t span = 1; span <= 65535; ++span) {
            std::vector<std::int16_t> critical = {-32768};
            for (std::int32_t step = 1; step <= 255; step += zqtest::kThorough ? 1 : 7) {
                const std::int32_t sample = (step * span - 1) / 255 - 32768;
                critical.push_back(static_cast<std::int16_t>(sample));
                critical.push_back(static_cast<std::int16_t>(sample + 1));
            }
            compare(critical, IntegerRange{-32768, span - 32768}, i16_to_u8_in_range);
        }
    });
}

TEST(GreyRange, FloatsOfEveryKind) {
    const float inf = std::numeric_limits<float>::infinity(), nan = std::nanf("");
    std::vector<FloatRange> ranges = {
        {0, 1},       {-3, 1e-38F},     {-inf, 5},          {2, inf},
        {7, 7},       {1e-3F, 3e-3F},   {-3e38F, 3e38F},    {0, 3e38F},
        FloatRange(), {-0.1F, 88.3F},   {0, 0x1.fffffep5F}, {0, 255},
        {3, 1e-30F},  {-1e-29F, 1e-30F}};
    std::mt19937 random(6);
    for (int i = 0; i < 20; ++i) {
        const float least = -static_cast<float>(random() % 1000);
        ranges.push_back({least, least + 1e-3F * static_cast<float>(random())});
    }
    zqtest::on_every_simd_target([&] {
        for (const FloatRange& range : ranges) {
            std::vector<float> values = {inf, -inf, nan, 0, -0.0F, range.least, range.largest};
            const int count = zqtest::kThorough ? 300'000 : 3000;
            for (int i = 0; i < count; ++i) {
                values.push_back(std::bit_cast<float>(static_cast<std::uint32_t>(random())));
                // Just below and at each byte's first value.
                const float step =
                    static_cast<float>(i % 256) * (range.largest / 255 - range.least / 255) +
                    range.least;
                values.push_back(std::nextafter(step, -inf));
                values.push_back(step);
                values.push_back(static_cast<float>(i) * (range.largest - range.least) /
                                     static_cast<float>(count) +
                                 range.least);
            }
            std::erase_if(
                values, [&](float value) { return value < range.least || value > range.largest; });
            compare(values, range,
                    [](const float* from, std::uint8_t* to, std::size_t pixels, FloatRange ends) {
                        f32_to_u8_scaled(from, to, pixels, scale_of(ends, pixels));
                    });
        }
    });
}

template <class Sample, class Range>
void compare_ranges(const std::vector<Sample>& samples, std::size_t pixels) {
    Range expected, actual;
    const auto stride = static_cast<std::ptrdiff_t>(samples.size() / 3);
    scalar::widen_range(samples.data(), pixels, 3, stride, expected);
    widen_range(samples.data(), pixels, 3, stride, actual);
    ASSERT_EQ(actual.least, expected.least) << pixels;
    ASSERT_EQ(actual.largest, expected.largest) << pixels;
}

TEST(GreyRange, EndsOfRowsOfEveryLength) {
    std::mt19937 random(7);
    zqtest::on_every_simd_target([&] {
        for (std::size_t pixels = 0; pixels < 150; ++pixels) {
            // Three rows with more between them.
            std::vector<std::int16_t> samples(3 * (pixels + 5));
            std::vector<float> floats(samples.size());
            for (auto& sample : samples) sample = static_cast<std::int16_t>(random());
            // NaN and infinities among them, and rows of negative numbers alone.
            for (auto& value : floats) {
                value = pixels % 3 == 0
                            ? -static_cast<float>(random() % 1000 + 1)
                            : std::bit_cast<float>(static_cast<std::uint32_t>(random()));
                if (random() % 4 == 0) value = std::nanf("");
            }
            compare_ranges<std::int16_t, IntegerRange>(samples, pixels);
            compare_ranges<float, FloatRange>(floats, pixels);
        }
    });
}

}  // namespace
}  // namespace zq
