// JPEG 2000 as written: what comes back, what a plain use of OpenJPEG sees, and the options.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <vector>

#include "refhost/refhost.h"
#include "support/bare_jpeg2000.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::store_bytes;

constexpr ZqError kInvalidParameter = -1074395997, kLosslessFloat = -1074396060,
                  kWavelet = -1074395953, kBadFormat = -1074395986, kType = -1074396077;

class Jpeg2000WriteTest : public testing::Test {
  protected:
    ZqError write(Picture& picture, const ZqWriteOptions* options = nullptr,
                  ZqArrayU32Handle* table = nullptr) {
        return ZqWriteFileByCode(path_.c_str(), picture.handle(), options, 7, table);
    }
    ZqError read(Picture& picture, ZqArrayU32Handle* table = nullptr) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, nullptr, table);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.jp2");
};

void clear_alpha(Picture& picture) {
    std::string pixels = picture.pixels();
    const size_t channel = picture.record().type == ZQ_TYPE_RGB ? 1 : 2;
    for (size_t i = 3 * channel; i < pixels.size(); i += 4 * channel)
        std::fill_n(pixels.begin() + static_cast<ptrdiff_t>(i), channel, '\0');
    picture.set_pixels(pixels);
}

TEST_F(Jpeg2000WriteTest, KeepsEveryPixel) {
    struct Case {
        int32_t type, width, height;
        bool alpha;
    };
    const Case cases[] = {{ZQ_TYPE_U8, 1, 1, false},      {ZQ_TYPE_U8, 1, 40, false},
                          {ZQ_TYPE_U8, 70, 33, false},    {ZQ_TYPE_I16, 17, 9, false},
                          {ZQ_TYPE_RGB, 70, 33, false},   {ZQ_TYPE_RGB, 31, 2, true},
                          {ZQ_TYPE_RGBU64, 19, 8, false}, {ZQ_TYPE_RGBU64, 33, 21, true}};
    const std::pair<const char*, bool> names[] = {
        {"a.jp2", false}, {"b.J2K", true}, {"c.jpc", true}, {"d.j2c", true}, {"none", false}};
    for (const auto& [name, plain] : names) {
        path_ = folder_.path(name);
        for (const Case& c : cases) {
            SCOPED_TRACE(testing::Message() << name << ' ' << c.type << ' ' << c.width);
            Picture picture(c.type, c.width, c.height), target(ZQ_TYPE_SGL);
            if (!c.alpha && c.type != ZQ_TYPE_U8 && c.type != ZQ_TYPE_I16) clear_alpha(picture);
            ASSERT_EQ(write(picture), 0);
            const std::string magic = plain ? "\xFF\x4F\xFF\x51" : std::string("\0\0\0\x0CjP  ", 8);
            EXPECT_EQ(load_bytes(path_).substr(0, magic.size()), magic);
            ASSERT_EQ(read(target), 0);
            if (plain && c.alpha)
                clear_alpha(picture);  // a code stream cannot tell it from anything else
            EXPECT_EQ(target.state(), picture.state());
        }
    }
}

TEST_F(Jpeg2000WriteTest, KeepsGreysOf16Bits) {
    struct Case {
        const char* name;
        int16_t lowest, highest;
        int32_t depth;
        bool moved;
        char depth_field;  // of the image header: bits - 1, the highest bit means signed
    };
    const Case cases[] = {
        {"unsigned", 0, 32767, 0, false, 15},
        {"signed", -5, 100, 0, false, '\x8F'},
        {"of 12 bits", 0, 4095, 12, false, 11},
        {"more than its 12 bits", 0, 4096, 12, false, 15},
        {"signed with a depth", -1, 5, 12, false, '\x8F'},
        {"moved", -32768, 32767, 0, true, 15},
        {"moved, all negative", -32768, -5, 0, true, '\x8F'},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_I16, 6, 4), target(ZQ_TYPE_U8);
        if (c.moved) {  // what a file with samples of the whole range leaves behind
            zqtest::BareJpeg2000 file{.width = 6, .height = 4, .components = {{16}}};
            store_bytes(path_, file.encode());
            ASSERT_EQ(read(picture), 0);
        }
        for (int32_t x = 0; x < 6; ++x) {
            for (int32_t y = 0; y < 4; ++y)
                picture.at<int16_t>(x, y) = x % 2 == 0 ? c.lowest : c.highest;
        }
        ASSERT_EQ(ZqSetBitDepth(picture.handle(), c.depth), 0);
        ASSERT_EQ(write(picture), 0);
        const std::string file = load_bytes(path_);
        EXPECT_EQ(file[file.find("ihdr") + 14], c.depth_field);
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.state(), picture.state());
        int32_t depth = -1;
        EXPECT_EQ(ZqGetBitDepth(target.handle(), &depth), 0);
        EXPECT_EQ(depth, c.depth_field == 11 ? 12 : 0);
    }
}

TEST_F(Jpeg2000WriteTest, KeepsColourTables) {
    Picture picture(ZQ_TYPE_U8, 40, 30), target(ZQ_TYPE_SGL);
    const ZqWriteOptions poor = {1, {10, 0, 0}};
    for (const uint32_t alpha : {0U, 0x7F000000U}) {
        std::array<uint32_t, 256> entries{};
        for (uint32_t i = 0; i < 256; ++i) entries[i] = (i * 0x010305 & 0xFFFFFF) | (i & 1) * alpha;
        refhost::ArrayU32 table(entries), out;
        ASSERT_EQ(write(picture, &poor, table.out()), 0);
        ASSERT_EQ(read(target, out.out()), 0);
        EXPECT_EQ(target.state(), picture.state()) << "indices are exact at any quality";
        EXPECT_EQ(out.elements(), std::vector<uint32_t>(entries.begin(), entries.end()));
        store_bytes(folder_.path("x.j2k"), "old");
        EXPECT_EQ(ZqWriteFileByCode(folder_.path("x.j2k").c_str(), picture.handle(), nullptr, 7,
                                    table.out()),
                  kBadFormat);
        EXPECT_EQ(load_bytes(folder_.path("x.j2k")), "old");
    }
}

int value_of(const std::string& pixels, size_t i, int32_t type) {
    const bool wide = type == ZQ_TYPE_I16 || type == ZQ_TYPE_RGBU64;
    const auto byte = [&](size_t at) { return static_cast<uint8_t>(pixels[at]); };
    return wide ? byte(i / 2 * 2) + 256 * byte(i / 2 * 2 + 1) : byte(i);
}

TEST_F(Jpeg2000WriteTest, GetsBetterWithTheQuality) {
    for (const int32_t type : {ZQ_TYPE_U8, ZQ_TYPE_I16, ZQ_TYPE_RGB, ZQ_TYPE_RGBU64}) {
        Picture picture(type, 128, 96), target(ZQ_TYPE_U8);
        const bool wide = type == ZQ_TYPE_I16 || type == ZQ_TYPE_RGBU64;
        const double most = type == ZQ_TYPE_I16 ? 32767 : wide ? 65535 : 255;
        std::string pixels = picture.pixels();
        const size_t channels = type == ZQ_TYPE_RGB || type == ZQ_TYPE_RGBU64 ? 4 : 1;
        for (size_t i = 0, n = 0; i < pixels.size(); i += wide ? 2 : 1, ++n) {
            const double x = static_cast<double>(n / channels % 128),
                         y = static_cast<double>(n) / static_cast<double>(128 * channels);
            const double noise = static_cast<double>(n * 2654435761U % 1024) / 1024 - 0.5;
            const double wave = 0.5 + 0.4 * std::sin(0.2 * x) * std::cos(0.13 * y) + 0.15 * noise;
            const int value = channels == 4 && n % 4 == 3 ? 0 : static_cast<int>(most * wave);
            pixels[i] = static_cast<char>(value);
            if (wide) pixels[i + 1] = static_cast<char>(value >> 8);
        }
        picture.set_pixels(pixels);
        for (const int32_t wavelet : {0, 1, 2}) {
            double last_error = 1e300;
            size_t last_size = 0;
            for (const int32_t quality : {0, 1, 100, 250, 500, 750, 900, 999, 1000}) {
                SCOPED_TRACE(testing::Message() << type << ' ' << wavelet << ' ' << quality);
                const ZqWriteOptions options = {1, {quality, 0, wavelet}};
                ASSERT_EQ(write(picture, &options), 0);
                ASSERT_EQ(read(target), 0);
                const std::string seen = target.pixels();
                ASSERT_EQ(seen.size(), pixels.size());
                double error = 0;
                for (size_t i = 0; i < seen.size(); i += wide ? 2 : 1)
                    error += std::pow(value_of(seen, i, type) - value_of(pixels, i, type), 2);
                const size_t size = load_bytes(path_).size();
                EXPECT_LE(error, last_error);
                EXPECT_GE(size, last_size);
                const double rms =
                    std::sqrt(error * (wide ? 2 : 1) / static_cast<double>(seen.size()));
                const double exact = wavelet == 2 ? 0.003 : 1e-9;
                EXPECT_LT(rms, most * (quality == 1000 ? exact : quality >= 750 ? 0.015 : 1));
                EXPECT_TRUE(quality != 0 || rms > most * 0.01) << "something was gained";
                last_error = error;
                last_size = size;
            }
        }
        const ZqWriteOptions lossless = {1, {10, 1, 0}}, integer = {1, {10, 1, 1}};
        for (const ZqWriteOptions* options : {&lossless, &integer}) {
            ASSERT_EQ(write(picture, options), 0);
            ASSERT_EQ(read(target), 0);
            EXPECT_TRUE(target.pixels() == pixels);
        }
    }
}

TEST_F(Jpeg2000WriteTest, RefusesWhatItCannotWrite) {
    struct Case {
        int32_t type, width;
        std::array<int32_t, 3> words;
        ZqError code;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 4, {-1, 0, 0}, kInvalidParameter},
        {ZQ_TYPE_U8, 4, {1001, 0, 0}, kInvalidParameter},
        {ZQ_TYPE_U8, 4, {750, 2, 0}, kInvalidParameter},
        {ZQ_TYPE_U8, 4, {750, 0, 3}, kWavelet},
        {ZQ_TYPE_U8, 4, {750, 0, -1}, kWavelet},
        {ZQ_TYPE_RGB, 4, {750, 1, 2}, kLosslessFloat},
        {ZQ_TYPE_U8, 0, {750, 0, 0}, -1074396154},
        {ZQ_TYPE_SGL, 4, {750, 0, 0}, kType},
        {ZQ_TYPE_COMPLEX, 4, {750, 0, 0}, kType},
        {ZQ_TYPE_HSL, 4, {750, 0, 0}, kType},
    };
    store_bytes(path_, "old");
    for (const Case& c : cases) {
        Picture picture(c.type, c.width, c.width);
        const ZqWriteOptions options = {1, {c.words[0], c.words[1], c.words[2]}};
        EXPECT_EQ(write(picture, &options), c.code) << c.type << ' ' << c.words[0];
        EXPECT_EQ(load_bytes(path_), "old");
        EXPECT_EQ(folder_.count(), 1);
    }
}

}  // namespace
