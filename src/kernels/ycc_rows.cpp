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

HWY_INLINE YccTarget behind(const YccTarget& row, std::size_t pixels) {
    return {row.y + pixels, row.cb + pixels, row.cr + pixels};
}

#if HWY_TARGET == HWY_SCALAR

void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores) {
    scalar::ycc_to_bgra(from, to, pixels);
}

void bgra_to_ycc(const std::uint32_t* from, const YccTarget& to, std::size_t pixels,
                 CommonBits& bits) {
    scalar::bgra_to_ycc(from, to, pixels, bits);
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

using Sums = hn::Repartition<std::int32_t, Words>;
using Sum = hn::Vec<Sums>;
using Bytes = hn::Repartition<std::uint8_t, Words>;

// Blue and red of a pixel, and green and alpha, as 16-bit samples.
struct ColourPairs {
    Word blue_red, green_alpha;
};

HWY_INLINE ColourPairs pairs_of(Pixel pixel) {
    const auto words = hn::BitCast(UnsignedWords(), pixel);
    return {hn::BitCast(Words(), hn::And(words, hn::Set(UnsignedWords(), 0xFF))),
            hn::BitCast(Words(), hn::ShiftRight<8>(words))};
}

// Weights of both samples of a pair, the first one's in the lower half.
HWY_INLINE Word weights(std::int16_t first, std::int16_t second) {
    const auto low = static_cast<std::uint16_t>(first);
    const auto high = static_cast<std::uint16_t>(second);
    return hn::BitCast(Words(), hn::Set(Pixels(), low | std::uint32_t{high} << 16));
}

constexpr int kHalf = 32768;
constexpr int kMiddle = (128 << 16) + kHalf - 1;

// Sums in parts of 65536. Green counts twice by half of its weight, which would exceed 16 bits.
HWY_INLINE Sum luminance(const ColourPairs& pixel) {
    const Word half_green = weights(19235, 0);
    Sum rest = hn::Zero(Sums());
    Sum sum = hn::Set(Sums(), kHalf);
    sum = hn::ReorderWidenMulAccumulate(Sums(), pixel.blue_red, weights(7471, 19595), sum, rest);
    sum = hn::ReorderWidenMulAccumulate(Sums(), pixel.green_alpha, half_green, sum, rest);
    sum = hn::ReorderWidenMulAccumulate(Sums(), pixel.green_alpha, half_green, sum, rest);
    return hn::RearrangeToOddPlusEven(sum, rest);
}

// With all weights of the other sign, as -32768 fits into 16 bits and 32768 does not.
HWY_INLINE Sum chrominance(const ColourPairs& pixel, Word blue_red, Word green_alpha) {
    Sum rest = hn::Zero(Sums());
    Sum sum = hn::Zero(Sums());
    sum = hn::ReorderWidenMulAccumulate(Sums(), pixel.blue_red, blue_red, sum, rest);
    sum = hn::ReorderWidenMulAccumulate(Sums(), pixel.green_alpha, green_alpha, sum, rest);
    return hn::Sub(hn::Set(Sums(), kMiddle), hn::RearrangeToOddPlusEven(sum, rest));
}

// Bits 16 to 23 of four vectors.
template <class Function>
HWY_INLINE void store_whole_part(const ColourPairs (&pixels)[4], std::uint8_t* to,
                                 const Function& function) {
    const auto upper_words = [&](const ColourPairs& low, const ColourPairs& high) HWY_ATTR {
        return hn::ConcatOdd(Words(), hn::BitCast(Words(), function(high)),
                             hn::BitCast(Words(), function(low)));
    };
    const Word low = upper_words(pixels[0], pixels[1]);
    const Word high = upper_words(pixels[2], pixels[3]);
    hn::StoreU(hn::ConcatEven(Bytes(), hn::BitCast(Bytes(), high), hn::BitCast(Bytes(), low)),
               Bytes(), to);
}

// Four vectors of pixels make one of bytes for each plane.
HWY_INLINE void take_apart(const Pixel (&pixels)[4], const YccTarget& to) {
    const ColourPairs pairs[] = {pairs_of(pixels[0]), pairs_of(pixels[1]), pairs_of(pixels[2]),
                                 pairs_of(pixels[3])};
    store_whole_part(pairs, to.y,
                     [](const ColourPairs& pixel) HWY_ATTR { return luminance(pixel); });
    store_whole_part(pairs, to.cb, [](const ColourPairs& pixel) HWY_ATTR {
        return chrominance(pixel, weights(-32768, 11059), weights(21709, 0));
    });
    store_whole_part(pairs, to.cr, [](const ColourPairs& pixel) HWY_ATTR {
        return chrominance(pixel, weights(5329, -32768), weights(27439, 0));
    });
}

HWY_INLINE std::uint32_t lanes_joined(Pixel pixel, std::uint32_t start, bool all) {
    HWY_ALIGN std::uint32_t lanes[HWY_MAX_BYTES / sizeof(std::uint32_t)];
    hn::Store(pixel, Pixels(), lanes);
    for (std::size_t i = 0; i < hn::Lanes(Pixels()); ++i) {
        start = all ? start & lanes[i] : start | lanes[i];
    }
    return start;
}

void bgra_to_ycc(const std::uint32_t* from, const YccTarget& to, std::size_t pixels,
                 CommonBits& bits) {
    const std::size_t step = hn::Lanes(Pixels());
    Pixel all = hn::Set(Pixels(), bits.all);
    Pixel any = hn::Set(Pixels(), bits.any);
    std::size_t done = 0;
    for (; done + 4 * step <= pixels; done += 4 * step) {
        Pixel four[4];
        for (std::size_t i = 0; i < 4; ++i) {
            four[i] = hn::LoadU(Pixels(), from + done + i * step);
            all = hn::And(all, four[i]);
            any = hn::Or(any, four[i]);
        }
        take_apart(four, behind(to, done));
    }
    bits.all = lanes_joined(all, bits.all, true);
    bits.any = lanes_joined(any, bits.any, false);
    scalar::bgra_to_ycc(from + done, behind(to, done), pixels - done, bits);
}

#endif

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(ycc_to_bgra);
HWY_EXPORT(bgra_to_ycc);

void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores stores) {
    HWY_DYNAMIC_DISPATCH(ycc_to_bgra)(from, to, pixels, stores);
}

void bgra_to_ycc(const std::uint32_t* from, const YccTarget& to, std::size_t pixels,
                 CommonBits& bits) {
    HWY_DYNAMIC_DISPATCH(bgra_to_ycc)(from, to, pixels, bits);
}

}  // namespace zq
#endif
