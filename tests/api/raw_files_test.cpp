// Files without a header, by every format number.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <algorithm>
#include <climits>
#include <cstdint>
#include <string>
#include <vector>

#include "refhost/refhost.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::Picture;
using zqtest::store_bytes;
using namespace std::string_literals;

constexpr ZqError kBadHeader = -1074396000;
constexpr ZqError kBadParameter = -1074395997;
constexpr ZqError kShort = -1074395989;
constexpr ZqError kNoSize = -1074396074;

std::string floats(const std::vector<float>& numbers) {
    return {reinterpret_cast<const char*>(numbers.data()), numbers.size() * sizeof(float)};
}

class RawFilesTest : public testing::Test {
  protected:
    ZqError read(Picture& picture, const std::string& bytes, const ZqRawParameters& raw,
                 int32_t* format = nullptr) {
        store_bytes(path_, bytes);
        return ZqReadFile(picture.handle(), path_.c_str(), &raw, type_.out(), format, nullptr);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("raw");
    refhost::String type_;
};

// Three columns, two rows; behind two bytes that do not belong to them.
TEST_F(RawFilesTest, EveryFormatInBothByteOrders) {
    struct Case {
        int32_t number, type, format;
        size_t swapped;  // bytes of a sample
        std::string file, pixels;
    };
    const std::string six = "abcdef", twelve = "abcdefghijkl";
    std::string alpha_added, planes_joined;
    for (size_t i = 0; i < 18; i += 3) {
        alpha_added += {"abcdefghijklmnopqr"[i + 2], "abcdefghijklmnopqr"[i + 1],
                        "abcdefghijklmnopqr"[i], '\0'};
    }
    for (size_t i = 0; i < 6; ++i) {
        planes_joined += {"abcdefghijklmnopqr"[12 + i], "abcdefghijklmnopqr"[6 + i],
                          "abcdefghijklmnopqr"[i], '\0'};
    }
    std::string wide, words48;
    for (int i = 0; i < 24; ++i) wide += static_cast<char>(i + 1);
    for (int i = 0; i < 36; ++i) words48 += static_cast<char>(i + 1);
    std::string pixels64;
    for (size_t i = 0; i < 36; i += 6) pixels64 += words48.substr(i, 6) + "\0\0"s;
    const Case cases[] = {
        {0, ZQ_TYPE_U8, 0, 1, "\xA0\x40"s, "\xFF\0\xFF\0\xFF\0"s},
        {1, ZQ_TYPE_U8, 1, 1, "\x1B\xE4"s, "\x00\x55\xAA\xFF\xAA\x55"s},
        {2, ZQ_TYPE_U8, 2, 1, "\x0F\x10\x87\x20"s, "\x00\xFF\x11\x88\x77\x22"s},
        {3, ZQ_TYPE_U8, 3, 1, six, six},
        {4, ZQ_TYPE_I16, 5, 2, "\1\0\2\0\3\0\4\0\5\0\6\0"s, "\1\0\2\0\3\0\4\0\5\0\6\0"s},
        {4, ZQ_TYPE_I16, 5, 2, "\0\0\2\0\3\0\4\0\5\0\xFF\xFF"s,
         "\0\x80\2\x80\3\x80\4\x80\5\x80\xFF\x7F"s},
        {5, ZQ_TYPE_I16, 6, 2, twelve, twelve},
        {6, ZQ_TYPE_RGB, 7, 2, "\x1F\0\xE0\x07\0\xF8\xFF\xFF\0\0\x10\0"s,
         "\xFF\0\0\0\0\xFF\0\0\0\0\xFF\0\xFF\xFF\xFF\0\0\0\0\0\x84\0\0\0"s},
        {7, ZQ_TYPE_RGB, 8, 1, "abcdefghijklmnopqr", alpha_added},
        {8, ZQ_TYPE_RGB, 8, 1, "abcdefghijklmnopqr", planes_joined},
        {9, ZQ_TYPE_SGL, 10, 4, "\1\0\0\0\2\0\0\0\0\0\0\x80\3\0\0\0\4\0\0\0\5\0\0\0"s,
         floats({1, 2, 2147483648.0F, 3, 4, 5})},
        {10, ZQ_TYPE_SGL, 11, 4, "\1\0\0\0\2\0\0\0\0\0\0\x80\3\0\0\0\4\0\0\0\xFF\xFF\xFF\xFF"s,
         floats({1, 2, -2147483648.0F, 3, 4, -1})},
        {11, ZQ_TYPE_RGB, 12, 1, wide, wide},
        {12, ZQ_TYPE_SGL, 13, 4, wide, wide},
        {13, ZQ_TYPE_RGBU64, 14, 2, words48, pixels64},
        {14, ZQ_TYPE_COMPLEX, 15, 4, wide + wide, wide + wide},
        {15, ZQ_TYPE_HSL, 17, 1, wide, wide},
    };
    for (const Case& c : cases) {
        for (const int32_t big_endian : {0, 1}) {
            SCOPED_TRACE(testing::Message() << "number " << c.number << ", order " << big_endian);
            std::string bytes = c.file;
            for (size_t i = 0; big_endian != 0 && i < bytes.size(); i += c.swapped) {
                std::reverse(bytes.begin() + static_cast<ptrdiff_t>(i),
                             bytes.begin() + static_cast<ptrdiff_t>(i + c.swapped));
            }
            Picture picture(ZQ_TYPE_U8, 3, 2);
            int32_t format = -1;
            ASSERT_EQ(read(picture, "xx" + bytes, {1, c.number, 2, 0, {0, 0}, big_endian}, &format),
                      0);
            EXPECT_EQ(picture.record().type, c.type);
            EXPECT_EQ(picture.pixels(), c.pixels);
            EXPECT_EQ(format, c.format);
            EXPECT_EQ(type_.text(), "RAW     ");
        }
    }
}

TEST_F(RawFilesTest, LinesWithGapsAndPlanesWithTails) {
    Picture picture(ZQ_TYPE_U8, 2, 2);
    ASSERT_EQ(read(picture, "ab--cd", {1, 3, 0, 2, {4, 0}, 0}), 0);
    EXPECT_EQ(picture.pixels(), "abcd");
    ASSERT_EQ(read(picture, "ab--cd", {1, 3, 0, 2, {4, 1}, 0}), 0);
    EXPECT_EQ(picture.pixels(), "cdab");
    ASSERT_EQ(read(picture, "abcd-efgh-ijkl-?", {1, 8, 0, 0, {}, 0}), 0);
    EXPECT_EQ(picture.pixels().substr(0, 3), "iea");
}

TEST_F(RawFilesTest, RefusalsLeaveThePicture) {
    struct Case {
        const char* what;
        ZqRawParameters raw;
        ZqError code;
    };
    const Case cases[] = {
        {"number 16", {1, 16, 0, 0, {}, 0}, kBadHeader},
        {"number -1", {1, -1, 0, 0, {}, 0}, kBadHeader},
        {"largest number", {1, INT32_MAX, 0, 0, {}, 0}, kBadHeader},
        {"a byte short", {1, 3, 1, 0, {}, 0}, kShort},
        {"an offset behind the file", {1, 3, INT32_MAX, 0, {}, 0}, kShort},
        {"a negative offset", {1, 3, -1, 0, {}, 0}, kShort},
        {"lines in each other", {1, 3, 0, 2, {1, 0}, 0}, kBadParameter},
        {"lines too far apart", {1, 3, 0, 2, {INT32_MAX, 0}, 0}, kShort},
    };
    Picture picture(ZQ_TYPE_U8, 2, 2);
    const std::string before = picture.state();
    for (const Case& c : cases) {
        EXPECT_EQ(read(picture, "abcd", c.raw), c.code) << c.what;
        EXPECT_EQ(picture.state(), before) << c.what;
    }
    Picture empty(ZQ_TYPE_U8);
    EXPECT_EQ(read(empty, "abcd", {1, 3, 0, 0, {}, 0}), kNoSize);
}

}  // namespace
