// Samples of 16-bit grey.
#include "files/unsigned_grey.h"

#include <algorithm>
#include <limits>

#include "kernels/grey_range.h"

namespace zq {

// As a pixel, which is signed, such a sample is negative.
bool any_above_signed(const std::uint8_t* row, std::size_t bytes) {
    IntegerRange range;
    widen_range(reinterpret_cast<const std::int16_t*>(row), bytes / 2, 1, 0, range);
    return range.least < 0;
}

void shift_unsigned_samples(Image& image, std::int32_t offset) {
    constexpr std::int32_t kLowest = std::numeric_limits<std::int16_t>::min();
    constexpr std::int32_t kHighest = std::numeric_limits<std::int16_t>::max();
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        auto* samples = reinterpret_cast<std::uint16_t*>(image.row(y));
        for (std::int32_t x = 0; x < image.record().width; ++x) {
            const std::int32_t value = samples[x] + offset;
            samples[x] = static_cast<std::uint16_t>(std::clamp(value, kLowest, kHighest));
        }
    }
}

}  // namespace zq
