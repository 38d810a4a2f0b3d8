// Plain loops that the compiler makes vectors of.
#include "files/jpeg2000_rows.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace zq {

namespace {

template <class Sample>
void to_colour(const std::array<SampleRow, 3>& rgb, const std::int32_t* alpha,
               Sample* __restrict to, std::size_t count) {
    const std::int32_t* __restrict red = rgb[0];
    const std::int32_t* __restrict green = rgb[1];
    const std::int32_t* __restrict blue = rgb[2];
    for (std::size_t i = 0; i < count; ++i) {
        to[4 * i] = static_cast<Sample>(blue[i]);
        to[4 * i + 1] = static_cast<Sample>(green[i]);
        to[4 * i + 2] = static_cast<Sample>(red[i]);
        to[4 * i + 3] = 0;
    }
    for (std::size_t i = 0; alpha != nullptr && i < count; ++i)
        to[4 * i + 3] = static_cast<Sample>(alpha[i]);
}

template <std::size_t kChannels, class Sample>
void from_colour(const Sample* __restrict from, const std::array<SampleRow, 3>& rgb,
                 std::size_t count) {
    std::int32_t* __restrict red = rgb[0];
    std::int32_t* __restrict green = rgb[1];
    std::int32_t* __restrict blue = rgb[2];
    for (std::size_t i = 0; i < count; ++i) {
        blue[i] = from[kChannels * i];
        green[i] = from[kChannels * i + 1];
        red[i] = from[kChannels * i + 2];
    }
}

template <class Sample>
void from_colour(const Sample* from, std::size_t channels, const std::array<SampleRow, 3>& rgb,
                 SampleRow alpha, std::size_t count) {
    if (channels == 3) {
        from_colour<3>(from, rgb, count);
    } else {
        from_colour<4>(from, rgb, count);
    }
    for (std::size_t i = 0; alpha != nullptr && i < count; ++i) alpha[i] = from[4 * i + 3];
}

template <class Sample>
void divide(Sample* pixels, std::size_t count) {
    constexpr std::uint64_t kMost = std::numeric_limits<Sample>::max();
    for (std::size_t i = 0; i < count; ++i, pixels += 4) {
        const std::uint64_t alpha = pixels[3];
        for (int c = 0; c < 3 && alpha != 0; ++c) {
            const std::uint64_t value = (pixels[c] * kMost + alpha / 2) / alpha;
            pixels[c] = static_cast<Sample>(std::min(value, kMost));
        }
    }
}

}  // namespace

void spread_samples(SampleRow row, std::size_t count, int bits, int to) {
    if (bits == to) return;
    const std::uint32_t most = (1U << bits) - 1, wanted = (1U << to) - 1;
    for (std::size_t i = 0; i < count; ++i) {
        const auto value = static_cast<std::uint32_t>(row[i]);
        row[i] = static_cast<std::int32_t>((value * wanted + most / 2) / most);
    }
}

void ycc_to_rgb_samples(const std::array<SampleRow, 3>& rows, std::size_t count, int bits) {
    const auto most = static_cast<float>((1 << bits) - 1),
               middle = static_cast<float>(1 << bits) / 2;
    const auto sample = [most](float value) {
        return static_cast<std::int32_t>(std::clamp(value, 0.0F, most + 0.5F));
    };
    std::int32_t* __restrict red = rows[0];
    std::int32_t* __restrict green = rows[1];
    std::int32_t* __restrict blue = rows[2];
    for (std::size_t i = 0; i < count; ++i) {
        const float luminance = static_cast<float>(red[i]) + 0.5F;  // so that truncation rounds
        const float cb = static_cast<float>(green[i]) - middle;
        const float cr = static_cast<float>(blue[i]) - middle;
        red[i] = sample(luminance + 1.402F * cr);
        green[i] = sample(luminance - 0.344136F * cb - 0.714136F * cr);
        blue[i] = sample(luminance + 1.772F * cb);
    }
}

void samples_to_bytes(const std::int32_t* row, std::uint8_t* to, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) to[i] = static_cast<std::uint8_t>(row[i]);
}

void samples_to_words(const std::int32_t* row, std::uint16_t* to, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) to[i] = static_cast<std::uint16_t>(row[i]);
}

void samples_to_colour(const std::array<SampleRow, 3>& rgb, const std::int32_t* alpha,
                       std::uint8_t* to, std::size_t count) {
    to_colour(rgb, alpha, to, count);
}

void samples_to_colour(const std::array<SampleRow, 3>& rgb, const std::int32_t* alpha,
                       std::uint16_t* to, std::size_t count) {
    to_colour(rgb, alpha, to, count);
}

void divide_by_alpha(std::uint8_t* pixels, std::size_t count) {
    divide(pixels, count);
}

void divide_by_alpha(std::uint16_t* pixels, std::size_t count) {
    divide(pixels, count);
}

void bytes_to_samples(const std::uint8_t* from, SampleRow row, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) row[i] = from[i];
}

void words_to_samples(const std::uint16_t* from, SampleRow row, std::size_t count) {
    for (std::size_t i = 0; i < count; ++i) row[i] = from[i];
}

void signed_words_to_samples(const std::int16_t* from, SampleRow row, std::size_t count,
                             std::int32_t offset) {
    for (std::size_t i = 0; i < count; ++i) row[i] = from[i] - offset;
}

void colour_to_samples(const std::uint8_t* from, std::size_t channels,
                       const std::array<SampleRow, 3>& rgb, SampleRow alpha, std::size_t count) {
    from_colour(from, channels, rgb, alpha, count);
}

void colour_to_samples(const std::uint16_t* from, std::size_t channels,
                       const std::array<SampleRow, 3>& rgb, SampleRow alpha, std::size_t count) {
    from_colour(from, channels, rgb, alpha, count);
}

}  // namespace zq
