// What holds for files of every type: choice of the type, options, colour tables, outputs, and what
// failures leave behind.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <array>
#include <numeric>
#include <vector>

#include "refhost/refhost.h"
#include "support/bare_png.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::store_bytes;

constexpr ZqError kNoMemory = -1074396159;
constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kLent = -1074396065;
constexpr ZqError kBadHeader = -1074396000;
constexpr ZqError kInvalidParameter = -1074395997;
constexpr ZqError kNotFound = -1074395995;
constexpr ZqError kFileIo = -1074395993;
constexpr ZqError kUnsupported = -1074395991;
constexpr ZqError kUnreadable = -1074395989;

class FilesTest : public testing::Test {
  protected:
    ZqError write(Picture& picture, const std::string& path, const char* type,
                  const ZqWriteOptions* options = nullptr) {
        return ZqWriteFileByName(path.c_str(), picture.handle(), options, type, nullptr);
    }
    ZqError read(Picture& picture, const std::string& path) {
        return ZqReadFile(picture.handle(), path.c_str(), nullptr, nullptr, nullptr, nullptr);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture");
};

TEST_F(FilesTest, PicksTheTypeByItsNormalisedName) {
    struct Case {
        const char* name;
        const char* magic;  // null: refused
    };
    const Case cases[] = {
        {"AIPD", "AIPD"},
        {"aipd", "AIPD"},
        {" \t\n\v\f\rPng", "\x89PNG"},
        {"PNG     ", "\x89PNG"},
        {"PNG     x", "\x89PNG"},
        {"PNG x", nullptr},
        {"bmp", "BM"},
        {" jpeg", "\xFF\xD8\xFF"},
        {"PN", nullptr},
        {"PNGS", nullptr},
        {"TIF", nullptr},
        {"JPG", nullptr},
        {"RAW", nullptr},
        {"", nullptr},
        {"   ", nullptr},
        {nullptr, nullptr},
    };
    Picture picture(ZQ_TYPE_U8, 5, 4);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name == nullptr ? "null" : c.name);
        std::filesystem::remove(path_);
        EXPECT_EQ(write(picture, path_, c.name), c.magic != nullptr ? 0 : kUnsupported);
        const std::string magic = c.magic != nullptr ? c.magic : "";
        EXPECT_EQ(load_bytes(path_).substr(0, magic.empty() ? 4 : magic.size()), magic);
    }
}

TEST_F(FilesTest, PicksTheTypeByItsCode) {
    Picture picture(ZQ_TYPE_U8, 5, 4);
    for (int32_t code = -1; code <= 8; ++code) {
        SCOPED_TRACE(code);
        const ZqError expected = (code >= 0 && code <= 4) || code == 7 ? 0 : kUnsupported;
        EXPECT_EQ(ZqWriteFileByCode(path_.c_str(), picture.handle(), nullptr, code, nullptr),
                  expected);
    }
    EXPECT_EQ(load_bytes(path_).substr(4, 4), "jP  ");
    EXPECT_EQ(write(picture, path_, "jpeg2000x"), 0);
    EXPECT_EQ(load_bytes(path_).substr(4, 4), "jP  ");
}

TEST_F(FilesTest, RefusesWhatItCannotOpen) {
    Picture picture(ZQ_TYPE_U8, 5, 4);
    const std::string before = picture.state();
    EXPECT_EQ(write(picture, "", "PNG"), kInvalidParameter);
    EXPECT_EQ(ZqWriteFileByName(nullptr, picture.handle(), nullptr, "PNG", nullptr),
              kInvalidParameter);
    EXPECT_EQ(write(picture, folder_.path("none/file"), "AIPD"), kNotFound);
    EXPECT_EQ(write(picture, folder_.path("none/file"), "PNG"), kNotFound);
    EXPECT_EQ(read(picture, ""), kUnreadable);
    EXPECT_EQ(ZqReadFile(picture.handle(), nullptr, nullptr, nullptr, nullptr, nullptr),
              kUnreadable);
    EXPECT_EQ(read(picture, folder_.path("none")), kNotFound);
    EXPECT_NE(read(picture, folder_.path(".")), 0);
    EXPECT_EQ(ZqWriteFileByName(path_.c_str(), nullptr, nullptr, "PNG", nullptr), kNotAnImage);
    EXPECT_EQ(picture.state(), before);
    EXPECT_EQ(folder_.count(), 0);
}

TEST_F(FilesTest, TellsWhatTheFileIs) {
    Picture picture(ZQ_TYPE_SGL, 5, 4), target(ZQ_TYPE_U8);
    ASSERT_EQ(write(picture, path_, "AIPD"), 0);
    refhost::String type("before, and longer than the name");
    const std::array<uint32_t, 1> one = {7};
    refhost::ArrayU32 table(one);
    int32_t format = -1;
    ASSERT_EQ(ZqReadFile(target.handle(), path_.c_str(), nullptr, type.out(), &format, table.out()),
              0);
    EXPECT_EQ(type.text(), "AIPD    ");
    EXPECT_EQ(format, 13);
    EXPECT_TRUE(table.elements().empty());
    EXPECT_EQ(target.state(), picture.state());

    store_bytes(path_, "this is no picture at all");
    EXPECT_EQ(ZqReadFile(target.handle(), path_.c_str(), nullptr, type.out(), nullptr, nullptr),
              kUnsupported);
    EXPECT_EQ(type.text(), "xxx");
    // A header of 56 bytes is recognised, and not supported.
    store_bytes(
        path_, std::string("BM\x52\0\0\0\0\0\0\0\x42\0\0\0\x38\0\0\0", 18) + std::string(64, '\0'));
    refhost::String kept("before");
    EXPECT_EQ(ZqReadFile(target.handle(), path_.c_str(), nullptr, kept.out(), nullptr, nullptr),
              kUnsupported);
    EXPECT_EQ(kept.text(), "before");
    EXPECT_EQ(target.state(), picture.state());
}

// A host that cannot take an output makes the read fail before the image changes.
TEST_F(FilesTest, KeepsTheImageWhenAnOutputFails) {
    Picture picture(ZQ_TYPE_U8, 5, 4), same_shape(ZQ_TYPE_U8, 5, 4), other_shape(ZQ_TYPE_RGB, 2, 2);
    picture.fill(9);
    for (const char* type : {"BMP", "AIPD", "TIFF", "JPEG", "PNG", "JPEG2000"}) {
        ASSERT_EQ(write(picture, path_, type), 0);
        for (Picture* target : {&same_shape, &other_shape}) {
            const std::string before = target->state();
            refhost::String name;
            refhost::refuse("NumericArrayResize", 1);
            EXPECT_EQ(
                ZqReadFile(target->handle(), path_.c_str(), nullptr, name.out(), nullptr, nullptr),
                kNoMemory);
            EXPECT_EQ(target->state(), before);
        }
    }
}

TEST_F(FilesTest, ReportsToTheHost) {
    Picture picture(ZQ_TYPE_SGL, 5, 4);
    const ZqImageValue value = picture.value();
    refhost::String source;
    ZqErrorCluster error = {0, 0, source.get()};
    EXPECT_EQ(DF_WriteFile2(&value, path_.c_str(), "png", nullptr, nullptr, &error), -1074396077);
    EXPECT_EQ(error.status, 1);
    EXPECT_EQ(refhost::text(error.source), "KEMO WriteFile\nIncompatible image type.");
    EXPECT_EQ(DF_WriteFile2(&value, path_.c_str(), "AIPD", nullptr, nullptr, &error), -1074396077)
        << "an error that is there must be returned and nothing done";
    EXPECT_EQ(folder_.count(), 0);
    const ZqImageValue none = {nullptr, nullptr};
    EXPECT_NE(DF_WriteFile2(&none, path_.c_str(), "AIPD", nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(DF_WriteFile2(&value, path_.c_str(), "AIPD", nullptr, nullptr, nullptr), 0);
    refhost::dispose(error.source);
}

TEST_F(FilesTest, TakesColourTablesOfOneSizeForOneType) {
    struct Case {
        int32_t type;
        size_t entries;
        const char* file_type;
        ZqError code;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 0, "PNG", 0},
        {ZQ_TYPE_U8, 256, "PNG", 0},
        {ZQ_TYPE_U8, 256, "AIPD", 0},
        {ZQ_TYPE_U8, 256, "TIFF", 0},
        {ZQ_TYPE_U8, 255, "PNG", -1074395976},
        {ZQ_TYPE_U8, 257, "AIPD", -1074395976},
        {ZQ_TYPE_RGB, 16, "PNG", -1074395976},
        {ZQ_TYPE_RGB, 256, "PNG", -1074396082},
        {ZQ_TYPE_I16, 256, "AIPD", -1074396082},
        {ZQ_TYPE_I16, 0, "AIPD", 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.type << ' ' << c.entries << ' ' << c.file_type);
        Picture picture(c.type, 4, 3);
        refhost::ArrayU32 table(std::vector<uint32_t>(c.entries, 5));
        std::filesystem::remove(path_);
        EXPECT_EQ(
            ZqWriteFileByName(path_.c_str(), picture.handle(), nullptr, c.file_type, table.out()),
            c.code);
        EXPECT_EQ(folder_.count(), c.code == 0 ? 1 : 0);
    }
}

TEST_F(FilesTest, RefusedWriteKeepsTheOldFile) {
    store_bytes(path_, "old");
    Picture complex(ZQ_TYPE_COMPLEX, 5, 4), empty(ZQ_TYPE_U8), grey(ZQ_TYPE_U8, 5, 4);
    const ZqWriteOptions below = {1, {-1, 0, 0}}, above = {1, {101, 0, 0}},
                         absent = {0, {101, 0, 0}};
    EXPECT_EQ(write(complex, path_, "PNG"), -1074396077);
    EXPECT_EQ(write(empty, path_, "PNG"), -1074396154);
    EXPECT_EQ(write(grey, path_, "PNG", &below), kInvalidParameter);
    EXPECT_EQ(write(grey, path_, "PNG", &above), kInvalidParameter);
    EXPECT_EQ(load_bytes(path_), "old");
    EXPECT_EQ(folder_.count(), 1);
    EXPECT_EQ(write(grey, path_, "PNG", &absent), 0);
    EXPECT_EQ(folder_.count(), 1);
}

TEST_F(FilesTest, ReadingALentImageNeedsItsShape) {
    Picture picture(ZQ_TYPE_U8, 5, 4), target(ZQ_TYPE_U8, 5, 4), other(ZQ_TYPE_U8, 5, 5);
    picture.fill(3);
    for (const char* type : {"BMP", "AIPD", "TIFF", "PNG", "JPEG2000"}) {
        ASSERT_EQ(write(picture, path_, type), 0);
        for (Picture* lent : {&target, &other}) {
            const ZqImageValue value = lent->value();
            const std::string before = lent->state();
            const uint8_t* first = lent->record().firstPixel;
            void* buffer = nullptr;
            ASSERT_EQ(Gen_MarkExternalBuffer(&value, 1, &buffer), 0);
            EXPECT_EQ(read(*lent, path_), lent == &target ? 0 : kLent);
            EXPECT_EQ(lent->state(), lent == &target ? picture.state() : before);
            EXPECT_EQ(lent->record().firstPixel, first);
            ASSERT_EQ(Gen_MarkExternalBuffer(&value, 0, &buffer), 0);
        }
    }
}

TEST_F(FilesTest, RefusesEveryTruncationAndKeepsTheImage) {
    Picture grey(ZQ_TYPE_I16, 5, 4), colour(ZQ_TYPE_RGB, 5, 4), other_shape(ZQ_TYPE_U8, 3, 3);
    grey.at<int16_t>(0, 0) = -5;  // so that the sample offset's chunk is there
    const std::array<ZqError, 4> known = {kBadHeader, kFileIo, kUnsupported, kUnreadable};
    for (Picture* picture : {&grey, &colour}) {
        for (const char* type : {"BMP", "AIPD", "TIFF", "PNG", "JPEG2000"}) {
            if (picture == &grey && type[0] == 'B') continue;  // no 16 bits
            ASSERT_EQ(write(*picture, path_, type), 0);
            picture->fill(77);
            for (auto length = std::filesystem::file_size(path_); length-- > 0;) {
                std::filesystem::resize_file(path_, length);
                for (Picture* target : {picture, &other_shape}) {
                    const std::string before = target->state();
                    const ZqError code = read(*target, path_);
                    ASSERT_NE(std::find(known.begin(), known.end(), code), known.end())
                        << type << " cut to " << length << " gives " << code;
                    ASSERT_EQ(target->state(), before) << type << " cut to " << length;
                }
            }
        }
    }
}

}  // namespace
