// Unpacking, placing and mending of samples.
#include "files/tiff_samples.h"

#include <algorithm>
#include <cstring>
#include <limits>

#include "kernels/colour_rows.h"

namespace zq {

namespace {

constexpr std::size_t kAlphaSlot = 3;

// Samples of 1 to 16 bits, the first in the highest bits. Each becomes itself, or its share of the
// whole range of `Sample`.
template <class Sample>
void unpack(const std::uint8_t* packed, int bits, bool scaled, std::vector<Sample>& samples) {
    const std::uint32_t most = (std::uint32_t{1} << bits) - 1;
    constexpr std::uint32_t kWhole = std::numeric_limits<Sample>::max();
    std::uint32_t buffer = 0;
    int held = 0;
    for (Sample& sample : samples) {
        while (held < bits) {
            buffer = buffer << 8 | *packed++;
            held += 8;
        }
        held -= bits;
        const std::uint32_t value = buffer >> held & most;
        sample = static_cast<Sample>(scaled ? (value * kWhole + most / 2) / most : value);
    }
}

void unpack_bits_of_grey(const std::uint8_t* packed, std::vector<std::uint8_t>& samples) {
    for (std::size_t i = 0; i < samples.size(); ++i) {
        samples[i] = static_cast<std::uint8_t>(-(packed[i / 8] >> (7 - i % 8) & 1));
    }
}

template <class From, class To>
void put_each(const std::uint8_t* from, std::size_t step, std::uint8_t* to, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i) {
        From value;
        std::memcpy(&value, from + i * step * sizeof(From), sizeof(value));
        const To converted = static_cast<To>(+value);
        std::memcpy(to + i * sizeof(To), &converted, sizeof(converted));
    }
}

// What is no float stays so; what is too large for one becomes infinite.
void put_doubles(const std::uint8_t* from, std::size_t step, std::uint8_t* to, std::size_t pixels) {
    constexpr double kMost = std::numeric_limits<float>::max();
    for (std::size_t i = 0; i < pixels; ++i) {
        double value;
        std::memcpy(&value, from + i * step * sizeof(value), sizeof(value));
        const float converted = value > kMost    ? std::numeric_limits<float>::infinity()
                                : value < -kMost ? -std::numeric_limits<float>::infinity()
                                                 : static_cast<float>(value);
        std::memcpy(to + i * sizeof(float), &converted, sizeof(converted));
    }
}

void rgba_to_bgra(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i) {
        std::uint32_t v;
        std::memcpy(&v, from + 4 * i, sizeof(v));
        v = (v & 0xFF00FF00U) | (v & 0xFFU) << 16 | (v >> 16 & 0xFFU);
        std::memcpy(to + 4 * i, &v, sizeof(v));
    }
}

void rgb48_to_bgra64(const std::uint16_t* from, std::uint16_t* to, std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i) {
        to[4 * i] = from[3 * i + 2];
        to[4 * i + 1] = from[3 * i + 1];
        to[4 * i + 2] = from[3 * i];
        to[4 * i + 3] = 0;
    }
}

bool are_pixels(const TiffLayout& layout) {
    if (layout.used_samples() != 1 || layout.colour == TiffColour::kInvertedGrey) return false;
    switch (layout.pixel_type()) {
        case PixelType::kU8:
            return layout.bits == 8;
        case PixelType::kI16:
            return layout.bits == 16;
        case PixelType::kSgl:
            return layout.bits == 32 && layout.number == TiffNumber::kFloat;
        default:
            return false;
    }
}

template <class Sample>
void unpremultiply(Sample* row, std::size_t pixels) {
    constexpr std::uint32_t kWhole = std::numeric_limits<Sample>::max();
    for (std::size_t i = 0; i < pixels; ++i) {
        Sample* const pixel = row + 4 * i;
        const std::uint32_t alpha = pixel[kAlphaSlot];
        if (alpha == 0 || alpha == kWhole) continue;
        for (std::size_t c = 0; c < kAlphaSlot; ++c) {
            const std::uint64_t value = (std::uint64_t{pixel[c]} * kWhole + alpha / 2) / alpha;
            pixel[c] = static_cast<Sample>(std::min<std::uint64_t>(value, kWhole));
        }
    }
}

}  // namespace

void bgra64_to_rgb48(const std::uint16_t* __restrict from, std::uint16_t* __restrict to,
                     std::size_t pixels) {
    for (std::size_t i = 0; i < pixels; ++i) {
        to[3 * i] = from[4 * i + 2];
        to[3 * i + 1] = from[4 * i + 1];
        to[3 * i + 2] = from[4 * i];
    }
}

TiffSampleSink::TiffSampleSink(const TiffLayout& layout)
    : layout_(layout), is_plain_(step() == 1 && are_pixels(layout)) {}

std::size_t TiffSampleSink::step() const {
    return layout_.separate ? 1 : static_cast<std::size_t>(layout_.samples);
}

void TiffSampleSink::put(int plane, const std::uint8_t* samples, std::uint8_t* row,
                         std::size_t pixels) {
    const int bits = layout_.bits;
    if (is_plain_) {
        std::memcpy(row, samples, pixels * static_cast<std::size_t>(bits / 8));
    } else if (bits > 16 || layout_.number != TiffNumber::kUnsigned) {
        put_numbers(samples, row, pixels);
    } else if (bits == 8) {
        put_as(plane, samples, row, pixels);
    } else if (bits == 16) {
        put_as(plane, reinterpret_cast<const std::uint16_t*>(samples), row, pixels);
    } else if (bits < 8) {
        bytes_.resize(pixels * step());
        const bool scaled = layout_.colour != TiffColour::kPalette;
        if (bits == 1 && scaled) {
            unpack_bits_of_grey(samples, bytes_);
        } else {
            unpack(samples, bits, scaled, bytes_);
        }
        put_as(plane, bytes_.data(), row, pixels);
    } else {
        words_.resize(pixels * step());
        unpack(samples, bits, layout_.pixel_type() != PixelType::kI16, words_);
        put_as(plane, words_.data(), row, pixels);
    }
}

// Samples that are what they measure: no colour, no other planes.
void TiffSampleSink::put_numbers(const std::uint8_t* samples, std::uint8_t* row,
                                 std::size_t pixels) const {
    const bool is_signed = layout_.number == TiffNumber::kSigned;
    if (layout_.number == TiffNumber::kFloat) {
        const auto put = layout_.bits == 64 ? put_doubles : put_each<float, float>;
        put(samples, step(), row, pixels);
    } else if (layout_.bits == 32) {
        const auto put = is_signed ? put_each<std::int32_t, float> : put_each<std::uint32_t, float>;
        put(samples, step(), row, pixels);
    } else {
        const auto put = layout_.bits == 8 ? put_each<std::int8_t, std::int16_t>
                                           : put_each<std::int16_t, std::int16_t>;
        put(samples, step(), row, pixels);
    }
}

template <class Sample>
void TiffSampleSink::put_as(int plane, const Sample* samples, std::uint8_t* row,
                            std::size_t pixels) const {
    auto* const target = reinterpret_cast<Sample*>(row);
    const int used = layout_.used_samples();
    const bool is_grey = used == 1;
    if (is_grey) {
        const bool inverted = layout_.colour == TiffColour::kInvertedGrey;
        // All bits of the sample, which may be fewer than those of its type.
        const int bits = layout_.bits > 8 ? layout_.bits : 8;
        const auto mask = static_cast<Sample>(inverted ? (std::uint32_t{1} << bits) - 1 : 0);
        for (std::size_t i = 0; i < pixels; ++i)
            target[i] = static_cast<Sample>(samples[i * step()] ^ mask);
    } else if (layout_.separate) {
        put_colour(plane, plane, samples, target, pixels);
    } else {
        put_colour(0, used - 1, samples, target, pixels);
    }
}

// The samples `first` to `last`; `samples` points to the first of them.
template <class Sample>
void TiffSampleSink::put_colour(int first, int last, const Sample* samples, Sample* row,
                                std::size_t pixels) const {
    const bool rgb =
        layout_.colour == TiffColour::kRgb && step() == static_cast<std::size_t>(last) + 1;
    if (rgb && last == 2) {
        if constexpr (sizeof(Sample) == 1) {
            rgb_to_bgra(samples, row, pixels);
        } else {
            rgb48_to_bgra64(samples, row, pixels);
        }
        return;
    }
    if constexpr (sizeof(Sample) == 1) {
        if (rgb && last == 3) {
            rgba_to_bgra(samples, row, pixels);
            return;
        }
    }
    if (first == 0) std::fill_n(row, 4 * pixels, Sample{0});
    for (int i = first; i <= last; ++i) put_sample(i, samples + (i - first), row, pixels);
}

template <class Sample>
void TiffSampleSink::put_sample(int index, const Sample* samples, Sample* row,
                                std::size_t pixels) const {
    constexpr std::uint32_t kWhole = std::numeric_limits<Sample>::max();
    const bool is_cmyk = layout_.colour == TiffColour::kCmyk;
    const auto each = [&](auto action) {
        const std::size_t step = this->step();
        for (std::size_t i = 0; i < pixels; ++i) action(row + 4 * i, samples[i * step]);
    };
    if (index == layout_.colour_samples()) {
        each([](Sample* pixel, Sample value) { pixel[kAlphaSlot] = value; });
    } else if (is_cmyk && index == 3) {
        each([](Sample* pixel, Sample value) {
            for (std::size_t c = 0; c < 3; ++c)
                pixel[c] = static_cast<Sample>(pixel[c] * (kWhole - value) / kWhole);
        });
    } else if (layout_.colour == TiffColour::kGrey) {
        each([](Sample* pixel, Sample value) { pixel[0] = pixel[1] = pixel[2] = value; });
    } else {
        const auto mask = static_cast<Sample>(is_cmyk ? kWhole : 0);  // ink is the lack of light
        const auto slot = static_cast<std::size_t>(2 - index);
        each([=](Sample* pixel, Sample value) { pixel[slot] = static_cast<Sample>(value ^ mask); });
    }
}

void TiffSampleSink::finish_row(std::uint8_t* row, std::size_t pixels) const {
    if (layout_.alpha != TiffAlpha::kPremultiplied) return;
    if (layout_.bits == 8) {
        unpremultiply(row, pixels);
    } else {
        unpremultiply(reinterpret_cast<std::uint16_t*>(row), pixels);
    }
}

}  // namespace zq
