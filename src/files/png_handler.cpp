// PNG: the signature and the hand-over to reader and writer.
#include "files/png_handler.h"

#include <array>

namespace zq {

bool PngFileHandler::read_header() {
    constexpr std::array<std::uint8_t, kPngSignatureBytes> kSignature = {0x89, 'P',  'N',  'G',
                                                                         '\r', '\n', 0x1A, '\n'};
    std::array<std::uint8_t, kPngSignatureBytes> bytes{};
    input().read_some(bytes.data(), bytes.size());
    if (bytes != kSignature) return false;

    reader_.emplace(input());
    reader_->read_info();
    header_ = {.pixel_format = reader_->pixel_format(),
               .type = reader_->pixel_type(),
               .width = reader_->width(),
               .height = reader_->height(),
               .bits_per_pixel = reader_->bits_per_pixel()};
    return true;
}

void PngFileHandler::write_header() {
    writer_.emplace(output(), job());
    writer_->write_info();
}

}  // namespace zq
