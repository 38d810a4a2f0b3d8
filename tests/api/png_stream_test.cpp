// PNG's pixels as a stream: every layout, width and setting through libpng, and chunks of pixels
// that are split, cut short, damaged, too many or too few.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <random>

#include "support/bare_png.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::Picture;
using zqtest::png_chunk;
using zqtest::store_bytes;

constexpr ZqError kUnreadable = -1074395989;

class PngStreamTest : public testing::Test {
  protected:
    ZqError read(Picture& picture) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, nullptr, nullptr);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.png");
    std::mt19937 random_{8};
};

// Samples of the image's rows as a file has them.
std::vector<std::vector<uint8_t>> rows_of(Picture& picture, int32_t type, size_t width,
                                          bool alpha) {
    const std::string pixels = picture.pixels();
    const size_t bytes = type == ZQ_TYPE_U8    ? 1
                         : type == ZQ_TYPE_I16 ? 2
                         : type == ZQ_TYPE_RGB ? 4
                                               : 8;
    const size_t sample = type == ZQ_TYPE_I16 || type == ZQ_TYPE_RGBU64 ? 2 : 1;
    const size_t channels = bytes / sample, kept = channels == 4 && !alpha ? 3 : channels;
    std::vector<std::vector<uint8_t>> rows;
    for (size_t at = 0; at < pixels.size(); at += bytes) {
        if (at % (bytes * width) == 0) rows.emplace_back();
        for (size_t channel = 0; channel < kept; ++channel) {
            const size_t source = channels == 4 && channel < 3 ? 2 - channel : channel;
            for (size_t i = sample; i-- > 0;) {
                rows.back().push_back(static_cast<uint8_t>(pixels[at + source * sample + i]));
            }
        }
    }
    return rows;
}

TEST_F(PngStreamTest, LibpngReadsEveryTypeWidthAndSetting) {
    struct Case {
        int32_t type;
        bool alpha;
    };
    for (const Case c :
         {Case{ZQ_TYPE_U8, false}, Case{ZQ_TYPE_I16, false}, Case{ZQ_TYPE_RGB, false},
          Case{ZQ_TYPE_RGB, true}, Case{ZQ_TYPE_RGBU64, false}, Case{ZQ_TYPE_RGBU64, true}}) {
        for (int32_t width = 1; width <= 67; width += width < 18 ? 1 : 7) {
            const int32_t setting = (width * 3 + c.type) % 101;
            SCOPED_TRACE(testing::Message() << c.type << ' ' << width << ' ' << setting);
            // Tall enough to be no tiny picture, which libpng would write.
            const int32_t height = 66000 / width;
            Picture picture(c.type, width, height), target(ZQ_TYPE_SGL);
            std::string pixels = picture.pixels();
            const size_t bytes = pixels.size() / static_cast<size_t>(width * height);
            for (size_t i = 0; i < pixels.size(); ++i) {
                const bool is_fourth = bytes >= 4 && i % bytes / (bytes / 4) == 3;
                const bool is_sign = c.type == ZQ_TYPE_I16 && i % 2 == 1;
                const auto noise = static_cast<uint32_t>(random_()) & (i % 128 < 64 ? 255U : 1U);
                pixels[i] = static_cast<char>(is_fourth && !c.alpha ? 0
                                              : is_sign             ? noise & 127
                                                                    : noise);
            }
            if (c.alpha) pixels.back() = 1;
            picture.set_pixels(pixels);
            const ZqWriteOptions options = {1, {setting, 0, 0}};
            ASSERT_EQ(ZqWriteFileByName(path_.c_str(), picture.handle(), &options, "PNG", nullptr),
                      0);
            EXPECT_EQ(zqtest::read_bare_png(path_).rows,
                      rows_of(picture, c.type, static_cast<size_t>(width), c.alpha));
            ASSERT_EQ(read(target), 0);
            EXPECT_EQ(target.pixels(), pixels);
        }
    }
}

std::string zlib_stream(const std::string& rows) {
    auto length = compressBound(static_cast<uLong>(rows.size()));
    std::string stream(length, '\0');
    compress(reinterpret_cast<Bytef*>(stream.data()), &length,
             reinterpret_cast<const Bytef*>(rows.data()), static_cast<uLong>(rows.size()));
    stream.resize(length);
    return stream;
}

// A grey file of 3 x 2 around chunks of pixels.
std::string file_around(const std::string& chunks) {
    return "\x89PNG\r\n\x1A\n" +
           png_chunk("IHDR", std::string("\0\0\0\3\0\0\0\2\x08\0\0\0\0", 13)) + chunks +
           png_chunk("IEND", "");
}

std::string split(const std::string& stream) {
    std::string chunks = png_chunk("IDAT", "");
    for (const char byte : stream) chunks += png_chunk("IDAT", {byte}) + png_chunk("IDAT", "");
    return chunks;
}

TEST_F(PngStreamTest, PixelsMayBeSplitAndAreRefusedWhenDamaged) {
    const std::string rows("\0abc\0def", 8), good = zlib_stream(rows);
    std::string other_sum = good, other_crc = png_chunk("IDAT", good);
    other_sum.back() = static_cast<char>(other_sum.back() ^ 1);
    other_crc.back() = static_cast<char>(other_crc.back() ^ 1);
    struct Case {
        const char* name;
        std::string chunks;
        bool is_read;
    };
    const Case cases[] = {
        {"one chunk", png_chunk("IDAT", good), true},
        {"a chunk a byte, and empty ones", split(good), true},
        {"text behind", png_chunk("IDAT", good) + png_chunk("tEXt", std::string("a\0b", 3)), true},
        {"bytes behind the stream", png_chunk("IDAT", good + "more"), true},
        {"chunks behind the stream", png_chunk("IDAT", good) + png_chunk("IDAT", "more"), true},
        {"a row too many", png_chunk("IDAT", zlib_stream(rows + rows)), true},
        {"a row too few", png_chunk("IDAT", zlib_stream(rows.substr(0, 4))), false},
        {"a byte too few", png_chunk("IDAT", zlib_stream(rows.substr(0, 7))), false},
        {"no stream", png_chunk("IDAT", ""), false},
        {"filter 5", png_chunk("IDAT", zlib_stream(std::string("\0abc\5def", 8))), false},
        {"check sum of the stream", png_chunk("IDAT", other_sum), false},
        {"check sum of the chunk", other_crc, false},
        {"no check sum of the stream", png_chunk("IDAT", good.substr(0, good.size() - 4)), false},
        {"a chunk in between",
         png_chunk("IDAT", good.substr(0, 9)) + png_chunk("tIME", "") +
             png_chunk("IDAT", good.substr(9)),
         false},
        {"an unknown chunk behind", png_chunk("IDAT", good) + png_chunk("ABCD", ""), true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        store_bytes(path_, file_around(c.chunks));
        Picture target(ZQ_TYPE_U8, 5, 5);
        const std::string before = target.state();
        EXPECT_EQ(read(target), c.is_read ? 0 : kUnreadable);
        EXPECT_EQ(c.is_read ? target.pixels() : target.state(), c.is_read ? "abcdef" : before);
    }
}

TEST_F(PngStreamTest, RefusesAFileCutAnywhere) {
    const std::string file = file_around(split(zlib_stream(std::string("\0abc\1def", 8))));
    for (size_t length = 8; length < file.size(); ++length) {
        store_bytes(path_, file.substr(0, length));
        Picture target(ZQ_TYPE_U8, 2, 2);
        const std::string before = target.state();
        EXPECT_NE(read(target), 0) << length;
        EXPECT_EQ(target.state(), before);
    }
}

}  // namespace
