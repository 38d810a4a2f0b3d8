// The quality codec of flattened images: what comes back, how true it is, and that no block,
// however damaged, does harm.
#include <gtest/gtest.h>
#include <zlib.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "base/byte_order.h"
#include "image/image.h"
#include "serialize/quality_codec.h"
#include "tests/support/thoroughness.h"

namespace zq {
namespace {

using Block = std::vector<std::uint8_t>;

constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInfinity = std::numeric_limits<float>::infinity();

std::unique_ptr<Image> make(const ImageShape& shape) {
    auto image = std::make_unique<Image>(Variant::kPrivate, std::string_view());
    image->reinitialise(shape);
    return image;
}

// The lossy samples of a pixel, and what full scale is.
struct Samples {
    int count, bytes;
    double full;
};
Samples samples_of(PixelType type) {
    constexpr Samples kSamples[] = {{1, 1, 255}, {1, 2, 65535}, {1, 4, 1},    {2, 4, 1},
                                    {3, 1, 255}, {3, 1, 255},   {3, 2, 65535}};
    return kSamples[static_cast<int>(type)];
}

double get(const Image& image, int x, int y, int channel) {
    const Samples samples = samples_of(image.type());
    const std::uint8_t* at =
        image.row(y) + x * bytes_per_pixel(image.type()) + channel * samples.bytes;
    if (samples.bytes == 1) return *at;
    if (samples.bytes == 4) {
        float value;
        std::memcpy(&value, at, sizeof(value));
        return value;
    }
    std::uint16_t value;
    std::memcpy(&value, at, sizeof(value));
    return image.type() == PixelType::kI16 ? static_cast<std::int16_t>(value) + 32768 : value;
}

// `value` is 0 to 1.
void set(const Image& image, int x, int y, int channel, double value) {
    const Samples samples = samples_of(image.type());
    std::uint8_t* at = image.row(y) + x * bytes_per_pixel(image.type()) + channel * samples.bytes;
    const int whole = static_cast<int>(std::lround(value * samples.full));
    const auto single = static_cast<float>(value);
    const auto word =
        static_cast<std::uint16_t>(image.type() == PixelType::kI16 ? whole - 32768 : whole);
    if (samples.bytes == 1) *at = static_cast<std::uint8_t>(whole);
    if (samples.bytes == 2) std::memcpy(at, &word, sizeof(word));
    if (samples.bytes == 4) std::memcpy(at, &single, sizeof(single));
}

using Paint = double (*)(int x, int y, int channel);
double soft(int x, int y, int channel) {
    return 0.45 + 0.2 * std::sin(x * 0.05 + channel) + 0.2 * std::cos(y * 0.04 + x * 0.02);
}
double gradient(int x, int y, int channel) {
    return ((channel == 0 ? x : channel == 1 ? y : x + y) % 256) / 255.0;
}
double noise(int x, int y, int channel) {
    const auto seed = static_cast<std::uint32_t>(x * 7919 + y * 104729 + channel * 1299709);
    const std::uint32_t mixed = (seed ^ seed >> 13) * 0x9E3779B1U;
    return ((mixed ^ mixed >> 15) * 0x85EBCA77U >> 24) / 255.0;
}
// Soft shapes, edges in all directions, and grain from coarse to fine.
double photograph(int x, int y, int channel) {
    double grain = 0;
    for (const int size : {1, 2, 3, 5, 11}) {
        grain += 0.02 * std::sqrt(size) * noise(x / size, y / size, channel + size);
    }
    const bool edge = (x / 23 + y / 17) % 5 == 0;
    const bool disc = std::hypot(x % 43 - 21, y % 37 - 18) < 14;
    return 0.3 * soft(x, y, channel) + (edge ? 0.2 : 0) + (disc ? 0.3 : 0) + grain;
}
double text(int x, int y, int channel) {
    return channel < 2 && noise(x / 3, y / 5, 0) < 0.4 ? 0 : 1;
}

void paint(const Image& image, Paint what) {
    for (int y = 0; y < image.record().height; ++y) {
        for (int x = 0; x < image.record().width; ++x) {
            for (int i = 0; i < samples_of(image.type()).count; ++i) {
                set(image, x, y, i, what(x, y, i));
            }
        }
    }
}

constexpr double kExact = 200;

// In decibels.
double psnr(const Image& a, const Image& b) {
    const Samples samples = samples_of(a.type());
    double sum = 0;
    for (int y = 0; y < a.record().height; ++y) {
        for (int x = 0; x < a.record().width; ++x) {
            for (int i = 0; i < samples.count; ++i) {
                const double error = get(a, x, y, i) - get(b, x, y, i);
                sum += error * error;
            }
        }
    }
    const double mean = sum / a.record().width / a.record().height / samples.count;
    return mean == 0 ? kExact : 10 * std::log10(samples.full * samples.full / mean);
}

std::string pixels_of(const Image& image) {
    std::string all;
    const auto line = static_cast<std::size_t>(image.record().width) *
                      static_cast<std::size_t>(bytes_per_pixel(image.type()));
    for (int y = 0; y < image.record().height; ++y) {
        all.append(reinterpret_cast<const char*>(image.row(y)), line);
    }
    return all;
}

// Of the same shape, filled with something else.
std::unique_ptr<Image> blank_like(const Image& image) {
    const Extent extent = image.extent();
    auto blank =
        make({static_cast<std::int32_t>(extent.type), extent.width, extent.height, extent.border});
    const auto line = static_cast<std::size_t>(extent.width) *
                      static_cast<std::size_t>(bytes_per_pixel(extent.type));
    for (int y = 0; y < extent.height; ++y) std::memset(blank->row(y), 0x55, line);
    return blank;
}

std::unique_ptr<Image> round_trip(const Image& image, int quality) {
    auto result = blank_like(image);
    decompress_pixels(*result, compress_pixels(image, quality));
    return result;
}

GRLIBError_enum decompress(Image& image, const Block& block) {
    try {
        decompress_pixels(image, block);
        return kSuccess;
    } catch (GRLIBError_enum code) {
        return code;
    }
}

TEST(QualityCodecTest, EverySizeComesBack) {
    constexpr int kSizes[][2] = {{1, 1},   {1, 7},   {7, 1},   {2, 2},     {9, 17},    {31, 33},
                                 {513, 5}, {5, 513}, {65, 64}, {70000, 2}, {2, 70000}, {0, 0}};
    for (int type = 0; type < 7; ++type) {
        for (const auto& [width, height] : kSizes) {
            SCOPED_TRACE(testing::Message() << type << ": " << width << " x " << height);
            const auto image = make({type, width, height, 2});
            paint(*image, soft);
            const bool is_long = width > 60000 || height > 60000;
            for (const int quality : {1, 75, 100}) {
                if (!zqtest::kThorough && is_long && quality != 75) continue;
                const auto back = round_trip(*image, quality);
                if (width > 0) {
                    ASSERT_GT(psnr(*image, *back), quality == 100 ? 45 : 10);
                }
            }
        }
    }
}

struct Picture {
    const char* name;
    Paint paint;
    std::int32_t width, height;
};

// At every single step (where tests are thorough), until nothing is left to get truer.
TEST(QualityCodecTest, PicturesGetTruerWithEveryQuality) {
    constexpr Picture kPictures[] = {{"photograph", photograph, 120, 90}, {"soft", soft, 96, 60}};
    for (int type = 0; type < 7; ++type) {
        for (const Picture& picture : kPictures) {
            const auto image = make({type, picture.width, picture.height, 0});
            paint(*image, picture.paint);
            double last = 0;
            for (int quality = 1; quality <= 100; quality += zqtest::kThorough ? 1 : 33) {
                const double now = psnr(*image, *round_trip(*image, quality));
                EXPECT_TRUE(now > last || now == kExact)
                    << type << ' ' << picture.name << ' ' << quality << ' ' << now << ' ' << last;
                last = now;
            }
            EXPECT_GE(last, 50) << type << ' ' << picture.name;
        }
    }
}

double stripes(int x, int y, int channel) {
    return (x + y + channel) / 7 % 2;
}
double chequers(int x, int y, int) {
    return (x / 5 + y / 5) % 2;
}

// Larger than what is always tried as a whole: pictures whose samples leave several qualities, low
// ones that have no room for strips, some of few different blocks, nearly exact ones, and text that
// is too large to be compared.
TEST(QualityCodecTest, SampledPicturesGetTruerToo) {
    constexpr struct {
        Picture picture;
        int first, last;
    } kCases[] = {
        {{"soft", soft, 1101, 203}, 1, 100},         {{"stripes", stripes, 1101, 203}, 1, 100},
        {{"gradient", gradient, 700, 300}, 80, 92},  {{"photograph", photograph, 601, 303}, 60, 75},
        {{"chequers", chequers, 1201, 901}, 65, 68}, {{"text", text, 1201, 901}, 65, 69},
        {{"text", text, 2201, 2003}, 67, 68}};
    for (const int type : {ZQ_TYPE_U8, ZQ_TYPE_RGB}) {
        if (!zqtest::kThorough && type != ZQ_TYPE_U8) continue;
        for (const auto& c : kCases) {
            const auto image = make({type, c.picture.width, c.picture.height, 0});
            paint(*image, c.picture.paint);
            double last = 0;
            const int end = zqtest::kThorough ? c.last : c.first + 1;
            for (int quality = c.first; quality <= end; ++quality) {
                const double now = psnr(*image, *round_trip(*image, quality));
                EXPECT_TRUE(now > last || now == kExact)
                    << type << ' ' << c.picture.name << ' ' << quality;
                last = now;
            }
        }
    }
}

TEST(QualityCodecTest, OtherPicturesDoNotGetWorse) {
    constexpr Picture kPictures[] = {
        {"gradient", gradient, 103, 57}, {"noise", noise, 103, 57}, {"text", text, 103, 57}};
    for (int type = 0; type < 7; ++type) {
        for (const Picture& picture : kPictures) {
            const auto image = make({type, picture.width, picture.height, 0});
            paint(*image, picture.paint);
            double last = 0;
            for (int quality = 1; quality <= 100; quality += zqtest::kThorough ? 3 : 33) {
                const double now = psnr(*image, *round_trip(*image, quality));
                ASSERT_GE(now, last) << type << ' ' << picture.name << ' ' << quality;
                last = now;
            }
            EXPECT_GE(last, 45) << type << ' ' << picture.name;
        }
    }
}

// Quality follows the values that are there, not what the type could hold.
TEST(QualityCodecTest, ImagesOfFewValuesKeepThem) {
    const auto image = make({1, 64, 64, 0});
    paint(*image, [](int x, int y, int channel) { return 0.5 + soft(x, y, channel) / 256; });
    EXPECT_GT(psnr(*image, *round_trip(*image, 50)), 75);
}

TEST(QualityCodecTest, FloatsOfEveryKindComeBackAsTheirKind) {
    constexpr float kMost = std::numeric_limits<float>::max();
    constexpr float kLeast = std::numeric_limits<float>::denorm_min();
    const std::vector<float> cases[] = {{kNaN},
                                        {kInfinity},
                                        {-kInfinity},
                                        {kNaN, kInfinity, -kInfinity},
                                        {-3e38F, 3e38F},
                                        {-kMost, kMost, 0},
                                        {kLeast, 7 * kLeast, -2 * kLeast},
                                        {kNaN, 1, 2, -kInfinity, 3},
                                        {1e-30F, kInfinity, 1e30F},
                                        {-0.0F, 0.0F}};
    for (const int type : {ZQ_TYPE_SGL, ZQ_TYPE_COMPLEX}) {
        const int parts = type == ZQ_TYPE_SGL ? 1 : 2;
        for (std::size_t number = 0; number < std::size(cases); ++number) {
            const std::vector<float>& values = cases[number];
            float lowest = kInfinity;
            float highest = -kInfinity;
            for (const float value : values) {
                if (value > -kInfinity) lowest = std::min(lowest, value);
                if (value < kInfinity) highest = std::max(highest, value);
            }
            const auto image = make({type, 19, 11, 1});
            for (int i = 0; i < 19 * 11 * parts; ++i) {
                const float value = values[static_cast<std::size_t>(i * i) % values.size()];
                std::memcpy(image->row(i / parts / 19) + i / parts % 19 * 4 * parts + i % parts * 4,
                            &value, 4);
            }
            for (const int quality : {1, 100}) {
                const auto back = round_trip(*image, quality);
                for (int i = 0; i < 19 * 11 * parts; ++i) {
                    const auto was = get(*image, i / parts % 19, i / parts / 19, i % parts);
                    const auto is = get(*back, i / parts % 19, i / parts / 19, i % parts);
                    ASSERT_EQ(std::isnan(was), std::isnan(is)) << number;
                    ASSERT_EQ(std::isinf(was), std::isinf(is)) << number;
                    if (std::isinf(was)) {
                        ASSERT_EQ(was, is) << number;
                    }
                    if (!std::isfinite(was)) continue;
                    ASSERT_TRUE(is >= lowest && is <= highest) << number;
                    if (values.size() == 1) {
                        ASSERT_EQ(was, is) << number;
                    }
                }
            }
        }
    }
}

// Reds lie on both sides of where the circle of hues closes: each stays on its side, in images that
// are tried as a whole and in larger ones.
TEST(QualityCodecTest, HuesStayOnTheirSideOfTheSeam) {
    struct Size {
        std::int32_t width, height;
    };
    for (const Size size : {Size{100, 60}, Size{500, 300}}) {
        const auto image = make({ZQ_TYPE_HSL, size.width, size.height, 0});
        paint(*image, [](int x, int y, int channel) {
            return channel < 2 ? 0.5 : (static_cast<int>(249 + 13 * noise(x, y, 5)) % 256) / 255.0;
        });
        const auto back = round_trip(*image, 40);
        for (int y = 0; y < size.height; ++y) {
            for (int x = 0; x < size.width; ++x) {
                ASSERT_LT(std::abs(image->row(y)[4 * x + 2] - back->row(y)[4 * x + 2]), 40)
                    << x << ' ' << y;
            }
        }
    }
}

TEST(QualityCodecTest, AlphaIsExact) {
    for (const int type : {ZQ_TYPE_RGB, ZQ_TYPE_HSL, ZQ_TYPE_RGBU64}) {
        for (const bool constant : {true, false}) {
            const auto image = make({type, 37, 21, 1});
            paint(*image, soft);
            const int bytes = bytes_per_pixel(image->type()) / 4;
            const auto alpha = [&](const Image& of, int i) {
                return of.row(i / 37) + (i % 37 * 4 + 3) * bytes;
            };
            for (int i = 0; i < 37 * 21; ++i) {
                std::memset(alpha(*image, i), constant ? 0xA7 : 1 + i * 5, 1);
                if (bytes == 2)
                    alpha(*image, i)[1] = static_cast<std::uint8_t>(constant ? 3 : i / 3);
            }
            const auto back = round_trip(*image, 20);
            for (int i = 0; i < 37 * 21; ++i) {
                const auto size = static_cast<std::size_t>(bytes);
                ASSERT_EQ(std::memcmp(alpha(*image, i), alpha(*back, i), size), 0) << type << i;
            }
        }
    }
}

TEST(QualityCodecTest, BordersRepeatTheNearestPixel) {
    for (int type = 0; type < 7; ++type) {
        const auto image = make({type, 6, 5, 3});
        paint(*image, gradient);
        const auto back = round_trip(*image, 90);
        const auto bytes = static_cast<std::size_t>(bytes_per_pixel(back->type()));
        for (int y = -3; y < 8; ++y) {
            for (int x = -3; x < 9; ++x) {
                const auto* nearest = back->pixel(std::clamp(x, 0, 5), std::clamp(y, 0, 4));
                ASSERT_EQ(std::memcmp(back->pixel(x, y), nearest, bytes), 0) << type << x << y;
            }
        }
    }
}

TEST(QualityCodecTest, BlocksAnnounceNoMoreThanTheirLengthAllows) {
    constexpr ImageShape kShapes[] = {{ZQ_TYPE_RGBU64, 2000, 1500, 3}, {ZQ_TYPE_U8, 3000, 1000, 0},
                                      {ZQ_TYPE_U8, 1, 1, 2000},        {ZQ_TYPE_RGB, 1, 1, 900},
                                      {ZQ_TYPE_COMPLEX, 1000, 900, 1}, {ZQ_TYPE_HSL, 900, 900, 40}};
    for (const ImageShape& shape : kShapes) {
        const auto image = make(shape);
        for (int y = 0; y < shape.height; ++y) {
            std::memset(image->row(y), 0, static_cast<std::size_t>(image->row_stride() / 2));
        }
        const auto blank = blank_like(*image);
        std::swap_ranges(blank->row(0), blank->row(0) + 1, image->row(0));
        const Block block = compress_pixels(*blank, 1);
        EXPECT_GE(block.size() * kMostExpansion, lay_out(image->extent()).buffer_bytes);
        EXPECT_EQ(decompress(*image, block), kSuccess);
    }
}

void mend(Block& block) {
    if (block.size() < 24) return;
    const auto length = std::min<std::size_t>(load_le32(block.data() + 16), block.size() - 24);
    const uLong head = adler32(1, block.data(), 20);
    const uLong sum = adler32(head, block.data() + 24, static_cast<uInt>(length));
    store_le32(block.data() + 20, static_cast<std::uint32_t>(sum));
}

// Two of the pictures have what is kept exactly in planes of its own.
TEST(QualityCodecTest, DamagedBlocksLeaveTheImageAlone) {
    for (int type = 0; type < 7; ++type) {
        const auto image = make({type, 11, 9, 0});
        paint(*image, soft);
        if (type == ZQ_TYPE_SGL) set(*image, 3, 3, 0, kNaN);
        if (type == ZQ_TYPE_RGB) image->row(4)[11] = 200;
        const Block good = compress_pixels(*image, 80);
        const auto target = blank_like(*image);
        const std::string before = pixels_of(*target);
        const auto expect_refused = [&](const Block& block) {
            ASSERT_EQ(decompress(*target, block), kInitializationError) << type;
            ASSERT_EQ(pixels_of(*target), before) << type;
        };
        // Behind the check sum anything may come out, but only whole.
        const auto expect_harmless = [&](Block block) {
            mend(block);
            const auto other = blank_like(*image);
            if (decompress(*other, block) != kSuccess) {
                ASSERT_EQ(pixels_of(*other), before) << type;
            }
        };
        for (std::size_t i = 0; i < good.size(); ++i) {
            const Block cut(good.begin(), good.begin() + static_cast<std::ptrdiff_t>(i));
            expect_refused(cut);
            if (i >= 24) {
                Block shorter = cut;
                store_le32(shorter.data() + 16, static_cast<std::uint32_t>(i - 24));
                expect_harmless(shorter);
            }
            for (const int change : {1, 0x80, 0xFF, 2 + static_cast<int>(i % 61)}) {
                Block changed = good;
                changed[i] = static_cast<std::uint8_t>(changed[i] ^ change);
                // The quality is told, not used: a changed one is caught by the check sum.
                expect_refused(changed);
                expect_harmless(changed);
            }
        }
    }
}

TEST(QualityCodecTest, BlocksOfOtherImagesAreRefused) {
    const auto image = make({ZQ_TYPE_U8, 12, 10, 1});
    paint(*image, soft);
    const Block block = compress_pixels(*image, 75);
    constexpr ImageShape kOthers[] = {{ZQ_TYPE_I16, 12, 10, 1},
                                      {ZQ_TYPE_U8, 10, 12, 1},
                                      {ZQ_TYPE_U8, 0, 0, 1},
                                      {ZQ_TYPE_HSL, 12, 10, 0}};
    for (const ImageShape& other : kOthers) {
        EXPECT_EQ(decompress(*make(other), block), kInitializationError);
    }
    EXPECT_EQ(decompress(*make({ZQ_TYPE_U8, 12, 10, 7}), block), kSuccess);

    // A picture that is too large for so short a block, with nothing else wrong.
    Block tiny = compress_pixels(*make({ZQ_TYPE_I16, 1, 1, 0}), 75);
    store_le32(tiny.data() + 8, 5000);
    store_le32(tiny.data() + 12, 4000);
    mend(tiny);
    EXPECT_EQ(decompress(*make({ZQ_TYPE_I16, 5000, 4000, 0}), tiny), kInitializationError);
}

}  // namespace
}  // namespace zq
