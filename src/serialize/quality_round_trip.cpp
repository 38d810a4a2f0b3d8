// Transform once, round and transform back for each quality.
#include "serialize/quality_round_trip.h"

#include <algorithm>

#include "convert/jpeg_planes.h"
#include "kernels/dct_blocks.h"
#include "kernels/stores.h"
#include "serialize/quality_bands.h"
#include "serialize/quality_lossless.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

constexpr std::int32_t kBandLines = DCTSIZE;

std::size_t blocks_for(std::int32_t samples) {
    return (static_cast<std::size_t>(samples) + DCTSIZE - 1) / DCTSIZE;
}

PixelTile whole(const Image& image) {
    return {image.row(0), image.row_stride(), 0, 0, image.record().width, image.record().height};
}

template <class Lines, class Rows>
Lines lines_of(const Rows& rows) {
    Lines lines{};
    std::copy(rows.begin(), rows.end(), lines.begin());
    return lines;
}

}  // namespace

JpegRoundTrip::JpegRoundTrip(const Image& picture)
    : planes_(picture.type() == PixelType::kU8 ? 1 : 3),
      blocks_(blocks_for(picture.record().width)) {
    const PixelTile tile = whole(picture);
    const std::size_t bands = blocks_for(tile.height);
    coefficients_.resize(bands * planes_ * blocks_ * kBlockValues);
    EncoderBand band(planes_ == 3, tile.width);
    std::int16_t* to = coefficients_.data();
    for (std::int32_t y = 0; y < tile.height; y += kBandLines) {
        const auto& rows = band.load(tile.pixels(), static_cast<JDIMENSION>(y));
        for (std::size_t plane = 0; plane < planes_; ++plane, to += blocks_ * kBlockValues) {
            forward_dct(lines_of<BlockLines>(rows[plane]), blocks_, to);
        }
    }
}

const std::int16_t* JpegRoundTrip::coefficients_of(std::size_t band, std::size_t plane) const {
    return coefficients_.data() + (band * planes_ + plane) * blocks_ * kBlockValues;
}

void JpegRoundTrip::decode(int quality, const Image& result) const {
    const PixelTile tile = whole(result);
    const bool colour = planes_ == 3;
    const BlockSteps luma(colour ? luma_steps(quality) : grey_steps(quality));
    const BlockSteps chroma(chroma_steps(quality));
    const LosslessPlane no_alpha;
    DecoderBand band(colour, no_alpha, tile.width, Stores::kCached);
    for (std::int32_t y = 0; y < tile.height; y += kBandLines) {
        const auto at = static_cast<std::size_t>(y / kBandLines);
        for (std::size_t plane = 0; plane < planes_; ++plane) {
            inverse_dct_of_rounded(coefficients_of(at, plane), blocks_, plane == 0 ? luma : chroma,
                                   lines_of<BlockTargets>(band.rows()[plane]));
        }
        band.store(tile, static_cast<JDIMENSION>(y));
    }
}

}  // namespace zq
