// TIFF files read: every layout that files have, made by hand.
#include <zlib.h>

#include <functional>
#include <limits>
#include <random>

#include "support/tiff_files.h"

namespace {

using namespace std::string_literals;
using zqtest::bare_tiff;
using zqtest::BareTiff;
using zqtest::kTiffLong;
using zqtest::kTiffRational;
using zqtest::kTiffShort;
using zqtest::packed;
using zqtest::Picture;
using zqtest::store_blocks;
using zqtest::with_field;
using zqtest::with_strip;
using Bytes = std::string;
using Samples = std::vector<uint32_t>;

constexpr ZqError kBadHeader = -1074396000, kUnreadable = -1074395989, kUnsupported = -1074395991,
                  kNoMemory = -1074396159;

using TiffReadTest = zqtest::TiffFiles;

template <class T>
void append(Bytes& bytes, std::initializer_list<uint32_t> values) {
    for (const uint32_t value : values) {
        const T narrow = static_cast<T>(value);
        bytes.append(reinterpret_cast<const char*>(&narrow), sizeof(T));
    }
}

TEST_F(TiffReadTest, ReadsEveryLayout) {
    using Pixel = std::function<void(Bytes&, const uint32_t*)>;
    const auto scaled = [](uint32_t factor, uint32_t flipped = 0) -> Pixel {
        return
            [=](Bytes& s, const uint32_t* v) { append<uint8_t>(s, {(v[0] ^ flipped) * factor}); };
    };
    const auto grey16 = [](uint32_t flipped) -> Pixel {
        return [=](Bytes& s, const uint32_t* v) { append<uint16_t>(s, {v[0] ^ flipped}); };
    };
    const Pixel grey32 = [](Bytes& s, const uint32_t* v) { append<uint32_t>(s, {v[0]}); };
    const Pixel whole = [](Bytes& s, const uint32_t* v) {
        const auto value = static_cast<float>(v[0]);
        s.append(reinterpret_cast<const char*>(&value), sizeof(value));
    };
    const Pixel signed8 = [](Bytes& s, const uint32_t* v) {
        append<uint16_t>(s, {v[0] | (v[0] > 127 ? 0xFF00U : 0U)});
    };
    const auto rgb = [](uint32_t factor) -> Pixel {
        return [=](Bytes& s, const uint32_t* v) {
            append<uint8_t>(s, {v[2] * factor, v[1] * factor, v[0] * factor, 0});
        };
    };
    const Pixel rgba = [](Bytes& s, const uint32_t* v) {
        append<uint8_t>(s, {v[2], v[1], v[0], v[3]});
    };
    const Pixel rgb16 = [](Bytes& s, const uint32_t* v) {
        append<uint16_t>(s, {v[2], v[1], v[0], 0});
    };
    const Pixel rgba16 = [](Bytes& s, const uint32_t* v) {
        append<uint16_t>(s, {v[2], v[1], v[0], v[3]});
    };
    const Pixel grey_alpha = [](Bytes& s, const uint32_t* v) {
        append<uint8_t>(s, {v[0], v[0], v[0], v[1]});
    };
    constexpr uint32_t kNone = 9;
    struct Case {
        const char* name;
        uint32_t photometric, bits, samples, extra, number;
        int32_t type, format;
        Pixel pixel;
    };
    const Case cases[] = {
        {"1 bit", 1, 1, 1, kNone, 1, ZQ_TYPE_U8, 0, scaled(255)},
        {"1 bit, white is 0", 0, 1, 1, kNone, 1, ZQ_TYPE_U8, 0, scaled(255, 1)},
        {"2 bits", 1, 2, 1, kNone, 1, ZQ_TYPE_U8, 1, scaled(85)},
        {"4 bits", 1, 4, 1, kNone, 1, ZQ_TYPE_U8, 2, scaled(17)},
        {"8 bits", 1, 8, 1, kNone, 1, ZQ_TYPE_U8, 3, scaled(1)},
        {"8 bits, white is 0", 0, 8, 1, kNone, 1, ZQ_TYPE_U8, 3, scaled(1, 255)},
        {"8 bits signed", 1, 8, 1, kNone, 2, ZQ_TYPE_I16, 3, signed8},
        {"12 bits", 1, 12, 1, kNone, 1, ZQ_TYPE_I16, 6, grey16(0)},
        {"12 bits, white is 0", 0, 12, 1, kNone, 1, ZQ_TYPE_I16, 6, grey16(0xFFF)},
        {"16 bits", 1, 16, 1, kNone, 1, ZQ_TYPE_I16, 6, grey16(0x8000)},
        {"16 bits signed", 1, 16, 1, kNone, 2, ZQ_TYPE_I16, 6, grey16(0)},
        {"32 bits", 1, 32, 1, kNone, 1, ZQ_TYPE_SGL, 13, whole},
        {"float", 1, 32, 1, kNone, 3, ZQ_TYPE_SGL, 13, grey32},
        {"1-bit indices", 3, 1, 1, kNone, 1, ZQ_TYPE_U8, 0, scaled(1)},
        {"4-bit indices", 3, 4, 1, kNone, 1, ZQ_TYPE_U8, 2, scaled(1)},
        {"8-bit indices", 3, 8, 1, kNone, 1, ZQ_TYPE_U8, 3, scaled(1)},
        {"grey and more", 1, 8, 3, 0, 1, ZQ_TYPE_U8, 3, scaled(1)},
        {"grey and alpha", 1, 8, 2, 2, 1, ZQ_TYPE_RGB, 12, grey_alpha},
        {"RGB", 2, 8, 3, kNone, 1, ZQ_TYPE_RGB, 8, rgb(1)},
        {"RGB of 4 bits", 2, 4, 3, kNone, 1, ZQ_TYPE_RGB, 8, rgb(17)},
        {"RGB and more", 2, 8, 4, 0, 1, ZQ_TYPE_RGB, 8, rgb(1)},
        {"RGB and alpha", 2, 8, 4, 2, 1, ZQ_TYPE_RGB, 12, rgba},
        {"16-bit RGB", 2, 16, 3, kNone, 1, ZQ_TYPE_RGBU64, 18, rgb16},
        {"16-bit RGB and alpha", 2, 16, 4, 2, 1, ZQ_TYPE_RGBU64, 19, rgba16},
    };
    std::mt19937 random(7);
    for (const Case& c : cases) {
        // Variants: byte order, planes, and strips of one row, of all, of three, and tiles.
        for (const uint32_t variant : {0U, 1U, 2U, 3U, 4U, 5U, 6U, 7U, 8U, 9U, 10U, 11U}) {
            const uint32_t width = Samples{1, 7, 33}[variant % 3], height = width / 2 + 5;
            SCOPED_TRACE(testing::Message() << c.name << ", variant " << variant);
            Samples samples(width * height * c.samples);
            for (uint32_t& s : samples) s = static_cast<uint32_t>(random()) >> (32 - c.bits);
            samples[0] = 0xFFFFFFFFU >> (32 - c.bits);  // 16-bit grey then needs the offset
            BareTiff file = bare_tiff(width, height, c.photometric, Samples(c.samples, c.bits));
            file.big_endian = variant % 2 == 1;
            file.fields[339] = {kTiffShort, Samples(c.samples, c.number)};
            if (c.extra != kNone)
                file.fields[338] = {kTiffShort,
                                    Samples(c.photometric == 1 ? c.samples - 1 : 1, c.extra)};
            if (c.photometric == 3)
                file.fields[320] = {kTiffShort, Samples(size_t{3} << c.bits, 0x0300)};
            const bool separate = variant / 3 % 2 == 1;
            file.fields[284].values = {separate ? 2U : 1U};
            file.tiled = variant >= 9;
            const uint32_t rows = file.tiled ? 16 : Samples{1, height, 3}[variant / 3];
            file.fields[file.tiled ? 323 : 278].values = {rows};
            if (file.tiled) file.fields[322].values = {32};
            store_blocks(file, samples, file.tiled ? 32 : width, rows, separate);
            store(file);

            Picture target(ZQ_TYPE_COMPLEX, 3, 3, 2);
            int32_t format = -1;
            ASSERT_EQ(read(target, &format), 0);
            Bytes expected;
            for (size_t i = 0; i < samples.size(); i += c.samples) c.pixel(expected, &samples[i]);
            EXPECT_EQ(target.record().type, c.type);
            EXPECT_EQ(target.record().width, static_cast<int32_t>(width));
            EXPECT_EQ(format, c.format);
            EXPECT_EQ(target.pixels(), expected);
        }
    }
}

// Runs of every length, and bytes that mean nothing; they do not heed the ends of rows.
Bytes packed_runs(size_t length, std::mt19937& random, Bytes& plain) {
    Bytes stream;
    while (plain.size() < length) {
        const size_t count = std::min<size_t>(random() % 128 + 1, length - plain.size());
        if (random() % 5 == 0) stream += '\x80';
        if (count > 1 && random() % 2 == 0) {
            const auto value = static_cast<char>(random());
            plain.append(count, value);
            stream += {static_cast<char>(257 - count), value};
        } else {
            stream += static_cast<char>(count - 1);
            for (size_t i = 0; i < count; ++i) plain += static_cast<char>(random());
            stream += plain.substr(plain.size() - count);
        }
    }
    return stream;
}

TEST_F(TiffReadTest, UnpacksRunsThatGoOnFromRowToRow) {
    std::mt19937 random(11);
    struct Case {
        uint32_t photometric, bits, samples;
        int32_t type;
    };
    for (const Case& c : {Case{1, 8, 1, ZQ_TYPE_U8}, Case{1, 16, 1, ZQ_TYPE_I16},
                          Case{2, 8, 3, ZQ_TYPE_RGB}, Case{2, 16, 3, ZQ_TYPE_RGBU64}}) {
        for (const uint32_t variant : {0U, 1U, 2U, 3U, 4U, 5U}) {
            SCOPED_TRACE(testing::Message() << c.type << ", variant " << variant);
            const uint32_t width = Samples{3, 97, 500}[variant % 3], height = 90, strip_rows = 70;
            const size_t line = size_t{width} * c.samples * c.bits / 8;
            BareTiff bare = bare_tiff(width, height, c.photometric, Samples(c.samples, c.bits));
            bare.big_endian = variant % 2 == 1;
            bare.fields[278].values = {strip_rows};
            BareTiff with_runs = bare;
            with_runs.fields[259] = {kTiffShort, {32773}};
            bare.strips.clear();
            with_runs.strips.clear();
            for (const uint32_t rows : {strip_rows, height - strip_rows}) {
                Bytes plain;
                with_runs.strips.push_back(packed_runs(line * rows, random, plain));
                bare.strips.push_back(plain);
            }
            Picture expected(ZQ_TYPE_U8), target(ZQ_TYPE_U8);
            store(bare);
            ASSERT_EQ(read(expected), 0);
            store(with_runs);
            ASSERT_EQ(read(target), 0);
            EXPECT_EQ(target.record().type, c.type);
            EXPECT_EQ(target.state(), expected.state());
            EXPECT_EQ(sample_offset(target), sample_offset(expected));

            const Bytes before = target.state();
            with_runs.strips.back().pop_back();
            store(with_runs);
            EXPECT_EQ(read(target), kUnreadable);
            EXPECT_EQ(target.state(), before);
        }
    }
}

Bytes deflated(const Bytes& plain) {
    Bytes stream(compressBound(static_cast<uLong>(plain.size())), '\0');
    auto length = static_cast<uLongf>(stream.size());
    compress(reinterpret_cast<Bytef*>(stream.data()), &length,
             reinterpret_cast<const Bytef*>(plain.data()), static_cast<uLong>(plain.size()));
    return stream.substr(0, length);
}

TEST_F(TiffReadTest, DecodesWhatItsStripsHold) {
    const BareTiff grey = bare_tiff(4, 2, 1, {8}), ink = bare_tiff(3, 1, 5, {8, 8, 8, 8});
    BareTiff doubles = with_field(bare_tiff(3, 1, 1, {64}), 339, {3});
    doubles.big_endian = true;
    BareTiff ink_planes = with_field(ink, 284, {2});
    ink_planes.strips = {"\xFF\0\x0A"s, "\0\0\x14"s, "\x80\0\x1E"s, "\0\xFF\x64"s};
    const BareTiff alpha = with_field(bare_tiff(4, 1, 2, {8, 8, 8, 8}), 338, {1});
    const BareTiff ycbcr = with_field(bare_tiff(2, 2, 6, {8, 8, 8}), 530, {2, 2});
    BareTiff overstated = with_strip(grey, 32773, "\xFD\x61\3bcde");
    overstated.fields[279] = {kTiffLong, {0x7FFFFFFF}};
    const Bytes ink_pixels = "\x7F\xFF\0\0\0\0\0\0\x88\x8E\x94\0"s;
    struct Case {
        const char* name;
        BareTiff file;
        Bytes pixels;
    };
    const Case cases[] = {
        {"PackBits", with_strip(grey, 32773, "\xFD\x61\3bcde"), "aaaabcde"},
        {"PackBits, more bytes announced than there are", overstated, "aaaabcde"},
        {"deflate", with_strip(grey, 8, deflated("abcdefgh")), "abcdefgh"},
        {"deflate, the old tag", with_strip(grey, 32946, deflated("abcdefgh")), "abcdefgh"},
        {"differences", with_field(with_strip(grey, 8, deflated("a\1\1\1b\0\0\0"s)), 317, {2}),
         "abcdbbbb"},
        // Clear, three bytes, the string of the first two, two bytes and the first again, end.
        {"LZW", with_strip(grey, 5, packed({}, {256, 'a', 'b', 'c', 258, 'd', 258, 257}, 9)),
         "abcabdab"},
        // Two rows as white as what is above them, and the end of the block.
        {"fax group 4", with_strip(bare_tiff(4, 2, 0, {1}), 4, "\xC0\x04\0\x40"s),
         Bytes(8, '\xFF')},
        {"lowest bit first",
         with_field(with_strip(bare_tiff(4, 2, 1, {1}), 1, "\x05\x0A"), 266, {2}),
         "\xFF\0\xFF\0\0\xFF\0\xFF"s},
        {"12-bit RGB", with_strip(bare_tiff(1, 1, 2, {12, 12, 12}), 1, "\0\x08\0\xFF\xF0"s),
         "\xFF\xFF\x08\x80\0\0\0\0"s},
        {"CMYK", with_strip(ink, 1, "\xFF\0\x80\0\0\0\0\xFF\x0A\x14\x1E\x64"s), ink_pixels},
        {"CMYK in planes", ink_planes, ink_pixels},
        {"premultiplied alpha",
         with_strip(alpha, 1, "\x64\x32\0\x80\5\6\7\0\1\2\3\xFF\xC8\0\0\x64"s),
         "\0\x64\xC7\x80\7\6\5\0\3\2\1\xFF\0\0\xFF\x64"s},
        {"subsampled YCbCr", with_strip(ycbcr, 1, "\x0A\x14\x1E\xC8\x80\x80"),
         "\x0A\x0A\x0A\0\x14\x14\x14\0\x1E\x1E\x1E\0\xC8\xC8\xC8\0"s},
        {"double",
         with_strip(doubles, 1,
                    "\x3F\xF8\0\0\0\0\0\0\xFF\xEF\xFF\xFF\xFF\xFF\xFF\xFF\0\0\0\0\0\0\0\0"s),
         "\0\0\xC0\x3F\0\0\x80\xFF\0\0\0\0"s},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        store(c.file);
        Picture target(ZQ_TYPE_U8, 1, 1);
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.pixels(), c.pixels);
    }
}

// Strips too large to be inflated as a whole.
TEST_F(TiffReadTest, InflatesLargeStrips) {
    constexpr uint32_t kWide = 1500, kBytes = 4200000;
    struct Case {
        const char* name;
        uint32_t bits, samples;
        bool differences, big_endian;
        size_t spoilt;  // byte of the stream, from its end; 0: none
        Bytes behind;   // the last row
        ZqError code = 0;
    };
    for (const Case& c :
         {Case{"16 bits", 16, 1, false, true, 0, ""}, Case{"differences", 8, 3, true, false, 0, ""},
          Case{"differences of 16 bits", 16, 3, true, true, 0, ""},
          Case{"a row too many", 16, 1, false, false, 0, Bytes(2 * kWide, 'x')},
          Case{"a wrong check sum", 16, 1, false, false, 1, "", kUnreadable},
          Case{"a damaged stream", 16, 1, false, false, 9000, "", kUnreadable},
          Case{"cut short", 16, 1, false, false, 0, "?", kUnreadable}}) {
        SCOPED_TRACE(c.name);
        const uint32_t high = kBytes * 8 / (kWide * c.samples * c.bits);
        BareTiff file = bare_tiff(kWide, high, c.samples == 1 ? 1 : 2, Samples(c.samples, c.bits));
        file.big_endian = c.big_endian;
        const uint32_t mask = c.bits == 8 ? 0xFF : 0x7FFF;
        const auto sample = [&](uint32_t x, uint32_t y, uint32_t i) {
            return (x * x / 64 + y * 3 + i * 71) & mask;
        };
        Bytes stored, expected;
        for (uint32_t y = 0; y < high; ++y) {
            Samples row;
            for (uint32_t x = 0; x < kWide; ++x) {
                for (uint32_t i = 0; i < c.samples; ++i) {
                    const uint32_t before = c.differences && x > 0 ? sample(x - 1, y, i) : 0;
                    row.push_back(sample(x, y, i) - before);
                }
                const Samples s = {sample(x, y, 2), sample(x, y, 1), sample(x, y, 0), 0};
                if (c.samples == 1) append<uint16_t>(expected, {s[2]});
                if (c.samples == 3 && c.bits == 8) append<uint8_t>(expected, {s[0], s[1], s[2], 0});
                if (c.samples == 3 && c.bits == 16)
                    append<uint16_t>(expected, {s[0], s[1], s[2], 0});
            }
            stored += packed(file, row, c.bits);
        }
        const bool cut = c.behind == "?";
        Bytes stream = deflated(cut ? stored : stored + c.behind);
        if (cut) stream.resize(stream.size() / 2);
        if (c.spoilt != 0) stream[stream.size() - c.spoilt] ^= 0x55;
        file = with_strip(file, 8, stream);
        if (c.differences) file.fields[317].values = {2};
        store(file);
        Picture target(ZQ_TYPE_SGL, 1, 1);
        EXPECT_EQ(read(target), c.code);
        EXPECT_EQ(target.pixels() == expected, c.code == 0);
    }
}

TEST_F(TiffReadTest, TurnsPicturesUpright) {
    const char* const expected[] = {"",       "abcdef", "cbafed", "fedcba", "defabc",
                                    "adbecf", "daebfc", "fcebda", "cfbead", "abcdef"};
    for (uint32_t orientation = 1; orientation <= 9; ++orientation) {
        SCOPED_TRACE(orientation);
        BareTiff file = with_strip(bare_tiff(3, 2, 1, {8}), 1, "abcdef");
        file.fields[274].values = {orientation};
        file.fields[282] = {kTiffRational, {2, 1}};
        file.fields[283] = {kTiffRational, {4, 1}};
        file.fields[296].values = {3};
        store(file);
        Picture target(ZQ_TYPE_U8);
        ASSERT_EQ(read(target), 0);
        const bool turned = orientation >= 5 && orientation <= 8;
        EXPECT_EQ(target.record().width, turned ? 2 : 3);
        EXPECT_EQ(target.pixels(), expected[orientation]);
        EXPECT_EQ(target.record().xStep, turned ? 0.25F : 0.5F);
    }
}

TEST_F(TiffReadTest, TurnsResolutionsIntoCalibrations) {
    struct Case {
        const char* name;
        Samples unit, x, y;  // empty: no tag
        int32_t expected;    // 77: the image's own stays
        float x_step, y_step;
    };
    for (const Case& c : {Case{"inch", {2}, {300, 1}, {100, 1}, 8, 1 / 300.0F, 0.01F},
                          Case{"centimetre", {3}, {1, 4}, {2, 1}, 4, 4, 0.5F},
                          Case{"no unit stated", {}, {2, 1}, {2, 1}, 8, 0.5F, 0.5F},
                          Case{"unit none", {1}, {2, 1}, {2, 1}, 77, 3, 3},
                          Case{"zero", {2}, {0, 1}, {2, 1}, 77, 3, 3},
                          Case{"divided by zero", {2}, {1, 0}, {2, 1}, 77, 3, 3},
                          Case{"only one", {2}, {1, 2}, {}, 77, 3, 3}}) {
        SCOPED_TRACE(c.name);
        BareTiff file = with_strip(bare_tiff(1, 1, 1, {8}), 1, "a");
        if (!c.unit.empty()) file.fields[296].values = c.unit;
        if (!c.x.empty()) file.fields[282] = {kTiffRational, c.x};
        if (!c.y.empty()) file.fields[283] = {kTiffRational, c.y};
        store(file);
        Picture target(ZQ_TYPE_U8, 1, 1);
        target.handle()->unit = 77;
        target.handle()->xStep = target.handle()->yStep = 3;
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.record().unit, c.expected);
        EXPECT_EQ(target.record().xStep, c.x_step);
        EXPECT_EQ(target.record().yStep, c.y_step);
    }
}

TEST_F(TiffReadTest, RefusesDamagedAndForeignFiles) {
    const BareTiff good = with_strip(bare_tiff(4, 2, 1, {8}), 1, "abcdefgh");
    const auto with_strips_at = [&good](const Samples& offsets, const Samples& counts) {
        BareTiff file = good;
        file.fields[273] = {kTiffLong, offsets};
        file.fields[279] = {kTiffLong, counts};
        return file;
    };
    struct Case {
        const char* name;
        BareTiff file;
        ZqError code;
    };
    const Case cases[] = {
        {"no width", with_field(good, 256, {0}), kBadHeader},
        {"no bits", with_field(good, 258, {0}), kBadHeader},
        {"no rows a strip", with_field(good, 278, {0}), kBadHeader},
        {"indices without colours", with_field(with_field(good, 258, {4}), 262, {3}), kBadHeader},
        {"RGB of one sample", with_field(good, 262, {2}), kBadHeader},
        {"no strip", with_strips_at({0}, {8}), kUnreadable},
        {"a strip behind the end", with_strips_at({5000}, {8}), kUnreadable},
        {"a strip that is too short", with_field(with_strips_at({8, 12}, {4, 3}), 278, {1}),
         kUnreadable},
        {"a deflate stream that is none", with_field(good, 259, {8}), kUnreadable},
        {"a codec that nobody knows", with_field(good, 259, {50000}), kUnsupported},
        {"complex samples", with_field(with_field(good, 258, {64}), 339, {6}), kUnsupported},
        {"8-bit floats", with_field(good, 339, {3}), kUnsupported},
        {"a colour filter", with_field(good, 262, {32803}), kUnsupported},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        store(c.file);
        Picture target(ZQ_TYPE_U8, 2, 2);
        const std::string before = target.state();
        EXPECT_EQ(read(target), c.code);
        EXPECT_EQ(target.state(), before);
    }
}

// Tiles are filled up, also the only one of a picture, which is then larger than the picture.
TEST_F(TiffReadTest, ReadsOneLargeTile) {
    constexpr uint32_t kSide = 4112;
    Bytes tile(size_t{kSide} * kSide, '\x21');
    const auto width = static_cast<int32_t>(kSide - 9);
    tile[static_cast<size_t>(width) - 1] = '\x42';
    BareTiff file = bare_tiff(kSide - 9, 2, 1, {8});
    file.tiled = true;
    file.fields[322].values = file.fields[323].values = {kSide};
    for (const bool is_deflated : {false, true}) {
        SCOPED_TRACE(is_deflated);
        store(with_strip(file, is_deflated ? 8 : 1, is_deflated ? deflated(tile) : tile));
        Picture target(ZQ_TYPE_U8, 1, 1);
        ASSERT_EQ(read(target), 0);
        EXPECT_EQ(target.record().width, width);
        const Bytes pixels = target.pixels();
        EXPECT_EQ(pixels.substr(0, static_cast<size_t>(width)),
                  tile.substr(0, static_cast<size_t>(width)));
    }
}

// A small file cannot hold these pictures, so it is refused before any memory is taken for them:
// each would need more than an image can have, which would be another error.
TEST_F(TiffReadTest, RefusesPicturesThatTheFileCannotHold) {
    // Where sizes have 32 bits the sums in libtiff itself overflow, and the header is refused.
    const auto is_refusal = [](ZqError code) {
        return code == kUnreadable || (sizeof(size_t) == 4 && code == kBadHeader);
    };
    for (const uint32_t compression : {1U, 2U, 4U, 5U, 7U, 8U, 32773U}) {
        SCOPED_TRACE(compression);
        const bool is_fax = compression == 2 || compression == 4;
        const BareTiff file = with_strip(bare_tiff(60000, 60000, 1, {is_fax ? 1U : 8U}),
                                         compression, Bytes(4096, '\0'));
        store(file);
        Picture target(ZQ_TYPE_U8, 2, 2);
        const std::string before = target.state();
        EXPECT_PRED1(is_refusal, read(target));
        // The same as one tile, which the picture hardly touches.
        BareTiff tile = with_field(with_field(file, 256, {16}), 257, {16});
        tile.tiled = true;
        tile.fields[322].values = tile.fields[323].values = {60000};
        store(tile);
        EXPECT_PRED1(is_refusal, read(target));
        store(with_field(with_field(file, 256, {0xFFFFFFFF}), 257, {0x7FFFFFFF}));
        const ZqError code = read(target);
        EXPECT_TRUE(is_refusal(code) || code == kNoMemory) << code;
        EXPECT_EQ(target.state(), before);
    }
}

}  // namespace
