// PNG: the chunks that describe a picture, byte by byte and in their order, without libpng.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <cmath>
#include <cstring>
#include <limits>

#include "refhost/refhost.h"
#include "support/bare_png.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::chunk_bytes;
using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::png_chunk;
using zqtest::with_chunks;

constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

class PngChunksTest : public testing::Test {
  protected:
    std::string written(Picture& picture, ZqArrayU32Handle* table = nullptr) {
        EXPECT_EQ(ZqWriteFileByName(path_.c_str(), picture.handle(), nullptr, "PNG", table), 0);
        return load_bytes(path_);
    }
    std::string written_with(Picture& picture, const ZqPngSettings& settings,
                             ZqArrayU32Handle* table = nullptr) {
        ZqVisionFile* file = nullptr;
        EXPECT_EQ(ZqNewVisionFile(&settings, &file), 0);
        EXPECT_EQ(ZqSetVisionPart(file, ZQ_VISION_TIMING, "t", 1), 0);
        EXPECT_EQ(ZqSetVisionPart(file, ZQ_VISION_OBJECTS, "o", 1), 0);
        EXPECT_EQ(ZqSetVisionPart(file, ZQ_VISION_PRIVATE_OBJECTS, "p", 1), 0);
        EXPECT_EQ(ZqWriteVisionFile(path_.c_str(), picture.handle(), nullptr, table, file), 0);
        ZqDisposeVisionFile(file);
        return load_bytes(path_);
    }
    ZqError read(Picture& picture, const std::string& bytes) {
        zqtest::store_bytes(path_, bytes);
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, nullptr, nullptr);
    }
    static void calibrate(Picture& picture, int32_t unit, float x, float y) {
        picture.handle()->unit = unit;
        picture.handle()->xStep = x;
        picture.handle()->yStep = y;
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.png");
};

std::string bytes(std::initializer_list<int> values) {
    std::string all;
    for (const int value : values) all += static_cast<char>(value);
    return all;
}

std::string pixel_size(float x, float y, int unit, const std::string& keyword = "ZQKEMO") {
    std::string all;
    for (const float step : {x, y}) {
        uint32_t bits = 0;
        std::memcpy(&bits, &step, sizeof(bits));
        for (int shift = 24; shift >= 0; shift -= 8) all += static_cast<char>(bits >> shift);
    }
    return all + static_cast<char>(unit) + keyword;
}

TEST_F(PngChunksTest, StandInTheirOrder) {
    refhost::ArrayU32 opaque(std::vector<uint32_t>(256, 0x010203));
    refhost::ArrayU32 translucent(std::vector<uint32_t>(256, 0x80010203));
    ZqPngSettings settings{};
    settings.gamma = 45455;
    constexpr int32_t kUsual[8] = {31270, 32900, 64000, 33000, 30000, 60000, 15000, 6000};
    std::memcpy(settings.chromaticities, kUsual, sizeof(kUsual));

    Picture wide(ZQ_TYPE_I16, 2, 2), indices(ZQ_TYPE_U8, 2, 2), colour(ZQ_TYPE_RGB, 2, 2);
    wide.at<int16_t>(0, 0) = -3;
    ASSERT_EQ(ZqSetBitDepth(wide.handle(), 12), 0);
    calibrate(indices, 0, 0, 1);
    EXPECT_EQ(zqtest::chunk_names(written_with(wide, settings)),
              "IHDR gAMA sBIT cHRM bKGD pHYs unIt scAl usBd pmTI zqEI zqEi zTXt IDAT IEND");
    const std::string palette = written_with(indices, settings, translucent.out());
    EXPECT_EQ(zqtest::chunk_names(palette),
              "IHDR gAMA cHRM PLTE tRNS bKGD pmTI zqEI zqEi zTXt IDAT IEND");
    EXPECT_EQ(chunk_bytes(palette, "gAMA"), bytes({0, 0, 0xB1, 0x8F}));
    EXPECT_EQ(chunk_bytes(palette, "cHRM").substr(4, 8), bytes({0, 0, 0x80, 0x84, 0, 0, 0xFA, 0}));
    EXPECT_EQ(zqtest::chunk_names(written(indices, opaque.out())), "IHDR PLTE bKGD zTXt IDAT IEND");
    EXPECT_EQ(zqtest::chunk_names(written(colour)), "IHDR bKGD pHYs unIt zTXt IDAT IEND");

    settings.gamma = -5;
    settings.chromaticities[1] = 2000000000;
    EXPECT_EQ(zqtest::chunk_names(written_with(indices, settings)),
              "IHDR bKGD pmTI zqEI zqEi zTXt IDAT IEND")
        << "what is no colour space is left out";

    const std::string text = chunk_bytes(written(colour), "zTXt");
    ASSERT_EQ(text.substr(0, 9), std::string("Version\0\0", 9));
    std::string version(100, '\0');
    auto length = static_cast<uLongf>(version.size());
    ASSERT_EQ(uncompress(reinterpret_cast<Bytef*>(version.data()), &length,
                         reinterpret_cast<const Bytef*>(text.data() + 9),
                         static_cast<uLong>(text.size() - 9)),
              Z_OK);
    EXPECT_EQ(version.substr(0, length), "Zorvane Kemo Vision 7.1.0");
}

TEST_F(PngChunksTest, CalibrationIsWritten) {
    struct Case {
        float x, y;
        int32_t unit;
        std::string per_unit;
        int unit_byte;
    };
    const Case cases[] = {
        {0.3F, 0.25F, 5, bytes({0, 0, 0, 3, 0, 0, 0, 4, 1}), 5},
        {0.3F, 2.0F, 3, bytes({0, 0, 0, 3, 0, 0, 0, 0, 0}), 3},
        {0.001F, 1e-12F, 12, bytes({0, 0, 3, 0xE7, 0x7F, 0xFF, 0xFF, 0x80, 0}), 12},
        {-0.5F, kNan, 0, bytes({0, 0, 0, 0, 0, 0, 0, 0, 0}), 0},
        {kInfinity, 1.0F, 300, bytes({0, 0, 0, 0, 0, 0, 0, 1, 0}), 255},
        {0.0F, 1.0F, 5, "", -1},
        {1.0F, 0.0F, 5, "", -1},
    };
    Picture picture(ZQ_TYPE_U8, 2, 2);
    for (const Case& c : cases) {
        SCOPED_TRACE(testing::Message() << c.x << ' ' << c.y << ' ' << c.unit);
        calibrate(picture, c.unit, c.x, c.y);
        const std::string file = written(picture);
        EXPECT_EQ(chunk_bytes(file, "pHYs"), c.per_unit);
        EXPECT_EQ(chunk_bytes(file, "unIt"),
                  c.unit_byte < 0 ? "" : pixel_size(c.x, c.y, c.unit_byte));
    }
}

TEST_F(PngChunksTest, CalibrationIsReadWhereItIsSound) {
    const std::string metre = png_chunk("pHYs", bytes({0, 0, 0, 4, 0, 0, 0, 2, 1}));
    const std::string shape = png_chunk("pHYs", bytes({0, 0, 0, 4, 0, 0, 0, 2, 0}));
    const std::string inches = png_chunk("unIt", pixel_size(0.5F, 3, 8));
    const std::string other = png_chunk("unIt", pixel_size(7, 7, 7));
    std::string wrong_sum = inches;
    wrong_sum.back() = static_cast<char>(wrong_sum.back() + 1);
    struct Case {
        const char* name;
        std::string chunks;
        const char* before;
        int32_t unit;
        float x, y;
    };
    const Case kept = {"", "", "IDAT", 9, 11, 12};  // what the image had
    const Case cases[] = {
        {"none", "", "IDAT", kept.unit, kept.x, kept.y},
        {"both", shape + inches, "IDAT", 8, 0.5F, 3},
        {"wrong order", inches + metre, "IDAT", 5, 0.25F, 0.5F},
        {"alone", inches, "IDAT", kept.unit, kept.x, kept.y},
        {"the first of two", shape + inches + other, "IDAT", 8, 0.5F, 3},
        {"the sound one of two", shape + wrong_sum + other, "IDAT", 7, 7, 7},
        {"wrong keyword", shape + png_chunk("unIt", pixel_size(7, 7, 7, "ZQKEMo")), "IDAT",
         kept.unit, kept.x, kept.y},
        {"wrong length", metre + png_chunk("unIt", pixel_size(7, 7, 7, "ZQKEMO!")), "IDAT", 5,
         0.25F, 0.5F},
        {"no size", metre + png_chunk("unIt", pixel_size(0, 7, 7)), "IDAT", 5, 0.25F, 0.5F},
        {"no number", metre + png_chunk("unIt", pixel_size(1, kNan, 7)), "IDAT", 5, 0.25F, 0.5F},
        {"behind the picture", metre + inches, "IEND", kept.unit, kept.x, kept.y},
        {"of no size", png_chunk("pHYs", bytes({0, 0, 0, 0, 0, 0, 0, 2, 1})), "IDAT", kept.unit,
         kept.x, kept.y},
        {"long", png_chunk("pHYs", bytes({0, 0, 0, 4, 0, 0, 0, 2, 1, 0})) + inches, "IDAT",
         kept.unit, kept.x, kept.y},
    };
    Picture source(ZQ_TYPE_U8, 2, 2), target(ZQ_TYPE_U8, 2, 2);
    calibrate(source, 0, 0, 0);
    const std::string file = written(source);
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        calibrate(target, kept.unit, kept.x, kept.y);
        ASSERT_EQ(read(target, with_chunks(file, c.before, c.chunks)), 0);
        EXPECT_EQ(target.record().unit, c.unit);
        EXPECT_EQ(target.record().xStep, c.x);
        EXPECT_EQ(target.record().yStep, c.y);
        EXPECT_EQ(target.pixels(), source.pixels());
    }
    for (const char* name : {"unIt", "zqEI"}) {
        EXPECT_EQ(read(target, with_chunks(file, "IHDR", png_chunk(name, "x"))), -1074396000);
    }
    EXPECT_EQ(
        read(target, file.substr(0, file.find("IDAT") - 4) + bytes({0x7F, -1, -1, -1}) + "unIt"),
        -1074395989)
        << "a chunk without end";
}

// Resolutions of other programs' files must not creep when a picture is read and written.
TEST_F(PngChunksTest, ResolutionsSurviveARoundTrip) {
    Picture source(ZQ_TYPE_U8, 1, 1), target(ZQ_TYPE_U8);
    calibrate(source, 0, 0, 0);
    const std::string file = written(source);
    for (int count = 1; count < 40000; count += count < 100 ? 1 : 971) {
        const std::string resolution =
            bytes({0, 0, count >> 8, count, 0, 0, count >> 9, count >> 1 | 1, 1});
        ASSERT_EQ(read(target, with_chunks(file, "IDAT", png_chunk("pHYs", resolution))), 0);
        ASSERT_EQ(chunk_bytes(written(target), "pHYs"), resolution) << count;
    }
}

TEST_F(PngChunksTest, SignificantBits) {
    struct Case {
        int32_t type, depth;
        std::string standard, own;
    };
    for (const Case& c : {Case{ZQ_TYPE_I16, 0, "\x10", ""},
                          Case{ZQ_TYPE_I16, 12, "\x0C", bytes({0, 0, 0, 12}) + "ZQKEMO"},
                          Case{ZQ_TYPE_RGBU64, 0, "\x10\x10\x10", ""},
                          Case{ZQ_TYPE_RGBU64, 8, "\x08\x08\x08", bytes({0, 0, 0, 8}) + "ZQKEMO"},
                          Case{ZQ_TYPE_U8, 0, "", ""}, Case{ZQ_TYPE_RGB, 0, "", ""}}) {
        Picture picture(c.type, 1, 1), target(ZQ_TYPE_U8);
        picture.set_pixels(std::string(Picture::pixel_bytes(c.type), '\0'));
        ASSERT_EQ(ZqSetBitDepth(picture.handle(), c.depth), 0);
        const std::string file = written(picture);
        EXPECT_EQ(chunk_bytes(file, "sBIT"), c.standard);
        EXPECT_EQ(chunk_bytes(file, "usBd"), c.own);
        int32_t depth = -1;
        ASSERT_EQ(read(target, file), 0);
        ASSERT_EQ(ZqGetBitDepth(target.handle(), &depth), 0);
        EXPECT_EQ(depth, c.depth) << "the standard chunk alone says something else";
        for (const int number : {0, 7, 17, 255}) {
            if (!c.own.empty()) break;
            const std::string nonsense = bytes({number == 255 ? 255 : 0, 0, 0, number}) + "ZQKEMO";
            ASSERT_EQ(read(target, with_chunks(file, "IDAT", png_chunk("usBd", nonsense))), 0);
            ASSERT_EQ(ZqGetBitDepth(target.handle(), &depth), 0);
            EXPECT_EQ(depth, 0) << number;
        }
    }
}

TEST_F(PngChunksTest, Background) {
    std::vector<uint32_t> entries(256, 0xFFFFFF);
    entries[9] = entries[10] = 0x102030;
    refhost::ArrayU32 table(entries);
    struct Case {
        int32_t type;
        bool palette;
        ZqPngSettings settings;
        std::string written;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, false, {}, bytes({0, 0})},
        {ZQ_TYPE_U8, false, {10, 20, 30, 0, 0, {}}, bytes({0, (770 + 3000 + 870) >> 8})},
        {ZQ_TYPE_U8, false, {999, 999, 999, 0, 0, {}}, bytes({0, 255})},
        {ZQ_TYPE_I16, false, {65535, 65535, 65535, 0, 0, {}}, bytes({255, 255})},
        {ZQ_TYPE_RGB, false, {1, 2, 300, 0, 0, {}}, bytes({0, 1, 0, 2, 0, 255})},
        {ZQ_TYPE_RGBU64, false, {1, 2, 300, 0, 0, {}}, bytes({0, 1, 0, 2, 1, 44})},
        {ZQ_TYPE_U8, true, {}, bytes({9})},
        {ZQ_TYPE_U8, true, {255, 250, 255, 0, 0, {}}, bytes({0})},
        {ZQ_TYPE_U8, true, {800, 0, 0, 0, 0, {}}, bytes({9})},
    };
    for (const Case& c : cases) {
        Picture picture(c.type, 2, 2);
        const std::string file =
            written_with(picture, c.settings, c.palette ? table.out() : nullptr);
        EXPECT_EQ(chunk_bytes(file, "bKGD"), c.written);
    }
}

}  // namespace
