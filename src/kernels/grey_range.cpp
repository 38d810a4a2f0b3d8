// Samples to 8 bits by their range.
#include "kernels/grey_range.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/grey_range.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/grey_range_scalar.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

// Comparisons with NaN are false, so that it changes nothing. Two of each, as one waits for the
// one before it.
template <class T, class Range>
HWY_INLINE void widen(const T* HWY_RESTRICT from, std::size_t pixels, Range& range) {
    const hn::ScalableTag<T> tag;
    const std::size_t lanes = hn::Lanes(tag);
    auto least = hn::Set(tag, static_cast<T>(range.least)), other_least = least;
    auto largest = hn::Set(tag, static_cast<T>(range.largest)), other_largest = largest;
    const auto take = [&](auto& low, auto& high, const T* at) HWY_ATTR {
        const auto value = hn::LoadU(tag, at);
        low = hn::IfThenElse(hn::Lt(value, low), value, low);
        high = hn::IfThenElse(hn::Gt(value, high), value, high);
    };
    std::size_t done = 0;
    for (; done + 2 * lanes <= pixels; done += 2 * lanes) {
        take(least, largest, from + done);
        take(other_least, other_largest, from + done + lanes);
    }
    for (; done + lanes <= pixels; done += lanes) take(least, largest, from + done);
    range.least = hn::GetLane(hn::MinOfLanes(tag, hn::Min(least, other_least)));
    range.largest = hn::GetLane(hn::MaxOfLanes(tag, hn::Max(largest, other_largest)));
    scalar::widen_range(from + done, pixels - done, range);
}

void widen_samples(const std::int16_t* from, std::size_t pixels, SampleRange& range) {
    widen(from, pixels, range);
}

void widen_floats(const float* from, std::size_t pixels, FloatRange& range) {
    widen(from, pixels, range);
}

// Products below 2^24 are exact, and a quotient that is no whole number lies further from the next
// one than rounding can carry it.
void i16_to_u8_in_range(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
                        SampleRange range) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::Rebind<std::int16_t, decltype(tag)> samples;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    const auto least = hn::Set(words, range.least);
    const std::int32_t span = range.largest - range.least;
    const auto divisor = hn::Set(tag, static_cast<float>(span < 1 ? 1 : span));
    map_row(samples, bytes, from, to, pixels, [&](auto sample) HWY_ATTR {
        const auto above = hn::ConvertTo(tag, hn::Sub(hn::PromoteTo(words, sample), least));
        const auto quotient = hn::Div(hn::Mul(above, hn::Set(tag, 255.0F)), divisor);
        return hn::DemoteTo(bytes, hn::ConvertTo(words, quotient));
    });
}

void f32_to_u8_in_range(const float* from, std::uint8_t* to, std::size_t pixels, FloatRange range) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    const auto least = hn::Set(tag, range.least);
    const auto divisor = hn::Set(tag, range.largest - range.least);
    const auto limit = hn::Set(tag, 2147483648.0F);
    map_row(tag, bytes, from, to, pixels, [&](auto value) HWY_ATTR {
        const auto quotient =
            hn::Div(hn::Mul(hn::Sub(value, least), hn::Set(tag, 255.0F)), divisor);
        const auto fits = hn::And(hn::Ge(quotient, hn::Neg(limit)), hn::Lt(quotient, limit));
        const auto word = hn::ConvertTo(words, hn::IfThenElseZero(fits, quotient));
        return hn::DemoteTo(bytes, hn::And(word, hn::Set(words, 255)));
    });
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
