// JPEG 2000 as others write it: every layout and box, against the samples that went in; damage.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <algorithm>
#include <array>
#include <cmath>

#include "refhost/refhost.h"
#include "support/bare_jpeg2000.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::BareJpeg2000;
using zqtest::big_endian;
using zqtest::jp2_box;
using zqtest::jp2_colour;
using zqtest::jp2_definitions;
using zqtest::jp2_file;
using zqtest::Picture;
using zqtest::store_bytes;
using Component = BareJpeg2000::Component;

constexpr ZqError kBadHeader = -1074396000, kFileIo = -1074395993, kUnsupported = -1074395991,
                  kUnreadable = -1074395989, kColourMethod = -1074395974, kLayers = -1074395973;
constexpr uint32_t kSrgb = 16, kGrey = 17, kYcc = 18, kCmyk = 12;

class Jpeg2000ReadTest : public testing::Test {
  protected:
    ZqError read(const std::string& bytes, Picture& picture, int32_t* format = nullptr,
                 ZqArrayU32Handle* table = nullptr) {
        store_bytes(path_, bytes);
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, format, table);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.jp2");
};

std::string little_endian(uint32_t value, int bytes) {
    std::string text = big_endian(value, bytes);
    std::reverse(text.begin(), text.end());
    return text;
}

uint32_t spread(int32_t value, int bits, int to) {
    const double most = std::ldexp(1.0, bits) - 1, wanted = std::ldexp(1.0, to) - 1;
    return static_cast<uint32_t>(std::lround(value * wanted / most));
}

TEST_F(Jpeg2000ReadTest, ReadsGreys) {
    struct Case {
        int bits;
        bool is_signed;
        int32_t type, format, bit_depth, offset;
    };
    const Case cases[] = {
        {1, false, ZQ_TYPE_U8, 0, 0, 0},        {2, false, ZQ_TYPE_U8, 1, 0, 0},
        {4, false, ZQ_TYPE_U8, 2, 0, 0},        {7, false, ZQ_TYPE_U8, 3, 0, 0},
        {8, false, ZQ_TYPE_U8, 3, 0, 0},        {9, false, ZQ_TYPE_I16, 6, 9, 0},
        {12, false, ZQ_TYPE_I16, 6, 12, 0},     {15, false, ZQ_TYPE_I16, 6, 15, 0},
        {16, false, ZQ_TYPE_I16, 6, 0, -32768}, {8, true, ZQ_TYPE_I16, 3, 0, 0},
        {12, true, ZQ_TYPE_I16, 6, 12, 0},      {16, true, ZQ_TYPE_I16, 6, 0, 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.bits << ' ' << c.is_signed);
        BareJpeg2000 file{.components = {{c.bits, c.is_signed}}};
        const std::string stream = file.encode();
        std::string expected;
        for (const int32_t sample : file.components[0].samples) {
            const bool byte = c.type == ZQ_TYPE_U8;
            const auto pixel =
                byte ? spread(sample, c.bits, 8) : static_cast<uint32_t>(sample + c.offset);
            expected += little_endian(pixel, byte ? 1 : 2);
        }
        for (const std::string& bytes : {stream, jp2_file(jp2_colour(kGrey), stream)}) {
            Picture picture(ZQ_TYPE_SGL, 2, 2);
            int32_t format = -1, depth = -1, offset = -1;
            ASSERT_EQ(read(bytes, picture, &format), 0);
            EXPECT_EQ(picture.record().type, c.type);
            EXPECT_EQ(format, c.format);
            EXPECT_TRUE(picture.pixels() == expected);
            EXPECT_EQ(ZqGetSampleOffset(picture.handle(), &offset), 0);
            EXPECT_EQ(offset, c.offset);
            EXPECT_EQ(ZqGetBitDepth(picture.handle(), &depth), 0);
            EXPECT_EQ(depth, c.bit_depth);
        }
    }
}

// What each pixel of a colour picture must be, from the samples that went in.
std::string colour_pixels(const BareJpeg2000& file, bool is_ycc, std::array<size_t, 4> channels) {
    std::string pixels;
    const int bits = file.components[0].bits, to = bits > 8 ? 16 : 8;
    for (uint32_t y = 0; y < file.height; ++y) {
        for (uint32_t x = 0; x < file.width; ++x) {
            std::array<double, 4> value{};
            for (size_t i = 0; i < 4 && channels[i] < file.components.size(); ++i) {
                const Component& c = file.components[channels[i]];
                const auto at = [](uint32_t from, uint32_t n, uint32_t step) {
                    const uint32_t first = (from + step - 1) / step, here = (from + n) / step;
                    return here < first ? 0 : here - first;
                };
                const size_t line = BareJpeg2000::count(file.left, file.width, c.dx);
                value[i] = c.samples[at(file.top, y, c.dy) * line + at(file.left, x, c.dx)];
            }
            if (is_ycc) {
                const double half = 1 << (bits - 1), most = (1 << bits) - 1;
                const double cb = value[1] - half, cr = value[2] - half, l = value[0];
                value = {l + 1.402 * cr, l - 0.344136 * cb - 0.714136 * cr, l + 1.772 * cb, 0};
                for (double& v : value) v = std::round(std::clamp(v, 0.0, most));
            }
            for (const size_t i : {2, 1, 0, 3})
                pixels += little_endian(spread(static_cast<int32_t>(value[i]), bits, to), to / 8);
        }
    }
    return pixels;
}

TEST_F(Jpeg2000ReadTest, ReadsColours) {
    const auto with = [](std::vector<Component> components, auto change) {
        BareJpeg2000 file{.components = std::move(components)};
        change(file);
        return file;
    };
    const auto nothing = [](BareJpeg2000&) {};
    const std::vector<Component> rgb(3), rgba(4), wide(3, {16}), ten(3, {10}), five(3, {5}),
        c420 = {{}, {8, false, 2, 2}, {8, false, 2, 2}}, c422 = {{}, {8, false, 2}, {8, false, 2}};
    constexpr size_t kNone = 9;
    const std::array<size_t, 4> plain = {0, 1, 2, kNone}, all = {0, 1, 2, 3};
    const auto alpha = [](uint16_t type) {
        return jp2_definitions({{0, 0, 1}, {1, 0, 2}, {2, 0, 3}, {3, type, 0}});
    };
    struct Case {
        const char* name;
        BareJpeg2000 file;
        std::string header;  // empty: the code stream alone
        int32_t format;
        bool is_ycc;
        std::array<size_t, 4> channels;
    };
    Case cases[] = {
        {"stream", with(rgb, nothing), "", 8, false, plain},
        {"transformed", with(rgb, [](auto& f) { f.mct = 1; }), "", 8, false, plain},
        {"file", with(rgb, nothing), jp2_colour(kSrgb), 8, false, plain},
        {"few bits", with(five, nothing), jp2_colour(kSrgb), 8, false, plain},
        {"10 bits", with(ten, nothing), jp2_colour(kSrgb), 18, false, plain},
        {"16 bits", with(wide, nothing), "", 18, false, plain},
        {"tiles, one resolution",
         with(rgb,
              [](auto& f) {
                  f.tile = 8;
                  f.resolutions = 1;
              }),
         "", 8, false, plain},
        {"offsets",
         with(rgb,
              [](auto& f) {
                  f.left = 5;
                  f.top = 3;
                  f.tile = 9;
              }),
         "", 8, false, plain},
        {"profile", with(rgb, nothing), jp2_box("colr", std::string("\2\0\0profile", 10)), 8, false,
         plain},
        {"the second of two spaces", with(rgb, nothing), jp2_colour(kCmyk) + jp2_colour(kSrgb), 8,
         false, plain},
        {"4:4:4", with(rgb, nothing), jp2_colour(kYcc), 8, true, plain},
        {"4:2:2", with(c422, nothing), jp2_colour(kYcc), 8, true, plain},
        {"4:2:0", with(c420, nothing), jp2_colour(kYcc), 8, true, plain},
        {"4:2:0 guessed", with(c420, nothing), "", 8, true, plain},
        {"4:2:0 at odd offsets",
         with(c420,
              [](auto& f) {
                  f.left = 3;
                  f.top = 5;
              }),
         jp2_colour(kYcc), 8, true, plain},
        {"4:2:0 said to be RGB", with(c420, nothing), jp2_colour(kSrgb), 8, false, plain},
        {"alpha", with(rgba, nothing), jp2_colour(kSrgb) + alpha(1), 12, false, all},
        {"a channel without meaning", with(rgba, nothing), jp2_colour(kSrgb), 8, false, plain},
        {"unspecified", with(rgba, nothing), jp2_colour(kSrgb) + alpha(65535), 8, false, plain},
        {"another order",
         with(rgba, nothing),
         jp2_colour(kSrgb) + jp2_definitions({{0, 1, 0}, {3, 0, 1}, {2, 0, 2}, {1, 0, 3}}),
         12,
         false,
         {3, 2, 1, 0}},
        {"grey with alpha",
         with({{}, {}}, nothing),
         jp2_colour(kGrey) + jp2_definitions({{0, 0, 1}, {1, 1, 0}}),
         12,
         false,
         {0, 0, 0, 1}},
    };
    for (Case& c : cases) {
        SCOPED_TRACE(c.name);
        const std::string stream = c.file.encode();
        Picture picture(ZQ_TYPE_SGL, 2, 2);
        int32_t format = -1;
        ASSERT_EQ(read(c.header.empty() ? stream : jp2_file(c.header, stream), picture, &format),
                  0);
        EXPECT_EQ(format, c.format);
        EXPECT_EQ(picture.record().type, format == 18 ? ZQ_TYPE_RGBU64 : ZQ_TYPE_RGB);
        const std::string expected = colour_pixels(c.file, c.is_ycc, c.channels);
        const std::string pixels = picture.pixels();
        ASSERT_EQ(pixels.size(), expected.size());
        // Halves may go either way.
        for (size_t i = 0; i < pixels.size(); ++i)
            ASSERT_LE(std::abs(pixels[i] - expected[i]), c.is_ycc ? 1 : 0) << i;
    }
    BareJpeg2000 file{.width = 3, .height = 1, .components = std::vector<Component>(4)};
    file.resolutions = 1;
    for (size_t i = 0; i < 4; ++i) file.components[i].samples = {i == 3 ? 100 : 50, 200, 0};
    Picture picture(ZQ_TYPE_U8);
    ASSERT_EQ(read(jp2_file(jp2_colour(kSrgb) + alpha(2), file.encode()), picture), 0);
    EXPECT_EQ(picture.at<uint32_t>(0, 0), 0x64808080U) << "50 of 100 is half";
    EXPECT_EQ(picture.at<uint32_t>(1, 0), 0xC8FFFFFFU);
    EXPECT_EQ(picture.at<uint32_t>(2, 0), 0U);
}

TEST_F(Jpeg2000ReadTest, KeepsPalettes) {
    const auto palette = [](const char* bits, const std::string& entries, int count) {
        const std::string columns(bits);
        return jp2_box("pclr", big_endian(static_cast<uint64_t>(count), 2) +
                                   big_endian(columns.size(), 1) + columns + entries);
    };
    const auto mapping = [](int channels, int component = 0) {
        std::string content;
        for (int i = 0; i < channels; ++i)
            content +=
                big_endian(static_cast<uint64_t>(component), 2) + '\1' + static_cast<char>(i);
        return jp2_box("cmap", content);
    };
    const std::string two = "\x10\x20\x30\xF0\xE0\xD0", colour = jp2_colour(kSrgb);
    struct Case {
        const char* name;
        std::string header;
        ZqError code;
        uint32_t first, second;
    };
    const Case cases[] = {
        {"colours", colour + palette("\7\7\7", two, 2) + mapping(3), 0, 0x102030, 0xF0E0D0},
        {"mapping first", colour + mapping(3) + palette("\7\7\7", two, 2), 0, 0x102030, 0xF0E0D0},
        {"another order",
         colour + palette("\7\7\7", two, 2) + mapping(3) +
             jp2_definitions({{0, 0, 3}, {1, 0, 2}, {2, 0, 1}}),
         0, 0x302010, 0xD0E0F0},
        {"alpha",
         colour + palette("\7\7\7\7", "\x10\x20\x30\x40\xF0\xE0\xD0\xC0", 2) + mapping(4) +
             jp2_definitions({{0, 0, 1}, {1, 0, 2}, {2, 0, 3}, {3, 1, 0}}),
         0, 0x40102030, 0xC0F0E0D0},
        {"greys", jp2_colour(kGrey) + palette("\7", "\x10\xF0", 2) + mapping(1), 0, 0x101010,
         0xF0F0F0},
        {"other bits",
         colour + palette("\x0F\3\7", std::string("\xFF\xFF\x0F\x01\x80\x00\x05\x02", 8), 2) +
             mapping(3),
         0, 0xFFFF01, 0x805502},
        {"no mapping", colour + palette("\7\7\7", two, 2), kBadHeader, 0, 0},
        {"too few columns", colour + palette("\7\7", two, 3) + mapping(3), kBadHeader, 0, 0},
        {"entries missing", colour + palette("\7\7\7", two, 3) + mapping(3), kBadHeader, 0, 0},
        {"no component", colour + palette("\7\7\7", two, 2) + mapping(3, 1), kBadHeader, 0, 0},
        {"too few channels", colour + palette("\7\7\7", two, 2) + mapping(2), kBadHeader, 0, 0},
        {"too many entries", colour + palette("\7\7\7", std::string(771, 'x'), 257) + mapping(3),
         kUnsupported, 0, 0},
        {"signed", colour + palette("\x87\7\7", two, 2) + mapping(3), kUnsupported, 0, 0},
        {"luminance", jp2_colour(kYcc) + palette("\7\7\7", two, 2) + mapping(3), kUnsupported, 0,
         0},
    };
    BareJpeg2000 file{.width = 9, .height = 4, .components = {{4}}};
    const std::string stream = file.encode();
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_SGL, 2, 2);
        refhost::ArrayU32 table;
        ASSERT_EQ(read(jp2_file(c.header, stream), picture, nullptr, table.out()), c.code);
        if (c.code != 0) continue;
        EXPECT_EQ(picture.record().type, ZQ_TYPE_U8);
        EXPECT_EQ(picture.at<uint8_t>(0, 0), 15) << "an index";
        ASSERT_EQ(table.elements().size(), 256U);
        EXPECT_EQ(table.elements()[0], c.first);
        EXPECT_EQ(table.elements()[1], c.second);
        EXPECT_EQ(table.elements()[2], 0U);
    }
}

TEST_F(Jpeg2000ReadTest, TellsWhatItCannotRead) {
    const auto stream_of = [](std::vector<Component> components, int layers = 1) {
        BareJpeg2000 file{.components = std::move(components)};
        file.layers = layers;
        return file.encode();
    };
    const std::string rgb = stream_of(std::vector<Component>(3)), grey = stream_of({{}});
    const std::string method_3 = jp2_box("colr", std::string("\3\0\0profile", 10));
    const auto changed = [](std::string bytes, size_t at, const std::string& by) {
        return bytes.replace(at, by.size(), by);
    };
    const std::string good = jp2_file(jp2_colour(kSrgb), rgb);
    const size_t start = good.size() - rgb.size();
    const std::string front = good.substr(0, start - 8), wide("\0\0\0\1", 4);
    struct Case {
        const char* name;
        std::string bytes;
        ZqError code;
    };
    const Case cases[] = {
        {"two layers", stream_of({{}}, 2), kLayers},
        {"two layers in a file", jp2_file(jp2_colour(kGrey), stream_of({{}}, 2)), kLayers},
        {"layers of the header", changed(grey, grey.find("\xFF\x52") + 6, std::string("\0\2", 2)),
         kLayers},
        {"inks", jp2_file(jp2_colour(kCmyk), stream_of(std::vector<Component>(4))), kColourMethod},
        {"any profile", jp2_file(method_3, rgb), kColourMethod},
        {"different bits", stream_of({{8}, {7}, {8}}), kUnsupported},
        {"different signs", stream_of({{8}, {8, true}, {8}}), kUnsupported},
        {"signed colours", stream_of(std::vector<Component>(3, {8, true})), kUnsupported},
        {"too many bits", stream_of({{17}}), kUnsupported},
        {"coarse first", stream_of({{8, false, 2, 2}, {}, {}}), kUnsupported},
        {"many components", stream_of(std::vector<Component>(17)), kUnsupported},
        {"colour of one", jp2_file(jp2_colour(kSrgb), grey), kBadHeader},
        {"one channel twice",
         jp2_file(jp2_colour(kSrgb) + jp2_definitions({{0, 0, 1}, {0, 0, 2}, {2, 0, 3}}), rgb),
         kBadHeader},
        {"no such channel",
         jp2_file(jp2_colour(kGrey) + jp2_definitions({{0, 0, 1}, {1, 1, 0}}), grey), kBadHeader},
        {"length of 64 bits", front + wide + "jp2c" + big_endian(rgb.size() + 16, 8) + rgb, 0},
        {"length of 64 bits too large", front + wide + "jp2c" + big_endian(~0ULL, 8) + rgb,
         kUnreadable},
        {"no length", changed(good, start - 8, std::string(4, '\0')), 0},
        {"length too small", changed(good, start - 8, std::string("\0\0\0\7", 4)), kBadHeader},
        {"box too long", changed(good, start - 8, std::string("\0\1\0\0", 4)), kUnreadable},
        {"no code stream", front, kUnreadable},
        {"bytes behind", good + "behind", 0},
        {"foreign boxes", front + jp2_box("uuid", "x") + jp2_box("jp2c", rgb), 0},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_HSL, 2, 2);
        const std::string before = picture.state();
        EXPECT_EQ(read(c.bytes, picture), c.code);
        EXPECT_EQ(picture.state() == before, c.code != 0);
    }
}

// Small files that announce much: refused before anything is allocated for it.
TEST_F(Jpeg2000ReadTest, RefusesWhatAFileCannotHold) {
    BareJpeg2000 file{.components = std::vector<Component>(3)};
    const std::string stream = file.encode();
    const auto sized = [&](const std::vector<uint32_t>& fields) {
        std::string bytes = stream;  // Xsiz stands behind SOC, SIZ, its length and capabilities
        for (size_t i = 0; i < fields.size(); ++i)
            bytes.replace(8 + 4 * i, 4, big_endian(fields[i], 4));
        return bytes + std::string(4096, 'x');
    };
    // With precincts of stated sizes, in pixels' powers of 2, a byte for each resolution.
    const auto divided = [&](const std::string& sizes, uint32_t side) {
        std::string bytes = stream;
        const size_t style = bytes.find("\xFF\x52") + 2;
        bytes[style + 1] = static_cast<char>(bytes[style + 1] + 3);  // length
        bytes[style + 2] = 1;
        bytes.insert(style + 12, sizes);
        if (side == 0) return bytes;
        for (const size_t field : {8, 12, 24, 28}) bytes.replace(field, 4, big_endian(side, 4));
        return bytes;
    };
    const std::string cases[] = {
        sized({60000, 60000, 0, 0, 60000, 60000, 0, 0}),
        sized({60000, 60000, 0, 0, 1, 1, 0, 0}),
        sized({250, 250, 0, 0, 1, 1, 0, 0}),
        sized({0xFFFFFFFF, 0xFFFFFFFF, 0, 0, 0xFFFFFFFF, 0xFFFFFFFF, 0, 0}),
        sized({21, 0xFFFFFFFF, 0, 0xFFFFFFF0, 21, 1, 0, 0}),
    };
    for (const std::string& bytes : cases) {
        Picture picture(ZQ_TYPE_U8, 2, 2);
        const std::string before = picture.state();
        const ZqError code = read(bytes, picture);
        EXPECT_TRUE(code == kUnreadable || code == kBadHeader) << code;
        EXPECT_EQ(picture.state(), before);
    }
    Picture picture(ZQ_TYPE_U8, 2, 2);
    EXPECT_EQ(read(divided("\xFF\xFF\xFF", 0), picture), 0);
    for (const char* sizes : {"\x11\x11\x11", "\x11\xFF\xFF", "\xFF\xFF\x31"})
        EXPECT_EQ(read(divided(sizes, 4000), picture), kUnreadable);
    BareJpeg2000 honest{.width = 1000, .height = 1000, .components = {{}}};
    honest.block = 4;
    EXPECT_EQ(read(honest.encode(), picture), 0);
}

TEST_F(Jpeg2000ReadTest, SurvivesTruncationAndDamage) {
    BareJpeg2000 file{.width = 9, .height = 7, .components = std::vector<Component>(3)};
    file.tile = 5;
    file.resolutions = 2;
    const std::string stream = file.encode();
    const std::array<ZqError, 7> known = {0,           kBadHeader,    kFileIo, kUnsupported,
                                          kUnreadable, kColourMethod, kLayers};
    const auto is_known = [&](ZqError code) {
        return std::find(known.begin(), known.end(), code) != known.end();
    };
    Picture picture(ZQ_TYPE_RGB, 9, 7);
    const std::string before = picture.state();
    for (const std::string& whole : {stream, jp2_file(jp2_colour(kSrgb), stream)}) {
        for (size_t length = 0; length < whole.size(); ++length) {
            const ZqError code = read(whole.substr(0, length), picture);
            ASSERT_TRUE(code != 0 && is_known(code)) << length << ' ' << code;
            ASSERT_EQ(picture.state(), before) << length;
        }
        for (size_t at = 0; at < whole.size(); ++at) {
            for (const char mask : {'\x01', '\x80', '\xFF'}) {
                std::string bytes = whole;
                bytes[at] = static_cast<char>(bytes[at] ^ mask);
                Picture target(ZQ_TYPE_U8, 3, 2);
                const std::string untouched = target.state();
                const ZqError code = read(bytes, target);
                ASSERT_TRUE(is_known(code)) << at << ' ' << code;
                ASSERT_TRUE(code == 0 || target.state() == untouched) << at;
            }
        }
    }
}

}  // namespace
