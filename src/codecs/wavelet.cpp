// Lifting, first down the columns (whole rows at a time), then along each row.
#include "codecs/wavelet.h"

#include <algorithm>

namespace zq {

namespace {

// The four lifting steps and the scale of the Daubechies-Sweldens factorisation.
constexpr std::array<float, 4> kLift = {-1.586134342F, -0.05298011854F, 0.8829110762F,
                                        0.4435068522F};
constexpr float kScale = 1.149604398F;

// target[i] += factor * (a[i] + b[i])
void lift(float* target, const float* a, const float* b, float factor, int count) {
    for (int i = 0; i < count; ++i) target[i] += factor * (a[i] + b[i]);
}

void scale(float* target, float factor, int count) {
    for (int i = 0; i < count; ++i) target[i] *= factor;
}

// Every second row, from row `parity` on, takes in its neighbours; outside, rows are mirrored.
void lift_rows(const Tile& level, int parity, float factor) {
    for (int y = parity; y < level.height; y += 2) {
        const int above = y > 0 ? y - 1 : y + 1;
        const int below = y + 1 < level.height ? y + 1 : y - 1;
        float* row = level.samples + y * level.stride;
        lift(row, level.samples + above * level.stride, level.samples + below * level.stride,
             factor, level.width);
    }
}

void scale_rows(const Tile& level, float low) {
    for (int y = 0; y < level.height; ++y) {
        scale(level.samples + y * level.stride, y % 2 == 0 ? low : 1 / low, level.width);
    }
}

// high[i] lies between low[i] and low[i + 1], low[i] between high[i - 1] and high[i].
void lift_high(float* high, const float* low, float factor, int count) {
    const int highs = count / 2;
    const int inner = (count + 1) / 2 - 1;
    lift(high, low, low + 1, factor, inner);
    if (inner < highs) high[inner] += factor * (low[inner] + low[inner]);
}

void lift_low(float* low, const float* high, float factor, int count) {
    const int highs = count / 2;
    low[0] += factor * (high[0] + high[0]);
    lift(low + 1, high, high + 1, factor, highs - 1);
    if (count % 2 != 0) low[highs] += factor * (high[highs - 1] + high[highs - 1]);
}

void split_row(float* row, int count, float* spare) {
    const int lows = (count + 1) / 2;
    float* high = spare;
    for (int i = 0; i < count / 2; ++i) high[i] = row[2 * i + 1];
    for (int i = 0; i < lows; ++i) row[i] = row[2 * i];
    lift_high(high, row, kLift[0], count);
    lift_low(row, high, kLift[1], count);
    lift_high(high, row, kLift[2], count);
    lift_low(row, high, kLift[3], count);
    scale(row, kScale, lows);
    for (int i = 0; i < count / 2; ++i) row[lows + i] = high[i] * (1 / kScale);
}

void join_row(float* row, int count, float* spare) {
    const int lows = (count + 1) / 2;
    float* low = spare;
    float* high = spare + lows;
    for (int i = 0; i < lows; ++i) low[i] = row[i] * (1 / kScale);
    for (int i = lows; i < count; ++i) spare[i] = row[i] * kScale;
    lift_low(low, high, -kLift[3], count);
    lift_high(high, low, -kLift[2], count);
    lift_low(low, high, -kLift[1], count);
    lift_high(high, low, -kLift[0], count);
    for (int i = 0; i < count / 2; ++i) {
        row[2 * i] = low[i];
        row[2 * i + 1] = high[i];
    }
    if (count % 2 != 0) row[count - 1] = low[lows - 1];
}

// What level 0, 1, ... splits: every 2^level-th row, and the columns that are still low.
Tile level_of(const Tile& tile, int level) {
    Tile part = tile;
    for (int i = 0; i < level; ++i) {
        part.width = (part.width + 1) / 2;
        part.height = (part.height + 1) / 2;
        part.stride *= 2;
    }
    return part;
}

}  // namespace

void forward_wavelet(const Tile& tile, float* spare) {
    for (int number = 0; number < kWaveletLevels; ++number) {
        const Tile level = level_of(tile, number);
        if (level.height > 1) {
            for (std::size_t i = 0; i < 4; ++i) lift_rows(level, i % 2 == 0 ? 1 : 0, kLift[i]);
            scale_rows(level, kScale);
        }
        if (level.width == 1) continue;
        for (int y = 0; y < level.height; ++y) {
            split_row(level.samples + y * level.stride, level.width, spare);
        }
    }
}

void inverse_wavelet(const Tile& tile, float* spare) {
    for (int number = kWaveletLevels - 1; number >= 0; --number) {
        const Tile level = level_of(tile, number);
        if (level.width > 1) {
            for (int y = 0; y < level.height; ++y) {
                join_row(level.samples + y * level.stride, level.width, spare);
            }
        }
        if (level.height == 1) continue;
        scale_rows(level, 1 / kScale);
        for (std::size_t i = 4; i-- > 0;) lift_rows(level, i % 2 == 0 ? 1 : 0, -kLift[i]);
    }
}

std::array<Band, kBands> bands_of(const Tile& tile) {
    std::array<Band, kBands> bands{};
    const Tile rest = level_of(tile, kWaveletLevels);
    bands[0] = {rest.samples, rest.width, rest.height, rest.stride};
    for (int number = kWaveletLevels - 1; number >= 0; --number) {
        const Tile level = level_of(tile, number);
        const int low_columns = (level.width + 1) / 2;
        const int high_columns = level.width / 2;
        const int low_rows = (level.height + 1) / 2;
        const int high_rows = level.height / 2;
        const std::ptrdiff_t stride = 2 * level.stride;
        float* high_row = level.samples + (high_rows > 0 ? level.stride : 0);
        Band* band = bands.data() + 1 + 3 * (kWaveletLevels - 1 - number);
        band[0] = {level.samples + low_columns, high_columns, low_rows, stride};
        band[1] = {high_row, low_columns, high_rows, stride};
        band[2] = {high_row + low_columns, high_columns, high_rows, stride};
    }
    return bands;
}

}  // namespace zq
