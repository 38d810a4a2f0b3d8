// The cosine transform of JPEG's blocks of 8 x 8 samples, exactly as libjpeg's accurate method
// (JDCT_ISLOW) computes it: the flow graph of Loeffler, Ligtenberg and Moschytz (1989) with factors
// of 13 binary places, columns and rows each rounded once.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

namespace zq {

inline constexpr std::size_t kBlockValues = 64;

// Eight lines of samples.
using BlockLines = std::array<const std::uint8_t*, 8>;
using BlockTargets = std::array<std::uint8_t*, 8>;

// Steps of quantisation, row by row, as the loop wants them.
class BlockSteps {
  public:
    // Each from 1 to 255.
    explicit BlockSteps(const std::array<unsigned, kBlockValues>& steps);

    const std::int32_t* steps() const { return steps_.data(); }
    const float* reciprocals() const { return reciprocals_.data(); }
    const float* biases() const { return biases_.data(); }

  private:
    std::array<std::int32_t, kBlockValues> steps_;
    // Coefficients are eight times as large as steps: round(c / (8 s)) = floor(c * reciprocal +
    // bias) for c = 0, 1, ... 2^15.
    std::array<float, kBlockValues> reciprocals_, biases_;
};

// Of `blocks` blocks that stand side by side, 64 coefficients each, row by row: eight times those
// that JPEG quantises. Lines at any alignment.
void forward_dct(const BlockLines& lines, std::size_t blocks, std::int16_t* coefficients);

// The samples that come back when the coefficients have been rounded to multiples of the steps,
// halves away from 0.
void inverse_dct_of_rounded(const std::int16_t* coefficients, std::size_t blocks,
                            const BlockSteps& steps, const BlockTargets& lines);

}  // namespace zq
