// Samples to 8 bits by their range.
#include "kernels/grey_range.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/grey_range.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <algorithm>
#include <bit>
#include <cmath>

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

// Four of each, as one waits for the one before it. The first and the last vector of a row overlap
// others, which lie within cache lines.
template <class T, class Range>
HWY_INLINE void widen(const T* first, std::size_t pixels, std::size_t rows, std::ptrdiff_t stride,
                      Range& range) {
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
    for (std::size_t row = 0; row < rows; ++row) {
        const T* from = first + static_cast<std::ptrdiff_t>(row) * stride;
        take(low2, high2, from);
        std::size_t done = (0 - reinterpret_cast<std::uintptr_t>(from)) / sizeof(T) % lanes;
        for (; done + 4 * lanes <= pixels; done += 4 * lanes) {
            take(low0, high0, from + done);
            take(low1, high1, from + done + lanes);
            take(low2, high2, from + done + 2 * lanes);
            take(low3, high3, from + done + 3 * lanes);
        }
        for (; done + lanes <= pixels; done += lanes) take(low0, high0, from + done);
        if (done < pixels) take(low1, high1, from + pixels - lanes);
    }
    const auto low = hn::Min(hn::Min(low0, low1), hn::Min(low2, low3));
    const auto high = hn::Max(hn::Max(high0, high1), hn::Max(high2, high3));
    range.least = hn::GetLane(hn::MinOfLanes(tag, low));
    range.largest = hn::GetLane(hn::MaxOfLanes(tag, high));
}

template <class T, class Range>
HWY_INLINE void widen_any(const T* first, std::size_t pixels, std::size_t rows,
                          std::ptrdiff_t stride, Range& range) {
    if (pixels < hn::Lanes(hn::ScalableTag<T>())) {
        scalar::widen_range(first, pixels, rows, stride, range);
    } else {
        widen(first, pixels, rows, stride, range);
    }
}

void widen_samples(const std::int16_t* first, std::size_t pixels, std::size_t rows,
                   std::ptrdiff_t stride, IntegerRange& range) {
    widen_any(first, pixels, rows, stride, range);
}

void widen_floats(const float* first, std::size_t pixels, std::size_t rows, std::ptrdiff_t stride,
                  FloatRange& range) {
    widen_any(first, pixels, rows, stride, range);
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
                        IntegerRange range) {
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

#if HWY_NATIVE_FMA
// Positive floats in order.
float neighbour(float value, std::int32_t steps) {
    return std::bit_cast<float>(std::bit_cast<std::int32_t>(value) + steps);
}

// Whether products with both parts of the reciprocal have the whole parts of the quotients, below
// 256. Products and quotients both grow with the numerator: of each whole part its first numerator
// and the one before that tell for all.
bool has_same_whole_parts(const FloatScale& scale) {
    const auto product = [&](float numerator) HWY_ATTR {
        return std::fma(numerator, scale.high, numerator * scale.low);
    };
    for (int i = 1; i < 256; ++i) {
        const auto whole = static_cast<float>(i);
        float first = whole * scale.span;
        while (first / scale.span < whole) first = neighbour(first, 1);
        while (neighbour(first, -1) / scale.span >= whole) first = neighbour(first, -1);
        if (product(first) < whole || product(neighbour(first, -1)) >= whole) return false;
    }
    return true;
}
#endif

FloatScale make_scale(FloatRange range, std::size_t pixels) {
    FloatScale scale{.least = range.least, .span = range.largest - range.least};
#if HWY_NATIVE_FMA
    constexpr std::size_t kWorthwhile = std::size_t{1} << 12U;
    // Far from where products overflow or lose bits.
    if (pixels < kWorthwhile || !(scale.span > 0x1p-80F && scale.span < 0x1p80F)) return scale;
    const double reciprocal = 1.0 / scale.span;
    scale.high = static_cast<float>(reciprocal);
    scale.low = static_cast<float>(reciprocal - scale.high);
    scale.multiplies = has_same_whole_parts(scale);
#else
    static_cast<void>(pixels);
#endif
    return scale;
}

void f32_to_u8_scaled(const float* from, std::uint8_t* to, std::size_t pixels,
                      const FloatScale& scale) {
    const hn::ScalableTag<float> tag;
#if HWY_NATIVE_FMA
    if (scale.multiplies) {
        const auto high = hn::Set(tag, scale.high), low = hn::Set(tag, scale.low);
        return map_floats(from, to, pixels, scale.least, [&](auto numerator) HWY_ATTR {
            return hn::MulAdd(numerator, high, hn::Mul(numerator, low));
        });
    }
#endif
    const auto divisor = hn::Set(tag, scale.span);
    map_floats(from, to, pixels, scale.least,
               [&](auto numerator) HWY_ATTR { return hn::Div(numerator, divisor); });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(widen_samples);
HWY_EXPORT(widen_floats);
HWY_EXPORT(i16_to_u8_in_range);
HWY_EXPORT(make_scale);
HWY_EXPORT(f32_to_u8_scaled);

void widen_range(const std::int16_t* first, std::size_t pixels, std::size_t rows,
                 std::ptrdiff_t stride, IntegerRange& range) {
    HWY_DYNAMIC_DISPATCH(widen_samples)(first, pixels, rows, stride, range);
}

void widen_range(const float* first, std::size_t pixels, std::size_t rows, std::ptrdiff_t stride,
                 FloatRange& range) {
    HWY_DYNAMIC_DISPATCH(widen_floats)(first, pixels, rows, stride, range);
}

void i16_to_u8_in_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                        IntegerRange range) {
    HWY_DYNAMIC_DISPATCH(i16_to_u8_in_range)(from, to, pixels, range);
}

FloatScale scale_of(FloatRange range, std::size_t pixels) {
    return HWY_DYNAMIC_DISPATCH(make_scale)(range, pixels);
}

void f32_to_u8_scaled(const float* from, std::uint8_t* to, std::size_t pixels,
                      const FloatScale& scale) {
    HWY_DYNAMIC_DISPATCH(f32_to_u8_scaled)(from, to, pixels, scale);
}

}  // namespace zq
#endif
