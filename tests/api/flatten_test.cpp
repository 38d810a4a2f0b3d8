// Images as bytes: what stands in a record, and what comes back from one.
#include <gtest/gtest.h>
#include <zqvissvc/custom_data.h>
#include <zqvissvc/files.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"
#include "tests/support/picture.h"
#include "tests/support/record.h"

namespace {

using zqtest::Cluster;
using zqtest::HostImage;
using zqtest::Picture;
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
std::string whole_buffer(const Picture& picture) {
    const ZqImageRecord& record = picture.record();
    const auto pixel = static_cast<ptrdiff_t>(Picture::pixel_bytes(record.type));
    const uint8_t* first =
        record.firstPixel - (ptrdiff_t{record.rowPixels} + 1) * record.border * pixel;
    const auto rows = static_cast<size_t>(record.height + 2 * record.border);
    return {reinterpret_cast<const char*>(first),
            rows * static_cast<size_t>(record.rowPixels * pixel)};
}

std::string flattened(ZqImageHandle image, int32_t codec, int32_t kind = 0, int32_t version = kNew,
                      uint8_t keep_name = 0) {
    refhost::String string;
    EXPECT_EQ(FlattenImageToArray1D2(image, string.out(), 2, codec, kind, 900, keep_name, version),
              0);
    return string.text();
}

// An image that a rebuilding made; it goes with the object.
class Rebuilt {
  public:
    explicit Rebuilt(const std::string& bytes) { code = unflatten(bytes, &handle); }
    ~Rebuilt() { ZqDisposeImage(handle); }
    Rebuilt(const Rebuilt&) = delete;
    Rebuilt& operator=(const Rebuilt&) = delete;
    std::string name() const { return handle->name == nullptr ? "" : handle->name; }

    ZqImageHandle handle = nullptr;
    ZqError code;
};

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

TEST(FlattenTest, AReferenceMeansTheVeryImage) {
    ZqImageHandle image = nullptr;
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 4, 4, 0, &image), 0);
    const std::string bytes = flattened(image, kPlain, 2);
    EXPECT_EQ(bytes.size(), 12U);
    ZqImageHandle target = nullptr;
    ASSERT_EQ(unflatten(bytes, &target), 0);
    EXPECT_EQ(target, image);
    HostImage value("given");
    const refhost::String string(bytes);
    const ZqImageHandle given = value.handle();
    ASSERT_EQ(DF_UnflattenImageFromString(&value.value, string.get(), nullptr), 0);
    EXPECT_EQ(value.handle(), image);
    EXPECT_EQ(value.name(), "");
    value.value.image = given;
    std::string invented = bytes;
    invented[8] = static_cast<char>(invented[8] + 5);
    std::string none = bytes;
    none.replace(8, 4, 4, '\0');
    EXPECT_EQ(unflatten(invented, &target), kBadRecord);
    EXPECT_EQ(unflatten(none, &target), kBadRecord);
    EXPECT_EQ(unflatten(bytes + "x", &target), kBadRecord);
    EXPECT_EQ(unflatten(bytes.substr(0, 11), &target), kBadRecord);
    ZqDisposeImage(image);
    target = nullptr;
    EXPECT_EQ(unflatten(bytes, &target), kBadRecord) << "disposed";
    EXPECT_EQ(target, nullptr);
}

TEST(FlattenTest, NamesOfRebuiltImages) {
    HostImage source("lamp");
    struct Case {
        int32_t version;
        uint8_t keep;
        const char* name;
    };
    const Case cases[] = {{kNew, 1, "lamp2"},
                          {kNew, 0, "remote image 1234ABCD"},
                          {kText, 1, "remote image 1234ABCD"}};
    for (const Case& c : cases) {
        Record record(flattened(source.handle(), kPlain, 0, c.version, c.keep));
        record.name = "lamp2";
        record.words[zqtest::kSource] = 0x1234ABCD;
        const Rebuilt first(record.bytes());
        ASSERT_EQ(first.code, 0);
        EXPECT_EQ(first.name(), c.name);
        ZqImageHandle again = nullptr;
        EXPECT_EQ(unflatten(record.bytes(), &again), 0);
        EXPECT_EQ(again, first.handle) << "the image of that name";
    }
    Record oldest = zqtest::grey_record(kOld, 5, 3, 1, 8);
    const Rebuilt made(oldest.bytes());
    ASSERT_EQ(made.code, 0);
    EXPECT_EQ(made.name(), "remote image 1234ABCD");
    EXPECT_EQ(made.handle->firstPixel[0], 9) << "row 1, column 1 of lines of 8";
}

TEST(FlattenTest, PropertiesTravelWithKindOne) {
    HostImage source("", ZQ_TYPE_I16);
    source.handle()->unit = 4;
    source.handle()->xStep = 0.25F;
    source.handle()->yStep = 8.0F;
    ASSERT_EQ(ZqSetBitDepth(source.handle(), 14), 0);
    ASSERT_EQ(DF_WriteCustomData(&source.value, "key", "va\0l", 4, nullptr), 0);
    for (const int32_t kind : {0, 1}) {
        HostImage target("", ZQ_TYPE_U8);
        ASSERT_EQ(DF_WriteCustomData(&target.value, "old", "x", 1, nullptr), 0);
        ZqImageHandle handle = target.handle();
        ASSERT_EQ(unflatten(flattened(source.handle(), kPlain, kind), &handle), 0);
        int32_t bits = 0;
        EXPECT_EQ(ZqGetBitDepth(handle, &bits), 0);
        EXPECT_EQ(bits, 14) << "the image setting of every kind";
        EXPECT_EQ(handle->unit, kind == 0 ? 0 : 4);
        EXPECT_EQ(handle->xStep, kind == 0 ? 1.0F : 0.25F);
        EXPECT_EQ(handle->yStep, kind == 0 ? 1.0F : 8.0F);
        uint32_t size = 0;
        ZqHandle value = nullptr;
        EXPECT_EQ(DF_ReadCustomData(&target.value, "old", &value, &size, nullptr) == 0, kind == 0);
        EXPECT_EQ(DF_ReadCustomData(&target.value, "key", &value, &size, nullptr) == 0, kind == 1);
        EXPECT_EQ(size, kind == 0 ? 1U : 4U);
        refhost::dispose(value);
    }
    // A setting that is no bit depth is kept for whoever wrote it, and means nothing here.
    Record record(flattened(source.handle(), kPlain));
    record.words[zqtest::kSetting] = 0x55AA;
    const Rebuilt made(record.bytes());
    int32_t bits = -1;
    EXPECT_EQ(ZqGetBitDepth(made.handle, &bits), 0);
    EXPECT_EQ(bits, 0);
    EXPECT_EQ(Record(flattened(made.handle, kPlain)).words[zqtest::kSetting], 0x55AAU);
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

// An object of a sibling library: a number that takes four bytes.
struct Attached {
    static inline int alive = 0;
    uint32_t number;

    static ZqAttachmentClass description() {
        return {{0x83C29D22, 0x03B0, 0x4F31, {0xCC, 0xA8, 0x34, 0x99, 0x6C, 0x14, 0x34, 0x99}},
                [](void* /*object*/) -> uint32_t { return 4; },
                [](void* object, void* block) -> ZqError {
                    std::memcpy(block, object, 4);
                    std::memset(static_cast<char*>(block) + 4, 0xEE, 4);  // may write past its size
                    return static_cast<Attached*>(object)->number == 13 ? -13 : 0;
                },
                [](const void* block, uint32_t size, void** object) -> ZqError {
                    if (size != 4) return -14;
                    auto* made = new Attached{};
                    std::memcpy(&made->number, block, 4);
                    ++alive;
                    *object = made;
                    return 0;
                },
                [](void* object) {
                    --alive;
                    delete static_cast<Attached*>(object);
                },
                nullptr,
                0};
    }
};

TEST(FlattenTest, AttachmentsOfKnownAndUnknownClasses) {
    const ZqAttachmentClass description = Attached::description();
    {
        const Picture source(ZQ_TYPE_U8, 4, 4);
        auto* object = new Attached{77};
        ++Attached::alive;
        ASSERT_EQ(
            ZqSetAttachment(source.handle(), &description.classId, object, description.destroy), 0);
        EXPECT_TRUE(Record(flattened(source.handle(), kPlain)).attachment.empty())
            << "no class yet";
        ASSERT_EQ(ZqRegisterAttachmentClass(&description), 0);
        const std::string bytes = flattened(source.handle(), kPlain);
        EXPECT_EQ(Record(bytes).attachment, std::string("M\0\0\0", 4));

        const Rebuilt made(bytes);
        void* found = nullptr;
        ASSERT_EQ(ZqFindAttachment(made.handle, &description.classId, &found), 0);
        ASSERT_NE(found, nullptr);
        EXPECT_EQ(static_cast<Attached*>(found)->number, 77U);

        Record other(bytes);
        other.attachment = "five!";
        Picture target(ZQ_TYPE_U8, 2, 2);
        const std::string before = target.state();
        ZqImageHandle handle = target.handle();
        EXPECT_EQ(unflatten(other.bytes(), &handle), -14) << "the class's own code";
        EXPECT_EQ(target.state(), before);
        object->number = 13;
        refhost::String string;
        EXPECT_EQ(FlattenImageToArray1D(source.handle(), string.out()), -13);

        ASSERT_EQ(ZqUnregisterAttachmentClass(&description.classId), 0);
        ASSERT_EQ(unflatten(other.bytes(), &handle), 0);
        EXPECT_EQ(Record(flattened(handle, kPlain)).attachment, "five!") << "carried unchanged";
        EXPECT_EQ(ZqFindAttachment(handle, &description.classId, &found), 0);
        EXPECT_EQ(found, nullptr);
    }
    EXPECT_EQ(Attached::alive, 0);
}

TEST(FlattenTest, ContextsOfEveryDeclaredLength) {
    const std::string pixels(8 * 4, 'p');
    const Picture referenced(ZQ_TYPE_U8, 2, 2);
    const uint32_t reference = zqtest::word_at(flattened(referenced.handle(), kPlain, 2), 8);
    ZqFlattenContext context{};
    context.type = ZQ_TYPE_I16;
    context.width = 6;
    context.height = 2;
    context.border = 1;
    context.lineWidth = 8;
    context.codecId = 55;
    context.pixelBlockSize = 32;
    context.pixelBlock = pixels.data();
    context.imageSetting = 10;
    context.keepName = 1;
    context.sourceImage = 0xAB;
    const uint32_t base = ZQ_FLATTEN_CONTEXT_BASE, setting = ZQ_FLATTEN_CONTEXT_SETTING;
    const uint32_t full = ZQ_FLATTEN_CONTEXT_FULL;
    struct Case {
        uint32_t length;
        ZqError code;
        int32_t bits;
        const char* name;
    };
    const Case cases[] = {{0, kBadRecord, 0, ""},
                          {base - 1, kBadRecord, 0, ""},
                          {base, 0, 0, "remote image 000000AB"},
                          {setting - 1, 0, 0, "remote image 000000AB"},
                          {setting, 0, 10, "remote image 000000AB"},
                          {full - 1, 0, 10, "remote image 000000AB"},
                          {full, 0, 10, "kept"},
                          {full + 8, 0, 10, "kept"}};
    for (const Case& c : cases) {
        ZqImageHandle image = nullptr;
        ASSERT_EQ(RpcConvertToGRImage3(&image, &context, c.length, "kept"), c.code) << c.length;
        if (c.code != 0) continue;
        int32_t bits = 0;
        EXPECT_EQ(ZqGetBitDepth(image, &bits), 0);
        EXPECT_EQ(bits, c.bits) << c.length;
        EXPECT_STREQ(image->name, c.name) << c.length;
        ZqDisposeImage(image);
    }
    ZqImageHandle image = nullptr;
    context.referencedImage = reference;
    ASSERT_EQ(RpcConvertToGRImage3(&image, &context, full, nullptr), 0);
    EXPECT_EQ(image, referenced.handle());
    image = nullptr;
    ASSERT_EQ(RpcConvertToGRImage3(&image, &context, full - 1, nullptr), 0);
    EXPECT_NE(image, referenced.handle()) << "a context that ends before the reference";
    ZqDisposeImage(image);
    context.referencedImage = 0;
    context.pixelBlock = nullptr;
    image = nullptr;
    EXPECT_EQ(RpcConvertToGRImage3(&image, &context, full, nullptr), kNullPointer);
    EXPECT_EQ(RpcConvertToGRImage3(nullptr, &context, full, nullptr), kNullPointer);
    EXPECT_EQ(RpcConvertToGRImage3(&image, nullptr, full, nullptr), kNullPointer);
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
