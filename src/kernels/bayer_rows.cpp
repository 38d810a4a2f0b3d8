// Mosaic rows with the widest vectors that the processor has.
#include "kernels/bayer_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/bayer_rows.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <algorithm>

#include "kernels/bayer_rows_scalar.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Lanes are twice as wide as samples and hold two columns each until they are taken apart. So sums
// do not overflow, and each vector has one kind of site.
template <class Sample>
using WideTag = hn::ScalableTag<hwy::MakeWide<Sample>>;

template <class Tag>
struct Colours {
    hn::Vec<Tag> own, green, other;
};
template <class Tag>
struct Sites {
    Colours<Tag> own, green;  // of columns x, x + 2, ... and x + 1, x + 3, ...
};

template <class Tag>
class Pairs {
  public:
    HWY_INLINE Pairs(Tag tag, const hwy::MakeNarrow<hn::TFromD<Tag>>* samples)
        : columns_(hn::BitCast(tag, hn::LoadU(hn::RepartitionToNarrow<Tag>(), samples))) {}

    HWY_INLINE hn::Vec<Tag> first() const {
        return hn::And(columns_, hn::Set(Tag(), (hn::TFromD<Tag>{1} << kSampleBits) - 1));
    }
    HWY_INLINE hn::Vec<Tag> second() const { return hn::ShiftRight<kSampleBits>(columns_); }

  private:
    static constexpr int kSampleBits = 4 * sizeof(hn::TFromD<Tag>);
    hn::Vec<Tag> columns_;
};

// Interpolates two columns a lane; own colour at x. Reads columns x - 1 to x + 2 * lanes.
template <class Tag, class Sample>
HWY_INLINE Sites<Tag> interpolate(Tag tag, const MosaicRow<Sample>& row, std::size_t x) {
    const Pairs left(tag, row.current + x - 1), right(tag, row.current + x + 1);
    const Pairs above_left(tag, row.above + x - 1), above_right(tag, row.above + x + 1);
    const Pairs below_left(tag, row.below + x - 1), below_right(tag, row.below + x + 1);
    const auto upright_left = hn::Add(above_left.first(), below_left.first());
    const auto upright = hn::Add(above_left.second(), below_left.second());
    const auto upright_right = hn::Add(above_right.first(), below_right.first());
    const auto own = left.second(), green = right.first();
    const auto around = hn::Add(upright, hn::Add(left.first(), green));
    return {
        {own, hn::ShiftRight<2>(around), hn::ShiftRight<2>(hn::Add(upright_left, upright_right))},
        {hn::ShiftRight<1>(hn::Add(own, right.second())), green, hn::ShiftRight<1>(upright_right)}};
}

// min(255, value * gain >> shift)
template <class Tag>
HWY_INLINE hn::Vec<Tag> on_line(Tag tag, hn::Vec<Tag> value, std::uint32_t gain, int shift) {
    const auto factor = hn::Set(tag, static_cast<hn::TFromD<Tag>>(gain));
    const auto limit = hn::Set(tag, 255);
    if constexpr (sizeof(hn::TFromD<Tag>) == 2) {
        return hn::Min(limit, hn::MulHigh(hn::ShiftLeftSame(value, 16 - shift), factor));
    } else {
        return hn::Min(limit, hn::ShiftRightSame(hn::Mul(value, factor), shift));
    }
}

template <class Tag>
struct Bgr {
    hn::Vec<Tag> blue_green;  // blue in bits 0 to 7, green in bits 8 to 15
    hn::Vec<Tag> red;
};

template <class Tag>
HWY_INLINE Bgr<Tag> apply(Tag tag, const Colours<Tag>& colours, const MosaicGains& gains) {
    const auto own = on_line(tag, colours.own, gains.own, gains.shift);
    const auto green = on_line(tag, colours.green, gains.green, gains.shift);
    const auto other = on_line(tag, colours.other, gains.other, gains.shift);
    return {hn::Or(gains.own_is_red ? other : own, hn::ShiftLeft<8>(green)),
            gains.own_is_red ? own : other};
}

template <class Tag>
HWY_INLINE void store(Tag tag, const Bgr<Tag>& even, const Bgr<Tag>& odd, std::uint32_t* pixels) {
    if constexpr (sizeof(hn::TFromD<Tag>) == 2) {
        hn::StoreInterleaved4(even.blue_green, even.red, odd.blue_green, odd.red, tag,
                              reinterpret_cast<std::uint16_t*>(pixels));
    } else {
        hn::StoreInterleaved2(hn::Or(even.blue_green, hn::ShiftLeft<16>(even.red)),
                              hn::Or(odd.blue_green, hn::ShiftLeft<16>(odd.red)), tag, pixels);
    }
}

// Looks up what is found at the columns from x on, which are put side by side again for that.
template <class Sample, class Tag>
HWY_INLINE void look_up(Tag tag, const Sites<Tag>& sites, const MosaicTables& tables,
                        std::uint32_t* pixels) {
    const hn::RepartitionToNarrow<Tag> samples_tag;
    const auto put = [&](hn::Vec<Tag> first, hn::Vec<Tag> second, Sample* samples) HWY_ATTR {
        const auto both = hn::Or(first, hn::ShiftLeft<8 * sizeof(Sample)>(second));
        hn::StoreU(hn::BitCast(samples_tag, both), samples_tag, samples);
    };
    constexpr std::size_t kMost = HWY_MAX_BYTES / sizeof(Sample);
    HWY_ALIGN Sample own[kMost], green[kMost], other[kMost];
    put(sites.own.own, sites.green.own, own);
    put(sites.own.green, sites.green.green, green);
    put(sites.own.other, sites.green.other, other);
    for (std::size_t i = 0; i < 2 * hn::Lanes(tag); ++i) {
        pixels[i] = tables.own[own[i]] | tables.green[green[i]] | tables.other[other[i]];
    }
}

// Calls finish(tag, sites, pixels) for whole vectors of columns. The last vector overlaps the one
// before it, so that only the ends of the row are left over.
template <class Sample, class Finish>
HWY_INLINE void decode_row(const MosaicRow<Sample>& row, const MosaicTables& tables,
                           std::uint32_t* pixels, [[maybe_unused]] const Finish& finish) {
    const std::size_t begin = std::min<std::size_t>(row.own_first ? 2 : 1, row.columns);
    std::size_t end = begin;
#if HWY_TARGET != HWY_SCALAR
    const WideTag<Sample> tag;
    const std::size_t step = 2 * hn::Lanes(tag);
    if (row.columns > begin + step) {
        const std::size_t room = row.columns - 1 - step - begin;
        const std::size_t last = begin + room - room % 2;
        for (std::size_t x = begin; x < last; x += step) {
            finish(tag, interpolate(tag, row, x), pixels + x);
        }
        finish(tag, interpolate(tag, row, last), pixels + last);
        end = last + step;
    }
#endif
    scalar::decode_mosaic_columns(row, tables, 0, begin, pixels);
    scalar::decode_mosaic_columns(row, tables, end, row.columns, pixels);
}

template <class Sample>
HWY_INLINE void decode_by_tables(const MosaicRow<Sample>& row, const MosaicTables& tables,
                                 std::uint32_t* pixels) {
    decode_row(row, tables, pixels, [&](auto tag, const auto& sites, std::uint32_t* at) HWY_ATTR {
        look_up<Sample>(tag, sites, tables, at);
    });
}

template <class Sample>
HWY_INLINE void decode_by_gains(const MosaicRow<Sample>& row, const MosaicTables& tables,
                                const MosaicGains& gains, std::uint32_t* pixels) {
    decode_row(row, tables, pixels, [&](auto tag, const auto& sites, std::uint32_t* at) HWY_ATTR {
        store(tag, apply(tag, sites.own, gains), apply(tag, sites.green, gains), at);
    });
}

void look_up_bytes(const MosaicRow<std::uint8_t>& row, const MosaicTables& tables,
                   std::uint32_t* pixels) {
    decode_by_tables(row, tables, pixels);
}
void look_up_words(const MosaicRow<std::uint16_t>& row, const MosaicTables& tables,
                   std::uint32_t* pixels) {
    decode_by_tables(row, tables, pixels);
}
void compute_bytes(const MosaicRow<std::uint8_t>& row, const MosaicTables& tables,
                   const MosaicGains& gains, std::uint32_t* pixels) {
    decode_by_gains(row, tables, gains, pixels);
}
void compute_words(const MosaicRow<std::uint16_t>& row, const MosaicTables& tables,
                   const MosaicGains& gains, std::uint32_t* pixels) {
    decode_by_gains(row, tables, gains, pixels);
}

bool is_clipped_line(const std::uint32_t* table, std::size_t entries, std::uint32_t gain, int shift,
                     int place) {
    const hn::ScalableTag<std::uint32_t> tag;
    const std::size_t lanes = hn::Lanes(tag);
    constexpr std::size_t kAtOnce = 64;  // differences are looked at as seldom as that
    for (std::size_t done = 0; done < entries; done += kAtOnce) {
        auto different = hn::Zero(tag);
        for (std::size_t i = done; i < done + kAtOnce; i += lanes) {
            const auto index = hn::Iota(tag, static_cast<std::uint32_t>(i));
            const auto wanted = hn::ShiftLeftSame(on_line(tag, index, gain, shift), place);
            different = hn::Or(different, hn::Xor(wanted, hn::LoadU(tag, table + i)));
        }
        if (!hn::AllTrue(tag, hn::Eq(different, hn::Zero(tag)))) return false;
    }
    return true;
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(look_up_bytes);
HWY_EXPORT(look_up_words);
HWY_EXPORT(compute_bytes);
HWY_EXPORT(compute_words);
HWY_EXPORT(is_clipped_line);

void decode_mosaic_row(const MosaicRow<std::uint8_t>& row, const MosaicTables& tables,
                       std::uint32_t* pixels) {
    HWY_DYNAMIC_DISPATCH(look_up_bytes)(row, tables, pixels);
}
void decode_mosaic_row(const MosaicRow<std::uint16_t>& row, const MosaicTables& tables,
                       std::uint32_t* pixels) {
    HWY_DYNAMIC_DISPATCH(look_up_words)(row, tables, pixels);
}

void decode_mosaic_row(const MosaicRow<std::uint8_t>& row, const MosaicTables& tables,
                       const MosaicGains& gains, std::uint32_t* pixels) {
    HWY_DYNAMIC_DISPATCH(compute_bytes)(row, tables, gains, pixels);
}
void decode_mosaic_row(const MosaicRow<std::uint16_t>& row, const MosaicTables& tables,
                       const MosaicGains& gains, std::uint32_t* pixels) {
    HWY_DYNAMIC_DISPATCH(compute_words)(row, tables, gains, pixels);
}

bool is_clipped_line(const std::uint32_t* table, std::size_t entries, std::uint32_t gain, int shift,
                     int place) {
    return HWY_DYNAMIC_DISPATCH(is_clipped_line)(table, entries, gain, shift, place);
}

}  // namespace zq
#endif
