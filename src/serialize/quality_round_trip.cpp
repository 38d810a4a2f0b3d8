// Transform once, round and transform back for each quality.
#include "serialize/quality_round_trip.h"

#include <algorithm>

#include "convert/jpeg_planes.h"
#include "kernels/dct_blocks.h"
#include "kernels/stores.h"
#include "serialize/quality_bands.h"
#include "serialize/quality_errors.h"
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

struct PlaneSteps {
    PlaneSteps(bool colour, int quality)
        : first(colour ? luma_steps(quality) : grey_steps(quality)),
          others(chroma_steps(quality)) {}
    BlockSteps first, others;
};

void transform(const BandRows& rows, const JpegBandShape& shape, std::int16_t* to) {
    for (std::size_t plane = 0; plane < shape.planes; ++plane) {
        forward_dct(lines_of<BlockLines>(rows[plane]), shape.blocks, to);
        to += shape.blocks * kBlockValues;
    }
}

void transform_back(const std::int16_t* from, const JpegBandShape& shape, const PlaneSteps& steps,
                    const BandRows& rows) {
    for (std::size_t plane = 0; plane < shape.planes; ++plane) {
        inverse_dct_of_rounded(from, shape.blocks, plane == 0 ? steps.first : steps.others,
                               lines_of<BlockTargets>(rows[plane]));
        from += shape.blocks * kBlockValues;
    }
}

}  // namespace

JpegBandShape::JpegBandShape(const Image& picture)
    : planes(picture.type() == PixelType::kU8 ? 1 : 3),
      blocks(blocks_for(picture.record().width)) {}

std::size_t JpegBandShape::coefficients() const {
    return planes * blocks * kBlockValues;
}

JpegRoundTrip::JpegRoundTrip(const Image& picture) : shape_(picture) {
    const PixelTile tile = whole(picture);
    coefficients_.resize(blocks_for(tile.height) * shape_.coefficients());
    EncoderBand band(shape_.planes == 3, tile.width);
    std::int16_t* to = coefficients_.data();
    for (std::int32_t y = 0; y < tile.height; y += kBandLines, to += shape_.coefficients()) {
        transform(band.load(tile.pixels(), static_cast<JDIMENSION>(y)), shape_, to);
    }
}

void JpegRoundTrip::decode(int quality, const Image& result) const {
    const PixelTile tile = whole(result);
    const bool colour = shape_.planes == 3;
    const PlaneSteps steps(colour, quality);
    const LosslessPlane no_alpha;
    DecoderBand band(colour, no_alpha, tile.width, Stores::kCached);
    const std::int16_t* from = coefficients_.data();
    for (std::int32_t y = 0; y < tile.height; y += kBandLines, from += shape_.coefficients()) {
        transform_back(from, shape_, steps, band.rows());
        band.store(tile, static_cast<JDIMENSION>(y));
    }
}

std::vector<double> squared_errors(const Image& picture, std::span<const int> qualities) {
    const PixelTile tile = whole(picture);
    const JpegBandShape shape(picture);
    const bool colour = shape.planes == 3;
    const ErrorMeasure measure = error_measure_of(picture.type());
    std::vector<PlaneSteps> steps;
    for (const int quality : qualities) steps.emplace_back(colour, quality);
    std::vector<std::int16_t> coefficients(shape.coefficients());
    const LosslessPlane no_alpha;
    EncoderBand there(colour, tile.width);
    DecoderBand back(colour, no_alpha, tile.width, Stores::kCached);
    Image lines(Variant::kPrivate, {});
    lines.reinitialise(
        {.type = picture.record().type, .width = tile.width, .height = kBandLines, .border = 0});
    std::vector<Errors> errors(qualities.size());
    for (std::int32_t y = 0; y < tile.height; y += kBandLines) {
        transform(there.load(tile.pixels(), static_cast<JDIMENSION>(y)), shape,
                  coefficients.data());
        for (std::size_t i = 0; i < qualities.size(); ++i) {
            transform_back(coefficients.data(), shape, steps[i], back.rows());
            back.store(whole(lines), 0);
            for (std::int32_t line = 0; line < std::min(kBandLines, tile.height - y); ++line) {
                measure.add_row(picture.row(y + line), lines.row(line), tile.width, errors[i]);
            }
        }
    }
    std::vector<double> totals;
    for (const Errors& each : errors) totals.push_back(each.total);
    return totals;
}

}  // namespace zq
