// Finding the gain of a table.
#include "convert/bayer_line.h"

#include <algorithm>
#include <cstddef>

#include "kernels/bayer_rows.h"

namespace zq {

namespace {

constexpr std::uint32_t kGainLimit = 4096;

// Index of the first entry of at least `level` in a rising table, the last entry at the latest. In
// other tables any index.
std::uint32_t first_at(std::span<const std::uint32_t> table, std::uint32_t level) {
    std::size_t low = 0, high = table.size() - 1;
    while (low < high) {
        const std::size_t middle = (low + high) / 2;
        if (table[middle] < level) {
            low = middle + 1;
        } else {
            high = middle;
        }
    }
    return static_cast<std::uint32_t>(low);
}

std::uint32_t divide_up(std::uint32_t dividend, std::uint32_t divisor) {
    return (dividend + divisor - 1) / divisor;
}

// If some gain makes this table, the result makes it too: it is the least one that reaches each
// level where the table does, and a smaller gain reaches none earlier. It is found as soon as a
// single candidate is left, mostly after the highest levels.
std::uint32_t least_gain(std::span<const std::uint32_t> table, int shift, int place) {
    std::uint32_t low = 0, high = kGainLimit;
    for (std::uint32_t level = std::min(table.back() >> place, 255U); level > 0 && low < high;
         --level) {
        const std::uint32_t reached = first_at(table, level << place);
        if (reached == 0) return kGainLimit;  // a line starts at 0
        low = std::max(low, divide_up(level << shift, reached));
        if (reached > 1) high = std::min(high, divide_up(level << shift, reached - 1) - 1);
    }
    return low;
}

}  // namespace

std::optional<std::uint32_t> gain_of_line(std::span<const std::uint32_t> table, int shift,
                                          int place) {
    const std::uint32_t gain = least_gain(table, shift, place);
    if (gain >= kGainLimit || !is_clipped_line(table.data(), table.size(), gain, shift, place)) {
        return std::nullopt;
    }
    return gain;
}

}  // namespace zq
