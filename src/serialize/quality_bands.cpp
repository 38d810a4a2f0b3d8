// libjpeg gets pointers to lines; those of U8 tiles can point into the image.
#include "serialize/quality_bands.h"

#include <algorithm>
#include <cstring>

namespace zq {

namespace {

// Whole blocks; an odd number of cache lines, so that rows do not drive each other out of it.
std::size_t pitch_for(std::size_t width) {
    constexpr std::size_t kLine = 64;
    return (((width + kLine - 1) / kLine) | 1) * kLine;
}

std::array<JSAMPARRAY, 3> plane_pointers(BandRows& rows) {
    return {rows[0].data(), rows[1].data(), rows[2].data()};
}

}  // namespace

BandPlanes::BandPlanes(std::size_t planes, std::size_t width)
    : pitch_(pitch_for(width)),
      memory_(std::make_unique_for_overwrite<std::uint8_t[]>(planes * DCTSIZE * pitch_)) {}

EncoderBand::EncoderBand(bool colour, std::int32_t width)
    : colour_(colour), planes_(colour ? 3 : 1, static_cast<std::size_t>(width)) {}

BandRows& EncoderBand::load(const PixelTile& tile, JDIMENSION first) {
    for (std::size_t at = 0; at < DCTSIZE; ++at) {
        const JDIMENSION line = first + static_cast<JDIMENSION>(at);
        if (line < static_cast<JDIMENSION>(tile.height)) {
            load_line(tile.row(line), static_cast<std::size_t>(tile.width), at);
        } else {
            for (auto& plane : rows_) plane[at] = plane[at - 1];
        }
    }
    return rows_;
}

void EncoderBand::write(jpeg_compress_struct& jpeg, const PixelTile& tile) {
    auto pointers = plane_pointers(load(tile, jpeg.next_scanline));
    jpeg_write_raw_data(&jpeg, pointers.data(), DCTSIZE);
}

void EncoderBand::load_line(const std::uint8_t* pixels, std::size_t width, std::size_t at) {
    if (colour_) {
        const YccTarget target = {planes_.row(0, at), planes_.row(1, at), planes_.row(2, at)};
        bgra_to_ycc(reinterpret_cast<const std::uint32_t*>(pixels), target, width, bits_);
        for (std::size_t plane = 0; plane < rows_.size(); ++plane) {
            rows_[plane][at] = whole_blocks(plane, at, width);
        }
    } else if (width % DCTSIZE == 0) {
        rows_[0][at] = const_cast<JSAMPROW>(pixels);  // libjpeg only reads
    } else {
        std::memcpy(planes_.row(0, at), pixels, width);
        rows_[0][at] = whole_blocks(0, at, width);
    }
}

JSAMPROW EncoderBand::whole_blocks(std::size_t plane, std::size_t at, std::size_t width) const {
    std::uint8_t* row = planes_.row(plane, at);
    std::memset(row + width, row[width - 1], (0 - width) % DCTSIZE);
    return row;
}

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
    auto pointers = plane_pointers(rows_);
    jpeg_read_raw_data(&jpeg, pointers.data(), DCTSIZE);
    store(tile, first);
}

const std::uint8_t* DecoderBand::alpha_row(const PixelTile& tile, JDIMENSION line) const {
    if (alpha_.planes == nullptr) return constant_alpha_.get();
    return alpha_.planes->row(0, static_cast<std::size_t>(tile.y) + line) + tile.x;
}

}  // namespace zq
