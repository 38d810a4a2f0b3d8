// PNG's filters against the plain loop, for every target that this processor runs.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

#include "kernels/png_filters.h"
#include "kernels/png_filters_scalar.h"
#include "support/simd_targets.h"

namespace zq {
namespace {

using Bytes = std::vector<std::uint8_t>;
constexpr std::uint8_t kGuard = 0xA5;
constexpr std::size_t kSteps[] = {1, 2, 3, 4, 6, 8};

// Rows of random bytes, and of extremes, where ties and wraps are.
Bytes row_of(std::size_t count, bool extreme, std::mt19937& random) {
    constexpr std::uint8_t kExtremes[] = {0, 1, 127, 128, 254, 255};
    Bytes row(kPngMostStep + count);
    for (std::size_t i = kPngMostStep; i < row.size(); ++i) {
        row[i] = extreme ? kExtremes[random() % 6] : static_cast<std::uint8_t>(random());
    }
    return row;
}

void compare_rows(std::size_t count, std::size_t step, bool extreme, std::mt19937& random) {
    const Bytes row = row_of(count, extreme, random), above = row_of(count, extreme, random);
    for (int filter = 0; filter < kPngFilters; ++filter) {
        SCOPED_TRACE(testing::Message() << count << " bytes, step " << step << ", " << filter);
        Bytes fast(count + 64, kGuard), plain = fast, back = fast;
        const auto sum =
            png_filter(filter, &row[kPngMostStep], &above[kPngMostStep], step, fast.data(), count);
        EXPECT_EQ(sum, scalar::png_filter(filter, &row[kPngMostStep], &above[kPngMostStep], step,
                                          plain.data(), count));
        ASSERT_EQ(fast, plain);
        // In blocks of their own, so that a step beyond their ends is found.
        const Bytes from(fast.begin(), fast.begin() + static_cast<std::ptrdiff_t>(count));
        const Bytes before(above.begin() + kPngMostStep, above.end());
        png_unfilter(filter, from.data(), before.data(), step, back.data(), count);
        ASSERT_TRUE(std::equal(row.begin() + kPngMostStep, row.end(), back.begin()));
        ASSERT_EQ(back[count], kGuard);
    }
}

TEST(PngFilters, EqualThePlainLoopAndUndoEachOther) {
    std::mt19937 random(5);
    zqtest::on_every_simd_target([&] {
        for (const std::size_t step : kSteps) {
            for (std::size_t pixels = 1; pixels <= 150; ++pixels) {
                compare_rows(pixels * step, step, pixels % 2 == 0, random);
            }
        }
    });
}

// All neighbourhoods of extremes and their like, where the nearest is a matter of order.
TEST(PngFilters, EveryTieOfPaethFallsAsTheStandardSays) {
    zqtest::on_every_simd_target([&] {
        for (const std::size_t step : kSteps) {
            constexpr int kValues[] = {0, 1, 2, 3, 100, 127, 128, 129, 200, 253, 254, 255};
            for (const int left : kValues) {
                for (const int corner : kValues) {
                    Bytes from(3 * step + 16, 0), above(from.size(), 0), fast = from, plain = from;
                    for (std::size_t i = 0; i < step; ++i) {
                        from[i] = static_cast<std::uint8_t>(left - corner);
                        above[i] = static_cast<std::uint8_t>(corner);
                        above[step + i] = static_cast<std::uint8_t>(kValues[i] * 37);
                    }
                    png_unfilter(4, from.data(), above.data(), step, fast.data(), from.size());
                    scalar::png_unfilter(4, from.data(), above.data(), step, plain.data(), 0,
                                         from.size());
                    ASSERT_EQ(fast, plain) << left << ' ' << corner << ' ' << step;
                }
            }
        }
    });
}

}  // namespace
}  // namespace zq
