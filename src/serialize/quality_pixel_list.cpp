// Writing lists of pixels.
#include "serialize/quality_pixel_list.h"

namespace zq {

void PixelListWriter::put(std::uint64_t index) {
    std::uint64_t skipped = index - next_;
    for (; skipped > 0x7F; skipped >>= 7) out_.push_back(static_cast<std::uint8_t>(skipped | 0x80));
    out_.push_back(static_cast<std::uint8_t>(skipped));
    next_ = index + 1;
}

}  // namespace zq
