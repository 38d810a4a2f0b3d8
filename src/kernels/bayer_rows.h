// Rows of Bayer mosaics: samples of one colour a pixel become pixels of three by bilinear
// interpolation.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq {

// A row and its neighbours. A row has two colours: its own, red or blue, in every second column,
// and green between; the other of red and blue lies above and below. Of each of the three rows
// `columns` samples are read and nothing beyond, at any alignment.
template <class Sample>
struct MosaicRow {
    const Sample* above;
    const Sample* current;
    const Sample* below;
    std::size_t columns;  // at least 1
    bool own_first;       // its own colour lies in columns 0, 2, 4, ...
};

// An entry for each value of a sample; a pixel is three entries, combined by "or".
struct MosaicTables {
    const std::uint32_t* own;
    const std::uint32_t* green;
    const std::uint32_t* other;
};

// What tables of clipped lines hold: min(255, value * gain >> shift) in the byte of the colour.
// Gains are below 4096; the shift is 8 to 10 for bytes and 11 to 18 for 16-bit samples.
struct MosaicGains {
    std::uint32_t own;
    std::uint32_t green;
    std::uint32_t other;
    int shift;
    bool own_is_red;
};

// Writes `columns` pixels that do not overlap the samples.
void decode_mosaic_row(const MosaicRow<std::uint8_t>& row, const MosaicTables& tables,
                       std::uint32_t* pixels);
void decode_mosaic_row(const MosaicRow<std::uint16_t>& row, const MosaicTables& tables,
                       std::uint32_t* pixels);

// The same for tables that hold the gains' lines: computes what the others look up.
void decode_mosaic_row(const MosaicRow<std::uint8_t>& row, const MosaicTables& tables,
                       const MosaicGains& gains, std::uint32_t* pixels);
void decode_mosaic_row(const MosaicRow<std::uint16_t>& row, const MosaicTables& tables,
                       const MosaicGains& gains, std::uint32_t* pixels);

// Whether entry i is min(255, i * gain >> shift) << place for every i. A gain below 4096, and a
// multiple of 64 entries up to 65,536.
bool is_clipped_line(const std::uint32_t* table, std::size_t entries, std::uint32_t gain, int shift,
                     int place);

}  // namespace zq
