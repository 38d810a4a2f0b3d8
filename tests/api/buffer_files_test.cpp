// Plain pixel buffers to and from files.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <climits>
#include <cstdint>

#include "refhost/refhost.h"
#include "support/bare_png.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::BarePng;
using zqtest::Picture;

constexpr auto code = [](uint32_t bits) { return static_cast<ZqError>(bits); };
const ZqError kNullPath = code(0xBFF60005), kNullBuffer = code(0xBFF60006),
              kReadFailed = code(0xBFF60007), kKind = code(0xBFF60046),
              kExtension = code(0xBFF60047), kMode = code(0xBFF6004E),
              kWriteFailed = code(0xBFF60050);

class BufferFilesTest : public testing::Test {
  protected:
    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("buffer.png");
};

TEST_F(BufferFilesTest, SavesEveryKind) {
    struct Case {
        int32_t kind, bits;
        int channels, depth;  // 0: refused
        const char* row;      // three pixels as they stand in the file
    };
    const Case cases[] = {
        {0, 32, 4, 8, "cbadgfehkjil"},
        {0, 24, 0, 0, ""},
        {4, 24, 3, 8, "cbafedihg"},
        {4, 32, 4, 8, "cbadgfehkjil"},
        {4, -1, 4, 8, "cbadgfehkjil"},
        {13, 24, 3, 8, "cbafedihg"},
        {13, 32, 0, 0, ""},
        {17, 8, 1, 8, "abc"},
        {17, 1, 4, 16, "fedcbahgnmlkjiponvutsrqpo"},
        {17, 9, 1, 16, "badcfe"},
        {17, 16, 1, 16, "badcfe"},
        {17, 17, 4, 8, "cbadgfehkjil"},
        {17, 24, 3, 8, "cbafedihg"},
        {17, 32, 4, 8, "cbadgfehkjil"},
        {17, 33, 4, 16, ""},
        {17, INT_MAX, 4, 16, ""},
        {17, 0, 0, 0, ""},
        {17, -8, 0, 0, ""},
        {1, 8, 0, 0, ""},
        {16, 8, 0, 0, ""},
        {18, 8, 0, 0, ""},
        {-1, 8, 0, 0, ""},
    };
    constexpr char kBuffer[] = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ";
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << "kind " << c.kind << ", bits " << c.bits);
        std::filesystem::remove(path_);
        const ZqError expected = c.channels != 0 ? 0 : kKind;
        ASSERT_EQ(Gen_SaveBuffer(path_.c_str(), kBuffer, c.bits, c.kind, 3, 2), expected);
        EXPECT_EQ(folder_.count(), expected == 0 ? 1 : 0);
        if (expected != 0) continue;
        const BarePng file = zqtest::read_bare_png(path_);
        constexpr int kColourTypes[] = {0, PNG_COLOR_TYPE_GRAY, 0, PNG_COLOR_TYPE_RGB,
                                        PNG_COLOR_TYPE_RGB_ALPHA};
        EXPECT_EQ(file.colour_type, kColourTypes[c.channels]);
        EXPECT_EQ(file.depth, c.depth);
        EXPECT_EQ(file.width, 3U);
        EXPECT_EQ(file.height, 2U);
        const std::string row(file.rows[0].begin(), file.rows[0].end());
        EXPECT_EQ(row.substr(0, 12), std::string(c.row).substr(0, 12).empty()
                                         ? "fedcbahgnmlk"
                                         : std::string(c.row).substr(0, 12));
    }
}

// All 16 bits of a sample count, without an offset.
TEST_F(BufferFilesTest, SavesUnsignedSamples) {
    const uint16_t samples[] = {0, 65535, 32768};
    ASSERT_EQ(Gen_SaveBuffer(path_.c_str(), samples, 16, 17, 3, 1), 0);
    EXPECT_EQ(zqtest::chunk_bytes(zqtest::load_bytes(path_), "scAl"), "");
    EXPECT_EQ(zqtest::read_bare_png(path_).rows[0], (std::vector<uint8_t>{0, 0, 255, 255, 128, 0}));
}

TEST_F(BufferFilesTest, ChecksItsArgumentsInOrder) {
    const uint32_t pixel = 0;
    struct Case {
        const char* name;
        const char* path;
        const void* buffer;
        int32_t kind, width, height;
        ZqError code;
    };
    const Case cases[] = {
        {"path before buffer", nullptr, nullptr, 99, 0, 0, kNullPath},
        {"buffer before extension", "none", nullptr, 99, 0, 0, kNullBuffer},
        {"dot before kind", "none", &pixel, 99, 0, 0, kExtension},
        {"kind before extension", "x.gif", &pixel, 99, 1, 1, kKind},
        {"extension", "x.gif", &pixel, 0, 1, 1, kExtension},
        {"no extension behind the dot", "x.", &pixel, 0, 1, 1, kExtension},
        {"dot in the folder only", "a.png/x", &pixel, 0, 1, 1, kExtension},
        {"the last dot counts", "x.png.txt", &pixel, 0, 1, 1, kExtension},
        {"width", "x.png", &pixel, 0, 0, 1, kWriteFailed},
        {"height", "x.png", &pixel, 0, 1, -1, kWriteFailed},
        {"folder", "no such folder/x.png", &pixel, 0, 1, 1, kWriteFailed},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(Gen_SaveBuffer(c.path, c.buffer, 32, c.kind, c.width, c.height), c.code);
    }
    for (const char* name : {"x.pNg", "x.tif", "x.Tiff"})
        EXPECT_EQ(Gen_SaveBuffer(folder_.path(name).c_str(), &pixel, 32, 0, 1, 1), 0);
}

// What a file gives in the three types of a loaded buffer.
TEST_F(BufferFilesTest, LoadsIntoTheTypeOfTheMode) {
    Picture grey(ZQ_TYPE_U8, 2, 1), deep(ZQ_TYPE_I16, 2, 1), colour(ZQ_TYPE_RGB, 2, 1),
        wide(ZQ_TYPE_RGBU64, 2, 1);
    grey.set_pixels("\x01\xFE");
    deep.set_pixels({"\xFB\xFF\x2C\x01", 4});  // -5, 300
    colour.set_pixels({"\1\2\3\4\xFF\xFF\xFF\0", 8});
    wide.set_pixels({"\1\0\2\0\3\0\4\0\xFF\xFF\xFF\xFF\xFF\xFF\0\0", 16});
    refhost::ArrayU32 table(std::vector<uint32_t>(256, 0x11223344));
    struct Case {
        const char* name;
        Picture* picture;
        const char* file_type;
        bool with_table;
        int32_t mode;
        int32_t type;
        std::string pixels;
    };
    const Case cases[] = {
        {"grey", &grey, "PNG", false, 0, ZQ_TYPE_U8, "\x01\xFE"},
        {"grey to 16", &grey, "PNG", false, 0x08, ZQ_TYPE_I16, {"\x01\0\xFE\0", 4}},
        {"grey to RGB", &grey, "AIPD", false, 4, ZQ_TYPE_RGB, {"\1\1\1\0\xFE\xFE\xFE\0", 8}},
        {"indices", &grey, "PNG", true, 0, ZQ_TYPE_U8, "\x01\xFE"},
        {"colours of indices", &grey, "PNG", true, 4, ZQ_TYPE_RGB,
         "\x44\x33\x22\x11\x44\x33\x22\x11"},
        {"16 bits", &deep, "PNG", false, 0x70, ZQ_TYPE_I16, deep.pixels()},
        {"16 to 8", &deep, "AIPD", false, 0, ZQ_TYPE_U8, {"\0\xFF", 2}},
        {"RGB", &colour, "PNG", false, 4, ZQ_TYPE_RGB, colour.pixels()},
        {"RGB to grey", &colour, "PNG", false, 0, ZQ_TYPE_U8, "\2\xFF"},
        {"RGB to 16, other bits of the mode set",
         &colour,
         "PNG",
         false,
         0x0D,
         ZQ_TYPE_I16,
         {"\2\0\xFF\0", 4}},
        {"wide to 16", &wide, "PNG", false, 0x40, ZQ_TYPE_I16, {"\2\0\xFF\x7F", 4}},
        {"wide to RGB", &wide, "AIPD", false, 4, ZQ_TYPE_RGB, {"\1\2\3\4\xFF\xFF\xFF\0", 8}},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        ASSERT_EQ(ZqWriteFileByName(path_.c_str(), c.picture->handle(), nullptr, c.file_type,
                                    c.with_table ? table.out() : nullptr),
                  0);
        void* pixels = nullptr;
        int32_t width = 0, height = 0, line = 0, type = -1;
        ASSERT_EQ(Gen_LoadBuffer(path_.c_str(), c.mode, &pixels, &width, &height, &line, &type), 0);
        EXPECT_EQ(width, 2);
        EXPECT_EQ(height, 1);
        EXPECT_GE(line, 2);
        EXPECT_EQ(type, c.type);
        EXPECT_EQ(std::string(static_cast<char*>(pixels), c.pixels.size()), c.pixels);
        EXPECT_EQ(Gen_FreeLoadedBuffer(pixels), 0);
        EXPECT_EQ(Gen_FreeLoadedBuffer(pixels), 0) << "a second time is ignored";
    }
}

TEST_F(BufferFilesTest, RefusesLoadsAndLeavesTheOutputs) {
    Picture floats(ZQ_TYPE_SGL, 2, 1);
    ASSERT_EQ(ZqWriteFileByCode(path_.c_str(), floats.handle(), nullptr, 1, nullptr), 0);
    int local = 0;
    void* pixels = &local;
    int32_t width = 77;
    struct Case {
        std::string path;
        int32_t mode;
        ZqError code;
    };
    for (const Case& c : {Case{folder_.path("none"), 0, kReadFailed}, Case{"", 4, kReadFailed},
                          Case{path_, 1, kMode}, Case{path_, 7, kMode}, Case{path_, 0x80, kMode}}) {
        EXPECT_EQ(
            Gen_LoadBuffer(c.path.c_str(), c.mode, &pixels, &width, nullptr, nullptr, nullptr),
            c.code);
    }
    EXPECT_EQ(Gen_LoadBuffer(nullptr, 0, &pixels, nullptr, nullptr, nullptr, nullptr), kNullPath);
    EXPECT_EQ(Gen_LoadBuffer(path_.c_str(), 0, nullptr, nullptr, nullptr, nullptr, nullptr),
              kNullBuffer);
    EXPECT_EQ(pixels, &local);
    EXPECT_EQ(width, 77);
    EXPECT_EQ(Gen_FreeLoadedBuffer(pixels), 0) << "not one of its own";
    EXPECT_EQ(Gen_FreeLoadedBuffer(nullptr), 0);
}

}  // namespace
