// Samples to 8 bits by their range.
#include "kernels/grey_range.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/grey_range.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <algorithm>
#include <cmath>
#include <type_traits>

#include "kernels/grey_range_scalar.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

// The lesser and the greater; of a NaN and `known`, `known`, as the instructions of x86 do.
template <class V>
HWY_INLINE V lesser(V value, V known) {
#if HWY_ARCH_X86
    return hn::Min(value, known);
#else
    return hn::IfThenElse(hn::Lt(value, known), value, known);
#endif
}

template <class V>
HWY_INLINE V greater(V value, V known) {
#if HWY_ARCH_X86
    return hn::Max(value, known);
#else
    return hn::IfThenElse(hn::Gt(value, known), value, known);
#endif
}

// Four of each, as one waits for the one before it.
template <class T, class Range>
HWY_INLINE void widen(const T* HWY_RESTRICT from, std::size_t pixels, Range& range) {
    const hn::ScalableTag<T> tag;
    const std::size_t lanes = hn::Lanes(tag);
    auto low0 = hn::Set(tag, static_cast<T>(range.least)), low1 = low0, low2 = low0, low3 = low0;
    auto high0 = hn::Set(tag, static_cast<T>(range.largest)), high1 = high0, high2 = high0,
         high3 = high0;
    const auto take = [&](auto& low, auto& high, const T* at) HWY_ATTR {
        const auto value = hn::LoadU(tag, at);
        low = lesser(value, low);
        high = greater(value, high);
    };
    std::size_t done = 0;
    for (; done + 4 * lanes <= pixels; done += 4 * lanes) {
        take(low0, high0, from + done);
        take(low1, high1, from + done + lanes);
        take(low2, high2, from + done + 2 * lanes);
        take(low3, high3, from + done + 3 * lanes);
    }
    for (; done + lanes <= pixels; done += lanes) take(low0, high0, from + done);
    const auto low = hn::Min(hn::Min(low0, low1), hn::Min(low2, low3));
    const auto high = hn::Max(hn::Max(high0, high1), hn::Max(high2, high3));
    range.least = hn::GetLane(hn::MinOfLanes(tag, low));
    range.largest = hn::GetLane(hn::MaxOfLanes(tag, high));
    scalar::widen_range(from + done, pixels - done, range);
}

void widen_samples(const std::int16_t* from, std::size_t pixels, SampleRange& range) {
    widen(from, pixels, range);
}

void widen_floats(const float* from, std::size_t pixels, FloatRange& range) {
    widen(from, pixels, range);
}

#if HWY_NATIVE_FMA
// Above this a quotient that is no whole number may lie within 255 * 2^-23 of the next one.
constexpr std::int32_t kShortSpan = 32767;

// The factor is above 255 / span by at most 2^-23 of it, so that products with it stay below the
// next whole number, and none lies on one. Their sums with 2^23 - 0.5, which are rounded once, have
// the whole number in the lowest bits.
HWY_INLINE void map_short_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                                std::int32_t least, std::int32_t span) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::RebindToUnsigned<decltype(tag)> bits;
    const hn::Rebind<std::int16_t, decltype(tag)> samples;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    const float nearest = 255.0F / static_cast<float>(span);
    const bool above_it = static_cast<double>(nearest) * span > 255.0;
    const auto factor = hn::Set(tag, above_it ? nearest : std::nextafter(nearest, 256.0F));
    const auto low = hn::Set(words, least);
    const auto shift = hn::Set(tag, 0x1p23F - 0.5F);
    map_row(samples, bytes, from, to, pixels, [&](auto sample) HWY_ATTR {
        const auto above = hn::ConvertTo(tag, hn::Sub(hn::PromoteTo(words, sample), low));
        const auto shifted = hn::Max(hn::MulAdd(above, factor, shift), hn::Set(tag, 0x1p23F));
        return hn::TruncateTo(bytes, hn::BitCast(bits, shifted));
    });
}
#endif

// Products are below 2^24 and so exact. The rounded reciprocal gives the quotient or, where that is
// a whole number, sometimes one less: a quotient that is no whole number lies further from the next
// one than both roundings can carry it.
HWY_INLINE void map_any_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                              std::int32_t least, std::int32_t span) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::Rebind<std::int16_t, decltype(tag)> samples;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    const auto low = hn::Set(words, least);
    const auto divisor = hn::Set(tag, static_cast<float>(span));
    const auto reciprocal = hn::Set(tag, std::nextafter(1.0F / static_cast<float>(span), 0.0F));
    map_row(samples, bytes, from, to, pixels, [&](auto sample) HWY_ATTR {
        const auto above = hn::ConvertTo(tag, hn::Sub(hn::PromoteTo(words, sample), low));
        const auto product = hn::Mul(above, hn::Set(tag, 255.0F));
        const auto quotient = hn::Trunc(hn::Mul(product, reciprocal));
        const auto rest = hn::Sub(product, hn::Mul(quotient, divisor));
        const auto one = hn::IfThenElseZero(hn::Ge(rest, divisor), hn::Set(tag, 1.0F));
        return hn::DemoteTo(bytes, hn::ConvertTo(words, hn::Add(quotient, one)));
    });
}

void i16_to_u8_in_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                        SampleRange range) {
    const std::int32_t span = std::max(1, range.largest - range.least);
#if HWY_NATIVE_FMA
    if (span <= kShortSpan) return map_short_range(from, to, pixels, range.least, span);
#endif
    map_any_range(from, to, pixels, range.least, span);
}

// divide(numerator) makes quotients. NaN and what is too large become 0; all others are below 256,
// and so are the lowest bits of their sums with 2^23.
template <class Divide>
HWY_INLINE void map_floats(const float* from, std::uint8_t* to, std::size_t pixels, float least,
                           const Divide& divide) {
    const hn::ScalableTag<float> tag;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    const hn::RebindToUnsigned<decltype(tag)> bits;
    const auto low = hn::Set(tag, least);
    map_row(tag, bytes, from, to, pixels, [&](auto value) HWY_ATTR {
        const auto quotient = divide(hn::Mul(hn::Sub(value, low), hn::Set(tag, 255.0F)));
        const auto whole = hn::Trunc(greater(quotient, hn::Zero(tag)));
        return hn::TruncateTo(bytes, hn::BitCast(bits, hn::Add(whole, hn::Set(tag, 0x1p23F))));
    });
}

// Where products and sums are rounded once, two corrections of a product with the rounded
// reciprocal give the rounded quotient: the first is within a unit in the last place, and from such
// the second is exact (P. Markstein, 1990). Nothing below 1 matters, but the divisor and its
// reciprocal must be far from both ends.
void f32_to_u8_in_range(const float* from, std::uint8_t* to, std::size_t pixels, FloatRange range) {
    const hn::ScalableTag<float> tag;
    const float span = range.largest - range.least;
    const auto divisor = hn::Set(tag, span);
#if HWY_NATIVE_FMA
    if (span > 0x1p-100F && span < 0x1p100F) {
        const auto reciprocal = hn::Set(tag, 1.0F / span);
        return map_floats(from, to, pixels, range.least, [&](auto numerator) HWY_ATTR {
            const auto rough = hn::Mul(numerator, reciprocal);
            const auto near =
                hn::MulAdd(hn::NegMulAdd(rough, divisor, numerator), reciprocal, rough);
            return hn::MulAdd(hn::NegMulAdd(near, divisor, numerator), reciprocal, near);
        });
    }
#endif
    map_floats(from, to, pixels, range.least,
               [&](auto numerator) HWY_ATTR { return hn::Div(numerator, divisor); });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(widen_samples);
HWY_EXPORT(widen_floats);
HWY_EXPORT(i16_to_u8_in_range);
HWY_EXPORT(f32_to_u8_in_range);

void widen_range(const std::int16_t* from, std::size_t pixels, SampleRange& range) {
    HWY_DYNAMIC_DISPATCH(widen_samples)(from, pixels, range);
}

void widen_range(const float* from, std::size_t pixels, FloatRange& range) {
    HWY_DYNAMIC_DISPATCH(widen_floats)(from, pixels, range);
}

void i16_to_u8_in_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                        SampleRange range) {
    HWY_DYNAMIC_DISPATCH(i16_to_u8_in_range)(from, to, pixels, range);
}

void f32_to_u8_in_range(const float* from, std::uint8_t* to, std::size_t pixels, FloatRange range) {
    HWY_DYNAMIC_DISPATCH(f32_to_u8_in_range)(from, to, pixels, range);
}

}  // namespace zq
#endif
