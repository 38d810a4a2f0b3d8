// Bayer decoding against its rules in plain arithmetic: pixels, tables, and lines found in tables.
#include <gtest/gtest.h>
#include <zqvissvc/bayer.h>
#include <zqvissvc/errors.h>

#include <array>
#include <cmath>
#include <limits>
#include <memory>
#include <random>
#include <vector>

#include "convert/bayer_line.h"
#include "kernels/bayer_rows.h"
#include "kernels/bayer_rows_scalar.h"
#include "support/simd_targets.h"
#include "support/thoroughness.h"

namespace {

using Words = std::vector<std::uint32_t>;
using Random = std::independent_bits_engine<std::mt19937, 32, std::uint32_t>;

constexpr std::uint32_t kGuard = 0xDEADBEEF;

struct Tables {
    Words red, green, blue;
};

std::size_t entries_for(std::uint32_t depth) {
    return depth > 8 ? 65536 : 256;
}

Tables linear_tables(double red, double green, double blue, std::uint32_t depth) {
    const Words empty(entries_for(depth));
    Tables tables = {empty, empty, empty};
    EXPECT_EQ(Gen_CalculateBayerColorLUT(red, green, blue, tables.red.data(), tables.green.data(),
                                         tables.blue.data(), depth),
              0);
    return tables;
}

Tables random_tables(std::uint32_t depth, Random& random) {
    Tables tables;
    for (Words* table : {&tables.red, &tables.green, &tables.blue}) {
        table->resize(entries_for(depth));
        for (auto& entry : *table) entry = random();
    }
    return tables;
}

struct Layout {
    std::uint32_t rows, columns, sample_line, pixel_line, pattern;
};

// Samples in a block of their own that ends with the last one that may be read.
template <class Sample>
struct Mosaic {
    explicit Mosaic(const Layout& layout, Random& random)
        : count(std::size_t{layout.sample_line} * (std::max(layout.rows, 2U) - 1) + layout.columns),
          samples(new Sample[count]) {
        for (std::size_t i = 0; i < count; ++i) samples[i] = static_cast<Sample>(random());
    }
    std::size_t count;
    std::unique_ptr<Sample[]> samples;
};

// ---- The rules, worded plainly.

struct PatternRule {
    bool blue_row_first;
    unsigned phase_of_red_rows, phase_of_blue_rows;
};
constexpr PatternRule kPatterns[] = {{true, 1, 0}, {false, 0, 1}, {true, 0, 1}, {false, 1, 0}};

template <class Sample>
std::uint32_t expected_pixel(const Layout& layout, const Sample* samples, const Tables& tables,
                             std::int64_t y, std::int64_t x) {
    const auto mirrored = [](std::int64_t at, std::int64_t size) {
        if (size == 1) return std::int64_t{0};
        return at < 0 ? 1 : (at == size ? size - 2 : at);
    };
    const auto at = [&](std::int64_t row, std::int64_t column) -> std::uint32_t {
        // A single row has the line after it above and below.
        const std::int64_t line = layout.rows == 1 ? row != 0 : mirrored(row, layout.rows);
        return samples[line * layout.sample_line + mirrored(column, layout.columns)];
    };
    const PatternRule& rule = kPatterns[layout.pattern];
    const bool blue_row = rule.blue_row_first == (y % 2 == 0);
    const unsigned phase = blue_row ? rule.phase_of_blue_rows : rule.phase_of_red_rows;
    std::uint32_t own = 0, green = 0, other = 0;
    if ((x % 2 == 0) == (phase == 1)) {
        own = at(y, x);
        green = (at(y - 1, x) + at(y + 1, x) + at(y, x - 1) + at(y, x + 1)) >> 2;
        other = (at(y - 1, x - 1) + at(y - 1, x + 1) + at(y + 1, x - 1) + at(y + 1, x + 1)) >> 2;
    } else {
        own = (at(y, x - 1) + at(y, x + 1)) >> 1;
        green = at(y, x);
        other = (at(y - 1, x) + at(y + 1, x)) >> 1;
    }
    const std::uint32_t red = blue_row ? other : own, blue = blue_row ? own : other;
    return tables.red[red] | tables.green[green] | tables.blue[blue];
}

template <class Sample>
void expect_decoded(const Layout& layout, const Mosaic<Sample>& mosaic, const Tables& tables,
                    std::uint32_t depth) {
    constexpr std::size_t kAround = 20;
    const std::size_t pixels = std::size_t{layout.pixel_line} * (layout.rows - 1) + layout.columns;
    Words actual(pixels + 2 * kAround, kGuard), expected = actual;
    ASSERT_EQ(Gen_BayerColorDecode(actual.data() + kAround, mosaic.samples.get(), layout.rows,
                                   layout.columns, layout.pixel_line, layout.sample_line,
                                   tables.red.data(), tables.green.data(), tables.blue.data(),
                                   layout.pattern, depth),
              0);
    for (std::uint32_t y = 0; y < layout.rows; ++y) {
        for (std::uint32_t x = 0; x < layout.columns; ++x) {
            expected[kAround + std::size_t{y} * layout.pixel_line + x] =
                expected_pixel(layout, mosaic.samples.get(), tables, y, x);
        }
    }
    ASSERT_TRUE(actual == expected)
        << "depth " << depth << ", pattern " << layout.pattern << ", " << layout.columns << " x "
        << layout.rows << ", lines of " << layout.sample_line << " and " << layout.pixel_line;
}

Words plain_line(std::size_t entries, std::uint32_t gain, int shift, int place) {
    Words table(entries);
    std::uint32_t sum = 0;
    for (auto& entry : table) {
        entry = std::min(sum >> shift, 255U) << place;
        sum += gain;
    }
    return table;
}

// ----

template <class Sample>
void expect_small_mosaics(std::uint32_t depth) {
    Random random(depth);
    const Tables tables = random_tables(depth, random);
    for (std::uint32_t pattern = 0; pattern < 4; ++pattern) {
        for (std::uint32_t rows = 1; rows <= 5; ++rows) {
            for (std::uint32_t columns = 1; columns <= 70; ++columns) {
                const std::uint32_t more = (columns + rows) % 3;
                // Lines of any width, also such that overlap.
                for (const Layout& layout :
                     {Layout{rows, columns, columns, columns, pattern},
                      Layout{rows, columns, columns + more, columns + 2 * more, pattern},
                      Layout{rows, columns, more, more, pattern}}) {
                    expect_decoded(layout, Mosaic<Sample>(layout, random), tables, depth);
                    if (testing::Test::HasFatalFailure()) return;
                }
            }
        }
    }
}

TEST(Bayer, DecodesSmallMosaicsWithAnyTablesAndStaysInside) {
    zqtest::on_every_simd_target([] {
        expect_small_mosaics<std::uint8_t>(8);
        expect_small_mosaics<std::uint16_t>(16);
    });
}

// Large enough for tables to be looked through.
template <class Sample>
void expect_large_mosaics(std::uint32_t depth) {
    Random random(depth);
    const Layout layout = {256, 300, 307, 301, depth % 4};
    const Mosaic<Sample> mosaic(layout, random);
    const std::array<double, 4> gains = {1.0, 0.0, 3.998, 1.0 + 0.1 * depth};
    for (std::size_t i = 0; i < gains.size(); i += zqtest::kThorough ? 1 : 2) {
        Tables tables = linear_tables(gains[i], gains[(i + 1) % 4], gains[(i + 2) % 4], depth);
        expect_decoded(layout, mosaic, tables, depth);
        Words& table = *std::array{&tables.red, &tables.green, &tables.blue}[i % 3];
        table[random() % table.size()] ^= 1U << (random() % 32);
        expect_decoded(layout, mosaic, tables, depth);
        if (testing::Test::HasFatalFailure()) return;
    }
}

TEST(Bayer, DecodesLargeMosaicsOfEveryDepthWithLinesAndAlmostLines) {
    zqtest::on_every_simd_target([] {
        for (std::uint32_t depth = 0; depth <= 16; depth += zqtest::kThorough ? 1 : 4) {
            if (depth > 8) {
                expect_large_mosaics<std::uint16_t>(depth);
            } else {
                expect_large_mosaics<std::uint8_t>(depth);
            }
        }
    });
}

// The rows and their neighbours end where their blocks end.
template <class Sample>
void expect_rows_of_any_length(const zq::MosaicTables& tables, const zq::MosaicGains& gains,
                               Random& random) {
    for (std::uint32_t columns = 1; columns <= 200; ++columns) {
        const Layout one_row = {1, columns, 0, 0, 0};
        const Mosaic<Sample> above(one_row, random), current(one_row, random),
            below(one_row, random);
        const zq::MosaicRow<Sample> row = {above.samples.get(), current.samples.get(),
                                           below.samples.get(), columns, random() % 2 == 0};
        Words expected(columns + 40, kGuard), actual = expected, looked_up = expected;
        zq::scalar::decode_mosaic_columns(row, tables, 0, columns, expected.data() + 1);
        zq::decode_mosaic_row(row, tables, gains, actual.data() + 1);
        zq::decode_mosaic_row(row, tables, looked_up.data() + 1);
        ASSERT_TRUE(actual == expected && looked_up == expected)
            << columns << " columns, shift " << gains.shift;
    }
}

template <class Sample>
void expect_rows_of_any_length(int least_shift, int most_shift) {
    Random random(5);
    const std::size_t entries = std::size_t{1} << 8 * sizeof(Sample);
    for (int shift = least_shift; shift <= most_shift; ++shift) {
        const bool red = shift % 2 == 0;
        const zq::MosaicGains gains = {random() % 4096, random() % 4096, random() % 4096, shift,
                                       red};
        const Words own = plain_line(entries, gains.own, shift, red ? 16 : 0);
        const Words green = plain_line(entries, gains.green, shift, 8);
        const Words other = plain_line(entries, gains.other, shift, red ? 0 : 16);
        expect_rows_of_any_length<Sample>({own.data(), green.data(), other.data()}, gains, random);
        if (testing::Test::HasFatalFailure()) return;
    }
}

TEST(Bayer, DecodesRowsOfAnyLengthByTablesAndByGains) {
    zqtest::on_every_simd_target([] {
        expect_rows_of_any_length<std::uint8_t>(8, 10);
        expect_rows_of_any_length<std::uint16_t>(11, 18);
    });
}

TEST(Bayer, FindsAGainForEveryLine) {
    for (int shift = 8; shift <= 18; ++shift) {
        const std::size_t entries = shift > 10 ? 65536 : 256;
        const std::uint32_t most_step = entries == 256 ? 1 : 97;
        const std::uint32_t step = most_step * (zqtest::kThorough ? 1 : 11);
        for (std::uint32_t gain = 0; gain < 4096; gain += step) {
            const int place = static_cast<int>(gain % 3) * 8;
            const Words table = plain_line(entries, gain, shift, place);
            const auto found = zq::gain_of_line(table, shift, place);
            ASSERT_TRUE(found.has_value()) << gain << " >> " << shift;
            ASSERT_TRUE(*found == gain || plain_line(entries, *found, shift, place) == table)
                << gain << " >> " << shift << " became " << *found;
        }
    }
}

// What is found describes the table to the last entry; one wrong bit anywhere is seen.
TEST(Bayer, TakesNothingElseForALine) {
    Random random(7);
    zqtest::on_every_simd_target([&] {
        for (int shift = 8; shift <= 18; ++shift) {
            Words table = plain_line(shift > 10 ? 65536 : 256, 700U + random() % 3000, shift, 8);
            const auto refuses_with = [&](std::size_t index, std::uint32_t bits) {
                table[index] ^= bits;
                const auto found = zq::gain_of_line(table, shift, 8);
                const bool right = !found || plain_line(table.size(), *found, shift, 8) == table;
                table[index] ^= bits;
                return right;
            };
            std::vector<std::size_t> places = {0, 1, 63, 64, table.size() - 1};
            for (int i = 0; i < 40; ++i) places.push_back(random() % table.size());
            for (const std::size_t index : places) {
                const std::uint32_t bit = 1U << (random() % 32);
                ASSERT_TRUE(refuses_with(index, bit)) << index << ", bit " << bit;
                ASSERT_TRUE(refuses_with(index, 0x100)) << index;
            }
            Words noise(table.size());
            for (auto& entry : noise) entry = random();
            EXPECT_FALSE(zq::gain_of_line(noise, shift, 8).has_value());
        }
    });
}

TEST(Bayer, FillsTablesAsAPlainLoopDoes) {
    std::vector<double> gains = {0.0,    0.00048, 0.0005, 0.25, 0.9995, 1.0,
                                 1.0004, 1.0006,  2.0,    3.5,  3.9,    3.998};
    Random random(8);
    for (int i = 0; zqtest::kThorough && i < 20; ++i) {
        gains.push_back(std::uniform_real_distribution(0.0, 3.99)(random));
    }
    for (std::uint32_t depth = 0; depth <= 16; ++depth) {
        const int shift = depth == 0 ? 10 : static_cast<int>(depth) - 8 + 10;
        for (const double gain : gains) {
            const auto fixed = static_cast<std::uint32_t>(std::floor(gain * 1024 + 0.5));
            const Tables tables = linear_tables(gain, gain, gain, depth);
            const std::size_t entries = entries_for(depth);
            ASSERT_TRUE(tables.red == plain_line(entries, fixed, shift, 16) &&
                        tables.green == plain_line(entries, fixed, shift, 8) &&
                        tables.blue == plain_line(entries, fixed, shift, 0))
                << gain << " at depth " << depth;
        }
    }
    const Tables capped = linear_tables(3.9, 1.0, 1.0, 8), deep = linear_tables(1.0, 1.0, 1.0, 12);
    EXPECT_EQ(capped.red[65], 253U << 16);
    EXPECT_EQ(capped.red[66], 255U << 16);
    EXPECT_EQ(capped.green[77], 77U << 8);
    EXPECT_EQ(deep.blue[1600], 100U);
}

TEST(Bayer, RefusesTablesInOrderAndWritesNothing) {
    struct Case {
        double red, green, blue;
        bool null;
        std::uint32_t depth;
        ZqError code;
    };
    const double nan = std::numeric_limits<double>::quiet_NaN();
    const Case cases[] = {
        {3.999, 9, 9, true, 17, ZQ_ERR_BAYER_RED_GAIN},
        {nan, 1, 1, false, 8, ZQ_ERR_BAYER_RED_GAIN},
        {-1e-9, 1, 1, false, 8, ZQ_ERR_BAYER_RED_GAIN},
        {3.998, 3.999, 9, true, 17, ZQ_ERR_BAYER_GREEN_GAIN},
        {1, nan, 1, false, 8, ZQ_ERR_BAYER_GREEN_GAIN},
        {-0.0, 1, 3.999, true, 17, ZQ_ERR_BAYER_BLUE_GAIN},
        {1, 1, std::numeric_limits<double>::infinity(), false, 8, ZQ_ERR_BAYER_BLUE_GAIN},
        {1, 1, 1, true, 17, ZQ_ERR_BAYER_NULL_POINTER},
        {1, 1, 1, false, 17, ZQ_ERR_BAYER_BIT_DEPTH},
        {1, 1, 1, false, 0xFFFFFFFF, ZQ_ERR_BAYER_BIT_DEPTH},
    };
    for (const Case& c : cases) {
        for (int missing = 0; missing < (c.null ? 3 : 1); ++missing) {
            Words tables(3, kGuard);
            std::array<std::uint32_t*, 3> pointers = {&tables[0], &tables[1], &tables[2]};
            if (c.null) pointers.at(static_cast<std::size_t>(missing)) = nullptr;
            EXPECT_EQ(Gen_CalculateBayerColorLUT(c.red, c.green, c.blue, pointers[0], pointers[1],
                                                 pointers[2], c.depth),
                      c.code)
                << c.red << ' ' << c.green << ' ' << c.blue << ' ' << c.depth;
            EXPECT_EQ(tables, Words(3, kGuard));
        }
    }
}

TEST(Bayer, RefusesMosaicsInOrderAndWritesNothing) {
    struct Case {
        int missing;  // which pointer is null, -1 for none
        std::uint32_t rows, columns, line, pattern, depth;
        ZqError code;
    };
    constexpr std::uint32_t kMost = 0xFFFFFFFF;
    const Case cases[] = {
        {0, 0, 1, 1, 4, 17, ZQ_ERR_BAYER_NULL_POINTER},
        {1, 0, 1, 1, 4, 17, ZQ_ERR_BAYER_NULL_POINTER},
        {2, 0, 1, 1, 4, 17, ZQ_ERR_BAYER_NULL_POINTER},
        {3, 0, 1, 1, 4, 17, ZQ_ERR_BAYER_NULL_POINTER},
        {4, 0, 1, 1, 4, 17, ZQ_ERR_BAYER_NULL_POINTER},
        {-1, 0, 1, 1, 4, 17, ZQ_ERR_BAYER_SIZE},
        {-1, 1, 0, 1, 4, 17, ZQ_ERR_BAYER_SIZE},
        {-1, kMost, kMost, kMost, 0, 8, ZQ_ERR_BAYER_SIZE},
        {-1, kMost, 1, kMost, 0, 16, ZQ_ERR_BAYER_SIZE},
        {-1, 1, 1, 1, 4, 17, ZQ_ERR_BAYER_PATTERN},
        {-1, 1, 1, 1, kMost, 8, ZQ_ERR_BAYER_PATTERN},
        {-1, 1, 1, 1, 0, 17, ZQ_ERR_BAYER_BIT_DEPTH},
        {-1, 1, 1, 1, 0, kMost, ZQ_ERR_BAYER_BIT_DEPTH},
    };
    std::array<std::uint32_t, 5> words = {};
    for (const Case& c : cases) {
        words.fill(kGuard);
        std::array<std::uint32_t*, 5> at = {};
        for (std::size_t i = 0; i < at.size(); ++i) {
            at[i] = static_cast<int>(i) == c.missing ? nullptr : &words[i];
        }
        EXPECT_EQ(Gen_BayerColorDecode(at[0], at[1], c.rows, c.columns, c.line, c.line, at[2],
                                       at[3], at[4], c.pattern, c.depth),
                  c.code)
            << c.missing << ": " << c.columns << " x " << c.rows;
        for (const std::uint32_t word : words) EXPECT_EQ(word, kGuard);
    }
}

}  // namespace
