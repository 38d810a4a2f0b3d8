// JPEG steps by quality. Each frequency's step goes down a ladder of divisors, and each quality
// passes a little further through the common order of all these divisions.
#include <algorithm>
#include <cmath>
#include <cstdint>
#include <span>

#include "serialize/quality_curve.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

constexpr int kOctave = 64;  // levels are in parts of an octave

struct Division {
    int due;  // the level at which it takes place; levels fall
    std::uint8_t place;
    std::uint8_t divisor;
    bool tells;  // in photographs of ordinary contrast
};

// From the coarsest step to 1. `due` is the level of the step before, and lower the more is gained
// at once. While a step is large, only frequencies whose square is below `reach` have coefficients
// that are larger; the others tell nothing yet.
struct Rung {
    int due, divisor, reach;
};
constexpr Rung kLadder[] = {{506, 2, 17}, {442, 2, 26},  {378, 2, 42},
                            {314, 2, 60}, {231, 3, 128}, {106, 5, 128}};
constexpr unsigned kCoarsest = 240;  // baseline JPEG has steps of 8 bits

// The mean is finer by half an octave: at quality 75 its step is 8, one grey level.
constexpr unsigned kCoarsestMean = 128;
constexpr int kMeanRungs = 7;
constexpr int kMeanDue = 38;

// What each step away from the mean adds to a step: a quarter of an octave.
constexpr int kSlope = kOctave / 4;

constexpr std::size_t kDivisions = kMeanRungs + 63 * std::size(kLadder);

// Frequencies from the lowest to the highest.
constexpr std::uint8_t kZigzag[] = {0,  1,  8,  16, 9,  2,  3,  10, 17, 24, 32, 25, 18, 11, 4,  5,
                                    12, 19, 26, 33, 40, 48, 41, 34, 27, 20, 13, 6,  7,  14, 21, 28,
                                    35, 42, 49, 56, 57, 50, 43, 36, 29, 22, 15, 23, 30, 37, 44, 51,
                                    58, 59, 52, 45, 38, 31, 39, 46, 53, 60, 61, 54, 47, 55, 62, 63};

// The bits of 0 to 63 in reverse: spread evenly for whatever power of two of first numbers.
constexpr int reversed(int number) {
    int result = 0;
    for (int bit = 0; bit < 6; ++bit) result |= (number >> bit & 1) << (5 - bit);
    return result;
}

// How much coarser the frequency `rank` places behind the mean is: nearest to what the slope calls
// for, with a part of an octave of its own, so that no two divide at once.
constexpr int offset_of(int rank, int diagonal) {
    const int phase = reversed(rank - 1);
    return phase + ((kSlope * diagonal - phase + 3 * kOctave / 2) / kOctave - 1) * kOctave;
}

constexpr auto kOrder = [] {
    std::array<Division, kDivisions> all{};
    std::size_t count = 0;
    for (int i = kMeanRungs; i > 0; --i) all[count++] = {i * kOctave + kMeanDue, 0, 2, true};
    for (int rank = 1; rank < 64; ++rank) {
        const std::uint8_t place = kZigzag[rank];
        const int down = place / 8;
        const int across = place % 8;
        const int offset = offset_of(rank, down + across);
        for (const Rung& rung : kLadder) {
            all[count++] = {rung.due - offset, place, static_cast<std::uint8_t>(rung.divisor),
                            down * down + across * across < rung.reach};
        }
    }
    std::ranges::sort(all, [](const Division& a, const Division& b) {
        return a.due != b.due ? a.due > b.due : a.place < b.place;
    });
    return all;
}();
constexpr auto kTelling = std::ranges::count_if(kOrder, &Division::tells);

// How many divisions that tell have taken place: one more or several at every quality.
constexpr Knot kGreyCurve[] = {{1, 0}, {75, 74}, {90, 160}, {100, kTelling}};
constexpr Knot kLumaCurve[] = {{1, 20}, {75, 95}, {90, 175}, {100, kTelling}};
constexpr Knot kChromaCurve[] = {{1, 0}, {75, 74}, {90, 155}, {100, kTelling}};

JpegSteps steps_at(std::span<const Knot> curve, int quality) {
    auto left = std::lround(value_at(curve, quality));
    JpegSteps steps;
    steps.fill(kCoarsest);
    steps[0] = kCoarsestMean;
    for (const Division& division : kOrder) {
        if (division.tells && left-- == 0) break;
        steps[division.place] /= division.divisor;
    }
    return steps;
}

}  // namespace

JpegSteps grey_steps(int quality) {
    return steps_at(kGreyCurve, quality);
}

JpegSteps luma_steps(int quality) {
    return steps_at(kLumaCurve, quality);
}

JpegSteps chroma_steps(int quality) {
    return steps_at(kChromaCurve, quality);
}

}  // namespace zq
