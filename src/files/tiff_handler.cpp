// TIFF: the magic numbers and the hand-over to reader and writer.
#include "files/tiff_handler.h"

#include <array>

namespace zq {

bool TiffFileHandler::read_header() {
    using Magic = std::array<std::uint8_t, 4>;
    constexpr Magic kBigEndian = {'M', 'M', 0, '*'};
    constexpr Magic kLittleEndian = {'I', 'I', '*', 0};
    Magic bytes{};
    input().read_some(bytes.data(), bytes.size());
    if (bytes != kBigEndian && bytes != kLittleEndian) return false;

    reader_.emplace(input());
    const TiffLayout& layout = reader_->layout();
    header_ = {.pixel_format = layout.pixel_format(),
               .type = layout.pixel_type(),
               .width = reader_->width(),
               .height = reader_->height(),
               .bits_per_pixel = layout.bits_per_pixel(),
               .bit_depth = layout.bit_depth(),
               .calibration = reader_->calibration()};
    return true;
}

void TiffFileHandler::write_header() {
    writer_.emplace(output(), job(), output_path());
    writer_->write_tags();
}

void TiffFileHandler::write_end() {
    writer_->write_end();
    writer_.reset();
}

}  // namespace zq
