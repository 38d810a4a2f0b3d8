// Images as bytes: what stands in a record, and what comes back from one.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <span>
#include <string>
#include <vector>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"
#include "tests/support/picture.h"
#include "tests/support/record.h"

extern "C" int32_t DSSetHandleSize(ZqHandle handle, int32_t size);

namespace {

using zqtest::Cluster;
using zqtest::flattened;
using zqtest::HostImage;
using zqtest::Picture;
using zqtest::Rebuilt;
using zqtest::Record;
using zqtest::unflatten;

constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kBadType = -1074396080;
constexpr ZqError kBadRecord = -1074395960;
constexpr ZqError kBadQuality = -1074395956;
constexpr ZqError kBadCodec = -1074395704;
constexpr ZqError kBadKind = -1074395703;
constexpr ZqError kSystem = -1074396160;
constexpr ZqError kNoMemory = -1074396159;
constexpr ZqError kNullPointer = -1074395269;
constexpr int32_t kPlain = 0, kQuality = 1, kPacked = 2;
constexpr int32_t kOld = 0x00070000, kText = 0x00070100, kNew = 0x00080000;

// Bytes from pixel (-border, -border) to the end of the last border row's line.
std::span<uint8_t> buffer_of(const ZqImageRecord& record) {
    const auto pixel = static_cast<ptrdiff_t>(Picture::pixel_bytes(record.type));
    uint8_t* first = record.firstPixel - (ptrdiff_t{record.rowPixels} + 1) * record.border * pixel;
    const auto rows = static_cast<size_t>(record.height) + 2 * static_cast<size_t>(record.border);
    return {first, rows * static_cast<size_t>(record.rowPixels * pixel)};
}
std::string whole_buffer(const ZqImageRecord& record) {
    const std::span<uint8_t> buffer = buffer_of(record);
    return {buffer.begin(), buffer.end()};
}
std::string whole_buffer(const Picture& picture) {
    return whole_buffer(picture.record());
}

TEST(FlattenTest, EveryWordStandsInItsPlace) {
    HostImage image("lamp", ZQ_TYPE_I16, 5, 3, 2);
    ASSERT_EQ(ZqSetBitDepth(image.handle(), 12), 0);
    image.handle()->reserved[0] = 71;
    image.handle()->reserved[1] = 72;
    for (const int32_t version : {kText, kNew}) {
        for (const int32_t kind : {0, 1}) {
            const std::string bytes = flattened(image.handle(), kPlain, kind, version, 1);
            const Record record(bytes);
            std::vector<uint32_t> expected = {
                static_cast<uint32_t>(version),
                static_cast<uint32_t>(kind),
                0,
                1,
                record.words[zqtest::kPropertySize],
                12,
                image.handle()->hostCookie,
                4,
                record.words[zqtest::kSource],
                ZQ_TYPE_I16,
                5,
                3,
                2,
                71,
                72,
                static_cast<uint32_t>(image.handle()->rowPixels),
                kPlain,
                static_cast<uint32_t>(image.handle()->rowPixels) * 2 * 7,
                0};
            if (version == kText) expected[1] = expected[3] = 0;
            EXPECT_EQ(record.words, expected);
            EXPECT_EQ(record.name, "lamp");
            EXPECT_EQ(record.properties.empty(), kind == 0 || version == kText);
            EXPECT_EQ(record.bytes(), bytes) << "a gap, or something behind";
        }
    }
}

TEST(FlattenTest, AppendsExactlyOneRecord) {
    const Picture picture(ZQ_TYPE_RGB, 7, 5, 2);
    refhost::String string;
    ASSERT_EQ(FlattenImageToArray1D(picture.handle(), string.out()), 0);
    const std::string once = string.text();
    EXPECT_EQ(once.substr(60), whole_buffer(picture))
        << "unnamed, no attachment: 60 bytes and pixels";
    ASSERT_EQ(FlattenImageToArray1D(picture.handle(), string.out()), 0);
    EXPECT_EQ(string.text(), once + once);
    ZqImageHandle none = nullptr;
    EXPECT_EQ(UnflattenImageFromArray1D(&none, string.get()), kBadRecord) << "two records";
    refhost::refuse("NumericArrayResize");
    EXPECT_EQ(FlattenImageToArray1D(picture.handle(), string.out()), kNoMemory);
    EXPECT_EQ(string.text(), once + once) << "a string that could not grow";
}

TEST(FlattenTest, BlocksTooSmallForTheirStringAreEmpty) {
    const Picture picture(ZQ_TYPE_U8, 3, 2, 0);
    const std::string record = flattened(picture.handle(), kPlain, 0, kText);
    for (const int32_t size : {0, 3, 4, 6}) {
        refhost::String string("abc");
        ASSERT_EQ(DSSetHandleSize(reinterpret_cast<ZqHandle>(string.get()), size), 0);
        ZqImageHandle none = nullptr;
        EXPECT_EQ(UnflattenImageFromArray1D(&none, string.get()), kBadRecord);
        ASSERT_EQ(FlattenImageToArray1D(picture.handle(), string.out()), 0);
        EXPECT_EQ(string.text(), record) << size << " bytes";
    }
}

// What a codec makes of a pixel of another image, for codecs that are exact.
std::string packed_pixels(const Picture& source) {
    Picture grey(ZQ_TYPE_U8);
    const ZqImageValue from = source.value();
    ZqImageValue to = grey.value();
    EXPECT_EQ(ZqConvertImage(from.image, to.image), 0);
    std::string pixels = grey.pixels();
    for (char& pixel : pixels) pixel = static_cast<char>(pixel == 0 ? 0 : 255);
    return pixels;
}

TEST(FlattenTest, ComesBackInEveryTypeCodecAndShape) {
    struct Shape {
        int32_t width, height, border;
    };
    const Shape shapes[] = {{7, 5, 3}, {1, 1, 0}, {17, 2, 1}, {64, 3, 0}, {0, 0, 3}};
    for (int32_t type = 0; type < 7; ++type) {
        for (const Shape& shape : shapes) {
            for (const int32_t codec : {kPlain, kQuality, kPacked}) {
                SCOPED_TRACE(testing::Message() << "type " << type << ", " << shape.width << " x "
                                                << shape.height << ", codec " << codec);
                const Picture source(type, shape.width, shape.height, shape.border);
                const Rebuilt made(flattened(source.handle(), codec, 1));
                Picture refilled(ZQ_TYPE_SGL, 3, 3, 1);
                ZqImageHandle target = refilled.handle();
                ASSERT_EQ(made.code, 0);
                ASSERT_EQ(unflatten(flattened(source.handle(), codec), &target), 0);
                ASSERT_EQ(target, refilled.handle());
                const bool packed = codec == kPacked && shape.height > 0;
                for (const ZqImageHandle image : {made.handle, target}) {
                    EXPECT_EQ(image->type, packed ? ZQ_TYPE_U8 : type);
                    EXPECT_EQ(image->width, shape.width);
                    EXPECT_EQ(image->height, shape.height);
                    EXPECT_EQ(image->border, shape.border);
                }
                if (packed) {
                    EXPECT_EQ(refilled.pixels(), packed_pixels(source));
                }
                if (codec == kPlain && shape.height > 0) {
                    EXPECT_EQ(whole_buffer(refilled), whole_buffer(source)) << "border and all";
                }
            }
        }
    }
}

TEST(FlattenTest, PacksTheFirstPixelIntoTheLowestBit) {
    Picture picture(ZQ_TYPE_U8, 10, 2, 1);
    picture.set_pixels(
        std::string("\1\0\0\377\0\0\0\200\0\7"
                    "\0\1\0\0\0\0\0\0\0\0",
                    20));
    const Record record(flattened(picture.handle(), kPacked));
    EXPECT_EQ(record.pixels, std::string("\x89\x02\x02\x00", 4));
    for (const uint32_t type : {1U, 4U}) {
        Record other = record;
        other.words[zqtest::kType] = type;
        EXPECT_EQ(Rebuilt(other.bytes()).code, kBadRecord) << "packed pixels have 8 bits";
    }
}

// Between lines of different widths, offsets and lengths are pixel counts taken as bytes.
TEST(FlattenTest, RestridesInBytesForEveryType) {
    for (const uint32_t type : {ZQ_TYPE_U8, ZQ_TYPE_I16, ZQ_TYPE_RGBU64}) {
        Picture image(static_cast<int32_t>(type), 5, 3, 1);
        const size_t pixel = Picture::pixel_bytes(static_cast<int32_t>(type));
        for (const uint32_t line : {7U, 9U, 100U}) {
            Record record =
                zqtest::grey_record(kText, 5, 3, 1, line * static_cast<uint32_t>(pixel));
            record.words[zqtest::kType] = type;
            record.words[zqtest::kLine] = line;
            image.fill(9);
            std::string expected = whole_buffer(image);
            const auto own_line = static_cast<size_t>(image.record().rowPixels);
            if (own_line == line) {
                expected = record.pixels;
            } else {
                for (size_t row = 0; row < 5; ++row) {
                    const size_t count = std::min<size_t>(line, own_line);
                    expected.replace(row * own_line, count, record.pixels, row * line, count);
                }
            }
            ZqImageHandle target = image.handle();
            ASSERT_EQ(unflatten(record.bytes(), &target), 0);
            EXPECT_EQ(whole_buffer(image), expected) << "type " << type << ", line " << line;
        }
    }
}

TEST(FlattenTest, ABlockMustFitItsGeometryAndLeavesTheDestination) {
    struct Case {
        const char* what;
        zqtest::Word word;
        uint32_t value;
        ZqError code;
    };
    const Case cases[] = {
        {"line below the row", zqtest::kLine, 6, kBadRecord},
        {"line that asks for more", zqtest::kLine, 16, kBadRecord},
        {"no line", zqtest::kLine, 0, kBadRecord},
        {"one row more", zqtest::kHeight, 4, kBadRecord},
        {"wider pixels", zqtest::kType, ZQ_TYPE_SGL, kBadRecord},
        {"no such type", zqtest::kType, 7, kBadType},
        {"negative width", zqtest::kWidth, 0xFFFFFFFF, kBadRecord},
        {"negative border", zqtest::kBorder, 0x80000000, kBadRecord},
        {"a gigabyte", zqtest::kHeight, 0x20000000, kBadRecord},
        {"more than memory", zqtest::kWidth, 0x7FFFFFFF, kBadRecord},
        {"no such kind", zqtest::kKind, 3, kBadKind},
        {"a stale reference", zqtest::kReference, 0x7FFFFFF1, kBadRecord},
        {"packed to another size", zqtest::kCodec, kPacked, kBadRecord},
        {"not of the quality codec", zqtest::kCodec, kQuality, kBadRecord},
    };
    for (const Case& c : cases) {
        Picture image(ZQ_TYPE_I16, 6, 4, 2);
        const std::string before = image.state();
        Record record = zqtest::grey_record(kNew, 5, 3, 1, 8);
        record.words[c.word] = c.value;
        ZqImageHandle target = image.handle();
        EXPECT_EQ(unflatten(record.bytes(), &target), c.code) << c.what;
        EXPECT_EQ(image.state(), before) << c.what;
        EXPECT_EQ(Rebuilt(record.bytes()).handle, nullptr) << c.what;
    }
}

// Memory of 64 KiB, which the allocator hands out again.
TEST(FlattenTest, NewImagesShowNothingOfTheMemoryBefore) {
    const Record narrow = [] {
        Record record = zqtest::grey_record(kNew, 60, 60, 30, 120 * 8);
        record.words[zqtest::kType] = ZQ_TYPE_RGBU64;
        record.words[zqtest::kLine] = 127;
        record.pixels.assign(size_t{127} * 8 * 120, '\0');
        return record;
    }();
    Picture black(ZQ_TYPE_U8, 60, 60, 100);
    black.set_pixels(std::string(size_t{60} * 60, '\0'));
    for (const std::string& bytes : {flattened(black.handle(), kPacked), narrow.bytes()}) {
        size_t size = 0;
        {
            const Rebuilt first(bytes);
            ASSERT_EQ(first.code, 0);
            const std::span<uint8_t> buffer = buffer_of(*first.handle);
            std::ranges::fill(buffer, uint8_t{0x55});
            size = buffer.size();
        }
        const Rebuilt second(bytes);
        EXPECT_EQ(whole_buffer(*second.handle), std::string(size, '\0'));
    }
}

// An image that has the shape asks for no memory, however little the block explains.
TEST(FlattenTest, LargeImagesWithoutPixelsFillThoseOfTheirShape) {
    Picture image(ZQ_TYPE_U8, 9000, 9000, 0);
    Record record = zqtest::grey_record(kText, 9000, 9000, 0, 9000);
    record.pixels.clear();
    EXPECT_EQ(Rebuilt(record.bytes()).code, kBadRecord);
    ZqImageHandle target = image.handle();
    EXPECT_EQ(unflatten(record.bytes(), &target), 0);
}

TEST(FlattenTest, PixelsThatNobodyCanDecodeAreLeftOut) {
    Record record = zqtest::grey_record(kNew, 5, 3, 1, 8);
    record.words[zqtest::kCodec] = 77;
    const Rebuilt made(record.bytes());
    ASSERT_EQ(made.code, 0);
    EXPECT_EQ(made.handle->width, 5);
    EXPECT_EQ(made.handle->firstPixel[0], 0) << "what was in the memory before";
    record.pixels.clear();
    EXPECT_EQ(Rebuilt(record.bytes()).code, 0);
    record.words[zqtest::kWidth] = record.words[zqtest::kHeight] = 30000;
    EXPECT_EQ(Rebuilt(record.bytes()).code, kBadRecord) << "nearly a gigabyte from 76 bytes";
}

TEST(FlattenTest, RefusesWrongRequestsInOrder) {
    const Picture picture(ZQ_TYPE_U8, 4, 4);
    struct Case {
        int32_t mode, codec, kind, quality, version;
        ZqError code;
    };
    const Case cases[] = {
        {2, 9, 3, 1001, 1, kBadQuality}, {2, 9, 3, -1, 1, kBadQuality},
        {2, 9, 3, 0, 1, kBadKind},       {2, 9, -1, 0, 1, kBadKind},
        {2, 3, 2, 0, 1, kBadCodec},      {2, -1, 0, 0, 1, kBadCodec},
        {2, 0, 0, 1000, 1, kBadRecord},  {3, 0, 0, 0, 1, kSystem},
        {-1, 0, 0, 0, -1, kSystem},      {1, 9, 3, 1001, kOld, kBadRecord},
        {0, 9, 3, 1001, -1, 0},          {1, 9, 3, 1001, kText, 0},
        {2, 1, 1, 0, kNew, 0},
    };
    for (const Case& c : cases) {
        refhost::String string("ab");
        EXPECT_EQ(FlattenImageToArray1D2(picture.handle(), string.out(), c.mode, c.codec, c.kind,
                                         c.quality, 0, c.version),
                  c.code);
        EXPECT_EQ(string.text() == "ab", c.code != 0);
    }
    EXPECT_EQ(FlattenImageToArray1D(picture.handle(), nullptr), kNullPointer);
    refhost::String string;
    EXPECT_EQ(FlattenImageToArray1D(nullptr, string.out()), kNotAnImage);
    EXPECT_EQ(UnflattenImageFromArray1D(nullptr, string.get()), kNullPointer);
    const ZqImageValue nothing{};
    Cluster error;
    EXPECT_EQ(DF_FlattenImageToString(&nothing, string.out(), error), kNotAnImage);
    EXPECT_EQ(error.source(), "KEMO Flatten Image To String\nNot an image.");
    HostImage image("x");
    for (const ZqStringHandle handle : {ZqStringHandle{}, string.get()}) {
        Cluster bad;
        EXPECT_EQ(DF_UnflattenImageFromString(&image.value, handle, bad), kBadRecord);
        EXPECT_EQ(bad.source(), "KEMO Unflatten Image From String\nInitialization error.");
    }
    Cluster pending(-5);
    EXPECT_EQ(DF_FlattenImageToString(&image.value, string.out(), pending), -5);
    EXPECT_EQ(string.text(), "");
}

TEST(FlattenTest, LinesShorterThanTheirRowsAreRefused) {
    alignas(32) static uint8_t buffer[4096];
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewExternalImage(ZQ_TYPE_U8, 4000, 3, 0, buffer, 4, "", &image), 0);
    refhost::String string;
    EXPECT_EQ(FlattenImageToArray1D(image, string.out()), kBadRecord);
    EXPECT_EQ(FlattenImageToArray1D2(image, string.out(), 2, kPacked, 0, 0, 0, -1), 0);
    ZqDisposeImage(image);
}

TEST(FlattenTest, ImagesOverBuffersThatEndWithTheirLastPixel) {
    alignas(32) uint8_t buffer[3 * 8 - 4];  // 3 lines of 8, the last one of 4 pixels
    for (size_t i = 0; i < sizeof buffer; ++i) buffer[i] = static_cast<uint8_t>(i + 1);
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewExternalImage(ZQ_TYPE_U8, 4, 3, 0, buffer, 8, "", &image), 0);
    const std::string bytes = flattened(image, kPlain);
    const Record record(bytes);
    EXPECT_EQ(record.pixels,
              std::string(reinterpret_cast<char*>(buffer), sizeof buffer) + std::string(4, '\0'));
    std::memset(buffer, 0, sizeof buffer);
    ASSERT_EQ(unflatten(bytes, &image), 0);
    EXPECT_EQ(std::string(reinterpret_cast<char*>(buffer), sizeof buffer),
              record.pixels.substr(0, sizeof buffer));
    ZqDisposeImage(image);
}

}  // namespace
