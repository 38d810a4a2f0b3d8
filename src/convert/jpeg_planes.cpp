// libjpeg gets pointers to lines; those of U8 can point into the image.
#include "convert/jpeg_planes.h"

#include <algorithm>
#include <cstring>

namespace zq {

namespace {

// Whole blocks; an odd number of cache lines, so that rows do not drive each other out of it.
std::size_t pitch_for(std::size_t width) {
    constexpr std::size_t kLine = 64;
    return (((width + kLine - 1) / kLine) | 1) * kLine;
}

}  // namespace

BandPlanes::BandPlanes(std::size_t planes, std::size_t width)
    : pitch_(pitch_for(width)),
      memory_(std::make_unique_for_overwrite<std::uint8_t[]>(planes * DCTSIZE * pitch_)) {}

EncoderBand::EncoderBand(bool colour, std::int32_t width)
    : colour_(colour), planes_(colour ? 3 : 1, static_cast<std::size_t>(width)) {}

BandRows& EncoderBand::load(const JpegPixels& pixels, JDIMENSION first) {
    for (std::size_t at = 0; at < DCTSIZE; ++at) {
        const JDIMENSION line = first + static_cast<JDIMENSION>(at);
        if (line < static_cast<JDIMENSION>(pixels.height)) {
            load_line(pixels.row(line), static_cast<std::size_t>(pixels.width), at);
        } else {
            for (auto& plane : rows_) plane[at] = plane[at - 1];
        }
    }
    return rows_;
}

void EncoderBand::write(jpeg_compress_struct& jpeg, const JpegPixels& pixels) {
    BandRows& rows = load(pixels, jpeg.next_scanline);
    JSAMPARRAY planes[] = {rows[0].data(), rows[1].data(), rows[2].data()};
    jpeg_write_raw_data(&jpeg, planes, DCTSIZE);
}

void EncoderBand::load_line(const std::uint8_t* pixels, std::size_t width, std::size_t at) {
    if (colour_) {
        const YccTarget target = {planes_.row(0, at), planes_.row(1, at), planes_.row(2, at)};
        bgra_to_ycc(reinterpret_cast<const std::uint32_t*>(pixels), target, width, bits_);
        for (std::size_t plane = 0; plane < rows_.size(); ++plane) {
            rows_[plane][at] = whole_blocks(plane, at, width);
        }
    } else if (width % DCTSIZE == 0) {
        rows_[0][at] = const_cast<JSAMPROW>(pixels);  // only read, whatever libjpeg's type says
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

}  // namespace zq
