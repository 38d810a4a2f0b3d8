// Painting into a canvas: stretched bitmaps and brushes.
#include <algorithm>
#include <cstring>

#include "base/byte_order.h"
#include "display/canvas.h"
#include "kernels/colour_rows.h"
#include "kernels/from_u8.h"

namespace zq {
namespace {

std::uint32_t pixel_of_colour(std::uint32_t bgr) {
    return (bgr & 0xFFU) << 16U | (bgr & 0xFF00U) | (bgr >> 16U & 0xFFU);
}

// Which of `size` source positions the target position i of `shown` takes, as the system's
// colour-on-colour stretching does: enlarging repeats each; shrinking takes the first of each
// group.
std::int64_t first_of_group(std::int64_t i, std::int64_t size, std::int64_t shown) {
    if (shown > size) return ((2 * i + 1) * size - 1) / (2 * shown);
    return (2 * i * size + shown) / (2 * shown);
}

// The last of each group: the same but for shrinking.
std::int64_t last_of_group(std::int64_t i, std::int64_t size, std::int64_t shown) {
    if (shown > size) return first_of_group(i, size, shown);
    return first_of_group(i + 1, size, shown) - 1;
}

// Pixels of source rows as those of the canvas. One object paints all rows of a part.
class RowPainter {
  public:
    RowPainter(const Dib& dib, const Box& source, const Box& target, const Box& part)
        : bits_(static_cast<std::size_t>(dib.bits_per_pixel)),
          columns_(static_cast<std::size_t>(part.width())) {
        for (std::size_t i = 0; i < columns_.size(); ++i) {
            const std::int64_t at = part.left + static_cast<std::int64_t>(i) - target.left;
            columns_[i] = static_cast<std::size_t>(
                source.left + last_of_group(at, source.width(), target.width()));
        }
        const std::size_t span = columns_.back() - columns_.front() + 1;
        consecutive_ = source.width() == target.width();
        if (span < columns_.size()) line_.resize(span);
        if (source.width() % target.width() == 0) {
            step_ = static_cast<std::size_t>(source.width() / target.width());
        }
    }

    void paint(const std::uint8_t* row, std::uint32_t* to) {
        const std::size_t first = columns_.front();
        if (consecutive_) return expand(row, to, columns_.size());
        if (line_.empty()) return pick(row, to);
        expand(row, line_.data(), line_.size());
        for (std::size_t i = 0; i < columns_.size(); ++i) to[i] = line_[columns_[i] - first];
    }

  private:
    // From the first column on.
    void expand(const std::uint8_t* row, std::uint32_t* to, std::size_t pixels) const {
        const std::uint8_t* from = row + columns_.front() * (bits_ / 8);
        if (bits_ == 8) return u8_to_grey32(from, to, pixels, Stores::kCached);
        if (bits_ == 24) return bgr_to_bgra(from, reinterpret_cast<std::uint8_t*>(to), pixels);
        for (std::size_t i = 0; i < pixels; ++i) to[i] = load_le32(from + 4 * i) & 0xFFFFFFU;
    }
    void pick(const std::uint8_t* row, std::uint32_t* to) const {
        const auto load_8 = [row](std::size_t x) { return row[x] * 0x010101U; };
        const auto load_24 = [row](std::size_t x) {
            const std::uint8_t* at = row + 3 * x;
            return std::uint32_t{load_le16(at)} | std::uint32_t{at[2]} << 16U;
        };
        const auto load_32 = [row](std::size_t x) { return load_le32(row + 4 * x) & 0xFFFFFFU; };
        if (bits_ == 8) return pick_each(load_8, to);
        if (bits_ == 24) return pick_each(load_24, to);
        pick_each(load_32, to);
    }
    // Steps of one length need no list; those of two, known beforehand, become vectors.
    template <class Load>
    void pick_each(const Load& load, std::uint32_t* to) const {
        const std::size_t pixels = columns_.size(), first = columns_.front();
        if (step_ == 2) {
            for (std::size_t i = 0; i < pixels; ++i) to[i] = load(first + 2 * i);
        } else if (step_ != 0) {
            for (std::size_t i = 0, x = first; i < pixels; ++i, x += step_) to[i] = load(x);
        } else {
            for (std::size_t i = 0; i < pixels; ++i) to[i] = load(columns_[i]);
        }
    }

    std::size_t bits_;
    std::vector<std::size_t> columns_;
    bool consecutive_;
    std::size_t step_ = 0;             // from column to column where all are alike, else 0
    std::vector<std::uint32_t> line_;  // of an enlarged row
};

// Lines in the lower half of each byte, as the system's brushes: bits that are set are gaps.
constexpr std::array<Pattern, 6> kHatches = {{
    {0xFF, 0xFF, 0xFF, 0x00, 0xFF, 0xFF, 0xFF, 0xFF},  // horizontal
    {0xF7, 0xF7, 0xF7, 0xF7, 0xF7, 0xF7, 0xF7, 0xF7},  // vertical
    {0x7F, 0xBF, 0xDF, 0xEF, 0xF7, 0xFB, 0xFD, 0xFE},  // falling
    {0xFE, 0xFD, 0xFB, 0xF7, 0xEF, 0xDF, 0xBF, 0x7F},  // rising
    {0xF7, 0xF7, 0xF7, 0x00, 0xF7, 0xF7, 0xF7, 0xF7},  // cross
    {0x7E, 0xBD, 0xDB, 0xE7, 0xE7, 0xDB, 0xBD, 0x7E},  // diagonal cross
}};

}  // namespace

void Canvas::stretch(const Dib& dib, const Box& source, const Box& destination) {
    const Box target = to_device(destination);
    if (target.empty() || source.empty()) return;
    for (const Box& clip : clip_) {
        const Box part = intersect(target, clip);
        if (part.empty()) continue;
        RowPainter painter(dib, source, target, part);
        std::int64_t painted = -1;
        for (std::int32_t y = part.top; y < part.bottom; ++y) {
            const std::int64_t line =
                first_of_group(std::int64_t{y} - target.top, source.height(), target.height());
            std::uint32_t* to = row(y) + part.left;
            if (line == painted) {
                // An enlarged row shows again.
                std::memcpy(to, row(y - 1) + part.left,
                            static_cast<std::size_t>(part.width()) * sizeof(*to));
                continue;
            }
            painted = line;
            const std::int64_t from = dib.bottom_up ? source.bottom - 1 - line : source.top + line;
            painter.paint(dib.bits + static_cast<std::size_t>(from) * dib.stride(), to);
        }
    }
}

std::int32_t Canvas::fill(const Box& device, const Brush& brush) {
    std::uint32_t set = pixel_of_colour(brush.background_colour);
    std::uint32_t unset = pixel_of_colour(brush.text_colour);
    Pattern pattern = brush.pattern;
    if (brush.kind != Brush::Kind::kPattern) unset = pixel_of_colour(brush.colour);
    if (brush.kind == Brush::Kind::kPlain) pattern = {};
    if (brush.kind == Brush::Kind::kHatch) {
        if (brush.hatch < 0 || brush.hatch > 5) return 0;
        pattern = kHatches[static_cast<std::size_t>(brush.hatch)];
    }
    for (const Box& clip : clip_) {
        const Box part = intersect(device, clip);
        for (std::int32_t y = part.top; y < part.bottom; ++y) {
            const std::uint8_t bits =
                pattern[static_cast<std::size_t>((y - std::int64_t{device.top}) % 8)];
            std::uint32_t* to = row(y);
            for (std::int32_t x = part.left; x < part.right; ++x) {
                const auto column = static_cast<unsigned>((x - std::int64_t{device.left}) % 8);
                to[x] = (bits << column & 0x80U) != 0 ? set : unset;
            }
        }
    }
    return 1;
}

}  // namespace zq
