// Steps by quality: one falling curve a codec. JPEG's transform is orthonormal, so its coefficients
// can halve their steps at different qualities; the wavelet's is not quite: its bands halve theirs
// together, or an error that is gone in one could lay bare one in another.
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
constexpr Knot kJpegCurve[] = {{1, 2.8}, {50, 0.75}, {75, -0.15}, {90, -2.2}, {100, -7.5}};
// Samples span 2^kNominalBits.
constexpr Knot kWaveletCurve[] = {{1, 16.2}, {50, 13}, {75, 12}, {90, 9.5}, {100, -2.5}};

// Log2 of the steps at level 0: the base, and what each step away from the mean adds. Chroma steps
// halve where luma steps do, as errors of the two mix in a pixel.
constexpr double kGreyBase = 3.6;
constexpr double kLumaBase = 3.2;
constexpr double kChromaBase = kLumaBase + 1;
constexpr double kSlope = 0.21;
constexpr double kMostLevel = 7;      // baseline JPEG has steps of 8 bits
constexpr double kMostMeanLevel = 3;  // a step of 8 tells the mean of a block to one grey level

// The low-pass rest weighs 32 times as much as a sample, so that this keeps flat areas exact.
constexpr double kMostRestLevel = 3;
// Twice as coarse as brightness, and half a step apart from it, for smaller steps on the whole.
constexpr double kColourLevel = 1.5;

// Spread evenly over [0, 1) whatever stretch of numbers is taken.
double spread(int number) {
    return std::fmod(number * 0.6180339887, 1.0);
}

JpegSteps jpeg_steps(int quality, double base) {
    const double level = level_at(kJpegCurve, quality);
    JpegSteps steps{};
    for (int i = 0; i < 64; ++i) {
        const double most = i == 0 ? kMostMeanLevel : kMostLevel;
        const int diagonal = i / 8 + i % 8;
        const double wanted = level + base + kSlope * diagonal;
        const double exponent = std::clamp(std::floor(wanted + spread(i)), 0.0, most);
        steps[static_cast<std::size_t>(i)] = 1U << static_cast<unsigned>(exponent);
    }
    return steps;
}

}  // namespace

JpegSteps grey_steps(int quality) {
    return jpeg_steps(quality, kGreyBase);
}

JpegSteps luma_steps(int quality) {
    return jpeg_steps(quality, kLumaBase);
}

JpegSteps chroma_steps(int quality) {
    return jpeg_steps(quality, kChromaBase);
}

WaveletSteps wavelet_steps(int quality, bool is_colour, int finest) {
    const double level = level_at(kWaveletCurve, quality) + (is_colour ? kColourLevel : 0);
    const auto step = [&](double wanted) {
        const int exponent = static_cast<int>(std::floor(wanted));
        return static_cast<std::int8_t>(std::clamp(exponent, finest, kCoarsestStep));
    };
    WaveletSteps steps{};
    steps.fill(step(level));
    steps[0] = step(std::min(level - 2, kMostRestLevel));
    return steps;
}

}  // namespace zq
