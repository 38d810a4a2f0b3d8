// What hosts read from images and set on them: description, size, pixel pointers, attributes.
#include <gtest/gtest.h>
#include <zqvissvc/image.h>

#include <climits>
#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "refhost/refhost.h"
#include "tests/support/host_image.h"

namespace {

using zqtest::Cluster;
using zqtest::HostImage;

constexpr ZqError kNotAnImage = -1074396120;
constexpr ZqError kNullPointer = -1074395269;
constexpr ZqError kIncompatibleSize = -1074396074;
constexpr ZqError kNoCoordinate = -1074395261;

TEST(InformationTest, DescribesTheImage) {
    HostImage image("part", ZQ_TYPE_RGB, 7, 3, 2);
    image.value.image->unit = 4;
    image.value.image->xStep = 0.25F;
    image.value.image->yStep = 8.0F;
    HostImage unnamed("", ZQ_TYPE_U8, 1, 1);
    int32_t type = -1, width = -1, height = -1, unit = -1;
    float x_step = -1, y_step = -1;
    refhost::String name("longer than the name");
    Cluster error;
    EXPECT_EQ(DF_GetImageInfo2(&image.value, &type, &width, &height, &unit, &x_step, &y_step,
                               name.out(), error),
              0);
    EXPECT_EQ(std::vector<int32_t>({type, width, height, unit}),
              std::vector<int32_t>({ZQ_TYPE_RGB, 7, 3, 4}));
    EXPECT_EQ(x_step, 0.25F);
    EXPECT_EQ(y_step, 8.0F);
    EXPECT_EQ(name.text(), "part");
    type = height = 0;
    EXPECT_EQ(
        DF_GetImageInfo(&image.value, &type, nullptr, &height, nullptr, nullptr, nullptr, nullptr),
        0);
    EXPECT_EQ(type, ZQ_TYPE_RGB);
    EXPECT_EQ(height, 3);
    EXPECT_EQ(DF_GetImageInfo2(&unnamed.value, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                               name.out(), nullptr),
              0);
    EXPECT_EQ(name.text(), "");
    EXPECT_EQ(DF_GetImageSize(&image.value, &width, &height, error), 0);
    EXPECT_EQ(width, 7);
    EXPECT_EQ(height, 3);
}

// Every entry point that takes a value: what it does without an image, and with an error pending.
TEST(InformationTest, ValuesWithoutAnImageAndPendingErrors) {
    static int32_t out[2];
    static void* pixel;
    struct Case {
        const char* name;
        ZqError (*call)(const ZqImageValue*, ZqErrorCluster*);
    };
    const Case cases[] = {
        {"KEMO Get Image Info",
         [](const ZqImageValue* v, ZqErrorCluster* e) {
             return DF_GetImageInfo(v, out, nullptr, nullptr, nullptr, nullptr, nullptr, e);
         }},
        {"KEMO Get Image Info",
         [](const ZqImageValue* v, ZqErrorCluster* e) {
             return DF_GetImageInfo2(v, out, nullptr, nullptr, nullptr, nullptr, nullptr, nullptr,
                                     e);
         }},
        {"KEMO Get Image Size",
         [](const ZqImageValue* v, ZqErrorCluster* e) {
             return DF_GetImageSize(v, out, out + 1, e);
         }},
        {"KEMO Set Image Size",
         [](const ZqImageValue* v, ZqErrorCluster* e) { return DF_SetImageSize(v, 9, 9, e); }},
        {"KEMO Get Image Pixel Pointer",
         [](const ZqImageValue* v, ZqErrorCluster* e) {
             return DF_GetImagePixelPtr(v, 0, 0, 0, &pixel, out, nullptr, nullptr, nullptr, e);
         }},
        {"KEMO Image Bit Depth",
         [](const ZqImageValue* v, ZqErrorCluster* e) { return DF_ImageBitDepth2(v, 0, out, e); }},
    };
    HostImage live("live");
    HostImage stale("stale");
    DF_Dispose(&stale.value, 0, nullptr);
    const ZqImageValue none{};
    const ZqImageValue* const without_image[] = {&stale.value, &none, nullptr};
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        out[0] = out[1] = 77;
        pixel = out;
        for (const ZqImageValue* value : without_image) {
            Cluster error;
            EXPECT_EQ(c.call(value, error), kNotAnImage);
            EXPECT_EQ(error.source(), std::string(c.name) + "\nNot an image.");
        }
        Cluster pending(-5);
        EXPECT_EQ(c.call(&live.value, pending), -5);
        EXPECT_EQ(pending.code(), -5);
        EXPECT_EQ(out[0], 77);
        EXPECT_EQ(out[1], 77);
        EXPECT_EQ(pixel, out);
        EXPECT_EQ(live.record().width, 6);
    }
}

// ---- Geometry

std::vector<std::string> removed;

constexpr ZqClassId kGeometry1 = {
    0x0AAFCF76, 0x8F2F, 0x4044, {0x64, 0xB9, 0xE1, 0x34, 0xE5, 0xC8, 0xE1, 0x34}};
constexpr ZqClassId kGeometry2 = {
    0x83C29D22, 0x03B0, 0x4F31, {0xCC, 0xA8, 0x34, 0x99, 0x6C, 0x14, 0x34, 0x99}};
constexpr ZqClassId kOther = {
    0x83C29D22, 0x03B0, 0x4F31, {0xCC, 0xA8, 0x34, 0x99, 0x6C, 0x14, 0x34, 0x98}};

// Hangs everything on an image that a change of size may remove, or must not.
void decorate(ZqImageHandle image) {
    static char first[] = "first", second[] = "second", other[] = "other", extra[] = "extra";
    const auto destroy = [](void* text) { removed.emplace_back(static_cast<const char*>(text)); };
    const auto remove_kind = [](void* /*object*/, int32_t kind) {
        removed.push_back("kind " + std::to_string(kind));
    };
    EXPECT_EQ(ZqSetAttachment(image, &kOther, other, destroy), 0);
    EXPECT_EQ(ZqSetAttachment(image, &kGeometry2, second, destroy), 0);
    EXPECT_EQ(ZqSetAttachment(image, &kGeometry1, first, destroy), 0);
    EXPECT_EQ(ZqSetExtraInfo(image, extra, remove_kind, destroy), 0);
    removed.clear();
}

TEST(InformationTest, ANewSizeDropsWhatDescribesTheOldOne) {
    HostImage image("part");
    void* lent = nullptr;
    const std::vector<std::string> expected = {"kind 2", "kind 3", "first", "second"};
    struct Case {
        const char* name;
        int32_t width, height;
        bool lend;
        ZqError code;
    };
    const Case cases[] = {
        {"other size", 20, 10, false, 0},  {"same size", 20, 10, false, 0},
        {"negative", -4, 7, false, 0},     {"too large", 70000, 70000, false, -1074396159},
        {"lent", 5, 5, true, -1074396065},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        decorate(image.handle());
        if (c.lend) Gen_MarkExternalBuffer(&image.value, 1, &lent);
        EXPECT_EQ(DF_SetImageSize(&image.value, c.width, c.height, nullptr), c.code);
        EXPECT_EQ(removed, expected);
        decorate(image.handle());
        const int32_t size[] = {c.width, c.height};
        EXPECT_EQ(DF_SetImageAttr(image.handle(), 3, size, nullptr), c.code);
        EXPECT_EQ(removed, expected);
        void* found = nullptr;
        EXPECT_EQ(ZqFindAttachment(image.handle(), &kOther, &found), 0);
        EXPECT_NE(found, nullptr);
        EXPECT_EQ(ZqFindAttachment(image.handle(), &kGeometry1, &found), 0);
        EXPECT_EQ(found, nullptr);
        if (c.lend) Gen_MarkExternalBuffer(&image.value, 0, &lent);
    }
    removed.clear();
    EXPECT_EQ(ZqRemoveAttachment(image.handle(), &kGeometry1), 0);
    EXPECT_TRUE(removed.empty()) << "an attachment that is absent is skipped";
    DF_Dispose(&image.value, 0, nullptr);
    EXPECT_EQ(removed, (std::vector<std::string>{"extra", "other"}));
}

TEST(InformationTest, PixelPointersAndTheBytesBehindThem) {
    HostImage image("i16", ZQ_TYPE_I16, 10, 6, 3);  // 16 pixels of 2 bytes: 32 bytes a row
    HostImage empty("empty", ZQ_TYPE_U8, 0, 0, 3);
    struct Case {
        HostImage& image;
        int32_t x, y;
        int16_t mode;
        ZqError code;
        ptrdiff_t offset;  // bytes from pixel (0, 0)
        int32_t remaining;
    };
    const Case cases[] = {
        {image, 0, 0, 0, 0, 0, 192},
        {image, 9, 5, 0, 0, 178, 14},  // (16 - 10 + 1) * 2
        {image, -3, -3, 0, 0, -102, 294},
        {image, 9, -3, 0, 0, -78, 270},
        {image, 10, 0, 0, kIncompatibleSize, 0, 0},
        {image, 0, 6, 0, kIncompatibleSize, 0, 0},
        {image, -4, 0, 0, kNoCoordinate, 0, 0},
        {image, 0, INT_MIN, 0, kNoCoordinate, 0, 0},
        {empty, 0, 0, 0, kIncompatibleSize, 0, 0},
        {empty, -1, -1, 0, -1074396154, 0, 0},
        {image, 9, 5, 1, 0, 0, 14},
        {image, 500, 5, -1, 0, 0, -968},
        {image, 0, 100, 1, 0, 0, -3008},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.x << ',' << c.y << " mode " << c.mode);
        void* pixel = &removed;
        int32_t border = -1, line = -1, bytes = -1, remaining = -1;
        EXPECT_EQ(DF_GetImagePixelPtr(&c.image.value, c.x, c.y, c.mode, &pixel, &border, &line,
                                      &bytes, &remaining, nullptr),
                  c.code);
        if (c.code == 0 && c.mode == 0) {
            EXPECT_EQ(static_cast<uint8_t*>(pixel) - c.image.record().firstPixel, c.offset);
        } else {
            EXPECT_EQ(pixel, &removed);
        }
        EXPECT_EQ(remaining, c.code == 0 ? c.remaining : -1);
        EXPECT_EQ(border, c.code == 0 ? 3 : -1);
        EXPECT_EQ(line, c.code == 0 ? 16 : -1);
        EXPECT_EQ(bytes, c.code == 0 ? 2 : -1);
    }
}

TEST(InformationTest, AttributesGoByHandleAndReportAText) {
    HostImage image("part", ZQ_TYPE_SGL, 7, 5, 2);
    refhost::String text("old");
    const auto get = [&](int32_t attribute, void* value) {
        return DF_GetImageAttr(image.handle(), attribute, value, text.out());
    };
    ZqImageHandle handle = nullptr;
    int32_t numbers[2] = {-1, -1};
    refhost::String name;
    EXPECT_EQ(get(1, &handle), 0);
    EXPECT_EQ(handle, image.handle());
    EXPECT_EQ(text.text(), "");
    EXPECT_EQ(get(2, numbers), 0);
    EXPECT_EQ(numbers[0], 2);
    EXPECT_EQ(get(3, numbers), 0);
    EXPECT_EQ(numbers[0], 7);
    EXPECT_EQ(numbers[1], 5);
    EXPECT_EQ(get(4, name.out()), 0);
    EXPECT_EQ(name.text(), "part");
    EXPECT_EQ(get(5, numbers), 0);
    EXPECT_EQ(numbers[0], ZQ_TYPE_SGL);
    const int32_t border = 6;
    const int32_t too_large = 1 << 30;
    struct Case {
        std::function<ZqError()> call;
        ZqError code;
        const char* text;
    };
    const auto set = [&](ZqImageHandle target, int32_t attribute, const void* value) {
        return DF_SetImageAttr(target, attribute, value, text.out());
    };
    const Case cases[] = {
        {[&] { return get(0, numbers); }, -1074395713, "Value not in enumeration."},
        {[&] { return get(6, nullptr); }, -1074395713, "Value not in enumeration."},
        {[&] { return get(3, nullptr); }, kNullPointer, "Null pointer."},
        {[&] { return set(image.handle(), 2, &border); }, 0, ""},
        {[&] { return set(image.handle(), 2, nullptr); }, kNullPointer, "Null pointer."},
        {[&] { return set(image.handle(), 1, &border); }, -1074395713, "Value not in enumeration."},
        {[&] { return set(image.handle(), 5, &border); }, -1074395713, "Value not in enumeration."},
        {[&] { return set(nullptr, 2, &border); }, kNotAnImage, "Not an image."},
        {[&] { return set(image.handle(), 2, &too_large); }, -1074396159,
         "Not enough memory for requested operation."},
        {[&] { return DF_GetImageAttr(nullptr, 2, numbers, text.out()); }, kNotAnImage,
         "Not an image."},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(c.call(), c.code);
        EXPECT_EQ(text.text(), c.text);
    }
    EXPECT_EQ(image.record().border, 6);
    EXPECT_EQ(DF_GetImageAttr(nullptr, 0, nullptr, nullptr), -1074395713);
    // The handle is given back unseen.
    EXPECT_EQ(DF_GetImageAttr(nullptr, 1, &handle, nullptr), 0);
    EXPECT_EQ(handle, nullptr);
}

TEST(InformationTest, BitDepthIsSetAndReadInOneCall) {
    HostImage deep("deep", ZQ_TYPE_I16);
    HostImage flat("flat", ZQ_TYPE_U8);
    int32_t bits = 12;
    EXPECT_EQ(DF_ImageBitDepth2(&deep.value, 1, &bits, nullptr), 0);
    bits = 99;
    EXPECT_EQ(DF_ImageBitDepth2(&deep.value, 1, &bits, nullptr), -1074395721);
    EXPECT_EQ(bits, 99);
    EXPECT_EQ(DF_ImageBitDepth2(&deep.value, 0, &bits, nullptr), 0);
    EXPECT_EQ(bits, 12);
    EXPECT_EQ(DF_ImageBitDepth2(&flat.value, 1, &bits, nullptr), -1074395721);
    EXPECT_EQ(DF_ImageBitDepth2(&flat.value, 0, nullptr, nullptr), kNullPointer);
    EXPECT_EQ(ZqSetBitDepth(deep.handle(), 0), 0);
    EXPECT_EQ(ZqGetBitDepth(deep.handle(), &bits), 0);
    EXPECT_EQ(bits, 0);
}

TEST(InformationTest, TypesHaveDisplayTexts) {
    const char* const texts[] = {"Unknown", "8 bits", "16 bits",   "Float",  "Complex",
                                 "RGB",     "HSL",    "RGB (U64)", "Unknown"};
    for (int32_t type = -1; type <= 7; ++type) {
        EXPECT_STREQ(Gen_ImageTypeToText(type), texts[type + 1]);
    }
    EXPECT_STREQ(Gen_ImageTypeToText(INT_MIN), "Unknown");
}

}  // namespace
