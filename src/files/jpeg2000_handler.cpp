// JPEG 2000: the hand-over to reader and writer.
#include "files/jpeg2000_handler.h"

namespace zq {

bool Jpeg2000FileHandler::read_header() {
    reader_.emplace(input());
    if (!reader_->read_info()) return false;
    const Jpeg2000Layout& layout = reader_->layout();
    header_ = {.pixel_format = layout.format,
               .type = layout.type,
               .width = layout.width(),
               .height = layout.height(),
               .bits_per_pixel = layout.bits_per_pixel(),
               .bit_depth = layout.bit_depth()};
    return true;
}

void Jpeg2000FileHandler::write_header() {
    writer_.emplace(output(), job(), output_path());
    writer_->write_boxes();
}

}  // namespace zq
