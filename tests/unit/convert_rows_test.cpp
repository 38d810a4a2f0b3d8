// Pixel by pixel: every pair of types against the rules in plain arithmetic, on every set of vector
// instructions; and shapes of whole images.
#include "convert/convert_rows.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <bit>
#include <cmath>
#include <complex>
#include <cstring>
#include <limits>
#include <random>
#include <vector>

#include "convert/convert_image.h"
#include "image/memory.h"
#include "kernels/colour_model.h"
#include "support/simd_targets.h"
#include "support/thoroughness.h"

namespace zq {
namespace {

using Type = PixelType;
using Bytes = std::vector<std::uint8_t>;

template <class Channel>
struct Colour {
    Channel blue, green, red, alpha;  // or luminance, saturation, hue
};
using Rgb = Colour<std::uint8_t>;
using RgbU64 = Colour<std::uint16_t>;

// ---- The rules, worded plainly.

std::uint8_t reduced(std::int32_t value, std::int32_t depth) {
    if (value < 0) return 0;
    if (depth == 0) return static_cast<std::uint8_t>(value > 255 ? 255 : value);
    if ((value & (0xFFFF << depth) & 0xFFFF) != 0) return 255;
    std::int32_t result = value >> (depth - 8);
    if ((value & (256 >> (17 - depth))) != 0 && result != 255) ++result;
    return static_cast<std::uint8_t>(result);
}

double clamped(double value, double lower, double upper) {
    if (value >= upper) return upper;
    if (value >= lower) return std::trunc(value);
    return lower;
}

// The grey value of a pixel as a number, for every type but RGBU64 on its way to 8 bits.
double grey_of(Type type, const void* pixel) {
    const auto mean = [](const auto& colour) {
        return (colour.blue + colour.green + colour.red) * 0.3333333333333333;
    };
    switch (type) {
        case Type::kU8:
        case Type::kHsl:
            return *static_cast<const std::uint8_t*>(pixel);
        case Type::kI16:
            return *static_cast<const std::int16_t*>(pixel);
        case Type::kSgl:
            return *static_cast<const float*>(pixel);
        case Type::kComplex: {
            const auto* parts = static_cast<const float*>(pixel);
            const double re = parts[0], im = parts[1];
            return std::sqrt(re * re + im * im);
        }
        case Type::kRgb:
            return mean(*static_cast<const Rgb*>(pixel));
        case Type::kRgbU64:
            return mean(*static_cast<const RgbU64*>(pixel));
    }
    return 0;
}

bool is_colour(Type type) {
    return type == Type::kRgb || type == Type::kRgbU64;
}

Rgb to_8_bits(const RgbU64& colour, std::int32_t depth) {
    return {reduced(colour.blue, depth), reduced(colour.green, depth), reduced(colour.red, depth),
            reduced(colour.alpha, depth)};
}

std::uint8_t grey_in_8_bits(Type type, const void* pixel, std::int32_t depth) {
    if (type == Type::kI16) return reduced(*static_cast<const std::int16_t*>(pixel), depth);
    if (!is_colour(type)) return static_cast<std::uint8_t>(clamped(grey_of(type, pixel), 0, 255));
    const Rgb colour = type == Type::kRgb ? *static_cast<const Rgb*>(pixel)
                                          : to_8_bits(*static_cast<const RgbU64*>(pixel), depth);
    return static_cast<std::uint8_t>((colour.blue + colour.green + colour.red) / 3);
}

std::int16_t grey_in_16_bits(Type type, const void* pixel) {
    if (!is_colour(type))
        return static_cast<std::int16_t>(clamped(grey_of(type, pixel), -32768, 32767));
    const auto mean = [](const auto& colour) {
        return (colour.blue + colour.green + colour.red) / 3;
    };
    const int value = type == Type::kRgb ? mean(*static_cast<const Rgb*>(pixel))
                                         : mean(*static_cast<const RgbU64*>(pixel));
    return static_cast<std::int16_t>(std::min(value, 32767));
}

Rgb to_rgb(Type from, const void* pixel, std::int32_t depth) {
    if (from == Type::kRgb) return *static_cast<const Rgb*>(pixel);
    if (from == Type::kRgbU64) return to_8_bits(*static_cast<const RgbU64*>(pixel), depth);
    if (from == Type::kHsl) {
        Rgb result{};
        hsl_to_rgb(static_cast<const std::uint8_t*>(pixel), &result.blue, 1);
        return result;
    }
    const std::uint8_t grey = grey_in_8_bits(from, pixel, depth);
    return {grey, grey, grey, 0};
}

RgbU64 to_rgbu64(Type from, const void* pixel, std::int32_t depth) {
    if (from == Type::kRgb || from == Type::kHsl) {
        const Rgb colour = to_rgb(from, pixel, depth);
        return {colour.blue, colour.green, colour.red, colour.alpha};
    }
    const auto grey = static_cast<std::uint16_t>(clamped(grey_of(from, pixel), 0, 65535));
    return {grey, grey, grey, 0};
}

// HSL from RGB by the kernel, which has a test of its own.
Rgb to_hsl(Type from, const void* pixel, std::int32_t depth) {
    if (!is_colour(from)) return {grey_in_8_bits(from, pixel, depth), 0, 0, 0};
    const Rgb colour = to_rgb(from, pixel, depth);
    Rgb result{};
    rgb_to_hsl(&colour.blue, &result.blue, 1);
    return result;
}

void by_the_rules(Type from, Type to, std::int32_t depth, const void* source, void* target) {
    const auto put = [&](const auto& value) { std::memcpy(target, &value, sizeof value); };
    switch (to) {
        case Type::kU8:
            return put(grey_in_8_bits(from, source, depth));
        case Type::kI16:
            return put(grey_in_16_bits(from, source));
        case Type::kSgl:
            return put(static_cast<float>(grey_of(from, source)));
        case Type::kComplex:
            return put(std::complex<float>(static_cast<float>(grey_of(from, source)), 0));
        case Type::kRgb:
            return put(to_rgb(from, source, depth));
        case Type::kHsl:
            return put(to_hsl(from, source, depth));
        case Type::kRgbU64:
            return put(to_rgbu64(from, source, depth));
    }
}

// ---- What is converted

template <class T>
Bytes bytes_of(const std::vector<T>& values) {
    Bytes bytes(values.size() * sizeof(T));
    std::memcpy(bytes.data(), values.data(), bytes.size());
    return bytes;
}

// Every bound of a conversion and its neighbours, all kinds of odd numbers, and random ones of all
// magnitudes; a few millions of these when there is time.
std::vector<float> floats(std::size_t random_count) {
    using Limits = std::numeric_limits<float>;
    std::vector<float> values = {0.0F,
                                 -0.0F,
                                 -0.5F,
                                 0.5F,
                                 254.99F,
                                 Limits::min(),
                                 Limits::denorm_min(),
                                 -Limits::denorm_min(),
                                 Limits::max(),
                                 Limits::lowest(),
                                 Limits::infinity(),
                                 -Limits::infinity(),
                                 Limits::quiet_NaN(),
                                 -Limits::quiet_NaN(),
                                 2147483648.0F,
                                 -2147483904.0F,
                                 4294967296.0F};
    for (const float bound : {-32769.0F, -32768.0F, -1.0F, 0.0F, 1.0F, 255.0F, 256.0F, 32767.0F,
                              32768.0F, 65535.0F, 65536.0F}) {
        for (const float to : {-Limits::infinity(), Limits::infinity()}) {
            values.insert(values.end(), {bound, std::nextafter(bound, to)});
        }
    }
    std::mt19937 random(7);
    std::uniform_real_distribution<float> near(-70000.0F, 70000.0F), small(-1.0F, 300.0F);
    for (std::size_t i = 0; i < random_count; i += 3) {
        values.insert(values.end(), {std::bit_cast<float>(static_cast<std::uint32_t>(random())),
                                     near(random), small(random)});
    }
    return values;
}

// Pairs of the special numbers and of random ones.
std::vector<float> complex_numbers() {
    const std::vector<float> some = floats(0),
                             many = floats(zqtest::kThorough ? 2'000'000 : 20'000);
    std::vector<float> values = many;
    if (values.size() % 2 != 0) values.push_back(0);
    for (const float re : some) {
        for (const float im : some) values.insert(values.end(), {re, im});
    }
    return values;
}

Bytes all_16_bit_values() {
    std::vector<std::uint16_t> values(65536);
    for (std::size_t i = 0; i < values.size(); ++i) values[i] = static_cast<std::uint16_t>(i);
    return bytes_of(values);
}

// Random channels, many of them at the ends, and every value of 16 bits in every channel.
Bytes colours(std::size_t channel_bytes) {
    std::minstd_rand random(11);
    Bytes bytes(4 * channel_bytes * (zqtest::kThorough ? 1'000'000 : 20'000));
    for (auto& byte : bytes) {
        const auto word = static_cast<std::uint32_t>(random() >> 3);
        byte = static_cast<std::uint8_t>((word & 0x700) == 0 ? (word & 1 ? 255 : 0) : word);
    }
    if (channel_bytes == 2) {
        for (std::uint32_t i = 0; i < 65536; ++i) {
            for (const std::uint32_t channel : {i, i ^ 0xFFFFU, i * 3, i * 5 + 7}) {
                bytes.push_back(static_cast<std::uint8_t>(channel));
                bytes.push_back(static_cast<std::uint8_t>(channel >> 8));
            }
        }
    }
    return bytes;
}

Bytes pixels_of(Type type) {
    switch (type) {
        case Type::kU8: {
            Bytes bytes(256);
            for (std::size_t i = 0; i < 256; ++i) bytes[i] = static_cast<std::uint8_t>(i);
            return bytes;
        }
        case Type::kI16:
            return all_16_bit_values();
        case Type::kSgl:
            return bytes_of(floats(zqtest::kThorough ? 10'000'000 : 100'000));
        case Type::kComplex:
            return bytes_of(complex_numbers());
        case Type::kRgb:
        case Type::kHsl:
            return colours(1);
        case Type::kRgbU64:
            return colours(2);
    }
    return {};
}

std::size_t size_of(Type type) {
    return static_cast<std::size_t>(bytes_per_pixel(type));
}

// Bytes of NaN are not defined by the rules; everything else is.
void expect_equal(Type to, const Bytes& actual, const Bytes& expected, const Bytes& source) {
    const std::size_t bytes = size_of(to);
    for (std::size_t i = 0; i < expected.size(); i += bytes) {
        if (std::memcmp(&actual[i], &expected[i], bytes) == 0) continue;
        float a = 0, b = 0;
        if (to == Type::kSgl || to == Type::kComplex) {
            std::memcpy(&a, &actual[i], sizeof a);
            std::memcpy(&b, &expected[i], sizeof b);
            if (std::isnan(a) && std::isnan(b)) continue;
        }
        const std::size_t width = source.size() / (expected.size() / bytes);
        FAIL() << "pixel " << i / bytes << " of "
               << testing::PrintToString(
                      Bytes(&source[i / bytes * width], &source[i / bytes * width] + width))
               << ": " << testing::PrintToString(Bytes(&actual[i], &actual[i] + bytes)) << " for "
               << testing::PrintToString(Bytes(&expected[i], &expected[i] + bytes));
    }
}

void compare(Type from, Type to, std::int32_t depth, const Bytes& source) {
    const std::size_t count = source.size() / size_of(from);
    Bytes expected(count * size_of(to));
    for (std::size_t i = 0; i < count; ++i) {
        by_the_rules(from, to, depth, &source[i * size_of(from)], &expected[i * size_of(to)]);
    }
    zqtest::on_every_simd_target([&] {
        Bytes actual(expected.size());
        RowConverter(from, to, {.bit_depth = depth}, Stores::kCached)
            .convert(source.data(), actual.data(), count);
        ASSERT_NO_FATAL_FAILURE(expect_equal(to, actual, expected, source));
    });
}

TEST(ConvertRows, EveryPairFollowsTheRules) {
    for (std::int32_t from = 0; from < 7; ++from) {
        const auto source_type = static_cast<Type>(from);
        const Bytes source = pixels_of(source_type);
        for (std::int32_t to = 0; to < 7; ++to) {
            if (from == to) continue;
            for (std::int32_t depth = 0; depth <= 16; depth += depth == 0 ? 8 : 1) {
                if (depth != 0 && !has_bit_depth(source_type)) break;
                SCOPED_TRACE(testing::Message() << from << " to " << to << ", depth " << depth);
                ASSERT_NO_FATAL_FAILURE(compare(source_type, static_cast<Type>(to), depth, source));
            }
        }
    }
}

TEST(ConvertRows, ScaledMagnitudesAreExact) {
    const std::vector<float> parts = complex_numbers();
    const Bytes source = bytes_of(parts);
    for (const double pixels : {1.0, 3.0, 48.0, 640.0 * 480, 12'288'000.0}) {
        const double scale = 128 / pixels;
        std::vector<std::uint32_t> expected;
        for (std::size_t i = 0; i < parts.size(); i += 2) {
            const double value = grey_of(Type::kComplex, &parts[i]) * scale;
            expected.push_back(static_cast<std::uint32_t>(clamped(value, 0, 255)) * 0x10101U);
        }
        zqtest::on_every_simd_target([&] {
            Bytes actual(expected.size() * 4);
            RowConverter(Type::kComplex, Type::kRgb, {.scale = scale}, Stores::kCached)
                .convert(source.data(), actual.data(), expected.size());
            ASSERT_NO_FATAL_FAILURE(expect_equal(Type::kRgb, actual, bytes_of(expected), source))
                << "128 / " << pixels;
        });
    }
}

// Rows of every length around the vectors' and the passes', at odd addresses and at such as are
// aligned for elements only, written past the cache or not.
TEST(ConvertRows, StayInsideTheirRows) {
    static constexpr std::uint8_t kGuard = 0xA5;
    const Bytes noise = colours(2);
    const auto converted = [&](Type from, Type to, std::size_t pixels, std::size_t offset,
                               Stores stores) {
        const Bytes source(noise.begin(), noise.begin() + static_cast<std::ptrdiff_t>(
                                                              pixels * size_of(from) + offset));
        Bytes target(pixels * size_of(to) + offset + 128, kGuard);
        RowConverter(from, to, {}, stores)
            .convert(source.data() + offset, target.data() + offset, pixels);
        const auto is_guard = [](std::uint8_t byte) { return byte == kGuard; };
        EXPECT_TRUE(
            std::all_of(target.begin(), target.begin() + static_cast<int>(offset), is_guard));
        EXPECT_TRUE(std::all_of(target.end() - 128, target.end(), is_guard)) << pixels;
        return target;
    };
    zqtest::on_every_simd_target([&] {
        for (std::int32_t pair = 0; pair < 49; ++pair) {
            const auto from = static_cast<Type>(pair / 7), to = static_cast<Type>(pair % 7);
            if (from == to) continue;
            for (std::size_t pixels = 0; pixels < 70; ++pixels) {
                for (const std::size_t offset : {1, 8}) {
                    converted(from, to, pixels, offset, Stores::kStreamed);
                    ASSERT_EQ(converted(from, to, pixels + 480, offset, Stores::kCached),
                              converted(from, to, pixels + 480, offset, Stores::kStreamed))
                        << pair;
                }
            }
        }
    });
}

// ---- Whole images

struct TestImage {
    TestImage(Type type, std::int32_t width, std::int32_t height, std::int32_t border = 0) {
        image.reinitialise({static_cast<std::int32_t>(type), width, height, border});
    }
    template <class T>
    T& at(std::int32_t x, std::int32_t y) {
        return *reinterpret_cast<T*>(image.pixel(x, y));
    }

    Image image{Variant::kPrivate, {}};
};

TEST(ConvertImage, TakesSizeAndBorderButNotIntoALentImage) {
    TestImage source(Type::kU8, 33, 2, 5), colour(Type::kRgb, 1, 9, 1), copy(Type::kU8, 0, 0);
    source.at<std::uint8_t>(32, 1) = 7;
    source.at<std::uint8_t>(-5, 6) = 9;
    convert_image(source.image, colour.image);
    EXPECT_EQ(colour.image.extent(), (Extent{Type::kRgb, 33, 2, 5}));
    EXPECT_EQ(colour.at<std::uint32_t>(32, 1), 0x070707U);
    convert_image(source.image, copy.image);
    EXPECT_EQ(copy.image.extent(), source.image.extent());
    EXPECT_EQ(copy.at<std::uint8_t>(32, 1), 7);
    EXPECT_EQ(copy.at<std::uint8_t>(-5, 6), 9);

    colour.image.lend();
    TestImage other(Type::kSgl, 1, 1);
    EXPECT_THROW(convert_image(other.image, colour.image), GRLIBError_enum);
    EXPECT_EQ(colour.image.extent(), (Extent{Type::kRgb, 33, 2, 5}));
    EXPECT_EQ(colour.at<std::uint32_t>(32, 1), 0x070707U);
}

// A picture that there is no memory for leaves the destination as it was, the caller's own buffer
// included.
TEST(ConvertImage, FailureLeavesTheDestinationAlone) {
    alignas(64) std::array<std::uint8_t, 8 * 24 * 24> buffer{};
    TestImage source(Type::kU8, 17, 16), destination(Type::kComplex, 0, 0);
    destination.image.wrap_external({3, 16, 16, 4}, buffer.data(), 0);
    const std::uint8_t* const first = destination.image.record().firstPixel;
    const memory::HostRoutine none = {[](std::size_t) -> void* { return nullptr; }, [](void*) {}};
    memory::set_mode(memory::Mode::kHostRoutine, &none);
    EXPECT_THROW(convert_image(source.image, destination.image), GRLIBError_enum);
    memory::set_mode(memory::Mode::kHeap, nullptr);
    EXPECT_EQ(destination.image.record().firstPixel, first);
    EXPECT_EQ(destination.image.extent(), (Extent{Type::kComplex, 16, 16, 4}));
}

TEST(ConvertImage, SampleOffsetIsTheSourcesOrNone) {
    TestImage samples(Type::kI16, 2, 2), copy(Type::kI16, 2, 2), floats(Type::kSgl, 2, 2);
    samples.image.set_sample_offset(-5);
    convert_image(samples.image, copy.image);
    EXPECT_EQ(copy.image.sample_offset(), -5);
    convert_image(floats.image, copy.image);
    EXPECT_EQ(copy.image.sample_offset(), 0);
}

// Large enough to be written past the cache.
TEST(ConvertImage, LargePicturesAreWholeToTheLastPixel) {
    TestImage source(Type::kRgb, 2101, 1001, 2), copy(Type::kRgb, 0, 0), wide(Type::kRgbU64, 0, 0),
        grey(Type::kSgl, 0, 0);
    for (std::int32_t y = -2; y < 1003; ++y) {
        for (std::int32_t x = -2; x < 2103; ++x) {
            source.at<std::uint32_t>(x, y) = static_cast<std::uint32_t>(x * 4099 + y) & 0xFFFFFF;
        }
    }
    for (TestImage* destination : {&copy, &wide, &grey}) {
        convert_image(source.image, destination->image);
    }
    std::int64_t wrong = 0;
    for (std::int32_t y = 0; y < 1001; ++y) {
        for (std::int32_t x = 0; x < 2101; ++x) {
            const Rgb pixel = source.at<Rgb>(x, y);
            const RgbU64 wanted = to_rgbu64(Type::kRgb, &pixel, 0);
            wrong += copy.at<std::uint32_t>(x, y) != source.at<std::uint32_t>(x, y);
            wrong += std::memcmp(&wide.at<RgbU64>(x, y), &wanted, sizeof wanted) != 0;
            wrong += grey.at<float>(x, y) != static_cast<float>(grey_of(Type::kRgb, &pixel));
        }
    }
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(copy.at<std::uint32_t>(2102, 1002), source.at<std::uint32_t>(2102, 1002));
}

void exchange_quadrants(std::vector<std::uint32_t>& pixels, std::int32_t width,
                        std::int32_t height) {
    const auto at = [&](std::int32_t x, std::int32_t y) -> std::uint32_t& {
        return pixels[static_cast<std::size_t>(y) * static_cast<std::size_t>(width) +
                      static_cast<std::size_t>(x)];
    };
    const std::int32_t half_width = width / 2, half_height = height / 2;
    for (std::int32_t y = 0; y < half_height; ++y) {
        for (std::int32_t x = 0; x < half_width; ++x) {
            std::swap(at(x, y), at(x + half_width, y + half_height));
            std::swap(at(x + half_width, y), at(x, y + half_height));
        }
    }
}

TEST(ConvertImage, SpectrumIsScaledAndItsQuadrantsExchanged) {
    struct Case {
        std::int32_t width, height;
    };
    for (const auto [width, height] :
         {Case{6, 4}, {7, 5}, {1, 6}, {6, 1}, {1, 1}, {4, 3}, {1030, 2}}) {
        SCOPED_TRACE(testing::Message() << width << " x " << height);
        TestImage source(Type::kComplex, width, height), spectrum(Type::kRgb, 0, 0);
        std::vector<std::uint32_t> expected;
        for (std::int32_t y = 0; y < height; ++y) {
            for (std::int32_t x = 0; x < width; ++x) {
                const auto value = static_cast<float>((y * width + x) * 1.25);
                source.at<std::complex<float>>(x, y) = {value * 0.6F, -value * 0.8F};
                const double scale = 128.0 / (static_cast<double>(width) * height);
                const auto shade = static_cast<std::uint32_t>(
                    clamped(grey_of(Type::kComplex, source.image.pixel(x, y)) * scale, 0, 255));
                expected.push_back(shade * 0x10101U);
            }
        }
        exchange_quadrants(expected, width, height);
        convert_image(source.image, spectrum.image);
        for (std::size_t i = 0; i < expected.size(); ++i) {
            const auto index = static_cast<std::int32_t>(i);
            ASSERT_EQ(spectrum.at<std::uint32_t>(index % width, index / width), expected[i]) << i;
        }
    }
}

}  // namespace
}  // namespace zq
