// Where rows and pixels lie: line widths, alignment, bounds of the buffer, limits of its size.
#include <gtest/gtest.h>

#include <climits>
#include <cstdint>
#include <cstring>
#include <memory>

#include "image/image.h"
#include "image/layout.h"
#include "tests/support/image_probes.h"

namespace zq {
namespace {

using zqtest::code_of;

constexpr PixelType kAllTypes[] = {PixelType::kU8,      PixelType::kI16, PixelType::kSgl,
                                   PixelType::kComplex, PixelType::kRgb, PixelType::kHsl,
                                   PixelType::kRgbU64};

TEST(ImageLayoutTest, LineWidthIsRoundedUpTo32Bytes) {
    struct Case {
        PixelType type;
        std::int32_t width, border, row_pixels;
    };
    const Case cases[] = {
        {PixelType::kU8, 0, 0, 0},       {PixelType::kU8, 1, 0, 32},
        {PixelType::kU8, 32, 0, 32},     {PixelType::kU8, 33, 0, 64},
        {PixelType::kU8, 10, 3, 32},     {PixelType::kU8, 31, 1, 64},
        {PixelType::kU8, 0, 40, 96},     {PixelType::kI16, 16, 0, 16},
        {PixelType::kI16, 17, 0, 32},    {PixelType::kI16, 14, 1, 16},
        {PixelType::kI16, 15, 1, 32},    {PixelType::kSgl, 8, 0, 8},
        {PixelType::kSgl, 9, 0, 16},     {PixelType::kComplex, 4, 0, 4},
        {PixelType::kComplex, 5, 0, 8},  {PixelType::kRgb, 7, 0, 8},
        {PixelType::kRgb, 5, 2, 16},     {PixelType::kHsl, 8, 1, 16},
        {PixelType::kRgbU64, 10, 3, 16}, {PixelType::kRgbU64, 3, 1, 8},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(row_pixels_for({c.type, c.width, 1, c.border}), c.row_pixels)
            << static_cast<int>(c.type) << ' ' << c.width << ' ' << c.border;
    }
}

// The block is exactly as large as was asked, so the address sanitizer sees every step outside.
void check_placement(const Extent& extent, std::size_t misalignment) {
    const Layout layout = lay_out(extent);
    const auto block = std::make_unique<std::uint8_t[]>(layout.buffer_bytes + misalignment);
    std::uint8_t* buffer = block.get() + misalignment;
    std::uint8_t* first = place_first_pixel(buffer, extent, layout.row_pixels);
    const std::ptrdiff_t pixel_bytes = bytes_per_pixel(extent.type);
    const std::ptrdiff_t stride = layout.row_pixels * pixel_bytes;
    const std::ptrdiff_t row_bytes = (extent.width + 2 * extent.border) * pixel_bytes;
    ASSERT_GE(stride, row_bytes);
    for (std::int32_t y = -extent.border; y < extent.height + extent.border; ++y) {
        std::uint8_t* row = first + y * stride;
        ASSERT_EQ(reinterpret_cast<std::uintptr_t>(row) % 32, 0U) << "row " << y;
        row -= extent.border * pixel_bytes;
        ASSERT_GE(row, buffer) << "row " << y;
        ASSERT_LE(row + row_bytes, buffer + layout.buffer_bytes) << "row " << y;
        std::memset(row, 0xA5, static_cast<std::size_t>(row_bytes));
    }
}

TEST(ImageLayoutTest, EveryRowIsAlignedAndInsideTheBuffer) {
    for (const PixelType type : kAllTypes) {
        for (std::int32_t border = 0; border <= 40; ++border) {
            for (const std::size_t misalignment : {0, 1, 8, 15, 16, 24, 31}) {
                SCOPED_TRACE(testing::Message() << "type " << static_cast<int>(type) << " border "
                                                << border << " at " << misalignment);
                check_placement({type, 1, 1, border}, misalignment);
                check_placement({type, 7, 3, border}, misalignment);
                check_placement({type, 0, 0, border}, misalignment);
                ASSERT_FALSE(testing::Test::HasFatalFailure());
            }
        }
    }
}

// Padding up to an aligned address comes first; what of the left border it does not hold adds whole
// 32 bytes.
TEST(ImageLayoutTest, TheFirstRowIsMovedBehindItsBorderInSteps) {
    struct Case {
        PixelType type;
        std::int32_t border, misalignment;
        std::ptrdiff_t start;  // of x = 0 of the top border row, from the buffer
    };
    const Case cases[] = {
        {PixelType::kU8, 0, 0, 0},    {PixelType::kU8, 0, 8, 24},   {PixelType::kU8, 3, 0, 32},
        {PixelType::kU8, 3, 8, 24},   {PixelType::kU8, 3, 31, 33},  {PixelType::kU8, 24, 8, 24},
        {PixelType::kU8, 25, 8, 56},  {PixelType::kU8, 40, 16, 48}, {PixelType::kU8, 33, 0, 64},
        {PixelType::kRgb, 8, 24, 40}, {PixelType::kSgl, 2, 24, 8},  {PixelType::kRgbU64, 4, 0, 32},
    };
    alignas(32) static std::uint8_t buffer[64];
    for (const Case& c : cases) {
        std::uint8_t* from = buffer + c.misalignment;
        EXPECT_EQ(place_first_pixel(from, {c.type, 0, 0, c.border}, 0) - from, c.start)
            << static_cast<int>(c.type) << ' ' << c.border << ' ' << c.misalignment;
    }
}

TEST(ImageLayoutTest, BuffersEndAt2147483647Bytes) {
    // The largest multiple of 32 that leaves room for the 64 bytes of slack.
    EXPECT_EQ(lay_out({PixelType::kU8, 2147483552, 1, 0}).buffer_bytes, 2147483616U);
    EXPECT_EQ(lay_out({PixelType::kU8, 32, 67108861, 0}).buffer_bytes, 2147483616U);
    EXPECT_EQ(lay_out({PixelType::kRgbU64, 0, 67108859, 1}).buffer_bytes, 2147483616U);
    const Extent too_large[] = {
        {PixelType::kU8, 2147483553, 1, 0},
        {PixelType::kU8, 32, 67108862, 0},
        {PixelType::kU8, INT_MAX, 1, 0},
        {PixelType::kU8, 1, INT_MAX, 0},
        {PixelType::kU8, 1, 1, INT_MAX},
        {PixelType::kRgbU64, INT_MAX, 1, 0},
        {PixelType::kRgbU64, 0, 0, INT_MAX},
        {PixelType::kSgl, 65536, 65536, 0},
        {PixelType::kComplex, INT_MAX, INT_MAX, INT_MAX},
    };
    for (const Extent& extent : too_large) {
        EXPECT_EQ(code_of([&] { lay_out(extent); }), kNotEnoughMemory)
            << extent.width << 'x' << extent.height << " border " << extent.border;
    }
}

// Every way to a size that cannot be leaves the image and its pixels alone.
TEST(ImageLayoutTest, ImpossibleSizesChangeNothing) {
    Image image(Variant::kRegistered, {});
    image.reinitialise({ZQ_TYPE_I16, 9, 4, 2, true});
    zqtest::fill(image);
    const ImageRecord before = image.record();
    const auto pixels = zqtest::pixels_of(image);
    struct Case {
        std::int32_t type, width, height, border;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, INT_MAX, 1, 2},     {ZQ_TYPE_U8, 1, INT_MAX, 2},
        {ZQ_TYPE_I16, 1, 1, INT_MAX},    {ZQ_TYPE_COMPLEX, INT_MAX, INT_MAX, INT_MAX},
        {ZQ_TYPE_RGBU64, 0, 0, INT_MAX}, {ZQ_TYPE_I16, 9, 4, 1 << 30},
        {ZQ_TYPE_U8, 50000, 50000, 2},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.width << 'x' << c.height << " border " << c.border);
        EXPECT_EQ(code_of([&] {
                      image.reinitialise({c.type, c.width, c.height, c.border, false});
                  }),
                  kNotEnoughMemory);
        if (c.border == 2) {
            for (const auto mode : {ResizeMode::kPlain, ResizeMode::kKeepContents}) {
                EXPECT_EQ(code_of([&] { image.resize(c.width, c.height, c.type, mode); }),
                          kNotEnoughMemory);
            }
        } else {
            EXPECT_EQ(code_of([&] { image.set_border(c.border); }), kNotEnoughMemory);
        }
        EXPECT_TRUE(zqtest::same_record(image.record(), before));
        EXPECT_EQ(zqtest::pixels_of(image), pixels);
    }
}

}  // namespace
}  // namespace zq
