// Wavelet steps by quality: one falling curve. A band halves its step when the curve passes it, and
// in between counts ever smaller coefficients as more than 0.
#include <algorithm>
#include <cmath>

#include "serialize/quality_curve.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

// Log2 of the magnitude from which on a coefficient counts; samples span 2^kNominalBits.
constexpr Knot kCurve[] = {{1, 15.5}, {75, 11.85}, {90, 9}};

// The low-pass rest weighs 32 times as much as a sample, so that this keeps flat areas exact.
constexpr double kRestLevel = -2;
constexpr double kMostRestLevel = 3;
// Colour is coarser than brightness.
constexpr double kColourLevel = 1.6;
// From one group of bands to the next coarser: they halve their steps at different qualities.
constexpr double kGroupLevel = -0.2;

// Groups: where columns and rows are high; where one is; then a level each.
double group_level(int band) {
    const int level = (kBands - 1 - band) / 3;
    const int group = level > 0 ? level + 1 : band < kBands - 1 ? 1 : 0;
    return kGroupLevel * (group - 2);
}

// The step is the first power of two from `level` on: coefficients that count are within half a
// step, all others stay below a step. Where the finest step is reached, the rest of the way to the
// nearest multiple remains.
WaveletStep step_at(double level, int finest) {
    const int exponent = std::clamp(static_cast<int>(std::ceil(level)), finest, kCoarsestStep);
    const double least = std::max(level, exponent - 1.0);
    return {static_cast<std::int8_t>(exponent), static_cast<float>(std::exp2(least))};
}

}  // namespace

WaveletSteps wavelet_steps(int quality, bool is_colour, int finest) {
    const double finest_level = finest - 1.0;
    WaveletSteps steps;
    steps.fill(step_at(finest_level, finest));
    if (quality == 100) return steps;
    const Knot curve[] = {kCurve[0], kCurve[1], kCurve[2], {100, finest_level}};
    const double level = value_at(curve, quality) + (is_colour ? kColourLevel : 0);
    steps[0] = step_at(std::min(level + kRestLevel, kMostRestLevel), finest);
    for (int band = 1; band < kBands; ++band) {
        steps[static_cast<std::size_t>(band)] = step_at(level + group_level(band), finest);
    }
    return steps;
}

}  // namespace zq
