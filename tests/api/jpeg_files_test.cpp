// JPEG: every layout that files have, against plain loops over libjpeg; what is written, by its
// markers.
#include <gtest/gtest.h>
#include <zqvissvc/files.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <cstdlib>

#include "support/bare_jpeg.h"
#include "support/picture.h"
#include "support/scratch_folder.h"

namespace {

using zqtest::BareJpeg;
using zqtest::find_marker;
using zqtest::load_bytes;
using zqtest::Picture;
using zqtest::store_bytes;

constexpr ZqError kBadHeader = -1074396000, kInvalidParameter = -1074395997, kFileIo = -1074395993,
                  kUnsupported = -1074395991, kUnreadable = -1074395989;

// Smooth enough to be a photograph, with something in every block.
std::string waves(uint32_t width, uint32_t height, int channels) {
    std::string samples;
    for (uint32_t y = 0; y < height; ++y) {
        for (uint32_t x = 0; x < width; ++x) {
            for (int c = 0; c < channels; ++c) {
                const double wave = std::sin(0.2 * x + c) * std::cos(0.15 * y - c);
                samples += static_cast<char>(static_cast<int>(128 + 120 * wave));
            }
        }
    }
    return samples;
}

class JpegFilesTest : public testing::Test {
  protected:
    ZqError write(Picture& picture, const ZqWriteOptions* options = nullptr) {
        return ZqWriteFileByCode(path_.c_str(), picture.handle(), options, 3, nullptr);
    }
    ZqError read(Picture& picture, int32_t* format = nullptr) {
        return ZqReadFile(picture.handle(), path_.c_str(), nullptr, nullptr, format, nullptr);
    }
    ZqError read(const std::string& bytes, Picture& picture) {
        store_bytes(path_, bytes);
        return read(picture);
    }
    std::string bare_bytes(BareJpeg picture) {
        picture.samples = waves(picture.width, picture.height, picture.components);
        zqtest::write_bare_jpeg(path_, picture);
        return load_bytes(path_);
    }

    zqtest::ScratchFolder folder_;
    std::string path_ = folder_.path("picture.jpg");
};

const BareJpeg kGrey = {.components = 1,
                        .given = JCS_GRAYSCALE,
                        .stored = JCS_GRAYSCALE,
                        .h_sampling = 1,
                        .v_sampling = 1};
const BareJpeg kInk = {.components = 4, .given = JCS_CMYK, .stored = JCS_CMYK};

TEST_F(JpegFilesTest, ReadsEveryLayout) {
    struct Case {
        const char* name;
        BareJpeg file;
    };
    const auto with = [](BareJpeg file, auto change) {
        change(file);
        return file;
    };
    const Case cases[] = {
        {"colour", {}},
        {"full colour", with({}, [](auto& f) { f.h_sampling = f.v_sampling = 1; })},
        {"upright halves", with({}, [](auto& f) { f.h_sampling = 1; })},
        {"quarters", with({},
                          [](auto& f) {
                              f.h_sampling = 4;
                              f.v_sampling = 1;
                          })},
        {"progressive", with({}, [](auto& f) { f.progressive = true; })},
        {"arithmetic coding", with({}, [](auto& f) { f.arithmetic = true; })},
        {"restart markers", with({}, [](auto& f) { f.restart = 1; })},
        {"stored as RGB", with({},
                               [](auto& f) {
                                   f.stored = JCS_RGB;
                                   f.h_sampling = f.v_sampling = 1;
                               })},
        {"grey", kGrey},
        {"progressive grey", with(kGrey, [](auto& f) { f.progressive = true; })},
        {"inks", kInk},
        {"inks as YCCK", with(kInk, [](auto& f) { f.stored = JCS_YCCK; })},
        {"inks that count themselves", with(kInk, [](auto& f) { f.adobe_marker = false; })},
    };
    for (const Case& c : cases) {
        for (const uint32_t width : {1U, 7U, 16U, 33U, 2100U}) {
            if (width == 2100 && &c != cases) continue;
            SCOPED_TRACE(testing::Message() << c.name << ' ' << width);
            BareJpeg file = c.file;
            file.width = width;
            file.height = width == 2100 ? 1050 : width + 3;  // the largest goes past the cache
            bare_bytes(file);
            const bool grey = file.components == 1, inks = file.components == 4;
            const BareJpeg plain = zqtest::read_bare_jpeg(path_, grey   ? JCS_GRAYSCALE
                                                                 : inks ? JCS_CMYK
                                                                        : JCS_RGB);
            std::string expected = grey ? plain.samples : "";
            for (size_t i = 0; !grey && i < plain.samples.size(); i += grey ? 1 : inks ? 4 : 3) {
                const auto sample = [&](size_t channel) {
                    const double s = static_cast<uint8_t>(plain.samples[i + channel]);
                    return file.adobe_marker ? s : 255 - s;
                };
                for (const size_t channel : {2, 1, 0}) {
                    expected +=
                        static_cast<char>(inks ? std::lround(sample(channel) * sample(3) / 255)
                                               : plain.samples[i + channel]);
                }
                expected += '\0';
            }
            Picture picture(ZQ_TYPE_SGL, 2, 2);
            int32_t format = 0;
            ASSERT_EQ(read(picture, &format), 0);
            EXPECT_EQ(picture.record().type, grey ? ZQ_TYPE_U8 : ZQ_TYPE_RGB);
            EXPECT_EQ(format, grey ? 3 : 8);
            EXPECT_TRUE(picture.pixels() == expected);
        }
    }
}

TEST_F(JpegFilesTest, WritesByTheQuality) {
    struct Case {
        int32_t quality;  // negative: no options
        int step;         // of luminance's lowest frequency
        int sampling;
    };
    const Case cases[] = {{-1, 8, 0x22},   {0, 255, 0x22},  {10, 255, 0x22},
                          {500, 16, 0x22}, {504, 16, 0x22}, {750, 8, 0x22},
                          {899, 3, 0x22},  {900, 3, 0x11},  {1000, 1, 0x11}};
    const BareJpeg wave = {.width = 40, .height = 30, .samples = waves(40, 30, 4)};
    Picture colour(ZQ_TYPE_RGB, 40, 30), grey(ZQ_TYPE_U8, 40, 30);
    colour.set_pixels(wave.samples);
    grey.set_pixels(waves(40, 30, 1));
    for (const Case& c : cases) {
        SCOPED_TRACE(c.quality);
        const ZqWriteOptions options = {c.quality < 0 ? 0 : 8, {c.quality, 0, 0}};
        for (Picture* picture : {&colour, &grey}) {
            ASSERT_EQ(write(*picture, &options), 0);
            const std::string file = load_bytes(path_);
            const size_t frame = find_marker(file, 0xC0), steps = find_marker(file, 0xDB);
            ASSERT_NE(frame, std::string::npos) << "baseline";
            EXPECT_EQ(file.substr(frame, 5), std::string("\x08\0\x1E\0\x28", 5));
            EXPECT_EQ(file[frame + 5], picture == &grey ? 1 : 3);
            EXPECT_EQ(file[frame + 7], picture == &grey ? 0x11 : c.sampling);
            EXPECT_EQ(static_cast<uint8_t>(file[steps + 1]), c.step);
        }
    }
    // Now at quality 1000: what another reader sees.
    ASSERT_EQ(zqtest::read_bare_jpeg(path_, JCS_GRAYSCALE).width, 40U);
    ASSERT_EQ(write(colour, nullptr), 0);
    const std::string native = load_bytes(path_);
    std::string packed;
    for (size_t i = 0; i < wave.samples.size(); i += 4) packed += wave.samples.substr(i, 3);
    ASSERT_EQ(Gen_SaveBuffer(path_.c_str(), packed.data(), 24, 4, 40, 30), 0);
    EXPECT_TRUE(load_bytes(path_) == native) << "the same pixels, packed";
    const ZqWriteOptions best = {1, {1000, 0, 0}};
    ASSERT_EQ(write(colour, &best), 0);
    const BareJpeg seen = zqtest::read_bare_jpeg(path_, JCS_RGB);
    for (size_t i = 0; i < packed.size(); ++i) {
        const int other = static_cast<uint8_t>(seen.samples[i / 3 * 3 + 2 - i % 3]);
        ASSERT_LE(std::abs(static_cast<uint8_t>(packed[i]) - other), 4) << i;
    }
}

TEST_F(JpegFilesTest, KeepsTheDensity) {
    struct Case {
        const char* name;
        int32_t unit;
        float x_step, y_step;
        std::array<uint8_t, 5> written;  // unit, x, y big-endian
        int32_t unit_read;
    };
    constexpr float kNan = std::numeric_limits<float>::quiet_NaN();
    const Case cases[] = {
        {"none", 0, 1, 1, {0, 0, 1, 0, 1}, 0},
        {"inches", 8, 300, 600.4F, {1, 1, 44, 2, 88}, 8},
        {"centimetres", 4, 118.5F, 1, {2, 0, 119, 0, 1}, 4},
        {"metres have no code", 5, 10, 20, {0, 0, 10, 0, 20}, 0},
        {"too small", 4, 0.01F, 0, {2, 0, 1, 0, 1}, 4},
        {"too large", 4, 70000, 1e30F, {2, 255, 255, 255, 255}, 4},
        {"no numbers", 4, -5, kNan, {2, 0, 1, 0, 1}, 4},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_U8, 4, 4), target(ZQ_TYPE_U8);
        picture.handle()->unit = c.unit;
        picture.handle()->xStep = c.x_step;
        picture.handle()->yStep = c.y_step;
        ASSERT_EQ(write(picture), 0);
        std::string file = load_bytes(path_);
        const size_t density = find_marker(file, 0xE0) + 7;
        EXPECT_EQ(file.substr(density, 5), std::string(c.written.begin(), c.written.end()));
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.record().unit, c.unit_read);
        EXPECT_EQ(target.record().xStep, static_cast<float>(c.written[1] * 256 + c.written[2]));
        EXPECT_EQ(target.record().yStep, static_cast<float>(c.written[3] * 256 + c.written[4]));

        target.handle()->unit = 77;
        file[density + 3] = file[density + 4] = 0;  // a density of nothing says nothing
        ASSERT_EQ(read(file, target), 0);
        EXPECT_EQ(target.record().unit, 77);
        file[density - 7] = 'X';  // no JFIF any more
        ASSERT_EQ(read(file, target), 0);
        EXPECT_EQ(target.record().unit, 77);
    }
}

TEST_F(JpegFilesTest, RefusesWhatItCannotWrite) {
    store_bytes(path_, "old");
    const ZqWriteOptions below = {1, {-1, 0, 0}}, above = {1, {1001, 0, 0}};
    struct Case {
        int32_t type, width, height;
        const ZqWriteOptions* options;
        ZqError code;
    };
    const Case cases[] = {
        {ZQ_TYPE_U8, 4, 4, &below, kInvalidParameter},
        {ZQ_TYPE_U8, 4, 4, &above, kInvalidParameter},
        {ZQ_TYPE_U8, 0, 0, nullptr, -1074396154},
        {ZQ_TYPE_I16, 4, 4, nullptr, -1074396077},
        {ZQ_TYPE_HSL, 4, 4, nullptr, -1074396077},
        {ZQ_TYPE_RGBU64, 4, 4, nullptr, -1074396077},
        {ZQ_TYPE_U8, 65501, 1, nullptr, -1074396074},
        {ZQ_TYPE_RGB, 1, 65501, nullptr, -1074396074},
    };
    for (const Case& c : cases) {
        Picture picture(c.type, c.width, c.height);
        EXPECT_EQ(write(picture, c.options), c.code) << c.type << ' ' << c.width;
        EXPECT_EQ(load_bytes(path_), "old");
        EXPECT_EQ(folder_.count(), 1);
    }
    Picture largest(ZQ_TYPE_U8, 65500, 1), target(ZQ_TYPE_U8);
    EXPECT_EQ(write(largest), 0);
    EXPECT_EQ(read(target), 0);
    EXPECT_EQ(target.record().width, 65500);
}

TEST_F(JpegFilesTest, RefusesEveryTruncation) {
    BareJpeg small = {.width = 9, .height = 5};
    BareJpeg grey = kGrey;
    grey.width = grey.height = 9;
    for (BareJpeg file : {small, grey}) {
        for (const bool progressive : {false, true}) {
            file.progressive = progressive;
            size_t length = bare_bytes(file).size();
            Picture picture(ZQ_TYPE_RGB, 9, 5);
            ASSERT_EQ(read(picture), 0);
            const std::string before = picture.state();
            while (length-- > 0) {
                std::filesystem::resize_file(path_, length);
                ASSERT_EQ(read(picture), length < 18 ? kFileIo : kUnreadable) << length;
                ASSERT_EQ(picture.state(), before);
            }
        }
    }
}

// Made-up pixels are refused, harmless oddities are not.
TEST_F(JpegFilesTest, TellsDamageFromOddities) {
    BareJpeg shape = kGrey;
    shape.width = shape.height = 64;
    shape.restart = 4;
    const std::string file = bare_bytes(shape);
    shape.restart = 0;
    shape.progressive = true;
    const std::string progressive = bare_bytes(shape);
    BareJpeg drawing = {.width = 2000, .height = 2000, .arithmetic = true};
    drawing.samples.assign(size_t{2000} * 2000 * 3, 'w');
    zqtest::write_bare_jpeg(path_, drawing);
    const std::string blank = load_bytes(path_);
    const size_t frame = find_marker(file, 0xC0), blank_frame = find_marker(blank, 0xC9),
                 jfif = find_marker(file, 0xE0), restart = file.find("\xFF\xD3"),
                 last_scan = progressive.rfind("\xFF\xDA"), end = file.size() - 2;
    const auto changed = [](std::string bytes, size_t at, size_t count, const std::string& by) {
        return bytes.replace(at, count, by);
    };
    std::string scans = progressive.substr(0, last_scan);
    const std::string scan = progressive.substr(last_scan, progressive.size() - 2 - last_scan);
    for (int i = 0; i < 600; ++i) scans += scan;
    struct Case {
        const char* name;
        std::string bytes;
        ZqError code;
    };
    const Case cases[] = {
        {"as it is", file, 0},
        {"bytes behind the end", file + "behind", 0},
        {"bytes before the end", changed(file, end, 0, std::string(5, '\0')), 0},
        {"a later JFIF", changed(file, jfif + 5, 1, "\x02"), 0},
        {"pixels end early", changed(file, restart, end - restart, ""), kUnreadable},
        {"another restart marker", changed(file, restart + 1, 1, "\xD5"), kUnreadable},
        {"no code", changed(file, restart + 2, 6, std::string("\xFF\0\xFF\0\xFF\0", 6)),
         kUnreadable},
        {"60000 by 60000", changed(file, frame + 1, 4, "\xEA\x60\xEA\x60"), kUnreadable},
        {"a blank drawing", blank, 0},
        {"the same, 60000 by 60000", changed(blank, blank_frame + 1, 4, "\xEA\x60\xEA\x60"),
         kUnreadable},
        {"12 bits", changed(file, frame, 1, "\x0C"), kBadHeader},
        {"no width", changed(file, frame + 3, 2, std::string(2, '\0')), kBadHeader},
        {"unknown coding", changed(file, frame - 3, 1, "\xC3"), kBadHeader},
        {"no pixels", file.substr(0, frame - 4) + "\xFF\xD9", kBadHeader},
        {"600 scans", scans + "\xFF\xD9", kUnreadable},
        {"another start", changed(file, 2, 1, "\xFE"), kUnsupported},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        Picture picture(ZQ_TYPE_RGB, 3, 3);
        const std::string before = picture.state();
        EXPECT_EQ(read(c.bytes, picture), c.code);
        EXPECT_EQ(picture.state() == before, c.code != 0);
    }
    BareJpeg two = {.width = 8,
                    .height = 8,
                    .components = 2,
                    .given = JCS_UNKNOWN,
                    .stored = JCS_UNKNOWN,
                    .h_sampling = 1,
                    .v_sampling = 1};
    Picture picture(ZQ_TYPE_RGB, 3, 3);
    EXPECT_EQ(read(bare_bytes(two), picture), kBadHeader);
}

}  // namespace
