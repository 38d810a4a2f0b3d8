// Rows of bitmaps as rows of a canvas, in whole rows where the columns allow it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

namespace zq {

class RowPainter {
  public:
    // `columns` is the source column of each target pixel, at least one, none left of the one
    // before it.
    RowPainter(std::int32_t bits_per_pixel, std::vector<std::int32_t> columns);

    void paint(const std::uint8_t* row, std::uint32_t* to);

  private:
    enum class Pattern { kConsecutive, kEverySecond, kRepeated, kAny };

    bool has_step(std::int32_t step) const;
    bool find_repeats();
    void expand(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels) const;
    void halve(const std::uint8_t* from, std::uint32_t* to);
    void pick(const std::uint8_t* row, std::uint32_t* to) const;
    void repeat(std::uint32_t* to) const;

    std::int32_t bits_;
    std::vector<std::int32_t> columns_;
    Pattern pattern_ = Pattern::kAny;
    std::size_t times_ = 0;            // kRepeated: target pixels of each column but the ends
    std::size_t head_ = 0;             // and of the first column
    std::vector<std::uint32_t> line_;  // source columns of a row, from the first that is wanted on
};

}  // namespace zq
