// The biorthogonal 9/7 wavelet (CDF) of one tile in place, scaled so that every coefficient weighs
// about the same in the squared error.
#pragma once

#include <array>
#include <cstddef>

namespace zq {

inline constexpr int kWaveletLevels = 5;
inline constexpr int kBands = 1 + 3 * kWaveletLevels;

// width x height samples, `stride` floats from one row to the next.
struct Tile {
    float* samples;
    int width;
    int height;
    std::ptrdiff_t stride;
};

// Where the coefficients of one band lie in the tile; possibly none.
struct Band {
    float* first;
    int width;
    int height;
    std::ptrdiff_t stride;
};

// A level splits what the one before left over into low and high columns (side by side) and low and
// high rows (row by row in turn). A side of one sample is not split. `spare` holds as many floats
// as a row.
void forward_wavelet(const Tile& tile, float* spare);
void inverse_wavelet(const Tile& tile, float* spare);

// Coarsest first: the low-pass rest; then, from the coarsest level to the finest, the high columns
// of the low rows, the low columns of the high rows, and the high columns of the high rows.
std::array<Band, kBands> bands_of(const Tile& tile);

}  // namespace zq
