// Bands of eight lines, a row of blocks, on their way from the planes that libjpeg decodes to
// pixels. Cheaper than to take pixels from it, as alpha would cost another pass over them.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

#include "convert/jpeg_planes.h"
#include "kernels/stores.h"
#include "serialize/quality_lossless.h"

namespace zq {

// Borrows pixels.
struct PixelTile {
    std::uint8_t* first;
    std::ptrdiff_t stride;  // bytes
    std::int32_t x, y, width, height;

    std::uint8_t* row(JDIMENSION line) const { return first + line * stride; }
    JpegPixels pixels() const { return {first, stride, width, height}; }
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
