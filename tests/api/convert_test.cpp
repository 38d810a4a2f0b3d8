// Pixels into host arrays and images into other types, as a host asks for them.
#include <gtest/gtest.h>
#include <zqvissvc/convert.h>
#include <zqvissvc/errors.h>

#include <cstring>
#include <string>
#include <vector>

#include "refhost/refhost.h"
#include "support/host_image.h"

namespace {

using zqtest::Cluster;
using zqtest::HostImage;

template <class Array>
class HostArray {
  public:
    HostArray() = default;
    ~HostArray() { refhost::dispose(handle); }
    HostArray(const HostArray&) = delete;
    HostArray& operator=(const HostArray&) = delete;

    // A block of so many 32-bit words behind a first one, all of them all ones.
    void reserve(size_t words) {
        handle =
            reinterpret_cast<Array**>(refhost::new_array(std::vector<uint32_t>(words, UINT32_MAX)));
        if (words > 0) (*handle)->rows = -1;
    }
    std::string shape() const {
        if (handle == nullptr) return "none";
        return std::to_string((*handle)->rows) + " x " + std::to_string((*handle)->columns);
    }
    auto element(int32_t row, int32_t column) const {
        decltype(+(*handle)->elements[0]) value{};
        const auto index = static_cast<size_t>(int64_t{row} * (*handle)->columns + column);
        std::memcpy(&value, reinterpret_cast<const char*>(*handle) + 8 + index * kBytes, kBytes);
        return value;
    }

    Array** handle = nullptr;

  private:
    static constexpr size_t kBytes = sizeof(Array{}.elements[0]);
};

class Rectangle {
  public:
    explicit Rectangle(const std::vector<int32_t>& elements)
        : words_(elements.begin(), elements.end()), array_(refhost::new_array(words_)) {}
    ZqArrayI32Handle handle() const { return reinterpret_cast<ZqArrayI32Handle>(array_.get()); }

  private:
    std::vector<uint32_t> words_;
    refhost::Owned<ZqArrayU32Handle> array_;
};

struct Outputs {
    HostArray<ZqArray2dU8> u8;
    HostArray<ZqArray2dI16> i16;
    HostArray<ZqArray2dSgl> sgl;
    HostArray<ZqArray2dU32> u32;
    HostArray<ZqArray2dU64> u64;
};

// Each byte of a pixel tells where it is: 10 * y + x, and its place in the pixel.
void number_pixels(const HostImage& image, size_t bytes) {
    for (int32_t y = 0; y < image.record().height; ++y) {
        for (int32_t x = 0; x < image.record().width; ++x) {
            void* pixel = nullptr;
            ASSERT_EQ(ZqGetPixelAddress(image.handle(), x, y, &pixel), 0);
            for (size_t i = 0; i < bytes; ++i) {
                static_cast<uint8_t*>(pixel)[i] = static_cast<uint8_t>(10 * y + x + 64 * (i & 1));
            }
        }
    }
}

TEST(ImageToArrayTest, EveryRectangleMeansTheSamePixelsGreyAndColour) {
    struct Case {
        std::vector<int32_t> rectangle;
        std::string grey, colour;
        int first;  // of the first pixel, -1 without pixels
    };
    const Case cases[] = {
        {{}, "4 x 6", "4 x 6", 0},
        {{1}, "4 x 5", "4 x 5", 1},
        {{1, 2, 3, 4}, "2 x 2", "2 x 2", 21},
        {{3, 4, 1, 2}, "2 x 2", "2 x 2", 21},
        {{-9, -9, 100, 100}, "4 x 6", "4 x 6", 0},
        {{INT32_MAX, INT32_MAX, INT32_MIN, INT32_MIN}, "4 x 6", "4 x 6", 0},
        {{5, 3, 6, 4, 77}, "1 x 1", "1 x 1", 35},
        {{6, 0, 9, 2}, "2 x 0", "0 x 0", -1},
        {{2, 4, 4, 9}, "0 x 2", "0 x 0", -1},
        {{2, 2, 2, 2}, "0 x 0", "0 x 0", -1},
        {{0, -5, 3, -1}, "0 x 3", "0 x 0", -1},
    };
    const HostImage grey("", ZQ_TYPE_U8), colour("", ZQ_TYPE_RGB), wide("", ZQ_TYPE_RGBU64);
    number_pixels(grey, 1);
    number_pixels(colour, 4);
    number_pixels(wide, 8);
    Outputs out;
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::PrintToString(c.rectangle));
        const Rectangle rectangle(c.rectangle);
        EXPECT_EQ(DF_ImageToArray(&grey.value, rectangle.handle(), &out.u8.handle, nullptr, nullptr,
                                  nullptr),
                  0);
        EXPECT_EQ(DF_ColorImageToArray(&colour.value, rectangle.handle(), &out.u32.handle, nullptr),
                  0);
        EXPECT_EQ(DF_ColorImageToArray_v2(&wide.value, rectangle.handle(), nullptr, &out.u64.handle,
                                          nullptr),
                  0);
        EXPECT_EQ(out.u8.shape(), c.grey);
        EXPECT_EQ(out.u32.shape(), c.colour);
        EXPECT_EQ(out.u64.shape(), c.grey);
        if (c.first < 0) continue;
        EXPECT_EQ(out.u8.element(0, 0), c.first);
        EXPECT_EQ(out.u32.element(0, 0), 0x01000100U * (static_cast<uint32_t>(c.first) + 64) +
                                             0x00010001U * static_cast<uint32_t>(c.first));
        EXPECT_EQ(out.u64.element(0, 0) & 0xFFFF, out.u32.element(0, 0) & 0xFFFF);
    }
}

TEST(ImageToArrayTest, OnlyTheArrayOfTheTypeIsTouched) {
    struct Case {
        int32_t type;
        ZqError grey, colour, colour_v2;
        std::string arrays;  // after all three: U8, I16, SGL, U32, U64
    };
    constexpr ZqError kType = ZQ_ERR_INVALID_IMAGE_TYPE;
    const Case cases[] = {
        {ZQ_TYPE_U8, 0, kType, kType, "4 x 6,none,none,none,none"},
        {ZQ_TYPE_I16, 0, kType, kType, "none,4 x 6,none,none,none"},
        {ZQ_TYPE_SGL, 0, kType, kType, "none,none,4 x 6,none,none"},
        {ZQ_TYPE_COMPLEX, kType, kType, kType, "none,none,none,none,none"},
        {ZQ_TYPE_RGB, kType, 0, 0, "none,none,none,4 x 6,none"},
        {ZQ_TYPE_HSL, kType, 0, 0, "none,none,none,4 x 6,none"},
        {ZQ_TYPE_RGBU64, kType, kType, 0, "none,none,none,none,4 x 6"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.type);
        const HostImage image("", c.type);
        Outputs out;
        Cluster grey, colour;
        EXPECT_EQ(DF_ImageToArray(&image.value, nullptr, &out.u8.handle, &out.i16.handle,
                                  &out.sgl.handle, grey),
                  c.grey);
        EXPECT_EQ(DF_ColorImageToArray(&image.value, nullptr, &out.u32.handle, colour), c.colour);
        EXPECT_EQ(DF_ColorImageToArray_v2(&image.value, nullptr, &out.u32.handle, &out.u64.handle,
                                          nullptr),
                  c.colour_v2);
        EXPECT_EQ(out.u8.shape() + "," + out.i16.shape() + "," + out.sgl.shape() + "," +
                      out.u32.shape() + "," + out.u64.shape(),
                  c.arrays);
        EXPECT_EQ(grey.source(), c.grey == 0 ? "" : "KEMO Image To Array\nInvalid image type.");
        EXPECT_EQ(colour.source(),
                  c.colour == 0 ? "" : "KEMO ColorImageToArray\nInvalid image type.");
    }
}

TEST(ImageToArrayTest, BoundedArraysStayWhereTheyAre) {
    struct Case {
        size_t elements;  // that there is room for
        ZqError code;
        std::string grey, colour;
    };
    const HostImage grey("", ZQ_TYPE_SGL), colour("", ZQ_TYPE_HSL);
    for (const Case& c : {Case{24, 0, "4 x 6", "4 x 6"}, Case{500, 0, "4 x 6", "4 x 6"},
                          Case{23, ZQ_ERR_OUTPUT_ARRAY_TOO_SMALL, "-1 x -1", "0 x 0"},
                          Case{0, ZQ_ERR_OUTPUT_ARRAY_TOO_SMALL, "-1 x -1", "0 x 0"}}) {
        SCOPED_TRACE(c.elements);
        Outputs out;
        out.sgl.reserve(1 + c.elements);
        out.u32.reserve(1 + c.elements);
        const void *const block = *out.sgl.handle, *const colour_block = *out.u32.handle;
        EXPECT_EQ(DF_ImageToArray_Bounded(&grey.value, nullptr, nullptr, nullptr, &out.sgl.handle,
                                          nullptr),
                  c.code);
        EXPECT_EQ(DF_ColorImageToArray_Bounded(&colour.value, nullptr, &out.u32.handle, nullptr),
                  c.code);
        EXPECT_EQ(out.sgl.shape(), c.grey);
        EXPECT_EQ(out.u32.shape(), c.colour);
        EXPECT_EQ(*out.sgl.handle, block);
        EXPECT_EQ(*out.u32.handle, colour_block);
    }
    HostArray<ZqArray2dSgl> tiny;
    tiny.reserve(0);
    EXPECT_EQ(
        DF_ImageToArray_Bounded(&grey.value, nullptr, nullptr, nullptr, &tiny.handle, nullptr),
        ZQ_ERR_OUTPUT_ARRAY_TOO_SMALL);
}

TEST(ImageToArrayTest, FailuresAreReportedAndTheImageIsFreeAgain) {
    const HostImage image("", ZQ_TYPE_U8);
    HostArray<ZqArray2dU8> none;
    const ZqImageValue nothing{};
    Cluster pending(-5);
    EXPECT_EQ(DF_ImageToArray(&image.value, nullptr, &none.handle, nullptr, nullptr, pending), -5);
    EXPECT_EQ(none.handle, nullptr);
    EXPECT_EQ(DF_ImageToArray(&nothing, nullptr, &none.handle, nullptr, nullptr, nullptr),
              ZQ_ERR_NOT_AN_IMAGE);
    EXPECT_EQ(DF_ImageToArray(&image.value, nullptr, nullptr, nullptr, nullptr, nullptr),
              ZQ_ERR_MEMORY);
    EXPECT_EQ(
        DF_ImageToArray_Bounded(&image.value, nullptr, &none.handle, nullptr, nullptr, nullptr),
        ZQ_ERR_MEMORY);
    refhost::refuse("NumericArrayResize");
    EXPECT_EQ(DF_ImageToArray(&image.value, nullptr, &none.handle, nullptr, nullptr, nullptr),
              ZQ_ERR_NOT_ENOUGH_MEMORY);
    EXPECT_EQ(none.handle, nullptr);
    ZqImageHandle handle = image.handle();
    EXPECT_EQ(ZqUnlockImages(&handle, 1), 0);
    EXPECT_EQ(DF_ImageToArray(&image.value, nullptr, &none.handle, nullptr, nullptr, nullptr), 0);
}

TEST(ConvertTest, DestinationsAreFoundOrMadeValuesOfTheSource) {
    HostImage source("convert source", ZQ_TYPE_U8, 5, 3), other("convert other", ZQ_TYPE_I16);
    number_pixels(source, 1);
    EXPECT_EQ(DF_Convert(&source.value, &other.value, nullptr), 0);
    EXPECT_EQ(other.record().width, 5);
    void* pixel = nullptr;
    ASSERT_EQ(ZqGetPixelAddress(other.handle(), 4, 2, &pixel), 0);
    EXPECT_EQ(*static_cast<int16_t*>(pixel), 24);

    ZqImageValue copy{};
    EXPECT_EQ(DF_Convert(&source.value, &copy, nullptr), 0);
    EXPECT_EQ(copy.image, source.handle());
    EXPECT_EQ(refhost::text(copy.name), "convert source");
    EXPECT_EQ(DF_Convert(&source.value, &copy, nullptr), 0) << "into itself";
    refhost::dispose(copy.name);

    const refhost::String name("convert other"), unknown("nobody");
    ZqImageHandle gone = nullptr;
    ASSERT_EQ(NewImage(ZQ_TYPE_U8, 1, 1, 0, &gone), 0);
    ASSERT_EQ(ZqDisposeImage(gone), 0);
    ASSERT_EQ(DF_SetImageSize(&other.value, 1, 1, nullptr), 0);
    ZqImageValue by_name{name.get(), gone}, stale{unknown.get(), gone};
    EXPECT_EQ(DF_Convert(&source.value, &by_name, nullptr), 0);
    EXPECT_EQ(by_name.image, other.handle());
    EXPECT_EQ(other.record().width, 5);
    Cluster error;
    EXPECT_EQ(DF_Convert(&source.value, &stale, error), ZQ_ERR_NOT_AN_IMAGE);
    EXPECT_EQ(error.source(), "KEMO Convert\nNot an image.");
    EXPECT_EQ(DF_Convert(&stale, &other.value, nullptr), ZQ_ERR_NOT_AN_IMAGE);
    EXPECT_EQ(DF_Convert(&source.value, nullptr, nullptr), 0);
}

}  // namespace
