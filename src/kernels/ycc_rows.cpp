// 16-bit lanes throughout: what exceeds them (1.402, 1.772, 0.71414 of 65536) is taken apart into
// whole multiples of the chrominance and a rest of less than half.
#include "kernels/ycc_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/ycc_rows.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/cache_control.h>
#include <hwy/highway.h>

#include <algorithm>

#include "kernels/ycc_rows_scalar.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

HWY_INLINE YccRow behind(const YccRow& row, std::size_t pixels) {
    return {row.y + pixels, row.cb + pixels, row.cr + pixels, row.alpha + pixels};
}

#if HWY_TARGET == HWY_SCALAR

void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores) {
    scalar::ycc_to_bgra(from, to, pixels);
}

#else

using Words = hn::ScalableTag<std::int16_t>;
using UnsignedWords = hn::RebindToUnsigned<Words>;
using HalfWords = hn::Half<UnsignedWords>;
using Pixels = hn::Repartition<std::uint32_t, Words>;
using Samples = hn::Rebind<std::uint8_t, Words>;
using Word = hn::Vec<Words>;
using UnsignedWord = hn::Vec<UnsignedWords>;
using Pixel = hn::Vec<Pixels>;

// In parts of 65536.
constexpr std::int16_t kRedOfCr = 26345;     // 1.402 - 1
constexpr std::int16_t kBlueOfCb = -14942;   // 1.772 - 2
constexpr std::int16_t kGreenOfCb = -22554;  // -0.34414
constexpr std::int16_t kGreenOfCr = 18734;   // 1 - 0.71414

HWY_INLINE Word load(const std::uint8_t* from) {
    return hn::PromoteTo(Words(), hn::LoadU(Samples(), from));
}

HWY_INLINE Word load_chrominance(const std::uint8_t* from) {
    return hn::Sub(load(from), hn::Set(Words(), 128));
}

// round(factor * chrominance / 65536): the upper half of twice the product, halved upwards.
HWY_INLINE Word part_of(Word chrominance, std::int16_t factor) {
    const auto twice = hn::Add(chrominance, chrominance);
    const auto high = hn::MulHigh(twice, hn::Set(Words(), factor));
    return hn::ShiftRight<1>(hn::Add(high, hn::Set(Words(), 1)));
}

// round((kGreenOfCb * cb + kGreenOfCr * cr) / 65536): the upper halves of both products, and what
// their lower halves carry.
HWY_INLINE Word part_of_green(Word cb, Word cr) {
    const auto of_cb = hn::Set(Words(), kGreenOfCb), of_cr = hn::Set(Words(), kGreenOfCr);
    const auto low_cb = hn::BitCast(UnsignedWords(), hn::Mul(cb, of_cb));
    const auto low_cr = hn::BitCast(UnsignedWords(), hn::Mul(cr, of_cr));
    const auto half_low =
        hn::Add(hn::And(low_cb, low_cr), hn::ShiftRight<1>(hn::Xor(low_cb, low_cr)));
    const auto carried =
        hn::ShiftRight<1>(hn::Add(hn::ShiftRight<14>(half_low), hn::Set(UnsignedWords(), 1)));
    return hn::Add(hn::Add(hn::MulHigh(cb, of_cb), hn::MulHigh(cr, of_cr)),
                   hn::BitCast(Words(), carried));
}

HWY_INLINE UnsignedWord clamped(Word sum) {
    const Word sample = hn::Min(hn::Max(sum, hn::Zero(Words())), hn::Set(Words(), 255));
    return hn::BitCast(UnsignedWords(), sample);
}

template <class Half>
HWY_INLINE Pixel joined(Half blue_green, Half red_alpha) {
    return hn::Or(hn::PromoteTo(Pixels(), blue_green),
                  hn::ShiftLeft<16>(hn::PromoteTo(Pixels(), red_alpha)));
}

// Half a vector of bytes from each plane makes two of pixels.
HWY_INLINE void convert(const YccRow& from, Pixel& first, Pixel& second) {
    const Word y = load(from.y), cb = load_chrominance(from.cb), cr = load_chrominance(from.cr);
    const auto alpha = hn::BitCast(UnsignedWords(), load(from.alpha));
    const auto red = clamped(hn::Add(hn::Add(y, cr), part_of(cr, kRedOfCr)));
    const auto green = clamped(hn::Add(hn::Sub(y, cr), part_of_green(cb, cr)));
    const auto blue = clamped(hn::Add(hn::Add(y, hn::Add(cb, cb)), part_of(cb, kBlueOfCb)));
    const auto blue_green = hn::Or(blue, hn::ShiftLeft<8>(green));
    const auto red_alpha = hn::Or(red, hn::ShiftLeft<8>(alpha));
    first = joined(hn::LowerHalf(blue_green), hn::LowerHalf(red_alpha));
    second = joined(hn::UpperHalf(HalfWords(), blue_green), hn::UpperHalf(HalfWords(), red_alpha));
}

template <class Store>
HWY_INLINE void convert_row(const YccRow& from, std::uint32_t* to, std::size_t pixels,
                            const Store& store) {
    const std::size_t step = hn::Lanes(Words());
    std::size_t done = 0;
    for (; done + step <= pixels; done += step) {
        Pixel first, second;
        convert(behind(from, done), first, second);
        store(first, to + done);
        store(second, to + done + step / 2);
    }
    scalar::ycc_to_bgra(behind(from, done), to + done, pixels - done);
}

void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores stores) {
    if (stores == Stores::kCached) {
        convert_row(from, to, pixels, [](Pixel pixel, std::uint32_t* at) HWY_ATTR {
            hn::StoreU(pixel, Pixels(), at);
        });
        return;
    }
    const std::size_t bytes = hn::Lanes(Pixels()) * sizeof *to;
    const std::size_t misaligned = (0 - reinterpret_cast<std::uintptr_t>(to)) % bytes / sizeof *to;
    const std::size_t head = std::min(misaligned, pixels);
    scalar::ycc_to_bgra(from, to, head);
    convert_row(behind(from, head), to + head, pixels - head,
                [](Pixel pixel, std::uint32_t* at) HWY_ATTR { hn::Stream(pixel, Pixels(), at); });
}

#endif

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(ycc_to_bgra);

void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores stores) {
    HWY_DYNAMIC_DISPATCH(ycc_to_bgra)(from, to, pixels, stores);
}

}  // namespace zq
#endif
