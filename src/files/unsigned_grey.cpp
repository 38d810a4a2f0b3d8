// Samples of 16-bit grey.
#include "files/unsigned_grey.h"

#include <algorithm>

#include "kernels/grey_range.h"
#include "kernels/shift_samples.h"

namespace zq {

// As a pixel, which is signed, such a sample is negative.
bool any_above_signed(const std::uint8_t* row, std::size_t bytes) {
    IntegerRange range;
    widen_range(reinterpret_cast<const std::int16_t*>(row), bytes / 2, 1, 0, range);
    return range.least < 0;
}

UnsignedGreyRows::UnsignedGreyRows(Image& image, std::optional<std::int32_t> offset)
    : image_(image), offset_(offset) {}

void UnsignedGreyRows::add(std::int32_t first, std::int32_t count) {
    const std::int32_t last = first + count;
    first_ = first_ == last_ ? first : std::min(first_, first);
    last_ = std::max(last_, last);
    if (offset_) {
        shift(first, last);
    } else if (any_above_signed_in(first, last)) {
        offset_ = kWholeRangeOffset;
        shift(first_, last_);
    }
}

bool UnsignedGreyRows::any_above_signed_in(std::int32_t first, std::int32_t last) const {
    const std::size_t bytes = std::size_t{2} * static_cast<std::size_t>(image_.record().width);
    for (std::int32_t y = first; y < last; ++y) {
        if (any_above_signed(image_.row(y), bytes)) return true;
    }
    return false;
}

void UnsignedGreyRows::shift(std::int32_t first, std::int32_t last) {
    const auto width = static_cast<std::size_t>(image_.record().width);
    for (std::int32_t y = first; y < last; ++y)
        shift_samples(reinterpret_cast<std::uint16_t*>(image_.row(y)), width, *offset_);
}

}  // namespace zq
