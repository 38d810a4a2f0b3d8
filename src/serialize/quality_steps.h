// How coarsely each quality quantises. Steps are powers of two and only ever halve as the quality
// rises, so what a lower quality can express a higher one can: no coefficient gets worse.
#pragma once

#include <array>
#include <cstdint>

#include "codecs/wavelet.h"

namespace zq {

using JpegSteps = std::array<unsigned, 64>;  // row by row

JpegSteps luma_steps(int quality);
JpegSteps chroma_steps(int quality);

// Steps of wavelet coefficients as exponents of two, where the samples span 2^kNominalBits.
inline constexpr int kNominalBits = 16;
inline constexpr int kFinestStep = -1;
inline constexpr int kCoarsestStep = 16;
using WaveletSteps = std::array<std::int8_t, kBands>;

// Of plane 0, 1, 2 of an image; never finer than 2^finest. Planes that hold colour rather than
// brightness are coded twice as coarsely.
WaveletSteps wavelet_steps(int quality, int plane, bool is_colour, int finest);

}  // namespace zq
