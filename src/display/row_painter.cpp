// Rows of a canvas: each pattern of columns has its kernels.
#include "display/row_painter.h"

#include <algorithm>
#include <utility>

#include "base/byte_order.h"
#include "kernels/colour_rows.h"
#include "kernels/from_u8.h"
#include "kernels/zoom_rows.h"

namespace zq {
namespace {

std::size_t count_equal(const std::vector<std::int32_t>& columns, std::size_t from) {
    std::size_t end = from;
    while (end < columns.size() && columns[end] == columns[from]) ++end;
    return end - from;
}

}  // namespace

RowPainter::RowPainter(std::int32_t bits_per_pixel, std::vector<std::int32_t> columns)
    : bits_(bits_per_pixel), columns_(std::move(columns)) {
    const auto span = static_cast<std::size_t>(columns_.back() - columns_.front()) + 1;
    if (has_step(1)) {
        pattern_ = Pattern::kConsecutive;
    } else if (has_step(2)) {
        pattern_ = Pattern::kEverySecond;
        line_.resize(span);
    } else if (find_repeats()) {
        pattern_ = Pattern::kRepeated;
        line_.resize(span);
    }
}

bool RowPainter::has_step(std::int32_t step) const {
    return std::adjacent_find(columns_.begin(), columns_.end(), [&](auto left, auto right) {
               return right - left != step;
           }) == columns_.end();
}

// Whole groups of one length between the first and the last, which may be cut off.
bool RowPainter::find_repeats() {
    head_ = count_equal(columns_, 0);
    if (head_ == columns_.size()) return false;
    times_ = std::max(head_, count_equal(columns_, head_));
    std::size_t done = head_;
    for (std::int32_t column = columns_.front() + 1; done < columns_.size(); ++column) {
        const std::size_t length = count_equal(columns_, done);
        const bool last = done + length == columns_.size();
        if (columns_[done] != column || length > times_ || (length < times_ && !last)) {
            return false;
        }
        done += length;
    }
    return true;
}

void RowPainter::paint(const std::uint8_t* row, std::uint32_t* to) {
    const std::uint8_t* from = row + std::ptrdiff_t{columns_.front()} * (bits_ / 8);
    switch (pattern_) {
        case Pattern::kConsecutive:
            return expand(from, to, columns_.size());
        case Pattern::kEverySecond:
            return halve(from, to);
        case Pattern::kRepeated:
            expand(from, line_.data(), line_.size());
            return repeat(to);
        case Pattern::kAny:
            return pick(row, to);
    }
}

void RowPainter::expand(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels) const {
    if (bits_ == 8) return u8_to_grey32(from, to, pixels, Stores::kCached);
    if (bits_ == 24) return bgr_to_bgra(from, reinterpret_cast<std::uint8_t*>(to), pixels);
    bgra_to_bgr0(reinterpret_cast<const std::uint32_t*>(from), to, pixels);
}

void RowPainter::halve(const std::uint8_t* from, std::uint32_t* to) {
    const std::size_t pixels = columns_.size();
    if (bits_ == 24) return every_second_bgr(from, to, pixels);
    if (bits_ == 32) {
        return every_second_bgra(reinterpret_cast<const std::uint32_t*>(from), to, pixels);
    }
    auto* bytes = reinterpret_cast<std::uint8_t*>(line_.data());
    every_second_u8(from, bytes, pixels);
    u8_to_grey32(bytes, to, pixels, Stores::kCached);
}

void RowPainter::repeat(std::uint32_t* to) const {
    std::fill_n(to, head_, line_.front());
    const std::size_t groups = (columns_.size() - head_) / times_;
    repeat_u32(line_.data() + 1, to + head_, groups, times_);
    const std::size_t done = head_ + groups * times_;
    std::fill_n(to + done, columns_.size() - done, line_.back());
}

void RowPainter::pick(const std::uint8_t* row, std::uint32_t* to) const {
    const auto each = [&](auto pixel) {
        for (std::size_t i = 0; i < columns_.size(); ++i) to[i] = pixel(columns_[i]);
    };
    if (bits_ == 8) return each([&](std::ptrdiff_t x) { return row[x] * 0x010101U; });
    if (bits_ == 32) {
        return each([&](std::ptrdiff_t x) { return load_le32(row + 4 * x) & 0xFFFFFFU; });
    }
    each([&](std::ptrdiff_t x) {
        const std::uint8_t* at = row + 3 * x;
        return std::uint32_t{load_le16(at)} | std::uint32_t{at[2]} << 16U;
    });
}

}  // namespace zq
