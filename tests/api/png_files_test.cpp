// PNG: every layout that files have and images need, against plain loops over libpng.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <algorithm>
#include <functional>
#include <random>

#include "refhost/refhost.h"
#include "support/bare_png.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::BarePng;
using zqtest::chunk_bytes;
using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::png_chunk;
using zqtest::store_bytes;

constexpr ZqError kBadHeader = -1074396000;
constexpr ZqError kUnreadable = -1074395989;

class PngFilesTest : public testing::Test {
  protected:
    ZqError write(Picture& picture, const ZqWriteOptions* options = nullptr,
                  ZqArrayU32Handle* table = nullptr) {
        return ZqWriteFileByName(path_.c_str(), picture.handle(), options, "PNG", table);
    }
    ZqError read(Picture& picture, int32_t* format = nullptr, ZqArrayU32Handle* table = nullptr) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, format, table);
    }
    int32_t sample_offset(Picture& picture) {
        int32_t offset = 1;
        EXPECT_EQ(ZqGetSampleOffset(picture.handle(), &offset), 0);
        return offset;
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.png");
};

using Samples = std::vector<uint32_t>;

// Packs samples of a row as PNG does: the first in the highest bits, 16 bits big-endian.
std::vector<uint8_t> packed(const uint32_t* samples, size_t count, int depth) {
    std::vector<uint8_t> row((count * static_cast<size_t>(depth) + 7) / 8);
    for (size_t i = 0; i < count; ++i) {
        if (depth == 16) {
            row[2 * i] = static_cast<uint8_t>(samples[i] >> 8);
            row[2 * i + 1] = static_cast<uint8_t>(samples[i]);
            continue;
        }
        const size_t bit = i * static_cast<size_t>(depth);
        const size_t shift = 8 - static_cast<size_t>(depth) - bit % 8;
        row[bit / 8] = static_cast<uint8_t>(row[bit / 8] | samples[i] << shift);
    }
    return row;
}

BarePng bare(int colour_type, int depth, uint32_t width, uint32_t height, const Samples& samples) {
    BarePng png;
    png.width = width;
    png.height = height;
    png.depth = depth;
    png.colour_type = colour_type;
    const size_t line = samples.size() / height;
    for (size_t y = 0; y < height; ++y) png.rows.push_back(packed(&samples[y * line], line, depth));
    return png;
}

template <class T>
void append(std::string& bytes, std::initializer_list<uint32_t> values) {
    for (const uint32_t value : values) {
        const T narrow = static_cast<T>(value);
        bytes.append(reinterpret_cast<const char*>(&narrow), sizeof(T));
    }
}

TEST_F(PngFilesTest, ReadsEveryLayout) {
    using Pixel = std::function<void(std::string&, const uint32_t*)>;
    const Pixel grey8 = [](std::string& s, const uint32_t* v) { append<uint8_t>(s, {v[0]}); };
    const Pixel rgb = [](std::string& s, const uint32_t* v) {
        append<uint8_t>(s, {v[2], v[1], v[0], 0});
    };
    const Pixel rgba = [](std::string& s, const uint32_t* v) {
        append<uint8_t>(s, {v[2], v[1], v[0], v[3]});
    };
    const Pixel grey_alpha = [](std::string& s, const uint32_t* v) {
        append<uint8_t>(s, {v[0], v[0], v[0], v[1]});
    };
    const Pixel rgb16 = [](std::string& s, const uint32_t* v) {
        append<uint16_t>(s, {v[2], v[1], v[0], 0});
    };
    const Pixel rgba16 = [](std::string& s, const uint32_t* v) {
        append<uint16_t>(s, {v[2], v[1], v[0], v[3]});
    };
    const Pixel grey_alpha16 = [](std::string& s, const uint32_t* v) {
        append<uint16_t>(s, {v[0], v[0], v[0], v[1]});
    };
    const auto scaled = [](uint32_t factor) -> Pixel {
        return [factor](std::string& s, const uint32_t* v) { append<uint8_t>(s, {v[0] * factor}); };
    };
    const Pixel above_signed = [](std::string& s, const uint32_t* v) {
        append<uint16_t>(s, {v[0] + 32768});
    };
    struct Case {
        int colour_type, depth, channels, type, format;
        Pixel pixel;
    };
    const Case cases[] = {
        {PNG_COLOR_TYPE_GRAY, 1, 1, ZQ_TYPE_U8, 0, scaled(255)},
        {PNG_COLOR_TYPE_GRAY, 2, 1, ZQ_TYPE_U8, 1, scaled(85)},
        {PNG_COLOR_TYPE_GRAY, 4, 1, ZQ_TYPE_U8, 2, scaled(17)},
        {PNG_COLOR_TYPE_GRAY, 8, 1, ZQ_TYPE_U8, 3, grey8},
        {PNG_COLOR_TYPE_GRAY, 16, 1, ZQ_TYPE_I16, 6, above_signed},
        {PNG_COLOR_TYPE_PALETTE, 1, 1, ZQ_TYPE_U8, 0, grey8},
        {PNG_COLOR_TYPE_PALETTE, 2, 1, ZQ_TYPE_U8, 1, grey8},
        {PNG_COLOR_TYPE_PALETTE, 4, 1, ZQ_TYPE_U8, 2, grey8},
        {PNG_COLOR_TYPE_PALETTE, 8, 1, ZQ_TYPE_U8, 3, grey8},
        {PNG_COLOR_TYPE_RGB, 8, 3, ZQ_TYPE_RGB, 8, rgb},
        {PNG_COLOR_TYPE_RGB, 16, 3, ZQ_TYPE_RGBU64, 18, rgb16},
        {PNG_COLOR_TYPE_GRAY_ALPHA, 8, 2, ZQ_TYPE_RGB, 12, grey_alpha},
        {PNG_COLOR_TYPE_GRAY_ALPHA, 16, 2, ZQ_TYPE_RGBU64, 19, grey_alpha16},
        {PNG_COLOR_TYPE_RGB_ALPHA, 8, 4, ZQ_TYPE_RGB, 12, rgba},
        {PNG_COLOR_TYPE_RGB_ALPHA, 16, 4, ZQ_TYPE_RGBU64, 19, rgba16},
    };
    std::mt19937 random(7);
    for (const Case& c : cases) {
        for (const uint32_t width : {1U, 2U, 7U, 8U, 9U, 33U}) {
            const bool interlaced = width % 2 == 1;
            SCOPED_TRACE(testing::Message() << c.colour_type << ' ' << c.depth << ' ' << width);
            const uint32_t height = width + 3;
            Samples samples(width * height * static_cast<uint32_t>(c.channels));
            for (uint32_t& s : samples) s = static_cast<uint32_t>(random()) & ((1U << c.depth) - 1);
            if (c.depth == 16) samples[0] = 65535;  // grey then needs the offset
            BarePng file = bare(c.colour_type, c.depth, width, height, samples);
            file.interlaced = interlaced;
            if (c.colour_type == PNG_COLOR_TYPE_PALETTE) {
                file.palette.resize(size_t{1} << c.depth, {1, 2, 3});
            }
            zqtest::write_bare_png(path_, file);

            Picture target(ZQ_TYPE_SGL, 3, 3, 2);
            int32_t format = -1;
            ASSERT_EQ(read(target, &format), 0);
            std::string expected;
            for (size_t i = 0; i < samples.size(); i += static_cast<size_t>(c.channels)) {
                c.pixel(expected, &samples[i]);
            }
            EXPECT_EQ(target.record().type, c.type);
            EXPECT_EQ(target.record().width, static_cast<int32_t>(width));
            EXPECT_EQ(format, c.format);
            EXPECT_EQ(target.pixels(), expected);
        }
    }
}

TEST_F(PngFilesTest, ExpandsATransparentColourAndIgnoresATransparentGrey) {
    BarePng colour = bare(PNG_COLOR_TYPE_RGB, 8, 2, 1, {1, 2, 3, 1, 2, 4});
    colour.has_key = true;
    colour.key.red = 1, colour.key.green = 2, colour.key.blue = 3;
    zqtest::write_bare_png(path_, colour);
    Picture target(ZQ_TYPE_U8);
    ASSERT_EQ(read(target), 0);
    EXPECT_EQ(target.pixels(), std::string("\3\2\1\0\4\2\1\xFF", 8));

    BarePng grey = bare(PNG_COLOR_TYPE_GRAY, 2, 2, 1, {1, 3});
    grey.has_key = true;
    grey.key.gray = 1;
    zqtest::write_bare_png(path_, grey);
    ASSERT_EQ(read(target), 0);
    EXPECT_EQ(target.record().type, ZQ_TYPE_U8);
    EXPECT_EQ(target.pixels(), "\x55\xFF");
}

TEST_F(PngFilesTest, WritesTheLayoutThatTheImageNeeds) {
    struct Case {
        const char* name;
        int32_t type;
        std::string pixels;  // two of them
        int colour_type, depth;
        std::string row;  // as it stands in the file
    };
    const Case cases[] = {
        {"grey", ZQ_TYPE_U8, "\x07\xF0", PNG_COLOR_TYPE_GRAY, 8, "\x07\xF0"},
        {"16-bit grey",
         ZQ_TYPE_I16,
         {"\x34\x12\xFF\x7F", 4},
         PNG_COLOR_TYPE_GRAY,
         16,
         "\x12\x34\x7F\xFF"},
        {"colour", ZQ_TYPE_RGB, {"bgr\0BGR\0", 8}, PNG_COLOR_TYPE_RGB, 8, "rgbRGB"},
        {"colour with alpha",
         ZQ_TYPE_RGB,
         {"bgr\0BGRA", 8},
         PNG_COLOR_TYPE_RGB_ALPHA,
         8,
         {"rgb\0RGBA", 8}},
        {"16-bit colour",
         ZQ_TYPE_RGBU64,
         {"bBgGrR\0\0cChHsS\0\0", 16},
         PNG_COLOR_TYPE_RGB,
         16,
         "RrGgBbSsHhCc"},
        {"16-bit colour with alpha",
         ZQ_TYPE_RGBU64,
         {"bBgGrR\0\0cChHsS\0\1", 16},
         PNG_COLOR_TYPE_RGB_ALPHA,
         16,
         {"RrGgBb\0\0SsHhCc\1\0", 16}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(c.type, 2, 1), target(ZQ_TYPE_SGL);
        picture.set_pixels(c.pixels);
        ASSERT_EQ(write(picture), 0);
        const BarePng file = zqtest::read_bare_png(path_);
        EXPECT_EQ(file.colour_type, c.colour_type);
        EXPECT_EQ(file.depth, c.depth);
        EXPECT_EQ(std::string(file.rows[0].begin(), file.rows[0].end()), c.row);
        EXPECT_EQ(chunk_bytes(load_bytes(path_), "scAl"), "");
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.state(), picture.state());
    }
}

TEST_F(PngFilesTest, KeepsTheValuesOf16BitFiles) {
    struct Case {
        const char* name;
        Samples samples;
        std::string chunk;  // of the file read, complete
        std::vector<int16_t> values;
        int32_t offset;
        std::string written;  // contents of the chunk in the file written again
        bool same_samples;    // in that file
    };
    const std::string down("\x80\0ZQKEMO", 8);
    const Case cases[] = {
        {"signed range", {0, 32767}, "", {0, 32767}, 0, "", true},
        {"whole range", {0, 32768, 65535}, "", {-32768, 0, 32767}, -32768, down, true},
        {"upper half only", {32768, 65535}, "", {0, 32767}, -32768, "", false},
        {"all above 0",
         {200, 500},
         png_chunk("scAl", "\xFF\x9CZQKEMO"),
         {100, 400},
         -100,
         "",
         false},
        {"own offset",
         {0, 65535, 100},
         png_chunk("scAl", "\xFF\x9CZQKEMO"),
         {-100, 32767, 0},
         -100,
         "\xFF\x9CZQKEMO",
         false},
        {"foreign chunk", {0, 5}, png_chunk("scAl", "\xFF\x9CSOMEBO"), {0, 5}, 0, "", true},
        {"other length", {0, 5}, png_chunk("scAl", "\xFF\x9CZQKEMO!"), {0, 5}, 0, "", true},
        {"the first of two",
         {0, 5},
         png_chunk("scAl", "\xFF\xFFZQKEMO") + png_chunk("scAl", "\xFF\x9CZQKEMO"),
         {-1, 4},
         -1,
         "\xFF\xFFZQKEMO",
         true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        BarePng file =
            bare(PNG_COLOR_TYPE_GRAY, 16, static_cast<uint32_t>(c.samples.size()), 1, c.samples);
        zqtest::write_bare_png(path_, file);
        store_bytes(path_, zqtest::with_chunks(load_bytes(path_), "IDAT", c.chunk));
        Picture target(ZQ_TYPE_U8);
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.pixels(),
                  std::string(reinterpret_cast<const char*>(c.values.data()), 2 * c.values.size()));
        EXPECT_EQ(sample_offset(target), c.offset);

        ASSERT_EQ(write(target), 0);
        EXPECT_EQ(chunk_bytes(load_bytes(path_), "scAl"), c.written);
        EXPECT_EQ(zqtest::read_bare_png(path_).rows == file.rows, c.same_samples);
        Picture again(ZQ_TYPE_U8);
        ASSERT_EQ(read(again), 0);
        EXPECT_EQ(again.pixels(), target.pixels());
    }
}

TEST_F(PngFilesTest, WritesNegativeValuesWithAnOffset) {
    Picture picture(ZQ_TYPE_I16, 3, 1), target(ZQ_TYPE_U8);
    for (const int16_t lowest : {int16_t{-100}, int16_t{-32768}, int16_t{-1}, int16_t{0}}) {
        SCOPED_TRACE(lowest);
        picture.at<int16_t>(0, 0) = 5;
        picture.at<int16_t>(1, 0) = lowest;
        picture.at<int16_t>(2, 0) = 32767;
        ASSERT_EQ(write(picture), 0);
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.pixels(), picture.pixels());
        EXPECT_EQ(sample_offset(target), lowest);
    }
}

TEST_F(PngFilesTest, KeepsColourTables) {
    std::vector<uint32_t> entries(256);
    for (uint32_t i = 0; i < 256; ++i) entries[i] = i * 0x010305U & 0xFFFFFF;
    Picture picture(ZQ_TYPE_U8, 16, 16), target(ZQ_TYPE_U8);
    for (const uint32_t alpha : {0x00000000U, 0x80000000U, 0xFF000000U}) {
        entries[3] = (entries[3] & 0xFFFFFF) | alpha;
        refhost::ArrayU32 table(entries), result;
        ASSERT_EQ(write(picture, nullptr, table.out()), 0);
        const BarePng file = zqtest::read_bare_png(path_);
        EXPECT_EQ(file.colour_type, PNG_COLOR_TYPE_PALETTE);
        EXPECT_EQ(file.palette[7].red, 0x07);
        EXPECT_EQ(file.palette[7].green, 0x15);
        EXPECT_EQ(file.palette[7].blue, 0x23);
        EXPECT_EQ(file.palette_alpha.empty(), alpha == 0);
        ASSERT_EQ(read(target, nullptr, result.out()), 0);
        EXPECT_EQ(result.elements(), entries);
        EXPECT_EQ(target.state(), picture.state());
    }
}

TEST_F(PngFilesTest, FillsShortColourTables) {
    BarePng file = bare(PNG_COLOR_TYPE_PALETTE, 2, 4, 1, {0, 1, 2, 2});
    file.palette = {{1, 2, 3}, {4, 5, 6}, {7, 8, 9}};
    file.palette_alpha = {0x20};
    zqtest::write_bare_png(path_, file);
    Picture target(ZQ_TYPE_U8);
    refhost::ArrayU32 table;
    ASSERT_EQ(read(target, nullptr, table.out()), 0);
    std::vector<uint32_t> expected(256, 0);
    expected[0] = 0x20010203, expected[1] = 0xFF040506, expected[2] = 0xFF070809;
    EXPECT_EQ(table.elements(), expected);
    EXPECT_EQ(target.pixels(), std::string("\0\1\2\2", 4));
}

TEST_F(PngFilesTest, CompressesAsTheSettingSays) {
    struct Case {
        int32_t setting;
        char filter;  // of every row
        bool stored;  // pixels stand in the file as they are
    };
    Picture picture(ZQ_TYPE_U8, 64, 64, 0);
    for (const Case c : {Case{100, 0, true}, Case{99, 1, true}, Case{98, 2, true},
                         Case{97, 3, true}, Case{96, 4, true}, Case{95, 0, true},
                         Case{90, 0, false}, Case{0, 0, false}, Case{9, 1, false}}) {
        SCOPED_TRACE(c.setting);
        picture.set_pixels(std::string(64 * 64, 'x'));
        const ZqWriteOptions options = {1, {c.setting, 0, 0}};
        ASSERT_EQ(write(picture, &options), 0);
        const std::string stream = chunk_bytes(load_bytes(path_), "IDAT");
        EXPECT_EQ(stream.size() > 64 * 65, c.stored);
        std::string rows(64 * 65, '\0');
        auto length = static_cast<uLongf>(rows.size());
        ASSERT_EQ(uncompress(reinterpret_cast<Bytef*>(rows.data()), &length,
                             reinterpret_cast<const Bytef*>(stream.data()),
                             static_cast<uLong>(stream.size())),
                  Z_OK);
        for (size_t y = 1; y < 64; ++y) ASSERT_EQ(rows[y * 65], c.filter) << "row " << y;
    }
}

TEST_F(PngFilesTest, RefusesDamagedFiles) {
    BarePng good = bare(PNG_COLOR_TYPE_PALETTE, 8, 2, 2, {0, 1, 1, 0});
    good.palette.resize(2);
    zqtest::write_bare_png(path_, good);
    const std::string file = load_bytes(path_);
    const size_t palette = file.find("PLTE") - 4, pixels = file.find("IDAT") - 4;
    const auto with_byte = [&](size_t at, char byte) {
        std::string changed = file;
        changed[at] = byte;
        return changed;
    };
    struct Case {
        const char* name;
        std::string bytes;
        ZqError code;
    };
    const Case cases[] = {
        {"check sum of the header", with_byte(29, '!'), kBadHeader},
        {"no palette", file.substr(0, palette) + file.substr(pixels), kBadHeader},
        {"check sum of the pixels", with_byte(file.size() - 13, '!'), kUnreadable},
        {"deflate stream", with_byte(pixels + 8, '!'), kUnreadable},
        {"no end", file.substr(0, file.size() - 12), kUnreadable},
        {"no header", file.substr(0, 8) + file.substr(palette), kBadHeader},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        store_bytes(path_, c.bytes);
        Picture target(ZQ_TYPE_U8, 2, 2);
        const std::string before = target.state();
        EXPECT_EQ(read(target), c.code);
        EXPECT_EQ(target.state(), before);
    }
}

// A small file cannot hold these pictures, so it is refused before any memory is taken for them:
// each would need more than an image can have, which would be another error.
TEST_F(PngFilesTest, RefusesPicturesThatTheFileCannotHold) {
    struct Case {
        const char* size;  // width, height: big-endian
        char depth, colour_type;
        ZqError code;
    };
    for (const Case c : {Case{"\x00\x00\xEA\x60\x00\x00\xEA\x60", 8, 2, kUnreadable},
                         Case{"\x00\x00\xEA\x60\x00\x00\xEA\x60", 1, 0, kUnreadable},
                         Case{"\x1F\xFF\x00\x00\x00\x00\x00\x05", 8, 0, kUnreadable},
                         // more bits than can be counted
                         Case{"\x1F\xFF\x00\x00\x7F\xFF\xFF\xFF", 16, 6, -1074396159}}) {
        std::string header(c.size, 8);
        header += {c.depth, c.colour_type, 0, 0, 0};
        store_bytes(path_, "\x89PNG\r\n\x1A\n" + png_chunk("IHDR", header) +
                               png_chunk("IDAT", std::string(4096, '\0')) + png_chunk("IEND", ""));
        Picture target(ZQ_TYPE_U8, 2, 2);
        const std::string before = target.state();
        EXPECT_EQ(read(target), c.code);
        EXPECT_EQ(target.state(), before);
    }
}

}  // namespace
