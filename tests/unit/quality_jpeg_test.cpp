// The quality codec's own ways round libjpeg: planes instead of pixels, and trials without streams;
// all of them must come to what libjpeg makes of the pixels.
#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <memory>
#include <random>
#include <span>
#include <string_view>
#include <vector>

#include "codecs/jpeg_memory.h"
#include "codecs/jpeg_session.h"
#include "image/image.h"
#include "kernels/dct_blocks.h"
#include "serialize/quality_jpeg.h"
#include "serialize/quality_round_trip.h"
#include "serialize/quality_steps.h"
#include "support/simd_targets.h"
#include "tests/support/thoroughness.h"

namespace zq {
namespace {

struct Size {
    std::int32_t width, height;
};
constexpr Size kSizes[] = {{1, 1}, {8, 8}, {7, 9}, {9, 7}, {64, 20}, {83, 21}, {131, 8}, {5, 33}};

std::unique_ptr<Image> blank(int type, const Size& size) {
    auto image = std::make_unique<Image>(Variant::kPrivate, std::string_view());
    image->reinitialise({.type = type, .width = size.width, .height = size.height, .border = 2});
    return image;
}

// Bytes of all pixels: `byte` of a byte's place in its row, and of the row.
template <class Byte>
std::unique_ptr<Image> painted(int type, const Size& size, Byte&& byte) {
    auto image = blank(type, size);
    for (std::int32_t y = 0; y < size.height; ++y) {
        std::uint8_t* row = image->row(y);
        for (int i = 0; i < size.width * bytes_per_pixel(image->type()); ++i) {
            row[i] = static_cast<std::uint8_t>(byte(i, y));
        }
    }
    return image;
}

std::unique_ptr<Image> noise(int type, const Size& size) {
    std::mt19937 random(7);
    return painted(type, size, [&](int, int) { return random(); });
}

void expect_same_colours(const Image& actual, const Image& expected) {
    const std::ptrdiff_t bytes = bytes_per_pixel(expected.type());
    for (std::int32_t y = 0; y < expected.record().height; ++y) {
        for (std::ptrdiff_t i = 0; i < expected.record().width * bytes; ++i) {
            if (bytes == 4 && i % 4 == 3) continue;
            ASSERT_EQ(actual.row(y)[i], expected.row(y)[i]) << i << ' ' << y;
        }
    }
}

double squared_error(const Image& a, const Image& b) {
    const std::ptrdiff_t bytes = bytes_per_pixel(a.type());
    int total = 0;
    for (std::int32_t y = 0; y < a.record().height; ++y) {
        for (std::ptrdiff_t i = 0; i < a.record().width * bytes; ++i) {
            if (bytes == 4 && i % 4 == 3) continue;
            total += (a.row(y)[i] - b.row(y)[i]) * (a.row(y)[i] - b.row(y)[i]);
        }
    }
    return total;
}

Bytes stream_of_libjpeg(const Image& image, int quality) {
    const bool colour = image.type() == PixelType::kRgb;
    const JpegSteps luma = colour ? luma_steps(quality) : grey_steps(quality);
    const JpegSteps chroma = chroma_steps(quality);
    JpegSink sink(100000);
    JpegCompressor session;
    jpeg_compress_struct& jpeg = session.jpeg();
    sink.attach(jpeg);
    session.run(kSystemError, [&] {
        jpeg.image_width = static_cast<JDIMENSION>(image.record().width);
        jpeg.image_height = static_cast<JDIMENSION>(image.record().height);
        jpeg.input_components = colour ? 4 : 1;
        jpeg.in_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
        jpeg_set_defaults(&jpeg);
        jpeg.write_JFIF_header = FALSE;
        jpeg.comp_info[0].h_samp_factor = jpeg.comp_info[0].v_samp_factor = 1;
        jpeg_add_quant_table(&jpeg, 0, luma.data(), 100, TRUE);
        if (colour) jpeg_add_quant_table(&jpeg, 1, chroma.data(), 100, TRUE);
        jpeg_start_compress(&jpeg, TRUE);
        while (jpeg.next_scanline < jpeg.image_height) {
            JSAMPROW row = image.row(static_cast<std::int32_t>(jpeg.next_scanline));
            jpeg_write_scanlines(&jpeg, &row, 1);
        }
        jpeg_finish_compress(&jpeg);
    });
    const auto bytes = sink.bytes();
    return {bytes.begin(), bytes.end()};
}

void decode_by_libjpeg(std::span<const std::uint8_t> stream, const Image& target) {
    const bool colour = target.type() == PixelType::kRgb;
    JpegSource source(stream);
    JpegDecompressor session;
    jpeg_decompress_struct& jpeg = session.jpeg();
    source.attach(jpeg);
    session.run(kSystemError, [&] {
        jpeg_read_header(&jpeg, TRUE);
        jpeg.jpeg_color_space = colour ? JCS_YCbCr : JCS_GRAYSCALE;
        jpeg.out_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
        jpeg_start_decompress(&jpeg);
        while (jpeg.output_scanline < jpeg.output_height) {
            JSAMPROW row = target.row(static_cast<std::int32_t>(jpeg.output_scanline));
            jpeg_read_scanlines(&jpeg, &row, 1);
        }
    });
}

TEST(QualityJpegTest, StreamsAndPicturesAreThoseOfLibjpeg) {
    for (const int type : {ZQ_TYPE_U8, ZQ_TYPE_RGB}) {
        for (const Size& size : kSizes) {
            SCOPED_TRACE(testing::Message() << type << ": " << size.width << " x " << size.height);
            const auto image = noise(type, size);
            Bytes payload;
            put_jpeg(payload, *image, 60);
            StreamReader reader(payload);
            const auto stream = reader.section();
            ASSERT_TRUE(std::ranges::equal(stream, stream_of_libjpeg(*image, 60)));
            const auto expected = blank(type, size), actual = blank(type, size);
            decode_by_libjpeg(stream, *expected);
            StreamReader again(payload);
            read_jpeg(again, *actual, PixelMemory::kUsed);
            expect_same_colours(*actual, *expected);
        }
    }
}

TEST(QualityJpegTest, TrialsComeToWhatStreamsBringBack) {
    struct Picture {
        const char* name;
        int (*byte)(int i, int y, std::uint32_t random);
    };
    const Picture pictures[] = {
        {"noise", [](int, int, std::uint32_t random) { return static_cast<int>(random & 255); }},
        {"black and white",
         [](int, int, std::uint32_t random) { return random % 2 == 0 ? 0 : 255; }},
        {"white on its side",
         [](int i, int y, std::uint32_t) { return (i / 4 + y) % 2 == 0 ? 255 : 0; }},
        {"blocks", [](int i, int y, std::uint32_t) { return (i / 32 + y / 8) % 2 == 0 ? 255 : 0; }},
        {"soft",
         [](int i, int y, std::uint32_t random) { return 60 + i / 2 + y + int(random % 3); }},
    };
    for (const int type : {ZQ_TYPE_U8, ZQ_TYPE_RGB}) {
        for (const Picture& picture : pictures) {
            std::mt19937 random(3);
            const Size size = &picture == pictures ? Size{64, 21} : Size{61, 43};
            const auto image = painted(type, size, [&](int i, int y) {
                return picture.byte(i, y, static_cast<std::uint32_t>(random()));
            });
            for (int quality = 1; quality <= 100; quality += zqtest::kThorough ? 1 : 9) {
                const auto expected = blank(type, size);
                decode_by_libjpeg(stream_of_libjpeg(*image, quality), *expected);
                zqtest::on_every_simd_target([&] {
                    SCOPED_TRACE(testing::Message()
                                 << picture.name << ", type " << type << ", quality " << quality);
                    const auto actual = blank(type, size);
                    JpegRoundTrip(*image).decode(quality, *actual);
                    expect_same_colours(*actual, *expected);
                    const int qualities[] = {101 - quality, quality};
                    ASSERT_EQ(squared_errors(*image, qualities)[1],
                              squared_error(*image, *expected));
                });
            }
        }
    }
}

// Rounding by the products of floats, with or without their sum rounded once more.
TEST(QualityJpegTest, CoefficientsAreRoundedToTheNearestMultiple) {
    for (unsigned step = 1; step <= 255; ++step) {
        std::array<unsigned, kBlockValues> all;
        all.fill(step);
        const BlockSteps steps(all);
        const float factor = steps.reciprocals()[0], bias = steps.biases()[0];
        for (int c = 0; c <= 32768; ++c) {
            const int nearest = (c + static_cast<int>(4 * step)) / static_cast<int>(8 * step);
            const auto value = static_cast<float>(c);
            const float product = value * factor;
            ASSERT_EQ(static_cast<int>(product + bias), nearest) << c << " by " << step;
            ASSERT_EQ(static_cast<int>(std::fma(value, factor, bias)), nearest)
                << c << " by " << step;
        }
    }
}

}  // namespace
}  // namespace zq
