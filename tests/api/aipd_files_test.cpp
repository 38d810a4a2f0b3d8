// The native format, byte by byte.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::store_bytes;

constexpr size_t kHeader = 512;

class AipdFilesTest : public testing::Test {
  protected:
    ZqError write(Picture& picture) {
        return ZqWriteFileByName(path_.c_str(), picture.handle(), nullptr, "AIPD", nullptr);
    }
    ZqError read(Picture& picture, int32_t* format = nullptr) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, format, nullptr);
    }
    // A file of its own making: the given fields, everything else 0, and the pixels.
    void store(uint8_t version, uint8_t kind, uint8_t width, uint8_t height,
               const std::string& pixels, const std::string& significant_bits = "") {
        std::string bytes(kHeader, '\0');
        bytes.replace(0, 4, "AIPD");
        bytes[5] = static_cast<char>(version);
        bytes[7] = static_cast<char>(kind);
        bytes[17] = static_cast<char>(width);
        bytes[19] = static_cast<char>(height);
        bytes.replace(48, significant_bits.size(), significant_bits);
        store_bytes(path_, bytes + pixels);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture");
};

TEST_F(AipdFilesTest, WritesEveryTypeFieldByField) {
    struct Case {
        int32_t type;
        uint8_t version, kind, bits, sample_class, depth;
        int32_t format;  // told by a read
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 1, 1, 8, 1, 0, 3},        {ZQ_TYPE_I16, 1, 4, 16, 1, 12, 6},
        {ZQ_TYPE_SGL, 1, 6, 32, 1, 0, 13},     {ZQ_TYPE_COMPLEX, 1, 5, 64, 2, 0, 15},
        {ZQ_TYPE_RGB, 1, 2, 32, 3, 0, 12},     {ZQ_TYPE_HSL, 2, 7, 32, 3, 0, 17},
        {ZQ_TYPE_RGBU64, 3, 8, 64, 3, 16, 19},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.type);
        Picture picture(c.type, 259, 2);
        ASSERT_EQ(ZqSetBitDepth(picture.handle(), c.depth), 0);
        ASSERT_EQ(write(picture), 0);

        std::string expected(kHeader, '\0');
        expected.replace(0, 4, "AIPD");
        expected[5] = static_cast<char>(c.version);
        expected[7] = static_cast<char>(c.kind);
        expected[9] = static_cast<char>(c.bits);
        expected[11] = static_cast<char>(c.sample_class);
        expected[13] = 2;
        expected[16] = 1, expected[17] = 3;  // 259, big-endian
        expected[19] = 2;
        expected[48] = static_cast<char>(c.depth);  // little-endian
        EXPECT_EQ(load_bytes(path_), expected + picture.pixels());

        Picture target(ZQ_TYPE_U8, 1, 1, 7);
        int32_t format = -1, depth = -1;
        ASSERT_EQ(read(target, &format), 0);
        EXPECT_EQ(format, c.format);
        EXPECT_EQ(target.record().type, c.type);
        EXPECT_EQ(target.record().border, 7);
        EXPECT_EQ(target.pixels(), picture.pixels());
        ASSERT_EQ(ZqGetBitDepth(target.handle(), &depth), 0);
        EXPECT_EQ(depth, c.depth);
    }
}

// Long rows go to the file one by one, short ones in blocks, rows without padding at once.
TEST_F(AipdFilesTest, KeepsRowsOfEveryLength) {
    struct Case {
        int32_t width, height, border;
    };
    for (const Case c : {Case{1, 1, 0}, Case{31, 2500, 0}, Case{32, 300, 0}, Case{33, 3000, 1},
                         Case{65535, 5, 0}, Case{40000, 12, 3}}) {
        SCOPED_TRACE(testing::Message() << c.width << 'x' << c.height);
        Picture picture(ZQ_TYPE_RGBU64, c.width, c.height, c.border);
        Picture same_shape(ZQ_TYPE_RGBU64, c.width, c.height, c.border), other(ZQ_TYPE_U8);
        same_shape.fill(5);
        ASSERT_EQ(write(picture), 0);
        ASSERT_EQ(read(same_shape), 0);
        EXPECT_TRUE(same_shape.state() == picture.state());
        ASSERT_EQ(read(other), 0);
        EXPECT_TRUE(other.pixels() == picture.pixels());
    }
}

TEST_F(AipdFilesTest, KeepsAnImageWithoutPixels) {
    Picture picture(ZQ_TYPE_HSL), target(ZQ_TYPE_U8, 4, 4);
    ASSERT_EQ(write(picture), 0);
    EXPECT_EQ(load_bytes(path_).size(), kHeader);
    ASSERT_EQ(read(target), 0);
    EXPECT_EQ(target.state(), picture.state());
}

TEST_F(AipdFilesTest, LosesTheUpperBitsOfLargeSizes) {
    Picture picture(ZQ_TYPE_U8, 65537, 2, 0), target(ZQ_TYPE_U8);
    ASSERT_EQ(write(picture), 0);
    const std::string bytes = load_bytes(path_);
    EXPECT_EQ(bytes.size(), kHeader + 2 * 65537);
    EXPECT_EQ(bytes.substr(16, 4), std::string("\0\1\0\2", 4));
    ASSERT_EQ(read(target), 0);
    EXPECT_EQ(target.record().width, 1);
    EXPECT_EQ(target.pixels(), bytes.substr(kHeader, 2));
}

TEST_F(AipdFilesTest, ChecksVersionAndKind) {
    struct Case {
        uint8_t version, kind;
        bool accepted;
    };
    const Case cases[] = {{0, 1, false}, {4, 1, false}, {1, 0, false}, {1, 9, false},
                          {1, 7, false}, {2, 7, true},  {3, 7, true},  {2, 8, false},
                          {3, 8, true},  {1, 3, true},  {3, 1, true}};
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << int{c.version} << ' ' << int{c.kind});
        Picture target(ZQ_TYPE_SGL, 2, 2);
        const std::string before = target.state();
        store(c.version, c.kind, 2, 1, std::string(16, 'p'));
        EXPECT_EQ(read(target), c.accepted ? 0 : -1074396000);
        EXPECT_EQ(target.state() == before, !c.accepted);
    }
}

TEST_F(AipdFilesTest, TakesABitDepthOnlyWhereThereCanBeOne) {
    struct Case {
        uint8_t version, kind;
        std::string field;
        int32_t depth;
    };
    const Case cases[] = {
        {1, 4, {"\x08\0\0\0", 4}, 8}, {1, 4, {"\x10\0\0\0", 4}, 16},  {3, 8, {"\x0C\0\0\0", 4}, 12},
        {1, 4, {"\x07\0\0\0", 4}, 0}, {1, 4, {"\x11\0\0\0", 4}, 0},   {1, 4, {"\0\0\0\x0C", 4}, 0},
        {1, 1, {"\x0C\0\0\0", 4}, 0}, {1, 4, {"\x0C\0\0\x80", 4}, 0},
    };
    for (const Case& c : cases) {
        Picture target(ZQ_TYPE_I16, 1, 1);
        ASSERT_EQ(ZqSetBitDepth(target.handle(), 9), 0);
        store(c.version, c.kind, 1, 1, std::string(8, 'p'), c.field);
        ASSERT_EQ(read(target), 0);
        int32_t depth = -1;
        ASSERT_EQ(ZqGetBitDepth(target.handle(), &depth), 0);
        EXPECT_EQ(depth, c.depth) << int{c.kind} << ' ' << int{static_cast<uint8_t>(c.field[0])};
    }
}

TEST_F(AipdFilesTest, ReadsColourOf48Bits) {
    store(1, 3, 2, 1, "bBgGrRcChHsS");
    Picture target(ZQ_TYPE_U8);
    int32_t format = -1;
    ASSERT_EQ(read(target, &format), 0);
    EXPECT_EQ(format, 14);
    EXPECT_EQ(target.record().type, ZQ_TYPE_RGBU64);
    EXPECT_EQ(target.pixels(), std::string("bBgGrR\0\0cChHsS\0\0", 16));
}

}  // namespace
