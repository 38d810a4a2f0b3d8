// Pixel by pixel: the rules of each pair of types, and shapes of whole images.
#include "convert/convert_rows.h"

#include <gtest/gtest.h>

#include <string>

#include "convert/convert_image.h"

namespace zq {
namespace {

TEST(ConvertRows, ReducesSixteenBitsByTheBitDepth) {
    struct Case {
        std::int32_t sample, bit_depth;
        int expected;
    };
    const Case cases[] = {
        {-1, 0, 0},        {0, 0, 0},        {255, 0, 255},    {256, 0, 255},     {65535, 0, 255},
        {-1, 10, 0},       {1023, 10, 255},  {1024, 10, 255},  {513, 10, 128},    {514, 10, 129},
        {1, 10, 0},        {2, 10, 1},       {1021, 10, 255},  {1017, 10, 254},   {255, 8, 255},
        {256, 8, 255},     {254, 8, 254},    {127, 16, 0},     {128, 16, 1},      {65535, 16, 255},
        {32767, 16, 128},  {32767, 15, 255}, {32768, 15, 255}, {0x0FF0, 12, 255}, {0x0FE8, 12, 255},
        {0x0FE7, 12, 254},
    };
    for (const Case& c : cases) {
        EXPECT_EQ(reduce_to_8_bits(c.sample, c.bit_depth), c.expected)
            << c.sample << " with " << c.bit_depth;
    }
}

TEST(ConvertRows, ConvertsEveryPair) {
    using Type = PixelType;
    struct Case {
        Type from, to;
        std::int32_t bit_depth;
        std::string source, expected;  // bytes of some pixels
    };
    const Case cases[] = {
        {Type::kU8, Type::kI16, 0, {"\0\xFF", 2}, {"\0\0\xFF\0", 4}},
        {Type::kU8, Type::kRgb, 0, "\xFE", {"\xFE\xFE\xFE\0", 4}},
        {Type::kU8, Type::kRgbU64, 0, "\xFE", {"\xFE\0\xFE\0\xFE\0\0\0", 8}},
        {Type::kI16, Type::kU8, 0, {"\xFF\xFF\0\1", 4}, {"\0\xFF", 2}},
        {Type::kI16, Type::kU8, 10, {"\1\2", 2}, "\x80"},
        {Type::kI16, Type::kRgb, 10, {"\1\2", 2}, {"\x80\x80\x80\0", 4}},
        {Type::kI16,
         Type::kRgbU64,
         0,
         "\x34\x12\xFF\xFF",
         {"\x34\x12\x34\x12\x34\x12\0\0\0\0\0\0\0\0\0\0", 16}},
        {Type::kRgb, Type::kU8, 0, "\1\1\3\xFF", "\1"},
        {Type::kRgb, Type::kI16, 0, "\xFF\xFF\xFF\1", {"\xFF\0", 2}},
        {Type::kRgb, Type::kRgbU64, 0, "\1\2\3\4", {"\1\0\2\0\3\0\4\0", 8}},
        {Type::kRgbU64, Type::kU8, 0, {"\0\1\0\0\1\0\0\0", 8}, "\x55"},     // 255, 0, 1
        {Type::kRgbU64, Type::kU8, 12, {"\0\x0F\0\0\0\0\0\0", 8}, "\x50"},  // 240, 0, 0
        {Type::kRgbU64, Type::kI16, 0, "\xFF\xFF\xFF\xFF\xFF\xFF\1\1", "\xFF\x7F"},
        {Type::kRgbU64, Type::kI16, 0, {"\1\0\1\0\3\0\0\0", 8}, {"\1\0", 2}},
        {Type::kRgbU64, Type::kRgb, 16, {"\0\1\0\2\0\3\0\4", 8}, "\1\2\3\4"},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << int(c.from) << " to " << int(c.to));
        const ConvertRow row = find_row_conversion(c.from, c.to);
        ASSERT_NE(row, nullptr);
        const auto width = static_cast<std::int32_t>(c.source.size()) / bytes_per_pixel(c.from);
        ASSERT_EQ(static_cast<std::size_t>(width * bytes_per_pixel(c.to)), c.expected.size());
        alignas(8) char source[16];
        alignas(8) char destination[16];
        c.source.copy(source, sizeof(source));
        row(source, destination, width, c.bit_depth);
        EXPECT_EQ(std::string(destination, c.expected.size()), c.expected);
    }
}

TEST(ConvertImage, TakesSizeAndBorderAndRefusesUnknownPairs) {
    Image source(Variant::kPrivate, {}), destination(Variant::kPrivate, {});
    source.reinitialise({.type = 0, .width = 33, .height = 2, .border = 5});
    source.row(1)[32] = 7;
    destination.reinitialise({.type = 4, .width = 1, .height = 9, .border = 1});
    convert_image(source, destination);
    EXPECT_EQ(destination.extent(), (Extent{PixelType::kRgb, 33, 2, 5}));
    EXPECT_EQ(destination.row(1)[4 * 32 + 2], 7);

    Image copy(Variant::kPrivate, {});
    copy.reinitialise({.type = 0, .width = 0, .height = 0, .border = 0});
    convert_image(source, copy);
    EXPECT_EQ(copy.extent(), source.extent());
    EXPECT_EQ(copy.row(1)[32], 7);

    Image floats(Variant::kPrivate, {});
    floats.reinitialise({.type = 2, .width = 1, .height = 1, .border = 0});
    EXPECT_THROW(convert_image(source, floats), GRLIBError_enum);
    EXPECT_EQ(floats.extent(), (Extent{PixelType::kSgl, 1, 1, 0}));

    destination.lend();
    EXPECT_THROW(convert_image(floats, destination), GRLIBError_enum);
    floats.reinitialise({.type = 6, .width = 1, .height = 1, .border = 0});
    EXPECT_THROW(convert_image(floats, destination), GRLIBError_enum);
    EXPECT_EQ(destination.extent(), (Extent{PixelType::kRgb, 33, 2, 5}));
}

}  // namespace
}  // namespace zq
