// Images out of records and contexts: which image it is, and what comes with the pixels.
#include <gtest/gtest.h>
#include <zqvissvc/custom_data.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <cstdint>
#include <cstring>
#include <string>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"
#include "tests/support/picture.h"
#include "tests/support/record.h"

namespace {

using zqtest::flattened;
using zqtest::HostImage;
using zqtest::Picture;
using zqtest::Rebuilt;
using zqtest::Record;
using zqtest::unflatten;

constexpr ZqError kBadRecord = -1074395960;
constexpr ZqError kNullPointer = -1074395269;
constexpr int32_t kPlain = 0;
constexpr int32_t kOld = 0x00070000, kText = 0x00070100, kNew = 0x00080000;

TEST(RebuildTest, AReferenceMeansTheVeryImage) {
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

TEST(RebuildTest, NamesOfRebuiltImages) {
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
    Record record(flattened(source.handle(), kPlain, 0, kNew, 1));
    record.name = "lamp2";
    const Rebuilt known(record.bytes());
    record.name += std::string("\0b", 2);
    ZqImageHandle same = nullptr;
    EXPECT_EQ(unflatten(record.bytes(), &same), 0);
    EXPECT_EQ(same, known.handle) << "a name ends at a zero byte";
    Record oldest = zqtest::grey_record(kOld, 5, 3, 1, 8);
    const Rebuilt made(oldest.bytes());
    ASSERT_EQ(made.code, 0);
    EXPECT_EQ(made.name(), "remote image 1234ABCD");
    EXPECT_EQ(made.handle->firstPixel[0], 9) << "row 1, column 1 of lines of 8";
}

TEST(RebuildTest, PropertiesTravelWithKindOne) {
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
    ZqImageHandle refilled = made.handle;
    ASSERT_EQ(unflatten(zqtest::grey_record(kOld, 5, 3, 1, 8).bytes(), &refilled), 0);
    EXPECT_EQ(Record(flattened(refilled, kPlain)).words[zqtest::kSetting], 0U) << "it has none";
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

TEST(RebuildTest, AttachmentsOfKnownAndUnknownClasses) {
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

TEST(RebuildTest, ContextsOfEveryDeclaredLength) {
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

}  // namespace
