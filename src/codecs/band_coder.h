// Wavelet coefficients as range-coded bytes: quantised, and each told in the context of its
// neighbours that are known already.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "codecs/range_coder.h"
#include "codecs/wavelet.h"

namespace zq {

// Quantised magnitudes stay below 2^kMostBits: so far single precision knows halves.
inline constexpr int kMostBits = 23;

// What was learnt about the coefficients so far. One for all bands of a plane of a tile.
class BandCoder {
  public:
    // `widest` is the width of the widest band that will come.
    explicit BandCoder(int widest);

    // Forgets everything.
    void reset();
    // Codes coefficient / step: 0 for magnitudes below `least`, which is half a step or more, and
    // the nearest integer for all others.
    void encode(RangeEncoder& coder, const Band& band, float step, float least);
    // Sets every coefficient of the band to a multiple of step.
    void decode(RangeDecoder& coder, const Band& band, float step);

  private:
    static constexpr std::size_t kContexts = 56;
    static constexpr std::size_t kMargin = 2;  // columns left of a row and right of it

    struct Models {
        // [context][i]: whether the magnitude has more than i bits, once it has i.
        std::array<std::array<BitModel, kMostBits>, kContexts> lengths;
        // [length]: the bit after the leading one.
        std::array<BitModel, kMostBits + 1> second_bits;
    };

    static std::size_t context(const std::uint32_t* current, const std::uint32_t* above);
    void put(RangeEncoder& coder, std::uint32_t magnitude, int most_bits, std::size_t context);
    std::uint32_t get(RangeDecoder& coder, int most_bits, std::size_t context);
    void next_row(std::size_t width);

    Models models_{};
    std::vector<std::uint32_t> current_;  // magnitudes, with margins of zeros
    std::vector<std::uint32_t> above_;
    std::vector<std::int32_t> row_;
};

}  // namespace zq
