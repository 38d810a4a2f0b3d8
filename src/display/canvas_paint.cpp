// Painting into a canvas: stretched bitmaps and brushes.
#include <algorithm>
#include <cstring>
#include <limits>

#include "display/canvas.h"
#include "display/row_painter.h"

namespace zq {
namespace {

std::uint32_t pixel_of_colour(std::uint32_t bgr) {
    return (bgr & 0xFFU) << 16U | (bgr & 0xFF00U) | (bgr >> 16U & 0xFFU);
}

// Which of `size` source positions the target position i of `shown` takes, as the system's
// colour-on-colour stretching does: enlarging repeats each; shrinking takes the first of each
// group.
// Targets have at most 2^32 positions and sources fewer than 2^31, so that unsigned products fit.
std::int64_t first_of_group(std::int64_t i, std::int64_t size, std::int64_t shown) {
    const auto at = static_cast<std::uint64_t>(i);
    const auto from = static_cast<std::uint64_t>(size);
    const auto to = static_cast<std::uint64_t>(shown);
    return static_cast<std::int64_t>(to > from ? ((2 * at + 1) * from - 1) / (2 * to)
                                               : (2 * at * from + to) / (2 * to));
}

// The last of each group: the same but for shrinking.
std::int64_t last_of_group(std::int64_t i, std::int64_t size, std::int64_t shown) {
    if (shown > size) return first_of_group(i, size, shown);
    return first_of_group(i + 1, size, shown) - 1;
}

// The source column of each target column, so that rows need no division.
std::vector<std::int32_t> source_columns(const Box& target, const Box& part, const Box& source) {
    std::vector<std::int32_t> columns(static_cast<std::size_t>(part.width()));
    for (std::size_t i = 0; i < columns.size(); ++i) {
        const std::int64_t at = part.left + static_cast<std::int64_t>(i) - target.left;
        columns[i] = static_cast<std::int32_t>(source.left +
                                               last_of_group(at, source.width(), target.width()));
    }
    return columns;
}

// The source row of a target row.
std::int64_t source_row(std::int32_t y, const Box& target, const Box& source, bool bottom_up) {
    const std::int64_t line =
        first_of_group(std::int64_t{y} - target.top, source.height(), target.height());
    return bottom_up ? source.bottom - 1 - line : source.top + line;
}

// Lines in the lower half of each byte, as the system's brushes: bits that are set are gaps.
constexpr std::array<Pattern, 6> kHatches = {{
    {0xFF, 0xFF, 0xFF, 0x00, 0xFF, 0xFF, 0xFF, 0xFF},  // horizontal
    {0xF7, 0xF7, 0xF7, 0xF7, 0xF7, 0xF7, 0xF7, 0xF7},  // vertical
    {0x7F, 0xBF, 0xDF, 0xEF, 0xF7, 0xFB, 0xFD, 0xFE},  // falling
    {0xFE, 0xFD, 0xFB, 0xF7, 0xEF, 0xDF, 0xBF, 0x7F},  // rising
    {0xF7, 0xF7, 0xF7, 0x00, 0xF7, 0xF7, 0xF7, 0xF7},  // cross
    {0x7E, 0xBD, 0xDB, 0xE7, 0xE7, 0xDB, 0xBD, 0x7E},  // diagonal cross
}};
constexpr std::int32_t kHatchLimit = 12;  // below it, numbers without lines fill plainly

std::int32_t end_after(std::int32_t last) {
    return last == std::numeric_limits<std::int32_t>::max() ? last : last + 1;
}

// A side that runs backwards is filled from its start, which it includes, to its end, which it
// does not.
Box filled_area(const Box& box) {
    Box result = box;
    if (box.right < box.left) {
        result.left = box.right + 1;
        result.right = end_after(box.left);
    }
    if (box.bottom < box.top) {
        result.top = box.bottom + 1;
        result.bottom = end_after(box.top);
    }
    return result;
}

}  // namespace

void Canvas::stretch(const Dib& dib, const Box& source, const Box& destination) {
    const Box target = to_device(destination);
    if (target.empty() || source.empty()) return;
    for (const Box& clip : clip_) {
        const Box part = intersect(target, clip);
        if (part.empty()) continue;
        RowPainter painter(dib.bits_per_pixel, source_columns(target, part, source));
        std::int64_t painted = -1;
        for (std::int32_t y = part.top; y < part.bottom; ++y) {
            const std::int64_t from = source_row(y, target, source, dib.bottom_up);
            std::uint32_t* to = row(y) + part.left;
            if (from == painted) {
                // An enlarged row shows again.
                std::memcpy(to, row(y - 1) + part.left,
                            static_cast<std::size_t>(part.width()) * sizeof(*to));
                continue;
            }
            painted = from;
            painter.paint(dib.bits + static_cast<std::size_t>(from) * dib.stride(), to);
        }
    }
}

std::vector<std::int32_t> Canvas::rows_to_stretch(const Box& source, const Box& destination,
                                                  bool bottom_up) {
    const Box target = to_device(destination);
    const Box part = intersect(target, bounds());
    std::vector<std::int32_t> rows;
    if (target.height() >= source.height()) return rows;
    rows.reserve(static_cast<std::size_t>(part.height()));
    for (std::int32_t y = part.top; y < part.bottom; ++y) {
        rows.push_back(static_cast<std::int32_t>(source_row(y, target, source, bottom_up)));
    }
    return rows;
}

bool Canvas::fill(const Box& device, const Brush& brush) {
    if (brush.kind == Brush::Kind::kNone) return true;
    if (brush.kind == Brush::Kind::kUnknown) return false;
    const Box area = filled_area(device);
    std::uint32_t set = pixel_of_colour(brush.background_colour);
    std::uint32_t unset = pixel_of_colour(brush.text_colour);
    Pattern pattern = brush.pattern;
    if (brush.kind != Brush::Kind::kPattern) unset = pixel_of_colour(brush.colour);
    if (brush.kind == Brush::Kind::kPlain) pattern = {};
    if (brush.kind == Brush::Kind::kHatch) {
        if (brush.hatch < 0 || brush.hatch >= kHatchLimit) return false;
        const auto hatch = static_cast<std::size_t>(brush.hatch);
        pattern = hatch < kHatches.size() ? kHatches[hatch] : Pattern{};
    }
    for (const Box& clip : clip_) {
        const Box part = intersect(area, clip);
        for (std::int32_t y = part.top; y < part.bottom; ++y) {
            const unsigned bits =
                pattern[static_cast<std::size_t>((y - std::int64_t{device.top}) & 7)];
            std::uint32_t* to = row(y);
            for (std::int32_t x = part.left; x < part.right; ++x) {
                const auto column = static_cast<unsigned>((x - std::int64_t{device.left}) & 7);
                to[x] = (bits << column & 0x80U) != 0 ? set : unset;
            }
        }
    }
    return true;
}

}  // namespace zq
