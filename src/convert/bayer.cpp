// Bayer decoding: checks, the order of the rows, and the choice between looking up and computing.
#include "convert/bayer.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <limits>
#include <optional>
#include <span>

#include "base/error_codes.h"
#include "convert/bayer_line.h"
#include "kernels/bayer_rows.h"

namespace zq {

namespace {

constexpr std::uint32_t kMaxBitDepth = 16;
constexpr int kRedPlace = 16, kGreenPlace = 8, kBluePlace = 0;

std::size_t entries_for(std::uint32_t bit_depth) {
    return bit_depth > 8 ? 65536 : 256;
}

// The shift modulo 32: depths below 8 shift by less than 10.
int shift_for(std::uint32_t bit_depth) {
    return static_cast<int>(bit_depth != 0 ? bit_depth + 2 : 10);
}

// Fails for a NaN.
bool is_gain(double gain) {
    return gain >= 0.0 && gain < 3.999;
}

void fill(std::span<std::uint32_t> table, double gain, int shift, int place) {
    const auto factor = static_cast<std::uint32_t>(std::floor(gain * 1024.0 + 0.5));
    for (std::size_t i = 0; i < table.size(); ++i) {
        const std::uint32_t value = (static_cast<std::uint32_t>(i) * factor) >> shift;
        table[i] = std::min(value, 255U) << place;
    }
}

struct Pattern {
    bool red_row_first;
    bool red_first;   // in red rows
    bool blue_first;  // in blue rows
};
constexpr std::array<Pattern, 4> kPatterns = {{
    {.red_row_first = false, .red_first = true, .blue_first = false},
    {.red_row_first = true, .red_first = false, .blue_first = true},
    {.red_row_first = false, .red_first = false, .blue_first = true},
    {.red_row_first = true, .red_first = true, .blue_first = false},
}};

// Whether lines of that width, `bytes` an element, can lie in memory.
bool has_place(std::uint64_t lines, std::uint64_t line_width, std::uint64_t columns,
               std::uint64_t bytes) {
    constexpr std::uint64_t kMost = std::numeric_limits<std::ptrdiff_t>::max();
    return (lines - 1) * line_width + columns <= kMost / bytes;
}

void check(const BayerMosaic& mosaic, const BayerTables<const std::uint32_t>& tables,
           const std::uint32_t* pixels, std::uint32_t pixel_line_width) {
    if (pixels == nullptr || mosaic.samples == nullptr || tables.red == nullptr ||
        tables.green == nullptr || tables.blue == nullptr) {
        throw kBayerNullPointer;
    }
    if (mosaic.rows == 0 || mosaic.columns == 0) throw kBayerSize;
    const std::uint64_t source_rows = std::max(mosaic.rows, 2U);
    if (!has_place(source_rows, mosaic.line_width, mosaic.columns, mosaic.bit_depth > 8 ? 2 : 1) ||
        !has_place(mosaic.rows, pixel_line_width, mosaic.columns, sizeof(std::uint32_t))) {
        throw kBayerSize;
    }
    if (mosaic.pattern >= kPatterns.size()) throw kBayerPattern;
    if (mosaic.bit_depth > kMaxBitDepth) throw kBayerBitDepth;
}

struct LineGains {
    std::uint32_t red, green, blue;
};

// The gains of tables that are lines. Nothing where computing does not pay: for few pixels, and for
// the depths below 6, whose shift the kernels do not know.
std::optional<LineGains> find_gains(const BayerMosaic& mosaic,
                                    const BayerTables<const std::uint32_t>& tables) {
    constexpr std::uint64_t kPixelsThatPay = 65536;
    const int shift = shift_for(mosaic.bit_depth);
    if (std::uint64_t{mosaic.rows} * mosaic.columns < kPixelsThatPay || shift < 8) return {};
    const auto gain = [&](const std::uint32_t* table, int place) {
        return gain_of_line({table, entries_for(mosaic.bit_depth)}, shift, place);
    };
    const auto red = gain(tables.red, kRedPlace);
    if (!red) return {};
    const auto green = gain(tables.green, kGreenPlace);
    if (!green) return {};
    const auto blue = gain(tables.blue, kBluePlace);
    if (!blue) return {};
    return LineGains{*red, *green, *blue};
}

template <class Sample>
class Decoder {
  public:
    Decoder(const BayerMosaic& mosaic, const BayerTables<const std::uint32_t>& tables)
        : mosaic_(mosaic),
          pattern_(kPatterns.at(mosaic.pattern)),
          red_tables_{tables.red, tables.green, tables.blue},
          blue_tables_{tables.blue, tables.green, tables.red},
          gains_(find_gains(mosaic, tables)) {}

    void decode_row(std::uint32_t y, std::uint32_t* pixels) const {
        const bool is_red = (y % 2 == 0) == pattern_.red_row_first;
        const MosaicRow<Sample> row = row_at(y, is_red ? pattern_.red_first : pattern_.blue_first);
        const MosaicTables& tables = is_red ? red_tables_ : blue_tables_;
        if (gains_) {
            decode_mosaic_row(row, tables, gains_for(is_red), pixels);
        } else {
            decode_mosaic_row(row, tables, pixels);
        }
    }

  private:
    // At the ends the neighbour that is there stands for the one that is not; a single row has the
    // line after it.
    MosaicRow<Sample> row_at(std::uint32_t y, bool own_first) const {
        const std::uint32_t last = mosaic_.rows - 1;
        const std::uint32_t above = y > 0 ? y - 1 : 1;
        const std::uint32_t below = y < last ? y + 1 : above;
        return {samples(above), samples(y), samples(below), mosaic_.columns, own_first};
    }

    const Sample* samples(std::uint32_t y) const {
        return static_cast<const Sample*>(mosaic_.samples) + std::size_t{mosaic_.line_width} * y;
    }

    MosaicGains gains_for(bool is_red) const {
        return {.own = is_red ? gains_->red : gains_->blue,
                .green = gains_->green,
                .other = is_red ? gains_->blue : gains_->red,
                .shift = shift_for(mosaic_.bit_depth),
                .own_is_red = is_red};
    }

    const BayerMosaic& mosaic_;
    const Pattern& pattern_;
    MosaicTables red_tables_;
    MosaicTables blue_tables_;
    std::optional<LineGains> gains_;
};

template <class Sample>
void decode_rows(const BayerMosaic& mosaic, const BayerTables<const std::uint32_t>& tables,
                 std::uint32_t* pixels, std::uint32_t pixel_line_width) {
    const Decoder<Sample> decoder(mosaic, tables);
    for (std::uint32_t y = 0; y < mosaic.rows; ++y) {
        decoder.decode_row(y, pixels + std::size_t{pixel_line_width} * y);
    }
}

}  // namespace

void calculate_bayer_tables(const BayerGains& gains, const BayerTables<std::uint32_t>& tables,
                            std::uint32_t bit_depth) {
    if (!is_gain(gains.red)) throw kBayerRedGain;
    if (!is_gain(gains.green)) throw kBayerGreenGain;
    if (!is_gain(gains.blue)) throw kBayerBlueGain;
    if (tables.red == nullptr || tables.green == nullptr || tables.blue == nullptr) {
        throw kBayerNullPointer;
    }
    if (bit_depth > kMaxBitDepth) throw kBayerBitDepth;
    const std::size_t entries = entries_for(bit_depth);
    const int shift = shift_for(bit_depth);
    fill({tables.red, entries}, gains.red, shift, kRedPlace);
    fill({tables.green, entries}, gains.green, shift, kGreenPlace);
    fill({tables.blue, entries}, gains.blue, shift, kBluePlace);
}

void decode_bayer(const BayerMosaic& mosaic, const BayerTables<const std::uint32_t>& tables,
                  std::uint32_t* pixels, std::uint32_t pixel_line_width) {
    check(mosaic, tables, pixels, pixel_line_width);
    if (mosaic.bit_depth > 8) {
        decode_rows<std::uint16_t>(mosaic, tables, pixels, pixel_line_width);
    } else {
        decode_rows<std::uint8_t>(mosaic, tables, pixels, pixel_line_width);
    }
}

}  // namespace zq
