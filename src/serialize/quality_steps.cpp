// Steps by quality: one falling curve a codec, and an offset for each coefficient, so that at every
// rise of the quality some of them halve.
#include "serialize/quality_steps.h"

#include <algorithm>
#include <cmath>
#include <span>

namespace zq {

namespace {

struct Knot {
    int quality;
    double level;  // log2 of a step
};

double level_at(std::span<const Knot> curve, int quality) {
    std::size_t i = 1;
    while (i + 1 < curve.size() && quality > curve[i].quality) ++i;
    const Knot& from = curve[i - 1];
    const Knot& to = curve[i];
    const double part = static_cast<double>(quality - from.quality) / (to.quality - from.quality);
    return from.level + part * (to.level - from.level);
}

// Relative to the bases and slopes below.
constexpr Knot kJpegCurve[] = {{1, 3.2}, {50, 0.75}, {75, -0.15}, {90, -2.2}, {100, -7.5}};
// Samples span 2^kNominalBits.
constexpr Knot kWaveletCurve[] = {{1, 15}, {50, 13}, {75, 12.1}, {90, 9.5}, {100, -0.5}};

// Log2 of the steps at level 0: the base, and what each step away from the mean adds.
constexpr double kLumaSlope = 0.21;
constexpr double kChromaSlope = 0.25;
constexpr double kLumaBase = 3.6;
constexpr double kChromaBase = 4.2;
constexpr double kMostLevel = 7;      // baseline JPEG has steps of 8 bits
constexpr double kMostMeanLevel = 3;  // a step of 8 tells the mean of a block to one grey level

// The low-pass rest weighs 32 times as much as a sample, so that this keeps flat areas exact.
constexpr double kMostRestLevel = 3;

// Spread evenly over [0, 1) whatever stretch of numbers is taken.
double spread(int number) {
    return std::fmod(number * 0.6180339887, 1.0);
}

JpegSteps jpeg_steps(int quality, double base, double slope) {
    const double level = level_at(kJpegCurve, quality);
    JpegSteps steps{};
    for (int i = 0; i < 64; ++i) {
        const double most = i == 0 ? kMostMeanLevel : kMostLevel;
        const double wanted = level + base + slope * (i / 8 + i % 8);
        const double exponent = std::clamp(std::floor(wanted + spread(i)), 0.0, most);
        steps[static_cast<std::size_t>(i)] = 1U << static_cast<unsigned>(exponent);
    }
    return steps;
}

}  // namespace

JpegSteps luma_steps(int quality) {
    return jpeg_steps(quality, kLumaBase, kLumaSlope);
}

JpegSteps chroma_steps(int quality) {
    return jpeg_steps(quality, kChromaBase, kChromaSlope);
}

WaveletSteps wavelet_steps(int quality, int plane, bool is_colour, int finest) {
    const double level = level_at(kWaveletCurve, quality) + (is_colour ? 1 : 0);
    WaveletSteps steps{};
    for (int band = 0; band < kBands; ++band) {
        double wanted = level + spread(3 * band + plane) - 0.5;
        if (band == 0) wanted = std::min(level - 2, kMostRestLevel);
        const int exponent = static_cast<int>(std::floor(wanted));
        steps[static_cast<std::size_t>(band)] =
            static_cast<std::int8_t>(std::clamp(exponent, finest, kCoarsestStep));
    }
    return steps;
}

}  // namespace zq
