// Pixels as the planes that libjpeg codes, a row of blocks at a time. Faster than to let libjpeg
// take the pixels, and what their alpha has in common is found on the way.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <memory>

// After <cstdio>, which it needs.
#include <jpeglib.h>

#include "kernels/ycc_rows.h"

namespace zq {

// U8 or RGB.
struct JpegPixels {
    const std::uint8_t* first;
    std::ptrdiff_t stride;  // bytes
    std::int32_t width, height;

    const std::uint8_t* row(JDIMENSION line) const { return first + line * stride; }
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

// What blocks have beyond the pixels repeats their last column and line.
class EncoderBand {
  public:
    // For pixels of up to so many columns.
    EncoderBand(bool colour, std::int32_t width);

    // The lines from `first` on. They may be the image's own, and are not to be written.
    BandRows& load(const JpegPixels& pixels, JDIMENSION first);
    // Those that libjpeg wants next; it has been told of raw data without subsampling.
    void write(jpeg_compress_struct& jpeg, const JpegPixels& pixels);

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

}  // namespace zq
