// A vector holds samples of as many columns, and the eight of a column are transformed in place;
// between columns and rows the block is transposed.
#include "kernels/dct_blocks.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/dct_blocks.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <utility>

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

constexpr std::size_t kSide = 8;
using Values = hn::CappedTag<std::int32_t, kSide>;
using Reals = hn::Rebind<float, Values>;
using Words = hn::Rebind<std::int16_t, Values>;
using Samples = hn::Rebind<std::uint8_t, Values>;
using Value = hn::Vec<Values>;
constexpr std::size_t kLanes = hn::MaxLanes(Values());

// Binary places of factors, and those that are kept between the two passes.
constexpr int kPlaces = 13;
constexpr int kKept = 2;
// Both passes together multiply by eight.
constexpr int kScale = 3;

HWY_INLINE Value times(Value value, std::int32_t factor) {
    return hn::Mul(value, hn::Set(Values(), factor));
}

template <int kBits>
HWY_INLINE Value rounded(Value value) {
    return hn::ShiftRight<kBits>(hn::Add(value, hn::Set(Values(), 1 << (kBits - 1))));
}

// By an angle of 6/16 pi, times the square root of 2.
HWY_INLINE void rotate(Value& a, Value& b) {
    const Value both = times(hn::Add(a, b), 4433);  // 0.541196100
    a = hn::Add(both, times(a, 6270));              // 0.765366865
    b = hn::Add(both, times(b, -15137));            // 1.847759065
}

// The odd half, which is the same both ways.
HWY_INLINE void transform_odd(Value& a, Value& b, Value& c, Value& d) {
    const Value ad = times(hn::Add(a, d), -7373);   // 0.899976223
    const Value bc = times(hn::Add(b, c), -20995);  // 2.562915447
    const Value ac_sum = hn::Add(a, c), bd_sum = hn::Add(b, d);
    const Value all = times(hn::Add(ac_sum, bd_sum), 9633);  // 1.175875602
    const Value ac = hn::Add(times(ac_sum, -16069), all);    // 1.961570560
    const Value bd = hn::Add(times(bd_sum, -3196), all);     // 0.390180644
    a = hn::Add(times(a, 2446), hn::Add(ad, ac));            // 0.298631336
    b = hn::Add(times(b, 16819), hn::Add(bc, bd));           // 2.053119869
    c = hn::Add(times(c, 25172), hn::Add(bc, ac));           // 3.072711026
    d = hn::Add(times(d, 12299), hn::Add(ad, bd));           // 1.501321110
}

HWY_INLINE void add_and_subtract(Value& a, Value& b) {
    const Value sum = hn::Add(a, b);
    b = hn::Sub(a, b);
    a = sum;
}

// The first pass keeps a few binary places, the second one rounds them away.
template <bool kIsFirst>
HWY_INLINE void forward(Value (&v)[kSide]) {
    constexpr int kDown = kIsFirst ? kPlaces - kKept : kPlaces + kKept;
    const auto whole = [](Value value) HWY_ATTR {
        if constexpr (kIsFirst)
            return hn::ShiftLeft<kKept>(value);
        else
            return rounded<kKept>(value);
    };
    for (std::size_t i = 0; i < 4; ++i) add_and_subtract(v[i], v[7 - i]);
    add_and_subtract(v[0], v[3]);
    add_and_subtract(v[1], v[2]);
    Value low = v[3], high = v[2];
    rotate(low, high);
    transform_odd(v[4], v[5], v[6], v[7]);
    const Value mean = whole(hn::Add(v[0], v[1]));
    const Value fourth = whole(hn::Sub(v[0], v[1]));
    const Value odd[] = {v[7], v[6], v[5], v[4]};
    v[0] = mean;
    v[2] = rounded<kDown>(low);
    v[4] = fourth;
    v[6] = rounded<kDown>(high);
    for (std::size_t i = 0; i < 4; ++i) v[2 * i + 1] = rounded<kDown>(odd[i]);
}

template <bool kIsFirst>
HWY_INLINE void inverse(Value (&v)[kSide]) {
    constexpr int kDown = kIsFirst ? kPlaces - kKept : kPlaces + kKept + kScale;
    Value low = v[2], high = v[6];
    rotate(low, high);
    Value even[4] = {hn::ShiftLeft<kPlaces>(hn::Add(v[0], v[4])),
                     hn::ShiftLeft<kPlaces>(hn::Sub(v[0], v[4])), high, low};
    add_and_subtract(even[0], even[3]);
    add_and_subtract(even[1], even[2]);
    Value odd[4] = {v[1], v[3], v[5], v[7]};
    transform_odd(odd[3], odd[2], odd[1], odd[0]);
    for (std::size_t i = 0; i < 4; ++i) {
        v[i] = rounded<kDown>(hn::Add(even[i], odd[i]));
        v[7 - i] = rounded<kDown>(hn::Sub(even[i], odd[i]));
    }
}

// Calls `pass` with the eight vectors of every so many columns.
template <class Pass>
HWY_INLINE void for_columns(std::int32_t* HWY_RESTRICT block, const Pass& pass) {
    for (std::size_t x = 0; x < kSide; x += kLanes) {
        Value column[kSide];
        for (std::size_t y = 0; y < kSide; ++y) {
            column[y] = hn::Load(Values(), block + y * kSide + x);
        }
        pass(column);
        for (std::size_t y = 0; y < kSide; ++y) {
            hn::Store(column[y], Values(), block + y * kSide + x);
        }
    }
}

#if HWY_TARGET == HWY_SCALAR

HWY_INLINE void transpose(std::int32_t* block) {
    for (std::size_t y = 1; y < kSide; ++y) {
        for (std::size_t x = 0; x < y; ++x) std::swap(block[y * kSide + x], block[x * kSide + y]);
    }
}

#else

// Squares of 4 x 4 where vectors have four values, two at once where they have eight.
HWY_INLINE void load_squares(const std::int32_t* from, Value (&rows)[4]) {
    const Values tag;
    const hn::Repartition<std::int64_t, Values> pairs;
    for (std::size_t i = 0; i < 4; ++i) rows[i] = hn::Load(tag, from + i * kSide);
    const auto low_01 = hn::BitCast(pairs, hn::InterleaveLower(tag, rows[0], rows[1]));
    const auto low_23 = hn::BitCast(pairs, hn::InterleaveLower(tag, rows[2], rows[3]));
    const auto high_01 = hn::BitCast(pairs, hn::InterleaveUpper(tag, rows[0], rows[1]));
    const auto high_23 = hn::BitCast(pairs, hn::InterleaveUpper(tag, rows[2], rows[3]));
    rows[0] = hn::BitCast(tag, hn::InterleaveLower(pairs, low_01, low_23));
    rows[1] = hn::BitCast(tag, hn::InterleaveUpper(pairs, low_01, low_23));
    rows[2] = hn::BitCast(tag, hn::InterleaveLower(pairs, high_01, high_23));
    rows[3] = hn::BitCast(tag, hn::InterleaveUpper(pairs, high_01, high_23));
}

HWY_INLINE void transpose(std::int32_t* HWY_RESTRICT block) {
    constexpr std::size_t kHalf = 4 * kSide;
    Value top[4], bottom[4];
    load_squares(block, top);
    load_squares(block + kHalf, bottom);
    if constexpr (kLanes == kSide) {
        for (std::size_t i = 0; i < 4; ++i) {
            std::int32_t* to = block + i * kSide;
            hn::Store(hn::ConcatLowerLower(Values(), bottom[i], top[i]), Values(), to);
            hn::Store(hn::ConcatUpperUpper(Values(), bottom[i], top[i]), Values(), to + kHalf);
        }
    } else {
        Value top_right[4], bottom_right[4];
        load_squares(block + 4, top_right);
        load_squares(block + kHalf + 4, bottom_right);
        for (std::size_t i = 0; i < 4; ++i) {
            std::int32_t* to = block + i * kSide;
            hn::Store(top[i], Values(), to);
            hn::Store(bottom[i], Values(), to + 4);
            hn::Store(top_right[i], Values(), to + kHalf);
            hn::Store(bottom_right[i], Values(), to + kHalf + 4);
        }
    }
}

#endif

HWY_INLINE void load_samples(const BlockLines& lines, std::size_t at,
                             std::int32_t* HWY_RESTRICT block) {
    for (std::size_t i = 0; i < kBlockValues; i += kLanes) {
        const std::uint8_t* from = lines[i / kSide] + at + i % kSide;
        const Value value = hn::PromoteTo(Values(), hn::LoadU(Samples(), from));
        hn::Store(hn::Sub(value, hn::Set(Values(), 128)), Values(), block + i);
    }
}

void forward_dct(const BlockLines& lines, std::size_t blocks, std::int16_t* coefficients) {
    HWY_ALIGN std::int32_t block[kBlockValues];
    for (std::size_t b = 0; b < blocks; ++b, coefficients += kBlockValues) {
        load_samples(lines, b * kSide, block);
        transpose(block);
        for_columns(block, [](Value(&rows)[kSide]) HWY_ATTR { forward<true>(rows); });
        transpose(block);
        for_columns(block, [](Value(&columns)[kSide]) HWY_ATTR { forward<false>(columns); });
        for (std::size_t i = 0; i < kBlockValues; i += kLanes) {
            hn::StoreU(hn::DemoteTo(Words(), hn::Load(Values(), block + i)), Words(),
                       coefficients + i);
        }
    }
}

HWY_INLINE void load_rounded(const std::int16_t* coefficients, const BlockSteps& steps,
                             std::int32_t* HWY_RESTRICT block) {
    for (std::size_t i = 0; i < kBlockValues; i += kLanes) {
        const Value value = hn::PromoteTo(Values(), hn::LoadU(Words(), coefficients + i));
        const auto parts = hn::MulAdd(hn::ConvertTo(Reals(), hn::Abs(value)),
                                      hn::LoadU(Reals(), steps.reciprocals() + i),
                                      hn::LoadU(Reals(), steps.biases() + i));
        const Value multiple =
            hn::Mul(hn::ConvertTo(Values(), parts), hn::LoadU(Values(), steps.steps() + i));
        const Value sign = hn::ShiftRight<31>(value);
        hn::Store(hn::Sub(hn::Xor(multiple, sign), sign), Values(), block + i);
    }
}

void inverse_dct_of_rounded(const std::int16_t* coefficients, std::size_t blocks,
                            const BlockSteps& steps, const BlockTargets& lines) {
    HWY_ALIGN std::int32_t block[kBlockValues];
    for (std::size_t b = 0; b < blocks; ++b, coefficients += kBlockValues) {
        load_rounded(coefficients, steps, block);
        for_columns(block, [](Value(&columns)[kSide]) HWY_ATTR { inverse<true>(columns); });
        transpose(block);
        for_columns(block, [](Value(&rows)[kSide]) HWY_ATTR { inverse<false>(rows); });
        transpose(block);
        for (std::size_t i = 0; i < kBlockValues; i += kLanes) {
            const Value value = hn::Add(hn::Load(Values(), block + i), hn::Set(Values(), 128));
            hn::StoreU(hn::DemoteTo(Samples(), value), Samples(),
                       lines[i / kSide] + b * kSide + i % kSide);
        }
    }
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

BlockSteps::BlockSteps(const std::array<unsigned, kBlockValues>& steps) {
    for (std::size_t i = 0; i < kBlockValues; ++i) {
        const float divisor = static_cast<float>(8 * steps[i]);
        steps_[i] = static_cast<std::int32_t>(steps[i]);
        // Another half of one keeps the sum off whole numbers by more than floats err.
        reciprocals_[i] = 1 / divisor;
        biases_[i] = (divisor / 2 + 0.5F) / divisor;
    }
}

HWY_EXPORT(forward_dct);
HWY_EXPORT(inverse_dct_of_rounded);

void forward_dct(const BlockLines& lines, std::size_t blocks, std::int16_t* coefficients) {
    HWY_DYNAMIC_DISPATCH(forward_dct)(lines, blocks, coefficients);
}

void inverse_dct_of_rounded(const std::int16_t* coefficients, std::size_t blocks,
                            const BlockSteps& steps, const BlockTargets& lines) {
    HWY_DYNAMIC_DISPATCH(inverse_dct_of_rounded)(coefficients, blocks, steps, lines);
}

}  // namespace zq
#endif
