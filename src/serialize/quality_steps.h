// How coarsely each quality quantises. As the quality rises a step is only ever divided by a whole
// number, so what a lower quality can express a higher one can: no coefficient gets worse.
#pragma once

#include <array>
#include <cstdint>

#include "codecs/wavelet.h"

namespace zq {

using JpegSteps = std::array<unsigned, 64>;  // row by row

JpegSteps grey_steps(int quality);  // U8
JpegSteps luma_steps(int quality);  // RGB, as are chroma_steps
JpegSteps chroma_steps(int quality);

// Steps of wavelet coefficients as exponents of two, where the samples span 2^kNominalBits.
inline constexpr int kNominalBits = 16;
inline constexpr int kFinestStep = -1;
inline constexpr int kCoarsestStep = 16;
struct WaveletStep {
    std::int8_t exponent = 0;
    float least = 0;  // magnitudes below it become 0; half a step or more
};
using WaveletSteps = std::array<WaveletStep, kBands>;

// Never finer than 2^finest. Planes that hold colour rather than brightness are coded more
// coarsely.
WaveletSteps wavelet_steps(int quality, bool is_colour, int finest);

}  // namespace zq
