// Fast rows against the obvious loops, for every target that this processor runs.
#include <gtest/gtest.h>

#include <random>
#include <vector>

#include "kernels/colour_rows.h"
#include "kernels/colour_rows_scalar.h"
#include "support/simd_targets.h"

namespace zq {
namespace {

TEST(Kernels, ColourRowsEqualThePlainLoopAndStayInside) {
    constexpr std::uint8_t kGuard = 0xA5;
    std::mt19937 random(3);
    zqtest::on_every_simd_target([&] {
        for (std::size_t pixels = 0; pixels <= 200; ++pixels) {
            std::vector<std::uint8_t> source(3 * pixels);
            for (auto& byte : source) byte = static_cast<std::uint8_t>(random());
            std::vector<std::uint8_t> expected(4 * pixels + 64, kGuard);
            std::vector<std::uint8_t> actual = expected;
            scalar::rgb_to_bgra(source.data(), expected.data() + 1, pixels);
            rgb_to_bgra(source.data(), actual.data() + 1, pixels);
            ASSERT_EQ(actual, expected) << pixels << " pixels";
        }
    });
}

}  // namespace
}  // namespace zq
