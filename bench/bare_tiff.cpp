// libtiff and nothing else.
#include "bare_tiff.h"

#include <tiffio.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <vector>

namespace zqbench {

namespace {

struct Closer {
    void operator()(TIFF* tiff) const { TIFFClose(tiff); }
};
using Tiff = std::unique_ptr<TIFF, Closer>;

Tiff open_tiff(const std::string& path, const char* mode) {
    Tiff tiff(TIFFOpen(path.c_str(), mode));
    check(tiff != nullptr, "TIFFOpen");
    return tiff;
}

void set_tags(TIFF* tiff, const Image& image, std::uint16_t compression, std::uint32_t strip_rows) {
    const bool colour = image.handle()->type == ZQ_TYPE_RGB;
    TIFFSetField(tiff, TIFFTAG_IMAGEWIDTH, kPhotoWidth);
    TIFFSetField(tiff, TIFFTAG_IMAGELENGTH, kPhotoHeight);
    TIFFSetField(tiff, TIFFTAG_BITSPERSAMPLE, image.handle()->type == ZQ_TYPE_I16 ? 16 : 8);
    TIFFSetField(tiff, TIFFTAG_SAMPLESPERPIXEL, colour ? 3 : 1);
    TIFFSetField(tiff, TIFFTAG_PHOTOMETRIC, colour ? PHOTOMETRIC_RGB : PHOTOMETRIC_MINISBLACK);
    TIFFSetField(tiff, TIFFTAG_PLANARCONFIG, PLANARCONFIG_CONTIG);
    TIFFSetField(tiff, TIFFTAG_COMPRESSION, compression);
    TIFFSetField(tiff, TIFFTAG_ROWSPERSTRIP, strip_rows);
}

}  // namespace

void bare_tiff_write(const std::string& path, const Image& image, std::uint16_t compression,
                     std::uint32_t strip_rows) {
    const Tiff tiff = open_tiff(path, "wl");
    set_tags(tiff.get(), image, compression, strip_rows);
    const bool colour = image.handle()->type == ZQ_TYPE_RGB;
    const auto line = static_cast<std::size_t>(TIFFScanlineSize(tiff.get()));
    std::vector<std::uint8_t> strip(line * strip_rows);
    for (std::uint32_t y = 0; y < std::uint32_t{kPhotoHeight}; y += strip_rows) {
        const std::uint32_t rows = std::min(strip_rows, kPhotoHeight - y);
        for (std::uint32_t i = 0; i < rows; ++i) {
            const std::uint8_t* from = image.row(static_cast<std::int32_t>(y + i));
            std::uint8_t* const to = &strip[i * line];
            if (!colour) std::memcpy(to, from, line);
            for (std::size_t x = 0; colour && x < std::size_t{kPhotoWidth}; ++x) {
                for (std::size_t c = 0; c < 3; ++c) to[3 * x + c] = from[4 * x + 2 - c];
            }
        }
        const auto bytes = static_cast<tmsize_t>(rows * line);
        check(TIFFWriteEncodedStrip(tiff.get(), y / strip_rows, strip.data(), bytes) == bytes,
              "TIFFWriteEncodedStrip");
    }
}

Rows bare_tiff_read(const std::string& path) {
    const Tiff tiff = open_tiff(path, "r");
    std::uint16_t samples = 1;
    std::uint32_t strip_rows = 0;
    TIFFGetField(tiff.get(), TIFFTAG_SAMPLESPERPIXEL, &samples);
    TIFFGetField(tiff.get(), TIFFTAG_ROWSPERSTRIP, &strip_rows);
    const bool colour = samples == 3;
    const auto line = static_cast<std::size_t>(TIFFScanlineSize(tiff.get()));
    Rows picture(colour ? std::size_t{4} * kPhotoWidth : line, kPhotoHeight);
    const std::unique_ptr<std::uint8_t[]> strip(new std::uint8_t[line * strip_rows]);
    for (std::uint32_t y = 0; y < std::uint32_t{kPhotoHeight}; y += strip_rows) {
        const std::uint32_t rows = std::min(strip_rows, kPhotoHeight - y);
        const auto bytes = static_cast<tmsize_t>(rows * line);
        check(TIFFReadEncodedStrip(tiff.get(), y / strip_rows, strip.get(), bytes) == bytes,
              "TIFFReadEncodedStrip");
        for (std::size_t i = 0; i < rows; ++i) {
            const std::uint8_t* from = strip.get() + i * line;
            std::uint8_t* pixel = picture.row(y + i);
            if (!colour) std::memcpy(pixel, from, line);
            for (std::int32_t x = 0; colour && x < kPhotoWidth; ++x, from += 3, pixel += 4) {
                for (std::size_t c = 0; c < 3; ++c) pixel[c] = from[2 - c];
                pixel[3] = 0;
            }
        }
    }
    return picture;
}

}  // namespace zqbench
