// What a quality asks for, as straight lines between a few knots.
#pragma once

#include <cstddef>
#include <span>

namespace zq {

struct Knot {
    int quality;
    double value;
};

// At least two knots, by quality; the first and the last are those of qualities 1 and 100.
inline double value_at(std::span<const Knot> curve, int quality) {
    std::size_t i = 1;
    while (i + 1 < curve.size() && quality > curve[i].quality) ++i;
    const Knot& from = curve[i - 1];
    const Knot& to = curve[i];
    const double part = static_cast<double>(quality - from.quality) / (to.quality - from.quality);
    return from.value + part * (to.value - from.value);
}

}  // namespace zq
