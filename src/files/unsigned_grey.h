// 16-bit grey of files, whose samples are unsigned, in images, whose pixels are signed.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>

#include "image/image.h"

namespace zq {

// What is added to samples of which some are too large for a pixel.
inline constexpr std::int32_t kWholeRangeOffset = -32768;

// Whether any of the unsigned samples of a row is above 32767; the row is aligned for them.
bool any_above_signed(const std::uint8_t* row, std::size_t bytes);

// Makes pixels of the samples that the rows of an I16 image hold, while they are at hand: sample +
// offset, saturated. A file that does not tell its offset has 0, or, when a sample is too large for
// a pixel, kWholeRangeOffset; rows that came before that sample are then gone over again.
class UnsignedGreyRows {
  public:
    // The image must outlive this.
    explicit UnsignedGreyRows(Image& image, std::optional<std::int32_t> offset = std::nullopt);

    // The rows from `first` on hold samples now. Each row is given once, next to those given
    // before.
    void add(std::int32_t first, std::int32_t count);

    // Final once all rows were given.
    std::int32_t offset() const { return offset_.value_or(0); }

  private:
    bool any_above_signed_in(std::int32_t first, std::int32_t last) const;
    void shift(std::int32_t first, std::int32_t last);

    Image& image_;
    std::optional<std::int32_t> offset_;
    std::int32_t first_ = 0, last_ = 0;  // rows given so far, without the last
};

}  // namespace zq
