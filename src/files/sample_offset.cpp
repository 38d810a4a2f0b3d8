// 16-bit samples that are unsigned in a file.
#include "files/sample_offset.h"

#include <algorithm>

namespace zq {

namespace {

constexpr std::uint16_t kSign = 0x8000;

template <class Visit>
void each_row(Image& image, Visit visit) {
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        auto* first = reinterpret_cast<std::uint16_t*>(image.row(y));
        visit(first, first + image.record().width);
    }
}

}  // namespace

void move_unsigned_samples(Image& image) {
    std::uint16_t all = 0;
    each_row(image, [&](const std::uint16_t* first, const std::uint16_t* last) {
        std::for_each(first, last, [&](std::uint16_t sample) {
            all = static_cast<std::uint16_t>(all | sample);
        });
    });
    if ((all & kSign) == 0) return;
    each_row(image, [](std::uint16_t* first, std::uint16_t* last) {
        std::transform(first, last, first, [](std::uint16_t sample) {
            return static_cast<std::uint16_t>(sample ^ kSign);
        });
    });
    image.set_sample_offset(-kSign);
}

}  // namespace zq
