// JPEG: the first bytes and the hand-over to reader and writer.
#include "files/jpeg_handler.h"

#include <array>

namespace zq {

bool JpegFileHandler::read_header() {
    constexpr std::array<std::uint8_t, 3> kStart = {0xFF, 0xD8, 0xFF};
    std::array<std::uint8_t, kStart.size()> bytes{};
    input().read_some(bytes.data(), bytes.size());
    if (bytes != kStart) return false;

    input().rewind();
    reader_.emplace(input());
    reader_->read_info();
    const bool grey = reader_->is_grey();
    header_ = {.pixel_format = grey ? PixelFormat::kGrey8 : PixelFormat::kRgb24,
               .type = grey ? PixelType::kU8 : PixelType::kRgb,
               .width = reader_->width(),
               .height = reader_->height(),
               .bits_per_pixel = grey ? 8 : 24,
               .calibration = reader_->calibration()};
    return true;
}

void JpegFileHandler::write_header() {
    writer_.emplace(output(), job());
    writer_->write_info();
}

}  // namespace zq
