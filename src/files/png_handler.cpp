// PNG: the signature and the hand-over to reader and writer.
#include "files/png_handler.h"

#include <array>

namespace zq {

namespace {

// 0 for what can be no bit depth of the type.
std::int32_t bit_depth_of(PixelType type, std::optional<std::uint32_t> significant_bits) {
    const std::uint32_t bits = significant_bits.value_or(0);
    return has_bit_depth(type) && bits >= 8 && bits <= 16 ? static_cast<std::int32_t>(bits) : 0;
}

}  // namespace

bool PngFileHandler::read_header() {
    constexpr std::array<std::uint8_t, kPngSignatureBytes> kSignature = {0x89, 'P',  'N',  'G',
                                                                         '\r', '\n', 0x1A, '\n'};
    std::array<std::uint8_t, kPngSignatureBytes> bytes{};
    input().read_some(bytes.data(), bytes.size());
    if (bytes != kSignature) return false;

    const PngExtras extras = read_png_extras(input(), vision_);
    reader_.emplace(input(), extras.sample_offset);
    reader_->read_info();
    header_ = {.pixel_format = reader_->pixel_format(),
               .type = reader_->pixel_type(),
               .width = reader_->width(),
               .height = reader_->height(),
               .bits_per_pixel = reader_->bits_per_pixel(),
               .bit_depth = bit_depth_of(reader_->pixel_type(), extras.significant_bits),
               .calibration = extras.calibration};
    return true;
}

void PngFileHandler::write_header() {
    writer_.emplace(output(), job(), vision_);
    writer_->write_info();
}

}  // namespace zq
