// Unsigned 16-bit samples as pixels: every sample, and rows as readers deliver them.
#include "files/unsigned_grey.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <numeric>
#include <vector>

#include "kernels/shift_samples.h"
#include "support/simd_targets.h"

namespace zq {
namespace {

TEST(ShiftSamples, EverySampleWithOffsetsOfEveryKind) {
    std::vector<std::uint16_t> all(1 << 16);
    std::iota(all.begin(), all.end(), std::uint16_t{0});
    zqtest::on_every_simd_target([&] {
        for (const std::int32_t offset : {-32768, -32767, -20000, -1, 0, 1, 300, 32766, 32767}) {
            std::vector<std::uint16_t> shifted = all;
            shift_samples(shifted.data(), shifted.size(), offset);
            for (std::size_t i = 0; i < all.size(); ++i) {
                const std::int32_t exact = std::clamp(all[i] + offset, -32768, 32767);
                ASSERT_EQ(shifted[i], static_cast<std::uint16_t>(exact)) << i << " + " << offset;
            }
        }
        for (std::size_t count = 0; count < 70; ++count) {
            std::vector<std::uint16_t> row(count + 1, 40000);
            shift_samples(row.data(), count, -32768);
            EXPECT_EQ(std::count(row.begin(), row.end(), 7232), static_cast<int>(count));
            EXPECT_EQ(row[count], 40000);
        }
    });
}

struct Rows {
    static constexpr std::int32_t kWidth = 37, kHeight = 6;

    Rows() : image(Variant::kPrivate, {}) {
        image.reinitialise({.type = ZQ_TYPE_I16, .width = kWidth, .height = kHeight, .border = 1});
        for (std::int32_t y = 0; y < kHeight; ++y) std::fill_n(row(y), kWidth, 1000);
    }
    std::uint16_t* row(std::int32_t y) { return reinterpret_cast<std::uint16_t*>(image.row(y)); }
    bool all_are(std::uint16_t value, std::int32_t except) {
        for (std::int32_t y = 0; y < kHeight; ++y) {
            const auto others = std::count(row(y), row(y) + kWidth, value);
            if (others != kWidth - (y == except ? 1 : 0)) return false;
        }
        return true;
    }

    Image image;
};

TEST(UnsignedGreyRows, OneLargeSampleMovesRowsBeforeAndAfterIt) {
    for (const bool bottom_up : {false, true}) {
        for (std::int32_t large = -1; large < Rows::kHeight; ++large) {
            for (const std::int32_t at_once : {1, 2, 3, 6}) {
                SCOPED_TRACE(testing::Message() << bottom_up << ' ' << large << ' ' << at_once);
                Rows rows;
                if (large >= 0) rows.row(large)[large * 7] = 32768;
                UnsignedGreyRows unsigned_rows(rows.image);
                for (std::int32_t done = 0; done < Rows::kHeight; done += at_once)
                    unsigned_rows.add(bottom_up ? Rows::kHeight - done - at_once : done, at_once);
                EXPECT_EQ(unsigned_rows.offset(), large < 0 ? 0 : -32768);
                EXPECT_TRUE(rows.all_are(large < 0 ? 1000 : 33768, large));
                if (large >= 0) {
                    EXPECT_EQ(rows.row(large)[large * 7], 0);
                }
            }
        }
    }
}

TEST(UnsignedGreyRows, AKnownOffsetHoldsWhateverTheSamples) {
    for (const std::int32_t offset : {0, -500, 30000}) {
        Rows rows;
        rows.row(3)[5] = 65535;
        UnsignedGreyRows unsigned_rows(rows.image, offset);
        for (std::int32_t y = 0; y < Rows::kHeight; ++y) unsigned_rows.add(y, 1);
        EXPECT_EQ(unsigned_rows.offset(), offset);
        EXPECT_TRUE(rows.all_are(static_cast<std::uint16_t>(1000 + offset), 3));
        EXPECT_EQ(rows.row(3)[5], std::min(65535 + offset, 32767));
    }
}

}  // namespace
}  // namespace zq
