// TIFF files written: taken apart by hand, and read back.
#include <algorithm>
#include <array>
#include <limits>

#include "refhost/refhost.h"
#include "support/tiff_files.h"

namespace {

using namespace std::string_literals;
using zqtest::bare_tiff;
using zqtest::BareTiff;
using zqtest::load_bytes;
using zqtest::packed;
using zqtest::parse_tiff;
using zqtest::Picture;
using zqtest::store_bytes;
using zqtest::with_field;
using zqtest::with_strip;
using Bytes = std::string;
using Samples = std::vector<uint32_t>;

constexpr ZqError kBadFormat = -1074395986;

using TiffWriteTest = zqtest::TiffFiles;

TEST_F(TiffWriteTest, CutsPicturesIntoStripsOfTheirRows) {
    struct Case {
        int32_t type, width, height;
        bool negative;
        uint32_t strips;
    };
    for (const Case& c :
         {Case{ZQ_TYPE_U8, 301, 700, false, 4}, Case{ZQ_TYPE_U8, 70000, 3, false, 3},
          Case{ZQ_TYPE_I16, 301, 300, true, 3}, Case{ZQ_TYPE_I16, 301, 300, false, 3},
          Case{ZQ_TYPE_U8, 1301, 2003, false, 41}, Case{ZQ_TYPE_I16, 701, 1801, true, 40},
          Case{ZQ_TYPE_U8, 1, 1, false, 1}}) {
        SCOPED_TRACE(testing::Message() << c.type << ' ' << c.width << 'x' << c.height);
        Picture picture(c.type, c.width, c.height);
        Bytes pixels = picture.pixels();
        for (size_t i = 1; c.type == ZQ_TYPE_I16 && !c.negative && i < pixels.size(); i += 2)
            pixels[i] &= 0x7F;
        picture.set_pixels(pixels);
        ASSERT_EQ(write(picture), 0);
        BareTiff file = parse_tiff(load_bytes(path_));
        ASSERT_EQ(file.strips.size(), c.strips);
        Bytes strips;
        for (const Bytes& strip : file.strips) strips += strip;
        EXPECT_EQ(strips, pixels);
        const size_t row = pixels.size() / static_cast<size_t>(c.height);
        EXPECT_EQ(file.strips[0].size(),
                  row * std::min(file.fields[278].values[0], static_cast<uint32_t>(c.height)));
        Picture copy(ZQ_TYPE_SGL);
        ASSERT_EQ(read(copy), 0);
        EXPECT_EQ(copy.record().type, c.type);
        EXPECT_EQ(copy.pixels(), pixels);
    }
}

TEST_F(TiffWriteTest, WritesCalibrationsThatAreLengths) {
    constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
    struct Case {
        int32_t unit;
        float x_step, y_step;
        uint32_t expected;  // 0: no resolution in the file
        float x, y;
    };
    for (const Case& c :
         {Case{8, 0.005F, 0.25F, 2, 200, 4}, Case{4, 0.5F, 4, 3, 2, 0.25F},
          Case{5, 0.001F, 0.01F, 3, 10, 1}, Case{0, 0.5F, 0.5F, 0, 0, 0}, Case{3, 1, 1, 0, 0, 0},
          Case{8, 0, 1, 0, 0, 0}, Case{8, 1, -1, 0, 0, 0}, Case{4, kNan, 1, 0, 0, 0},
          Case{8, 0x1p-32F, 1, 0, 0, 0}, Case{4, 1, 0x1p32F, 0, 0, 0}}) {
        SCOPED_TRACE(testing::Message() << c.unit << ' ' << c.x_step);
        Picture picture(ZQ_TYPE_U8, 1, 1);
        picture.handle()->unit = c.unit;
        picture.handle()->xStep = c.x_step;
        picture.handle()->yStep = c.y_step;
        ASSERT_EQ(write(picture), 0);
        BareTiff file = parse_tiff(load_bytes(path_));
        EXPECT_EQ(file.fields.count(296), c.expected == 0 ? 0U : 1U);
        EXPECT_EQ(file.fields.count(282), file.fields.count(296));
        if (c.expected == 0) continue;
        const Samples x = file.fields[282].values, y = file.fields[283].values;
        EXPECT_EQ(file.fields[296].values, Samples{c.expected});
        EXPECT_EQ(static_cast<double>(x[0]) / x[1], c.x);
        EXPECT_EQ(static_cast<double>(y[0]) / y[1], c.y);
    }
}

TEST_F(TiffWriteTest, WritesTheLayoutOfTheImage) {
    struct Case {
        const char* name;
        int32_t type;
        Bytes pixels;  // two of them
        Samples bits, number;
        uint32_t photometric;
        Bytes strip;
    };
    const Case cases[] = {
        {"grey", ZQ_TYPE_U8, "\x07\xF0", {8}, {}, 1, "\x07\xF0"},
        {"16-bit grey", ZQ_TYPE_I16, "\x34\x12\xFF\x7F", {16}, {1}, 1, "\x34\x12\xFF\x7F"},
        {"negative grey", ZQ_TYPE_I16, "\x34\x12\xFF\xFF", {16}, {2}, 1, "\x34\x12\xFF\xFF"},
        {"colour", ZQ_TYPE_RGB, "bgraBGRA", {8, 8, 8}, {}, 2, "rgbRGB"},
        {"16-bit colour",
         ZQ_TYPE_RGBU64,
         "bBgGrRaAcChHsSxX",
         {16, 16, 16},
         {1, 1, 1},
         2,
         "rRgGbBsShHcC"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(c.type, 2, 1);
        picture.set_pixels(c.pixels);
        ASSERT_EQ(ZqWriteFileByName(path_.c_str(), picture.handle(), nullptr, "TIFF", nullptr), 0);
        BareTiff file = parse_tiff(load_bytes(path_));
        const auto value = [&file](uint16_t tag) { return file.fields[tag].values; };
        const auto text = [&value](uint16_t tag) {
            const Samples characters = value(tag);
            return Bytes(characters.begin(), characters.end());
        };
        EXPECT_EQ(load_bytes(path_).substr(0, 4), "II*\0"s);
        EXPECT_EQ(value(256), Samples{2});
        EXPECT_EQ(value(257), Samples{1});
        EXPECT_EQ(value(258), c.bits);
        EXPECT_EQ(value(339), c.number);
        EXPECT_EQ(value(262), Samples{c.photometric});
        EXPECT_EQ(value(277), Samples{static_cast<uint32_t>(c.bits.size())});
        for (const uint16_t tag : std::array<uint16_t, 4>{259, 266, 274, 284})
            EXPECT_EQ(value(tag), Samples{1}) << tag;
        EXPECT_EQ(text(269), path_ + '\0');
        EXPECT_EQ(text(305), "Zorvane Kemo\0"s);
        EXPECT_EQ(file.strips, std::vector<Bytes>{c.strip});
    }
}

TEST_F(TiffWriteTest, GivesTheSamplesOf16BitFilesBack) {
    struct Case {
        const char* name;
        uint32_t number;
        Samples samples;
        std::vector<int16_t> values;
        int32_t offset;
    };
    for (const Case& c : {Case{"lower half", 1, {0, 32767}, {0, 32767}, 0},
                          Case{"whole range", 1, {0, 32768, 65535}, {-32768, 0, 32767}, -32768},
                          Case{"upper half", 1, {32768, 65535}, {0, 32767}, -32768},
                          Case{"signed", 2, {0x8000, 5}, {-32768, 5}, 0}}) {
        SCOPED_TRACE(c.name);
        const auto width = static_cast<uint32_t>(c.samples.size());
        BareTiff file = bare_tiff(width, 1, 1, {16});
        file.fields[339].values = {c.number};
        file.strips = {packed(file, c.samples, 16)};
        store(file);
        Picture target(ZQ_TYPE_U8), again(ZQ_TYPE_U8);
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.pixels(),
                  Bytes(reinterpret_cast<const char*>(c.values.data()), 2 * width));
        EXPECT_EQ(sample_offset(target), c.offset);
        ASSERT_EQ(write(target), 0);
        BareTiff written = parse_tiff(load_bytes(path_));
        EXPECT_EQ(written.strips, file.strips);
        EXPECT_EQ(written.fields[339].values, Samples{c.number});
        // Values that would come back otherwise from the samples that they were.
        for (uint32_t x = 0; x < width; ++x) target.at<int16_t>(static_cast<int32_t>(x), 0) = -7;
        ASSERT_EQ(write(target), 0);
        ASSERT_EQ(read(again), 0);
        EXPECT_EQ(again.pixels(), target.pixels());
    }
    const uint16_t buffer[] = {0, 65535, 32768};
    ASSERT_EQ(Gen_SaveBuffer(path_.c_str(), buffer, 16, 17, 3, 1), 0);
    EXPECT_EQ(parse_tiff(load_bytes(path_)).strips[0], "\0\0\xFF\xFF\0\x80"s);
    ASSERT_EQ(Gen_SaveBuffer(path_.c_str(), "bgrBGR", 24, 4, 2, 1), 0);
    EXPECT_EQ(parse_tiff(load_bytes(path_)).strips[0], "rgbRGB");
}

TEST_F(TiffWriteTest, KeepsColourTables) {
    Samples entries(256), words;
    for (uint32_t i = 0; i < 256; ++i) entries[i] = i * 0x010305U & 0xFFFFFF;
    for (const uint32_t shift : {16U, 8U, 0U})
        for (const uint32_t entry : entries) words.push_back((entry >> shift & 0xFF) * 257);
    Picture picture(ZQ_TYPE_U8, 16, 16), target(ZQ_TYPE_U8);
    refhost::ArrayU32 table(entries), result, of_bytes;
    ASSERT_EQ(write(picture, 0, table.out()), 0);
    BareTiff file = parse_tiff(load_bytes(path_));
    EXPECT_EQ(file.fields[262].values, Samples{3});
    EXPECT_EQ(file.fields[320].values, words);
    ASSERT_EQ(read(target, nullptr, result.out()), 0);
    EXPECT_EQ(result.elements(), entries);
    EXPECT_EQ(target.state(), picture.state());

    // Two bits, and bytes where words should be.
    store(with_field(with_strip(bare_tiff(4, 1, 3, {2}), 1, "\x1B"), 320,
                     {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 255}));
    ASSERT_EQ(read(target, nullptr, of_bytes.out()), 0);
    Samples expected(256, 0);
    expected[0] = 0x010509, expected[1] = 0x02060A, expected[2] = 0x03070B, expected[3] = 0x0408FF;
    EXPECT_EQ(of_bytes.elements(), expected);
    EXPECT_EQ(target.pixels(), "\0\1\2\3"s);
}

TEST_F(TiffWriteTest, CompressesAsTheOptionSays) {
    struct Case {
        int32_t type, option;
        uint32_t tag;  // 0: refused
        bool has_table = false;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 0, 1},        {ZQ_TYPE_U8, 1, 1},         {ZQ_TYPE_U8, 2, 7},
        {ZQ_TYPE_I16, 4, 32773},   {ZQ_TYPE_RGBU64, 5, 32946}, {ZQ_TYPE_U8, 8, 8, true},
        {ZQ_TYPE_RGB, 0x10005, 5}, {ZQ_TYPE_RGB, 2, 7},        {ZQ_TYPE_RGB, 32773, 32773},
        {ZQ_TYPE_U8, 0x10001, 1},  {ZQ_TYPE_U8, 3, 0},         {ZQ_TYPE_U8, 0x10000, 0},
        {ZQ_TYPE_U8, -1, 0},       {ZQ_TYPE_U8, 6, 0},         {ZQ_TYPE_U8, 50000, 0},
        {ZQ_TYPE_U8, 0x10004, 0},  {ZQ_TYPE_I16, 2, 0},        {ZQ_TYPE_RGBU64, 2, 0},
        {ZQ_TYPE_U8, 2, 0, true},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.type << ' ' << c.option);
        store_bytes(path_, "old");
        Picture picture(c.type, 40, 30), target(ZQ_TYPE_U8);
        picture.set_pixels(Bytes(picture.pixels().size(), '\x55'));
        refhost::ArrayU32 table(Samples(256, 5));
        ASSERT_EQ(write(picture, c.option, c.has_table ? table.out() : nullptr),
                  c.tag == 0 ? kBadFormat : 0);
        if (c.tag == 0) {
            EXPECT_EQ(load_bytes(path_), "old");
            continue;
        }
        BareTiff file = parse_tiff(load_bytes(path_));
        EXPECT_EQ(file.fields[259].values, Samples{c.tag});
        EXPECT_EQ(file.strips[0].size() < 1200, c.tag != 1);
        ASSERT_EQ(read(target), 0);
        Bytes expected = picture.pixels();
        const size_t pixel = Picture::pixel_bytes(c.type);
        for (size_t i = 0; pixel >= 4 && i < expected.size(); ++i)
            if (i % pixel >= pixel / 4 * 3) expected[i] = '\0';  // alpha has no place in the file
        EXPECT_EQ(target.pixels(), expected);
    }
    Picture complex(ZQ_TYPE_COMPLEX, 2, 2), real(ZQ_TYPE_SGL, 2, 2), empty(ZQ_TYPE_U8);
    EXPECT_EQ(write(complex), -1074396077);
    EXPECT_EQ(write(real), -1074396077);
    EXPECT_EQ(write(empty), -1074396154);
}

}  // namespace
