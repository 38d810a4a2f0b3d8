// Pixels of a mosaic one by one, through the tables: the ends of rows, and rows that are shorter
// than vectors.
#pragma once

#include <algorithm>

#include "kernels/bayer_rows.h"

namespace zq::scalar {

// The pixel of column x; left and right are the columns beside it, the same one at the ends.
template <class Sample>
std::uint32_t mosaic_pixel(const MosaicRow<Sample>& row, const MosaicTables& tables, std::size_t x,
                           std::size_t left, std::size_t right) {
    const auto sum = [](Sample a, Sample b) { return std::uint32_t{a} + b; };
    const Sample here = row.current[x];
    const std::uint32_t beside = sum(row.current[left], row.current[right]);
    const std::uint32_t upright = sum(row.above[x], row.below[x]);
    if ((x % 2 == 0) != row.own_first) {
        return tables.own[beside >> 1] | tables.green[here] | tables.other[upright >> 1];
    }
    const std::uint32_t corners =
        sum(row.above[left], row.above[right]) + sum(row.below[left], row.below[right]);
    return tables.own[here] | tables.green[(upright + beside) >> 2] | tables.other[corners >> 2];
}

// The pixels of columns begin to end, end exclusive. A single column is its own neighbour.
template <class Sample>
void decode_mosaic_columns(const MosaicRow<Sample>& row, const MosaicTables& tables,
                           std::size_t begin, std::size_t end, std::uint32_t* pixels) {
    const std::size_t last = row.columns - 1;
    for (std::size_t x = begin; x < end; ++x) {
        const std::size_t left = x > 0 ? x - 1 : std::min<std::size_t>(1, last);
        pixels[x] = mosaic_pixel(row, tables, x, left, x < last ? x + 1 : left);
    }
}

}  // namespace zq::scalar
