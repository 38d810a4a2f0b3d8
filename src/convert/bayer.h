// Bayer mosaics to RGB pixels, and the tables of that.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

struct BayerGains {
    double red, green, blue;
};

// Word is std::uint32_t to fill the tables and const std::uint32_t to use them.
template <class Word>
struct BayerTables {
    Word* red;
    Word* green;
    Word* blue;
};

// Fills tables for samples of `bit_depth` bits: 256 entries each for a depth of 8 or less, 65,536
// for a greater one. Throws the refusals of gains, pointers and depth, in that order, before
// anything is written.
void calculate_bayer_tables(const BayerGains& gains, const BayerTables<std::uint32_t>& tables,
                            std::uint32_t bit_depth);

// The mosaic: bytes for a bit depth of 8 or less, 16-bit samples for a greater one. Line widths are
// in samples and in pixels; they may be anything, but an area that has no place in memory is
// refused.
struct BayerMosaic {
    const void* samples;
    std::uint32_t rows;
    std::uint32_t columns;
    std::uint32_t line_width;
    std::uint32_t pattern;
    std::uint32_t bit_depth;
};

// Writes rows x columns pixels that do not overlap the samples. Throws the refusals of pointers,
// sizes, pattern and depth, in that order, before anything is written.
void decode_bayer(const BayerMosaic& mosaic, const BayerTables<const std::uint32_t>& tables,
                  std::uint32_t* pixels, std::uint32_t pixel_line_width);

}  // namespace zq
