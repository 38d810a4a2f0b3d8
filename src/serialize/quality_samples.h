// Between the pixels of an image and the planes of floats that the wavelet works on.
#pragma once

#include <array>
#include <cstdint>
#include <span>

#include "image/image.h"
#include "serialize/quality_lossless.h"

namespace zq {

inline constexpr std::int32_t kTileSide = 512;
inline constexpr std::size_t kMostPlanes = 3;

// Lowest and highest finite sample.
struct SampleRange {
    float low = 0;
    float high = 0;
    bool is_constant() const { return low == high; }
};

// How samples of a range become plane values and back: value = (sample - middle) * scale, so that
// the range spans at most 2^kNominalBits.
struct SampleScale {
    double middle = 0;
    double scale = 1;
};

// What differs from type to type.
struct PlaneLayout {
    std::size_t planes;           // of wavelet coefficients
    std::size_t ranges;           // one for all planes, or one for each
    std::size_t lossless_planes;  // bytes of each pixel that are kept exactly
    bool is_float;
    float least, most;  // of integer samples
};
PlaneLayout plane_layout(PixelType type);

// The integer types are scaled by powers of two, so that an integer stays one.
SampleScale scale_of(const SampleRange& range, const PlaneLayout& layout);
// The finest step worth having, as an exponent of two: half an integer.
int finest_step(const SampleRange& range, const PlaneLayout& layout);

struct PixelRect {
    std::int32_t x, y, width, height;
};

// Planes of a tile, kTileSide floats from one row to the next.
using PlaneRows = std::array<float*, kMostPlanes>;

// Ranges as stored in a block; where there is one, it stands for all planes.
using SampleRanges = std::array<SampleRange, kMostPlanes>;
SampleRanges measure(const Image& image, const PlaneLayout& layout);

// Samples that are not finite take the value of the finite one to their left (the middle of the
// range if there is none in the tile); what they were is in the lossless planes.
void load_tile(const Image& image, const PixelRect& rect, std::span<const SampleScale> scales,
               const PlaneRows& planes);
void store_tile(const Image& image, const PixelRect& rect, std::span<const SampleScale> scales,
                std::span<const SampleRange> ranges, const LosslessPlane& lossless,
                const PlaneRows& planes);

// Alpha, or which samples are not finite.
void put_lossless(Bytes& out, const Image& image);

}  // namespace zq
