// Back from planes: colours by a kernel that takes their alpha along.
#include "serialize/quality_bands.h"

#include <algorithm>
#include <cstring>

namespace zq {

DecoderBand::DecoderBand(bool colour, const LosslessPlane& alpha, std::int32_t width, Stores stores)
    : colour_(colour),
      alpha_(alpha),
      stores_(stores),
      planes_(colour ? 3 : 1, static_cast<std::size_t>(width)) {
    for (std::size_t plane = 0; plane < (colour ? rows_.size() : 1); ++plane) {
        for (std::size_t line = 0; line < DCTSIZE; ++line) {
            rows_[plane][line] = planes_.row(plane, line);
        }
    }
    if (!colour || alpha.planes != nullptr) return;
    constant_alpha_ =
        std::make_unique_for_overwrite<std::uint8_t[]>(static_cast<std::size_t>(width));
    std::fill_n(constant_alpha_.get(), width, static_cast<std::uint8_t>(alpha.value));
}

void DecoderBand::store(const PixelTile& tile, JDIMENSION first) const {
    const auto width = static_cast<std::size_t>(tile.width);
    const JDIMENSION count =
        std::min<JDIMENSION>(DCTSIZE, static_cast<JDIMENSION>(tile.height) - first);
    for (JDIMENSION i = 0; i < count; ++i) {
        std::uint8_t* pixels = tile.row(first + i);
        if (colour_) {
            ycc_to_bgra({rows_[0][i], rows_[1][i], rows_[2][i], alpha_row(tile, first + i)},
                        reinterpret_cast<std::uint32_t*>(pixels), width, stores_);
        } else {
            std::memcpy(pixels, rows_[0][i], width);
        }
    }
}

void DecoderBand::read(jpeg_decompress_struct& jpeg, const PixelTile& tile) {
    const JDIMENSION first = jpeg.output_scanline;
    JSAMPARRAY planes[] = {rows_[0].data(), rows_[1].data(), rows_[2].data()};
    jpeg_read_raw_data(&jpeg, planes, DCTSIZE);
    store(tile, first);
}

const std::uint8_t* DecoderBand::alpha_row(const PixelTile& tile, JDIMENSION line) const {
    if (alpha_.planes == nullptr) return constant_alpha_.get();
    return alpha_.planes->row(0, static_cast<std::size_t>(tile.y) + line) + tile.x;
}

}  // namespace zq
