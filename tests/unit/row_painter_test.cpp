// Rows of a canvas against the obvious loop: every zoom, phase and length, for every target that
// this processor runs.
#include "display/row_painter.h"

#include <gtest/gtest.h>

#include <random>

#include "support/simd_targets.h"

namespace zq {
namespace {

std::vector<std::uint32_t> picked(const std::vector<std::uint8_t>& row, std::size_t bytes,
                                  const std::vector<std::int32_t>& columns) {
    std::vector<std::uint32_t> pixels;
    for (const std::int32_t column : columns) {
        const std::uint8_t* at = &row[static_cast<std::size_t>(column) * bytes];
        const bool grey = bytes == 1;
        pixels.push_back(
            static_cast<std::uint32_t>(at[0] | at[grey ? 0 : 1] << 8 | at[grey ? 0 : 2] << 16));
    }
    return pixels;
}

// The row ends with the last column, so that a sanitizer sees what is read beyond.
void compare(const std::vector<std::int32_t>& columns, std::mt19937& random) {
    for (const std::size_t bytes : {std::size_t{1}, std::size_t{3}, std::size_t{4}}) {
        std::vector<std::uint8_t> row((static_cast<std::size_t>(columns.back()) + 1) * bytes);
        for (auto& byte : row) byte = static_cast<std::uint8_t>(random());
        std::vector<std::uint32_t> expected = picked(row, bytes, columns);
        expected.push_back(0xA5A5A5A5);
        std::vector<std::uint32_t> actual(expected.size(), 0xA5A5A5A5);
        RowPainter painter(static_cast<std::int32_t>(8 * bytes), columns);
        // Twice: a painter keeps nothing of the row before.
        std::vector<std::uint8_t> other(row.size());
        painter.paint(other.data(), actual.data());
        painter.paint(row.data(), actual.data());
        ASSERT_EQ(actual, expected) << testing::PrintToString(columns) << ' ' << bytes;
    }
}

TEST(RowPainter, EveryZoomFromEveryColumnOn) {
    std::mt19937 random(12);
    zqtest::on_every_simd_target([&] {
        for (std::int32_t zoom = -16; zoom <= 16; ++zoom) {
            if (zoom == 0) continue;
            for (std::int32_t length = 1; length <= 150; length += 1 + length / 40 * 7) {
                const auto first = static_cast<std::int32_t>(random() % 40);
                std::vector<std::int32_t> columns;
                for (std::int32_t i = first; i < first + length; ++i) {
                    columns.push_back(zoom > 0 ? i / zoom : i * -zoom + first % -zoom);
                }
                ASSERT_NO_FATAL_FAILURE(compare(columns, random));
            }
        }
    });
}

TEST(RowPainter, ColumnsThatFollowNoZoom) {
    std::mt19937 random(13);
    const std::vector<std::int32_t> some[] = {
        {3, 3},          {0, 1, 1},          {0, 0, 1, 2},    {0, 0, 1, 1, 2, 2, 2}, {0, 0, 2, 2},
        {0, 2, 4, 5},    {0, 1, 1, 2, 2, 3}, {0, 0, 0, 1, 1}, {0, 2, 3, 5, 6, 8},    {5, 5, 5, 6},
        {0, 1, 2, 3, 3},
    };
    for (const auto& columns : some) ASSERT_NO_FATAL_FAILURE(compare(columns, random));
}

}  // namespace
}  // namespace zq
