// Contexts and binary decisions.
#include "codecs/band_coder.h"

#include <algorithm>
#include <bit>
#include <cmath>

namespace zq {

namespace {

constexpr float kMostMagnitude = (1 << kMostBits) - 1;

struct Quantiser {
    float inverse;  // of the step
    float least;    // magnitudes below it become 0
};

// Nearest; halves away from zero.
void quantise(const float* coefficients, const Quantiser& by, std::size_t count,
              std::int32_t* out) {
    for (std::size_t x = 0; x < count; ++x) {
        float scaled = coefficients[x] * by.inverse;
        scaled = scaled < -kMostMagnitude ? -kMostMagnitude : scaled;
        scaled = scaled > kMostMagnitude ? kMostMagnitude : scaled;
        scaled = std::fabs(coefficients[x]) < by.least ? 0.0F : scaled;
        out[x] = static_cast<std::int32_t>(scaled + std::copysign(0.5F, scaled));
    }
}

float largest_magnitude(const Band& band) {
    float largest = 0;
    for (int y = 0; y < band.height; ++y) {
        const float* row = band.first + y * band.stride;
        for (int x = 0; x < band.width; ++x) {
            const float magnitude = std::fabs(row[x]);
            largest = largest < magnitude ? magnitude : largest;
        }
    }
    return largest;
}

constexpr int kLengthBits = 5;  // of the number that says how long a band's magnitudes get

}  // namespace

BandCoder::BandCoder(int widest)
    : current_(static_cast<std::size_t>(widest) + 2 * kMargin),
      above_(current_.size()),
      row_(static_cast<std::size_t>(widest)) {}

void BandCoder::reset() {
    models_ = Models{};
}

// Magnitudes to the left and above, weighed by nearness; in half octaves from 6 on.
std::size_t BandCoder::context(const std::uint32_t* current, const std::uint32_t* above) {
    const std::uint32_t around = 2 * (current[-1] + above[0]) + current[-2] + above[-1] + above[1];
    if (around < 6) return around;
    const auto bits = static_cast<std::uint32_t>(std::bit_width(around));
    return 2 * bits + (around >> (bits - 2) & 1);
}

void BandCoder::put(RangeEncoder& coder, std::uint32_t magnitude, int most_bits,
                    std::size_t context) {
    const int length = static_cast<int>(std::bit_width(magnitude));
    auto& lengths = models_.lengths[context];
    for (int i = 0; i < length; ++i) coder.put(true, lengths[static_cast<std::size_t>(i)]);
    if (length < most_bits) coder.put(false, lengths[static_cast<std::size_t>(length)]);
    if (length < 2) return;
    coder.put((magnitude >> (length - 2) & 1) != 0,
              models_.second_bits[static_cast<std::size_t>(length)]);
    coder.put_bits(magnitude, length - 2);
}

std::uint32_t BandCoder::get(RangeDecoder& coder, int most_bits, std::size_t context) {
    auto& lengths = models_.lengths[context];
    int length = 0;
    while (length < most_bits && coder.get(lengths[static_cast<std::size_t>(length)])) ++length;
    if (length < 2) return static_cast<std::uint32_t>(length);
    const std::uint32_t top =
        2U | (coder.get(models_.second_bits[static_cast<std::size_t>(length)]) ? 1U : 0U);
    return top << (length - 2) | coder.get_bits(length - 2);
}

void BandCoder::next_row(std::size_t width) {
    current_.swap(above_);
    std::fill(above_.begin() + static_cast<std::ptrdiff_t>(kMargin + width),
              above_.begin() + static_cast<std::ptrdiff_t>(2 * kMargin + width), 0U);
}

void BandCoder::encode(RangeEncoder& coder, const Band& band, float step, float least) {
    if (band.width == 0 || band.height == 0) return;
    const Quantiser by{1 / step, least};
    const auto width = static_cast<std::size_t>(band.width);
    std::int32_t largest = 0;
    const float magnitude = largest_magnitude(band);
    quantise(&magnitude, by, 1, &largest);
    const int most_bits = static_cast<int>(std::bit_width(static_cast<std::uint32_t>(largest)));
    coder.put_bits(static_cast<std::uint32_t>(most_bits), kLengthBits);
    if (most_bits == 0) return;

    std::fill(above_.begin(), above_.end(), 0U);
    for (int y = 0; y < band.height; ++y) {
        quantise(band.first + y * band.stride, by, width, row_.data());
        std::uint32_t* current = current_.data() + kMargin;
        const std::uint32_t* above = above_.data() + kMargin;
        for (std::size_t x = 0; x < width; ++x) {
            const std::int32_t value = row_[x];
            current[x] = static_cast<std::uint32_t>(value < 0 ? -value : value);
            put(coder, current[x], most_bits, context(current + x, above + x));
            if (value != 0) coder.put_bits(value < 0 ? 1 : 0, 1);
        }
        next_row(width);
    }
}

void BandCoder::decode(RangeDecoder& coder, const Band& band, float step) {
    if (band.width == 0 || band.height == 0) return;
    const auto width = static_cast<std::size_t>(band.width);
    const int most_bits = std::min(static_cast<int>(coder.get_bits(kLengthBits)), kMostBits);
    std::fill(above_.begin(), above_.end(), 0U);
    for (int y = 0; y < band.height; ++y) {
        float* row = band.first + y * band.stride;
        if (most_bits == 0) {
            std::fill_n(row, width, 0.0F);
            continue;
        }
        std::uint32_t* current = current_.data() + kMargin;
        const std::uint32_t* above = above_.data() + kMargin;
        for (std::size_t x = 0; x < width; ++x) {
            current[x] = get(coder, most_bits, context(current + x, above + x));
            const float magnitude = static_cast<float>(current[x]) * step;
            row[x] = current[x] != 0 && coder.get_bits(1) != 0 ? -magnitude : magnitude;
        }
        next_row(width);
    }
}

}  // namespace zq
