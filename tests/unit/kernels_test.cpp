// Fast rows against the obvious loops, for every target that this processor runs.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

#include "kernels/colour_rows.h"
#include "kernels/colour_rows_scalar.h"
#include "kernels/pack_bits.h"
#include "support/simd_targets.h"

namespace zq {
namespace {

constexpr std::uint8_t kGuard = 0xA5;

TEST(Kernels, ColourRowsEqualThePlainLoopAndStayInside) {
    using Kernel = void (*)(const std::uint8_t*, std::uint8_t*, std::size_t);
    struct Case {
        const char* name;
        std::size_t read;  // bytes a pixel
        Kernel fast, plain;
    };
    const Case cases[] = {
        {"rgb_to_bgra", 3, rgb_to_bgra, scalar::rgb_to_bgra},
        {"bgr_to_bgra", 3, bgr_to_bgra, scalar::bgr_to_bgra},
        {"bgra_to_bgr", 4, bgra_to_bgr, scalar::bgra_to_bgr},
        {"bgra_to_rgb", 4, bgra_to_rgb, scalar::bgra_to_rgb},
    };
    std::mt19937 random(3);
    zqtest::on_every_simd_target([&] {
        for (const Case& c : cases) {
            for (std::size_t pixels = 0; pixels <= 200; ++pixels) {
                std::vector<std::uint8_t> source(c.read * pixels);
                for (auto& byte : source) byte = static_cast<std::uint8_t>(random());
                std::vector<std::uint8_t> expected((7 - c.read) * pixels + 64, kGuard);
                std::vector<std::uint8_t> actual = expected;
                c.plain(source.data(), expected.data() + 1, pixels);
                c.fast(source.data(), actual.data() + 1, pixels);
                ASSERT_EQ(actual, expected) << c.name << ' ' << pixels << " pixels";
            }
        }
    });
}

TEST(Kernels, BitsOfRowsOfEveryLengthAndByte) {
    std::mt19937 random(4);
    zqtest::on_every_simd_target([&] {
        for (std::size_t pixels = 0; pixels <= 600; ++pixels) {
            std::vector<std::uint8_t> source(pixels);
            for (auto& byte : source)
                byte = random() % 2 == 0 ? 0 : static_cast<std::uint8_t>(random());
            std::vector<std::uint8_t> bits((pixels + 7) / 8, 0);
            std::vector<std::uint8_t> rows(pixels + 2, kGuard);
            for (std::size_t i = 0; i < pixels; ++i) {
                if (source[i] == 0) continue;
                bits[i / 8] = static_cast<std::uint8_t>(bits[i / 8] | 1U << (i % 8));
            }
            // One byte off any alignment, with a guard on both sides.
            std::vector<std::uint8_t> packed(bits.size() + 2, kGuard);
            std::vector<std::uint8_t> expected = packed;
            std::copy(bits.begin(), bits.end(), expected.begin() + 1);
            pack_bits(source.data(), packed.data() + 1, pixels);
            ASSERT_EQ(packed, expected) << pixels << " pixels";
            expected = rows;
            for (std::size_t i = 0; i < pixels; ++i) expected[i + 1] = source[i] == 0 ? 0 : 255;
            // Exactly as many bytes as the row has, so that a sanitizer sees a read beyond it.
            unpack_bits(bits.data(), rows.data() + 1, pixels);
            ASSERT_EQ(rows, expected) << pixels << " pixels";
        }
    });
}

}  // namespace
}  // namespace zq
