// BMP: files put together byte by byte, and written files looked at byte by byte.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <array>
#include <random>

#include "refhost/refhost.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::store_bytes;

constexpr ZqError kBadHeader = -1074396000, kFileIo = -1074395993, kUnsupported = -1074395991,
                  kUnreadable = -1074395989, kBadType = -1074396077;

std::string le(uint32_t value, int bytes = 4) {
    std::string text;
    for (int i = 0; i < bytes; ++i) text += static_cast<char>(value >> (8 * i));
    return text;
}

uint32_t word(const std::string& file, size_t offset, int bytes = 4) {
    uint32_t value = 0;
    for (int i = bytes; i-- > 0;) {
        value = value << 8 | static_cast<uint8_t>(file[offset + static_cast<size_t>(i)]);
    }
    return value;
}

// Fields in the order of the file.
struct Bmp {
    uint32_t header = 40;
    int32_t width = 1, height = 1;
    uint32_t bits = 8, compression = 0, data_bytes = 0;
    int32_t x_resolution = 0, y_resolution = 0;
    uint32_t colours = 0;
    std::vector<uint32_t> masks{};  // red, green, blue, alpha
    std::string palette{}, data{};

    std::string bytes() const {
        std::string all = le(header);
        if (header == 12) {
            all += le(static_cast<uint32_t>(width), 2) + le(static_cast<uint32_t>(height), 2);
            all += le(1, 2) + le(bits, 2);
        } else {
            all += le(static_cast<uint32_t>(width)) + le(static_cast<uint32_t>(height));
            all += le(1, 2) + le(bits, 2) + le(compression) + le(data_bytes);
            all +=
                le(static_cast<uint32_t>(x_resolution)) + le(static_cast<uint32_t>(y_resolution));
            all += le(colours) + le(0);
            for (const uint32_t mask : masks) all += le(mask);
            if (all.size() < header) all.resize(header);
        }
        all += palette;
        const auto offset = static_cast<uint32_t>(14 + all.size());
        all += data;
        return "BM" + le(static_cast<uint32_t>(14 + all.size())) + le(0) + le(offset) + all;
    }
};

class BmpFilesTest : public testing::Test {
  protected:
    ZqError read(Picture& picture, int32_t* format = nullptr, ZqArrayU32Handle* table = nullptr) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, format, table);
    }
    ZqError read(const std::string& bytes, Picture& picture) {
        store_bytes(path_, bytes);
        return read(picture);
    }
    ZqError write(Picture& picture, ZqArrayU32Handle* table = nullptr) {
        return ZqWriteFileByCode(path_.c_str(), picture.handle(), nullptr, 0, table);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.bmp");
};

TEST_F(BmpFilesTest, ReadsIndicesOfEveryDepthHeaderAndDirection) {
    std::mt19937 random(5);
    for (const uint32_t bits : {1U, 2U, 4U, 8U}) {
        for (const int32_t width : {1, 2, 5, 8, 9, 33}) {
            for (const uint32_t header : {12U, 40U, 108U}) {
                const bool top_down = header != 12 && width % 2 == 1;
                SCOPED_TRACE(testing::Message() << bits << ' ' << width << ' ' << header);
                constexpr int32_t kHeight = 5;
                Bmp file = {.header = header, .width = width, .height = kHeight, .bits = bits};
                if (top_down) file.height = -kHeight;
                const uint32_t entries = (1U << bits) - (width == 9 ? 1 : 0);  // one less than full
                if (width == 9 && header == 40) file.colours = entries;
                for (uint32_t i = 0; i < entries; ++i) {
                    file.palette += le(0x99102030 + i, header == 12 ? 3 : 4);
                }
                std::string expected;
                for (int32_t y = 0; y < kHeight; ++y) {
                    std::string line((static_cast<size_t>(width) * bits + 31) / 32 * 4, '\0');
                    std::string row;
                    for (size_t x = 0; x < static_cast<size_t>(width); ++x) {
                        const auto index = static_cast<uint32_t>(random()) & ((1U << bits) - 1);
                        row += static_cast<char>(index);
                        char& byte = line[x * bits / 8];
                        byte = static_cast<char>(byte | index << (8 - bits - x * bits % 8));
                    }
                    file.data += line;
                    expected.insert(top_down ? expected.size() : 0, row);
                }
                store_bytes(path_, file.bytes());
                Picture picture(ZQ_TYPE_RGB, 2, 2);
                refhost::ArrayU32 table(std::vector<uint32_t>{});
                int32_t format = -1;
                ASSERT_EQ(read(picture, &format, table.out()), 0);
                EXPECT_EQ(picture.record().type, ZQ_TYPE_U8);
                EXPECT_TRUE(picture.pixels() == expected);
                EXPECT_EQ(1 << format, static_cast<int>(bits));
                ASSERT_EQ(table.elements().size(), 256U);
                EXPECT_EQ(table.elements()[entries - 1], 0x102030 + entries - 1);
                EXPECT_TRUE(entries == 256 || table.elements()[entries] == 0);
            }
        }
    }
}

// Two lines of one pixel, the bottom one first.
TEST_F(BmpFilesTest, ReadsColoursByTheirMasks) {
    struct Case {
        const char* name;
        uint32_t header, bits, compression;
        std::vector<uint32_t> masks;
        uint32_t pixel, expected;  // 0xAARRGGBB
    };
    const Case cases[] = {
        {"24 bits", 40, 24, 0, {}, 0x112233, 0x00112233},
        {"24 bits, old header", 12, 24, 0, {}, 0x112233, 0x00112233},
        {"32 bits, fourth byte unused", 40, 32, 0, {}, 0x99112233, 0x00112233},
        {"32 bits, masks not asked for", 108, 32, 0, {1, 2, 4, 8}, 0x99112233, 0x00112233},
        {"16 bits are 5 5 5", 40, 16, 0, {}, 0x8000 | 31 << 10 | 16 << 5 | 1, 0x00FF8408},
        {"5 6 5", 40, 16, 3, {0xF800, 0x07E0, 0x001F}, 31 << 11 | 32 << 5 | 16, 0x00FF8284},
        {"4 4 4 4", 108, 16, 3, {0xF00, 0xF0, 0xF, 0xF000}, 0xA123, 0xAA112233},
        {"reversed", 40, 32, 3, {0xFF, 0xFF00, 0xFF0000}, 0x99112233, 0x00332211},
        {"plain with alpha",
         108,
         32,
         3,
         {0xFF0000, 0xFF00, 0xFF, 0xFF000000},
         0x99112233,
         0x99112233},
        {"four masks behind",
         40,
         32,
         6,
         {0xFF00, 0xFF0000, 0xFF000000, 0xFF},
         0x33221199,
         0x99112233},
        {"10 bits",
         40,
         32,
         3,
         {0x3FF00000, 0xFFC00, 0x3FF},
         0x3FF00000 | 512 << 10 | 7,
         0x00FF8001},
        {"wide and narrow", 40, 32, 3, {0xFFFF0000, 0x0008, 0x0003}, 0xABCD000A, 0x00ABFFAA},
        {"no green", 40, 32, 3, {0xFF0000, 0, 0xFF}, 0x112233, 0x00110033},
        {"no masks", 40, 32, 3, {0, 0, 0}, 0x99112233, 0x00112233},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Bmp file = {.header = c.header, .height = 2, .bits = c.bits, .compression = c.compression};
        file.masks = c.masks;
        file.data = (le(c.pixel, static_cast<int>(c.bits / 8)) + "...").substr(0, 4) + le(0);
        Picture picture(ZQ_TYPE_U8);
        int32_t format = 0;
        store_bytes(path_, file.bytes());
        ASSERT_EQ(read(picture, &format), 0);
        ASSERT_EQ(picture.record().type, ZQ_TYPE_RGB);
        EXPECT_EQ(picture.at<uint32_t>(0, 1), c.expected);
        EXPECT_EQ(picture.at<uint32_t>(0, 0), 0U);
        EXPECT_EQ(format, c.bits == 32 ? 12 : 8);
    }
}

// Rows of many widths, as they go through vectors and bands.
TEST_F(BmpFilesTest, RoundTripsColoursAndGreysOfEveryWidth) {
    for (const int32_t type : {ZQ_TYPE_U8, ZQ_TYPE_RGB}) {
        for (const int32_t width : {1, 2, 3, 4, 15, 16, 17, 64, 1001, 50000}) {
            SCOPED_TRACE(testing::Message() << type << ' ' << width);
            Picture picture(type, width, 70), target(ZQ_TYPE_SGL), same(type, width, 70);
            std::string pixels = picture.pixels();
            if (type == ZQ_TYPE_RGB) {
                for (size_t i = 3; i < pixels.size(); i += 4) pixels[i] = 0;
            }
            ASSERT_EQ(write(picture), 0);
            for (Picture* read_into : {&target, &same}) {
                refhost::ArrayU32 table(std::vector<uint32_t>(1));
                ASSERT_EQ(read(*read_into, nullptr, table.out()), 0);
                EXPECT_TRUE(read_into->pixels() == pixels);
                EXPECT_TRUE(table.elements().empty()) << "greys need no table";
            }
        }
    }
}

TEST_F(BmpFilesTest, ReadsGreyRampsAsGreys) {
    Bmp file = {.width = 2, .bits = 1, .palette = le(0) + le(0xFFFFFF), .data = "\x40..."};
    Picture picture(ZQ_TYPE_U8);
    ASSERT_EQ(read(file.bytes(), picture), 0);
    EXPECT_EQ(picture.pixels(), std::string("\0\xFF", 2));
    file.palette = le(0xFFFFFF) + le(0);
    ASSERT_EQ(read(file.bytes(), picture), 0);
    EXPECT_EQ(picture.pixels(), std::string("\0\1", 2));
}

TEST_F(BmpFilesTest, DecodesRuns) {
    using namespace std::string_literals;
    struct Case {
        const char* name;
        uint32_t bits;  // and 0 in the height: top line first
        int32_t width, height;
        std::string data, expected;
        ZqError code = 0;
    };
    const Case cases[] = {
        {"runs and lines", 8, 3, 2, "\3a\0\0\1b\2c\0\1"s, "bccaaa"},
        {"top line first", 8, 3, -2, "\3a\0\0\1b\2c\0\1"s, "aaabcc"},
        {"literals, odd and even", 8, 4, 2, "\0\3xyz.\1a\0\0\0\4abcd\0\1"s, "abcdxyza"},
        {"early ends", 8, 3, 3, "\1a\0\0\2b\0\1"s, "\0\0\0bb\0a\0\0"s},
        {"delta", 8, 4, 3, "\1a\0\2\1\1\1b\0\2\0\1\1c\0\1"s, "\0\0\0c\0\0b\0a\0\0\0"s},
        {"beyond the right edge", 8, 2, 2, "\377a\0\0\0\3xyz.\0\1"s, "xyaa"},
        {"beyond the top", 8, 2, 1, "\1a\0\2\0\377\1b\0\1"s, "a\0"s},
        {"delta beyond the edge", 8, 2, 2, "\0\2\5\0\1x\0\0\2b\0\1"s, "bb\0\0"s},
        {"no end mark", 8, 2, 2, "\2a\0\0\2b"s, "bbaa"},
        {"end of line at the end", 8, 2, 1, "\2a\0\0\0\1"s, "aa"},
        {"nibbles", 4, 5, 1, "\5\x12\0\1"s, "\1\2\1\2\1"},
        {"literal nibbles, padded", 4, 5, 2, "\0\5\x12\x34\x50.\0\0\0\3\x67\x80\2\x9A\0\1"s,
         "\6\7\x8\x9\xA\1\2\3\4\5"},
        {"run before its value", 8, 2, 1, "\2"s, "", kUnreadable},
        {"cut literal", 8, 4, 1, "\0\3xyz"s, "", kUnreadable},
        {"cut delta", 8, 4, 1, "\0\2\1"s, "", kUnreadable},
        {"cut between lines", 8, 2, 2, "\2a\0\0"s, "", kUnreadable},
        {"nothing", 8, 2, 2, ""s, "", kUnreadable},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Bmp file = {.width = c.width, .height = c.height, .bits = c.bits, .data = c.data};
        file.compression = c.bits == 8 ? 1 : 2;
        for (uint32_t i = 0; i < 1U << c.bits; ++i) file.palette += le(i + 7);
        Picture picture(ZQ_TYPE_U8);
        EXPECT_EQ(read(file.bytes(), picture), c.code);
        EXPECT_EQ(picture.pixels(), c.expected);
    }
}

TEST_F(BmpFilesTest, PixelsFollowThePaletteWhenTheOffsetForgetsIt) {
    const Bmp good = {
        .width = 3, .height = 2, .palette = std::string(1024, '\1'), .data = "abc.def."};
    for (const uint32_t offset : {0U, 54U}) {
        Picture picture(ZQ_TYPE_U8);
        ASSERT_EQ(read(good.bytes().replace(10, 4, le(offset)), picture), 0);
        EXPECT_EQ(picture.pixels(), "defabc") << offset;
    }
    const Bmp none = {.width = 3, .height = 2, .data = "abc.def."};
    Picture picture(ZQ_TYPE_U8);
    ASSERT_EQ(read(none.bytes(), picture), 0);
    EXPECT_EQ(picture.pixels(), "defabc");
}

TEST_F(BmpFilesTest, RefusesWrongFieldsAndKeepsTheImage) {
    Bmp good = {.width = 3, .height = 2, .palette = std::string(1024, '\1'), .data = "abc.def."};
    const std::string file = good.bytes();
    struct Case {
        const char* name;
        size_t offset;
        uint32_t value;
        ZqError code;
    };
    const Case cases[] = {
        {"as it is", 6, 0, 0},
        {"magic", 0, 0x4D43, kUnsupported},
        {"size less header is the file's", 2, 1086 + 40, kUnsupported},
        {"size less header is one less", 2, 1086 + 39, 0},
        {"size not filled in", 2, 0, 0},
        {"largest size", 2, 0xFFFFFFFF, kUnsupported},
        {"offset not filled in", 10, 0, 0},
        {"offset without the palette", 10, 54, 0},
        {"pixels inside the header", 10, 53, kBadHeader},
        {"pixels inside the palette", 10, 56, 0},
        {"pixels cut by one", 10, 1079, kUnreadable},
        {"pixels far outside", 10, 0xFFFFFFFF, kUnreadable},
        {"header of 52", 14, 52, kUnsupported},
        {"header of 56", 14, 56, kUnsupported},
        {"header of 124", 14, 124, kUnsupported},
        {"header of 16", 14, 16, kUnsupported},
        {"largest header", 14, 0xFFFFFFFF, kUnsupported},
        {"no width", 18, 0, kBadHeader},
        {"negative width", 18, 0xFFFFFFFD, kBadHeader},
        {"width and height", 18, 0x7FFFFFFF, kUnreadable},
        {"no height", 22, 0, kBadHeader},
        {"lowest height", 22, 0x80000000, kBadHeader},
        {"one row too many", 22, 3, kUnreadable},
        {"planes", 26, 0x80063, 0},
        {"3 bits", 28, 3, kBadHeader},
        {"runs of 4 bits for 8", 30, 2, kBadHeader},
        {"masks for 8 bits", 30, 3, kBadHeader},
        {"a JPEG inside", 30, 4, kBadHeader},
        {"too many colours", 46, 0xFFFFFFFF, 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_RGB, 2, 2);
        const std::string before = picture.state();
        EXPECT_EQ(read(std::string(file).replace(c.offset, 4, le(c.value)), picture), c.code);
        EXPECT_EQ(picture.state() == before, c.code != 0);
    }
    for (const uint32_t mask : {0x5U, 0x10000U}) {
        Bmp masks = {.bits = 16, .compression = 3, .masks = {mask, 0xE0, 0}, .data = "ab.."};
        Picture picture(ZQ_TYPE_U8);
        EXPECT_EQ(read(masks.bytes(), picture), kBadHeader) << mask;
    }
    // Runs can skip any number of pixels, so that only a rule can stop such a picture.
    const Bmp bomb = {
        .width = 60000, .height = 60000, .compression = 1, .data = std::string("\0\1", 2)};
    Picture picture(ZQ_TYPE_U8);
    EXPECT_EQ(read(bomb.bytes(), picture), kUnreadable);
}

TEST_F(BmpFilesTest, RefusesEveryTruncation) {
    using namespace std::string_literals;
    Bmp runs = {.width = 3, .height = 2, .bits = 4, .compression = 2, .data_bytes = 10};
    runs.palette = le(1) + le(2);
    runs.data = "\3\x01\0\0\0\3\x01\x10\0\1"s;
    Bmp masks = {.width = 2, .height = 2, .bits = 16, .compression = 3, .masks = {7, 8, 16}};
    masks.data = "abcdefgh";
    for (const Bmp& file : {runs, masks}) {
        Picture picture(ZQ_TYPE_SGL, 3, 2);
        size_t length = file.bytes().size();
        ASSERT_EQ(read(file.bytes(), picture), 0);
        const std::string before = picture.state();
        while (length-- > 0) {
            std::filesystem::resize_file(path_, length);
            const ZqError code = read(picture);
            // A file that is short by more than its info header's size is nobody's.
            ASSERT_EQ(code == kUnsupported ? kUnreadable : code,
                      length < 18 ? kFileIo : kUnreadable)
                << length;
            ASSERT_EQ(picture.state(), before);
        }
    }
}

TEST_F(BmpFilesTest, WritesWhatReadersExpect) {
    Picture grey(ZQ_TYPE_U8, 3, 2), colour(ZQ_TYPE_RGB, 1, 2), other(ZQ_TYPE_I16, 1, 1),
        none(ZQ_TYPE_U8);
    grey.set_pixels("abcdef");
    colour.set_pixels("bgraBGRA");
    std::vector<uint32_t> entries(256, 0x99010203);
    entries[255] = 0xFF112233;
    refhost::ArrayU32 table(entries);
    for (const bool with_table : {false, true}) {
        ASSERT_EQ(write(grey, with_table ? table.out() : nullptr), 0);
        const std::string file = load_bytes(path_);
        EXPECT_EQ(file.substr(0, 54), "BM" + le(1086) + le(0) + le(1078) + le(40) + le(3) + le(2) +
                                          le(1, 2) + le(8, 2) + le(0) + le(8) + le(0) + le(0) +
                                          le(256) + le(0));
        EXPECT_EQ(word(file, 54 + 4), with_table ? 0x010203U : 0x010101U);
        EXPECT_EQ(word(file, 54 + 4 * 255), with_table ? 0x112233U : 0xFFFFFFU);
        EXPECT_EQ(file.substr(1078), std::string("def\0abc\0", 8));
    }
    ASSERT_EQ(write(colour), 0);
    const std::string file = load_bytes(path_);
    EXPECT_EQ(file.substr(0, 54), "BM" + le(62) + le(0) + le(54) + le(40) + le(1) + le(2) +
                                      le(1, 2) + le(24, 2) + le(0) + le(8) + le(0) + le(0) + le(0) +
                                      le(0));
    EXPECT_EQ(file.substr(54), std::string("BGR\0bgr\0", 8));
    ASSERT_EQ(Gen_SaveBuffer(path_.c_str(), "bgrBGR", 24, 4, 1, 2), 0);
    EXPECT_EQ(load_bytes(path_), file);
    EXPECT_EQ(write(other), kBadType);
    EXPECT_EQ(write(none), -1074396154);
    EXPECT_EQ(load_bytes(path_), file);
}

TEST_F(BmpFilesTest, KeepsTheResolution) {
    struct Case {
        const char* name;
        int32_t unit;
        float x_step, y_step;
        uint32_t x_written, y_written;  // 0: nothing
    };
    const Case cases[] = {
        {"metres", 5, 0.0005F, 0.001F, 2000, 1000},
        {"centimetres", 4, 0.01F, 0.02F, 10000, 5000},
        {"inches", 8, 1.0F / 72, 1.0F / 300, 2835, 11811},
        {"no unit", 0, 0.001F, 0.001F, 0, 0},
        {"another unit", 3, 0.001F, 0.001F, 0, 0},
        {"a step of nothing", 5, 0.001F, 0, 0, 0},
        {"a negative step", 5, -0.001F, 0.001F, 0, 0},
        {"no number", 5, 0.001F, std::numeric_limits<float>::quiet_NaN(), 0, 0},
        {"larger than a metre", 5, 3.0F, 0.001F, 0, 0},
        {"too small to be told", 5, 1e-10F, 0.001F, 0, 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_U8, 2, 2), target(ZQ_TYPE_U8);
        picture.handle()->unit = c.unit;
        picture.handle()->xStep = c.x_step;
        picture.handle()->yStep = c.y_step;
        ASSERT_EQ(write(picture), 0);
        EXPECT_EQ(word(load_bytes(path_), 38), c.x_written);
        EXPECT_EQ(word(load_bytes(path_), 42), c.y_written);
        target.handle()->unit = 77;
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.record().unit, c.x_written != 0 ? 5 : 77);
        if (c.x_written == 0) continue;
        EXPECT_FLOAT_EQ(target.record().xStep, 1.0F / static_cast<float>(c.x_written));
        EXPECT_FLOAT_EQ(target.record().yStep, 1.0F / static_cast<float>(c.y_written));
    }
}

}  // namespace
