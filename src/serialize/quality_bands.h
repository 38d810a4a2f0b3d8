// Bands of eight lines, a row of blocks, on their way between the pixels of a tile and the planes
// that libjpeg codes. Cheaper than to give libjpeg pixels and take pixels from it, as alpha would
// cost another pass over them.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <memory>

// After <cstdio>, which it needs.
#include <jpeglib.h>

#include "kernels/stores.h"
#include "kernels/ycc_rows.h"
#include "serialize/quality_lossless.h"

namespace zq {

// Borrows pixels.
struct PixelTile {
    std::uint8_t* first;
    std::ptrdiff_t stride;  // bytes
    std::int32_t x, y, width, height;

    std::uint8_t* row(JDIMENSION line) const { return first + line * stride; }
};

// Luminance and chrominance, or luminance alone, in memory of its own: whole blocks.
class BandPlanes {
  public:
    BandPlanes(std::size_t planes, std::size_t width);
    BandPlanes(const BandPlanes&) = delete;
    BandPlanes& operator=(const BandPlanes&) = delete;

    std::uint8_t* row(std::size_t plane, std::size_t line) const {
        return memory_.get() + (plane * DCTSIZE + line) * pitch_;
    }

  private:
    std::size_t pitch_;
    std::unique_ptr<std::uint8_t[]> memory_;
};

// Eight lines of each plane.
using BandRows = std::array<std::array<JSAMPROW, DCTSIZE>, 3>;

// From pixels, U8 or RGB. What blocks have beyond the tile repeats its last column and line.
class EncoderBand {
  public:
    // For tiles of up to `width` pixels.
    EncoderBand(bool colour, std::int32_t width);

    // The tile's lines from `first` on. They may be the image's own, and are not to be written.
    BandRows& load(const PixelTile& tile, JDIMENSION first);
    // Those that libjpeg wants next.
    void write(jpeg_compress_struct& jpeg, const PixelTile& tile);

    // Of all pixels so far, if they have colours.
    const CommonBits& bits() const { return bits_; }

  private:
    void load_line(const std::uint8_t* pixels, std::size_t width, std::size_t at);
    JSAMPROW whole_blocks(std::size_t plane, std::size_t at, std::size_t width) const;

    bool colour_;
    BandPlanes planes_;
    CommonBits bits_;
    BandRows rows_{};
};

// To pixels, those of RGB with their alpha.
class DecoderBand {
  public:
    // For tiles of up to `width` pixels; `alpha` must outlive the band.
    DecoderBand(bool colour, const LosslessPlane& alpha, std::int32_t width, Stores stores);

    BandRows& rows() { return rows_; }
    // The rows become the tile's lines from `first` on.
    void store(const PixelTile& tile, JDIMENSION first) const;
    // Those that libjpeg has next.
    void read(jpeg_decompress_struct& jpeg, const PixelTile& tile);

  private:
    const std::uint8_t* alpha_row(const PixelTile& tile, JDIMENSION line) const;

    bool colour_;
    const LosslessPlane& alpha_;
    Stores stores_;
    BandPlanes planes_;
    std::unique_ptr<std::uint8_t[]> constant_alpha_;
    BandRows rows_{};
};

}  // namespace zq
