// BMP: reading.
#include "files/bmp_handler.h"

#include <algorithm>

#include "base/checked.h"
#include "files/bmp_rle.h"
#include "files/write_job.h"

namespace zq {

namespace {

// Lines are read this many bytes at a time, but at least one.
constexpr std::size_t kBand = std::size_t{128} * 1024;
constexpr std::int32_t kMetre = 5;

std::optional<Calibration> calibration_of(const BmpHeader& header) {
    if (header.x_resolution <= 0 || header.y_resolution <= 0) return std::nullopt;
    return Calibration{kMetre, static_cast<float>(1.0 / header.x_resolution),
                       static_cast<float>(1.0 / header.y_resolution)};
}

}  // namespace

bool BmpFileHandler::read_header() {
    std::optional<BmpHeader> header = read_bmp_header(input());
    if (!header) return false;
    bmp_ = std::move(*header);
    header_ = {.pixel_format = pixel_format(),
               .type = bmp_.bits_per_pixel <= 8 ? PixelType::kU8 : PixelType::kRgb,
               .width = bmp_.width,
               .height = bmp_.height,
               .bits_per_pixel = static_cast<std::int32_t>(bmp_.bits_per_pixel),
               .calibration = calibration_of(bmp_)};
    return true;
}

// Colours of 16 bits have no code of their own; they count as what they become.
PixelFormat BmpFileHandler::pixel_format() const {
    switch (bmp_.bits_per_pixel) {
        case 1:
            return PixelFormat::kGrey1;
        case 2:
            return PixelFormat::kGrey2;
        case 4:
            return PixelFormat::kGrey4;
        case 8:
            return PixelFormat::kGrey8;
        case 32:
            return PixelFormat::kRgb32;
        default:
            return PixelFormat::kRgb24;
    }
}

void BmpFileHandler::seek_to_data() {
    if (bmp_.is_rle()) {
        check_bmp_rle_plausible(bmp_, input());
    } else {
        const auto height = static_cast<std::uint64_t>(bmp_.height);
        input().require(bmp_.data_offset, checked_mul(bmp_.line_bytes(), height));
    }
    input().seek(bmp_.data_offset);
}

// A picture whose palette is the ramp of greys is a grey picture and has no table.
std::vector<std::uint32_t> BmpFileHandler::read_colour_table() {
    if (header_.type != PixelType::kU8 || is_grey_ramp(bmp_)) return {};
    std::vector<std::uint32_t> table = bmp_.palette;
    table.resize(kColourTableSize, 0);
    return table;
}

bool BmpFileHandler::may_read_in_place() const {
    return input().size() != InputFile::kUnknownSize && !bmp_.is_rle();
}

void BmpFileHandler::read_lines(Image& image) {
    if (bmp_.is_rle()) {
        read_bmp_rle(input(), bmp_, image);
    } else {
        read_plain_lines(image);
    }
}

bool BmpFileHandler::is_direct(const BmpRowDecoder& decoder, const Image& image) const {
    const auto row_bytes = static_cast<std::uint64_t>(bmp_.width) *
                           static_cast<std::uint64_t>(bytes_per_pixel(image.type()));
    return decoder.is_copy() && row_bytes == bmp_.line_bytes();
}

void BmpFileHandler::read_plain_lines(Image& image) {
    const BmpRowDecoder decoder(bmp_);
    const auto line = checked_narrow<std::size_t>(bmp_.line_bytes());
    const auto rows = static_cast<std::size_t>(bmp_.height);
    std::uint8_t* row = image.row(bmp_.top_down ? 0 : bmp_.height - 1);
    const std::ptrdiff_t next = bmp_.top_down ? image.row_stride() : -image.row_stride();
    if (is_direct(decoder, image)) {
        input().read_rows({row, next, line, rows});
        return;
    }
    const std::size_t band = std::min(std::max<std::size_t>(kBand / line, 1), rows);
    std::vector<std::uint8_t> bytes(band * line);
    for (std::size_t done = 0; done < rows;) {
        const std::size_t count = std::min(band, rows - done);
        input().read(bytes.data(), count * line, kUnableToReadData);
        for (std::size_t i = 0; i < count; ++i, row += next) decoder.decode(&bytes[i * line], row);
        done += count;
    }
}

}  // namespace zq
