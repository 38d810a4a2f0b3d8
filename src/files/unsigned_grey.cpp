// Samples of 16-bit grey, four at a time.
#include "files/unsigned_grey.h"

#include <algorithm>
#include <cstring>
#include <limits>

namespace zq {

bool any_above_signed(const std::uint8_t* row, std::size_t bytes) {
    std::uint64_t all = 0;
    std::size_t i = 0;
    for (; i + sizeof(all) <= bytes; i += sizeof(all)) {
        std::uint64_t four;
        std::memcpy(&four, row + i, sizeof(four));
        all |= four;
    }
    for (; i < bytes; i += 2) all |= std::uint64_t{row[i + 1]} << 8;
    return (all & 0x8000800080008000U) != 0;
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
