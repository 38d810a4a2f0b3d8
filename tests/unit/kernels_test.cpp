// Fast rows against the obvious loops, for every target that this processor runs.
#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <vector>

#include "kernels/colour_rows.h"
#include "kernels/colour_rows_scalar.h"
#include "kernels/pack_bits.h"
#include "kernels/squared_error.h"
#include "kernels/stream_copy.h"
#include "kernels/ycc_rows.h"
#include "kernels/ycc_rows_scalar.h"
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

// Every luminance with every chrominance: a row has all y for all cr.
TEST(Kernels, EveryYccColourEqualsThePlainLoop) {
    constexpr std::size_t kPixels = 256 * 256;
    std::vector<std::uint8_t> y(kPixels), cb(kPixels), cr(kPixels), alpha(kPixels);
    for (std::size_t i = 0; i < kPixels; ++i) {
        y[i] = static_cast<std::uint8_t>(i);
        cr[i] = static_cast<std::uint8_t>(i / 256);
        alpha[i] = static_cast<std::uint8_t>(i * 7);
    }
    const YccRow row = {y.data(), cb.data(), cr.data(), alpha.data()};
    std::vector<std::uint32_t> expected(kPixels), actual(kPixels);
    for (int blue = 0; blue < 256; ++blue) {
        std::fill(cb.begin(), cb.end(), static_cast<std::uint8_t>(blue));
        scalar::ycc_to_bgra(row, expected.data(), kPixels);
        zqtest::on_every_simd_target([&] {
            ycc_to_bgra(row, actual.data(), kPixels, Stores::kCached);
            ASSERT_EQ(actual, expected) << "cb " << blue;
        });
    }
}

TEST(Kernels, YccRowsOfEveryLengthStayInside) {
    std::mt19937 random(5);
    zqtest::on_every_simd_target([&] {
        for (std::size_t n = 0; n <= 400; ++n) {
            const std::size_t pixels = n / 2;
            std::vector<std::uint8_t> planes[4];
            for (auto& plane : planes) {
                plane.resize(pixels);
                for (auto& byte : plane) byte = static_cast<std::uint8_t>(random());
            }
            const YccRow row = {planes[0].data(), planes[1].data(), planes[2].data(),
                                planes[3].data()};
            const std::size_t start = random() % 16 + 1;
            std::vector<std::uint32_t> expected(pixels + 32, kGuard);
            std::vector<std::uint32_t> actual = expected;
            scalar::ycc_to_bgra(row, expected.data() + start, pixels);
            ycc_to_bgra(row, actual.data() + start, pixels,
                        n % 2 == 0 ? Stores::kStreamed : Stores::kCached);
            finish_streaming();
            ASSERT_EQ(actual, expected) << pixels << " pixels from " << start;
        }
    });
}

struct TakenApart {
    std::vector<std::uint8_t> y, cb, cr;
    CommonBits bits;

    explicit TakenApart(std::size_t size) : y(size, kGuard), cb(size, kGuard), cr(size, kGuard) {}
    YccTarget at(std::size_t start) { return {&y[start], &cb[start], &cr[start]}; }
    void expect_same(const TakenApart& other) const {
        ASSERT_EQ(y, other.y);
        ASSERT_EQ(cb, other.cb);
        ASSERT_EQ(cr, other.cr);
        ASSERT_EQ(bits.all, other.bits.all);
        ASSERT_EQ(bits.any, other.bits.any);
    }
};

TEST(Kernels, EveryColourIsTakenApartAsByThePlainLoop) {
    constexpr std::size_t kPixels = 256 * 256;
    std::vector<std::uint32_t> pixels(kPixels);
    for (std::uint32_t red = 0; red < 256; ++red) {
        for (std::uint32_t i = 0; i < kPixels; ++i) pixels[i] = i | red << 16 | i * 7 << 24;
        TakenApart expected(kPixels);
        scalar::bgra_to_ycc(pixels.data(), expected.at(0), kPixels, expected.bits);
        zqtest::on_every_simd_target([&] {
            TakenApart actual(kPixels);
            bgra_to_ycc(pixels.data(), actual.at(0), kPixels, actual.bits);
            actual.expect_same(expected);
        });
    }
}

TEST(Kernels, PixelsOfRowsOfEveryLengthAreTakenApartInside) {
    std::mt19937 random(6);
    zqtest::on_every_simd_target([&] {
        for (std::size_t count = 0; count <= 200; ++count) {
            std::vector<std::uint32_t> pixels(count + 1);
            // One pixel lacks a bit that all others have, or has one that none of them has.
            for (auto& pixel : pixels) pixel = (random() & 0x7FFFFFFF) | 0x40000000;
            if (count > 0) pixels[random() % count] ^= random() % 2 == 0 ? 0x80000000 : 0x40000000;
            const std::size_t start = random() % 16 + 1;
            TakenApart expected(count + 32), actual(count + 32);
            scalar::bgra_to_ycc(pixels.data(), expected.at(start), count, expected.bits);
            bgra_to_ycc(pixels.data(), actual.at(start), count, actual.bits);
            actual.expect_same(expected);
        }
    });
}

TEST(Kernels, SquaredErrorsOfRowsOfEveryLength) {
    struct Case {
        std::size_t bytes, samples;  // of a pixel
        SquaredError (*fast)(const std::uint8_t*, const std::uint8_t*, std::size_t);
    };
    const Case cases[] = {{1, 1, squared_error_u8}, {4, 3, squared_error_bgrx}};
    std::mt19937 random(8);
    zqtest::on_every_simd_target([&] {
        for (const Case& c : cases) {
            // The longest is more than 32 bits hold, where all samples are as far off as can be.
            for (std::size_t n = 0; n <= 301; ++n) {
                const std::size_t pixels = n == 301 ? 1100000 : n;
                std::vector<std::uint8_t> a(pixels * c.bytes), b(pixels * c.bytes);
                std::uint64_t total = 0;
                std::size_t different = 0;
                for (std::size_t i = 0; i < pixels; ++i) {
                    const bool same = n < 301 && random() % 3 == 0;
                    std::uint64_t squares = 0;
                    for (std::size_t k = 0; k < c.bytes; ++k) {
                        const std::size_t at = i * c.bytes + k;
                        a[at] = n == 301 ? 255 : static_cast<std::uint8_t>(random());
                        b[at] = same && k < c.samples ? a[at]
                                : n == 301            ? 0
                                                      : static_cast<std::uint8_t>(random());
                        const std::int64_t difference = a[at] - b[at];
                        if (k < c.samples) {
                            squares += static_cast<std::uint64_t>(difference * difference);
                        }
                    }
                    total += squares;
                    different += squares != 0 ? 1 : 0;
                }
                const SquaredError error = c.fast(a.data(), b.data(), pixels);
                ASSERT_EQ(error.total, total) << pixels << " pixels of " << c.bytes;
                ASSERT_EQ(error.pixels, different) << pixels << " pixels of " << c.bytes;
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
