// What the codecs are made of: transforms that undo themselves, coders that take any bytes, and
// libjpeg's failures as exceptions.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "codecs/band_coder.h"
#include "codecs/deflate.h"
#include "codecs/jpeg_memory.h"
#include "codecs/jpeg_session.h"
#include "codecs/range_coder.h"
#include "codecs/wavelet.h"
#include "kernels/alpha_rows.h"
#include "tests/support/simd_targets.h"

namespace zq {
namespace {

using Bytes = std::vector<std::uint8_t>;

std::uint32_t scramble(std::size_t seed) {
    auto number = static_cast<std::uint32_t>(seed);
    number = (number ^ number >> 15) * 0x2C1B3C6DU;
    return (number ^ number >> 12) * 0x297A2D39U;
}

// Rows are longer than the tile, so that a step beyond it shows.
struct Field {
    static constexpr int kStride = 80;
    std::vector<float> samples;
    Tile tile;

    Field(int width, int height)
        : samples(static_cast<std::size_t>(kStride * height), 1e9F),
          tile{samples.data(), width, height, kStride} {
        for (int y = 0; y < height; ++y) {
            for (int x = 0; x < width; ++x) {
                at(x, y) =
                    static_cast<float>(scramble(static_cast<std::uint32_t>(y * 97 + x)) >> 16) -
                    32768;
            }
        }
    }
    float& at(int x, int y) {
        return samples[static_cast<std::size_t>(y) * kStride + static_cast<std::size_t>(x)];
    }
};

TEST(WaveletTest, EverySizeIsRestored) {
    std::array<float, 80> spare{};
    for (int height = 1; height <= 67; height += height < 20 ? 1 : 9) {
        for (int width = 1; width <= 67; width += width < 20 ? 1 : 9) {
            Field field(width, height);
            const std::vector<float> before = field.samples;
            forward_wavelet(field.tile, spare.data());
            inverse_wavelet(field.tile, spare.data());
            for (std::size_t i = 0; i < before.size(); ++i) {
                ASSERT_NEAR(field.samples[i], before[i], 0.1) << width << " x " << height;
            }
        }
    }
}

// Bands are disjoint and cover the tile: what one misses would never be coded.
TEST(WaveletTest, BandsHoldEveryCoefficientOnce) {
    for (const auto& [width, height] : {std::pair{1, 1}, {1, 40}, {33, 1}, {64, 64}, {67, 35}}) {
        Field field(width, height);
        for (float& sample : field.samples) sample = 0;
        for (const Band& band : bands_of(field.tile)) {
            for (int y = 0; y < band.height; ++y) {
                for (int x = 0; x < band.width; ++x) band.first[y * band.stride + x] += 1;
            }
        }
        for (int y = 0; y < height; ++y) {
            for (int x = 0; x < Field::kStride; ++x) {
                ASSERT_EQ(field.at(x, y), x < width ? 1 : 0) << width << ' ' << x << ' ' << y;
            }
        }
    }
}

// Of flat tiles only the low-pass rest is left, 32 times as large; an error there would tint all.
TEST(WaveletTest, FlatTilesHaveNoDetail) {
    std::array<float, 80> spare{};
    Field field(64, 64);
    for (int y = 0; y < 64; ++y) std::fill_n(&field.at(0, y), 64, 100.0F);
    forward_wavelet(field.tile, spare.data());
    const auto bands = bands_of(field.tile);
    EXPECT_NEAR(bands[0].first[0], 3200, 0.1);
    for (std::size_t i = 1; i < bands.size(); ++i) EXPECT_NEAR(bands[i].first[0], 0, 0.01) << i;
}

TEST(RangeCoderTest, DecisionsAndBitsComeBack) {
    // From even chances to a single 1 in 100 000, where the coder's range runs into its limits.
    for (const std::uint32_t rarity : {2U, 7U, 1000U, 100000U}) {
        Bytes bytes;
        RangeEncoder encoder(bytes);
        BitModel model;
        const auto is_one = [&](std::uint32_t i) { return scramble(i) % rarity == 0; };
        for (std::uint32_t i = 0; i < 200000; ++i) {
            encoder.put(is_one(i), model);
            if (i % 1000 == 0) encoder.put_bits(scramble(i) >> 8, static_cast<int>(i / 1000 % 25));
        }
        encoder.finish();
        RangeDecoder decoder(bytes);
        model = BitModel();
        for (std::uint32_t i = 0; i < 200000; ++i) {
            ASSERT_EQ(decoder.get(model), is_one(i)) << rarity << ' ' << i;
            if (i % 1000 != 0) continue;
            const auto count = static_cast<int>(i / 1000 % 25);
            ASSERT_EQ(decoder.get_bits(count), (scramble(i) >> 8) & ((1U << count) - 1));
        }
        if (rarity > 1000) {
            EXPECT_LT(bytes.size(), 2000U);
        }
    }
}

TEST(RangeCoderTest, CarriesRunThroughFullBytes) {
    // Always the upper end of the range: bytes of 255 wait until the last decision settles them.
    for (int tail = 0; tail < 40; ++tail) {
        Bytes bytes;
        RangeEncoder encoder(bytes);
        for (int i = 0; i < 50; ++i) encoder.put_bits(255, 8);
        for (int i = 0; i < tail; ++i) encoder.put_bits(i % 3 == 0 ? 1 : 0, 1);
        encoder.finish();
        RangeDecoder decoder(bytes);
        for (int i = 0; i < 50; ++i) ASSERT_EQ(decoder.get_bits(8), 255U);
        for (int i = 0; i < tail; ++i) ASSERT_EQ(decoder.get_bits(1), i % 3 == 0 ? 1U : 0U);
    }
}

TEST(BandCoderTest, MultiplesOfTheStepComeBack) {
    // Largest magnitudes, as multiples of the step, up to the most that there is room for.
    for (const int most : {0, 1, 5, 1000, (1 << kMostBits) - 1}) {
        Field field(61, 9);
        for (float& sample : field.samples) {
            const auto wanted = static_cast<int>(scramble(static_cast<std::uint32_t>(sample)) >> 8);
            sample = 0.5F * static_cast<float>(most == 0 ? 0 : wanted % (2 * most + 1) - most);
        }
        field.at(3, 3) = -0.5F * static_cast<float>(most);
        const std::vector<float> before = field.samples;
        const Band band{field.samples.data(), 61, 9, Field::kStride};
        Bytes bytes;
        RangeEncoder encoder(bytes);
        BandCoder(61).encode(encoder, band, 0.5F, 0.25F);
        encoder.finish();
        for (int y = 0; y < 9; ++y) std::fill_n(&field.at(0, y), 61, 7.0F);
        RangeDecoder decoder(bytes);
        BandCoder(61).decode(decoder, band, 0.5F);
        ASSERT_EQ(field.samples, before) << most;
    }
}

TEST(BandCoderTest, AnyBytesGiveBoundedCoefficients) {
    for (std::uint32_t seed = 0; seed < 200; ++seed) {
        Bytes bytes(seed);
        for (std::size_t i = 0; i < bytes.size(); ++i) {
            bytes[i] = seed % 3 == 0 ? 0xFF : static_cast<std::uint8_t>(scramble(seed * 999U + i));
        }
        Field field(40, 12);
        RangeDecoder decoder(bytes);
        BandCoder(40).decode(decoder, {field.samples.data(), 40, 12, Field::kStride}, 1);
        for (int y = 0; y < 12; ++y) {
            for (int x = 0; x < 40; ++x) ASSERT_LT(std::fabs(field.at(x, y)), 1 << kMostBits);
        }
    }
}

TEST(AlphaRowsTest, OnlyTheRowAndOnlyAlphaChanges) {
    zqtest::on_every_simd_target([] {
        std::array<std::uint32_t, 80> from{};
        for (std::size_t i = 0; i < from.size(); ++i) {
            from[i] = 0x80000000U | scramble(i);
        }
        for (std::size_t count = 0; count <= 70; ++count) {
            for (const Stores stores : {Stores::kCached, Stores::kStreamed}) {
                std::array<std::uint32_t, 80> to{};
                copy_with_alpha(from.data() + 3, to.data() + 1, count, 0x5A, stores);
                for (std::size_t i = 0; i < to.size(); ++i) {
                    const bool inside = i >= 1 && i < 1 + count;
                    ASSERT_EQ(to[i], inside ? (from[i + 2] & 0xFFFFFFU) | 0x5A000000U : 0U) << i;
                }
            }
        }
    });
}

TEST(DeflateTest, OnlyWholeStreamsOfTheRightLengthAreTaken) {
    const Bytes bytes(1000, 42);
    const Bytes packed = deflate_bytes(bytes);
    struct Case {
        const char* name;
        std::size_t length;
        std::function<void(Bytes&)> damage;
        bool good;
    };
    const Case cases[] = {
        {"whole", 1000, [](Bytes&) {}, true},
        {"expected longer", 1001, [](Bytes&) {}, false},
        {"expected shorter", 999, [](Bytes&) {}, false},
        {"cut", 1000, [](Bytes& b) { b.pop_back(); }, false},
        {"followed by more", 1000, [](Bytes& b) { b.push_back(0); }, false},
        {"wrong sum", 1000, [](Bytes& b) { b.back() ^= 1; }, false},
        {"empty", 1000, [](Bytes& b) { b.clear(); }, false},
    };
    for (const Case& c : cases) {
        Bytes damaged = packed;
        c.damage(damaged);
        Bytes out(c.length);
        EXPECT_EQ(inflate_bytes(damaged, out), c.good) << c.name;
    }
}

TEST(JpegSessionTest, StreamsLongerThanExpectedComeBack) {
    std::vector<std::uint8_t> noise(300 * 200);
    for (std::size_t i = 0; i < noise.size(); ++i) {
        noise[i] = static_cast<std::uint8_t>(scramble(i) >> 24);
    }
    JpegSink sink(0);
    JpegCompressor compressor;
    sink.attach(compressor.jpeg());
    compressor.run(kSystemError, [&jpeg = compressor.jpeg(), pixels = noise.data()] {
        jpeg.image_width = 300;
        jpeg.image_height = 200;
        jpeg.input_components = 1;
        jpeg.in_color_space = JCS_GRAYSCALE;
        jpeg_set_defaults(&jpeg);
        jpeg_set_quality(&jpeg, 100, TRUE);
        jpeg_start_compress(&jpeg, TRUE);
        while (jpeg.next_scanline < 200) {
            JSAMPROW row = pixels + 300 * jpeg.next_scanline;
            jpeg_write_scanlines(&jpeg, &row, 1);
        }
        jpeg_finish_compress(&jpeg);
    });
    EXPECT_GT(sink.bytes().size(), 30000U);

    const auto decode = [&](std::span<const std::uint8_t> bytes) {
        std::vector<std::uint8_t> out(noise.size());
        JpegSource source(bytes);
        JpegDecompressor session;
        source.attach(session.jpeg());
        session.run(kInvalidFileHeader, [&jpeg = session.jpeg(), pixels = out.data()] {
            jpeg_read_header(&jpeg, TRUE);
            jpeg_start_decompress(&jpeg);
            while (jpeg.output_scanline < jpeg.output_height) {
                JSAMPROW row = pixels + 300 * jpeg.output_scanline;
                jpeg_read_scanlines(&jpeg, &row, 1);
            }
        });
        int worst = 0;
        for (std::size_t i = 0; i < out.size(); ++i) {
            worst = std::max(worst, std::abs(int{out[i]} - int{noise[i]}));
        }
        return std::pair(worst, session.warnings());
    };
    EXPECT_LE(decode(sink.bytes()).first, 3);
    EXPECT_EQ(decode(sink.bytes()).second, 0);
    // Half of it is a picture with a warning, a few bytes are none.
    EXPECT_GT(decode(sink.bytes().first(15000)).second, 0);
    for (const std::size_t length : {0U, 1U, 2U, 20U, 200U}) {
        EXPECT_THROW(decode(sink.bytes().first(length)), GRLIBError_enum) << length;
    }
}

TEST(JpegSessionTest, TheFirstRecordedCodeIsThrown) {
    struct Case {
        GRLIBError_enum recorded, thrown;
    };
    for (const Case& c : {Case{kFileIo, kFileIo}, {kSuccess, kUnableToReadData}}) {
        JpegDecompressor session;
        const auto common = reinterpret_cast<j_common_ptr>(&session.jpeg());
        try {
            session.run(kUnableToReadData,
                        [common, code = c.recorded] { JpegSession::fail(common, code); });
            FAIL();
        } catch (GRLIBError_enum code) {
            EXPECT_EQ(code, c.thrown);
        }
    }
}

}  // namespace
}  // namespace zq
