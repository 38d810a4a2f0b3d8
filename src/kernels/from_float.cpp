// Floating-point pixels to other pixels.
#include "kernels/from_float.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/from_float.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/export_kernel.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

// NaN compares false and so becomes the lower bound.
template <class V, class T = hn::TFromV<V>>
HWY_INLINE V clamp(V value, T lower, T upper) {
    const hn::DFromV<V> tag;
    const auto low = hn::Set(tag, lower);
    return hn::Min(hn::IfThenElse(hn::Ge(value, low), value, low), hn::Set(tag, upper));
}

void f32_to_u8(const float* from, std::uint8_t* to, std::size_t pixels) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    map_row(tag, bytes, from, to, pixels, [&](auto value) HWY_ATTR {
        return hn::DemoteTo(bytes, hn::ConvertTo(words, clamp(value, 0.0F, 255.0F)));
    });
}

void f32_to_i16(const float* from, std::int16_t* to, std::size_t pixels) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::Rebind<std::int16_t, decltype(tag)> halves;
    map_row(tag, halves, from, to, pixels, [&](auto value) HWY_ATTR {
        return hn::DemoteTo(halves, hn::ConvertTo(words, clamp(value, -32768.0F, 32767.0F)));
    });
}

void f32_to_u16(const float* from, std::uint16_t* to, std::size_t pixels) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    const hn::Rebind<std::uint16_t, decltype(tag)> halves;
    map_row(tag, halves, from, to, pixels, [&](auto value) HWY_ATTR {
        return hn::DemoteTo(halves, hn::ConvertTo(words, clamp(value, 0.0F, 65535.0F)));
    });
}

void f32_to_complex(const float* from, float* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<std::uint64_t> tag;
    const hn::Rebind<std::uint32_t, decltype(tag)> words;
    // On little-endian machines the float in the lower half of a word is the first of two.
    map_wide_row(words, tag, reinterpret_cast<const std::uint32_t*>(from),
                 reinterpret_cast<std::uint64_t*>(to), pixels, stores,
                 [&](auto value) HWY_ATTR { return hn::PromoteTo(tag, value); });
}

// Calls convert(magnitudes) for vectors of as many pixels as there are lanes of doubles.
template <class ToTag, class Convert>
HWY_INLINE void map_magnitudes(ToTag to_tag, const float* from, hn::TFromD<ToTag>* to,
                               std::size_t pixels, const Convert& convert) {
    const hn::ScalableTag<double> tag;
    const hn::Rebind<float, decltype(tag)> floats;
    for_each_vector<2>(from, to, pixels, hn::Lanes(tag),
                       [&](const float* source, hn::TFromD<ToTag>* target) HWY_ATTR {
                           hn::Vec<decltype(floats)> re, im;
                           hn::LoadInterleaved2(floats, source, re, im);
                           const auto x = hn::PromoteTo(tag, re);
                           const auto y = hn::PromoteTo(tag, im);
                           const auto sum = hn::Add(hn::Mul(x, x), hn::Mul(y, y));
                           hn::StoreU(convert(hn::Sqrt(sum)), to_tag, target);
                       });
}

// The nearest float, infinity beyond the largest: one lane at a time the vector form stops there.
template <class Floats, class V>
HWY_INLINE hn::Vec<Floats> nearest_float(Floats floats, V value) {
#if HWY_TARGET == HWY_SCALAR
    return hn::Set(floats, static_cast<float>(hn::GetLane(value)));
#else
    return hn::DemoteTo(floats, value);
#endif
}

void magnitude_to_f32(const float* from, float* to, std::size_t pixels) {
    const hn::Rebind<float, hn::ScalableTag<double>> floats;
    map_magnitudes(floats, from, to, pixels,
                   [&](auto magnitude) HWY_ATTR { return nearest_float(floats, magnitude); });
}

HWY_NOINLINE void exact_magnitude_to_u8(const float* from, std::uint8_t* to, std::size_t pixels,
                                        double scale) {
    const hn::ScalableTag<double> tag;
    const hn::Rebind<std::int32_t, decltype(tag)> words;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    map_magnitudes(bytes, from, to, pixels, [&](auto magnitude) HWY_ATTR {
        const auto value = hn::Mul(magnitude, hn::Set(tag, scale));
        return hn::DemoteTo(bytes, hn::DemoteTo(words, clamp(value, 0.0, 255.0)));
    });
}

// In single precision; a value below 256 is off by less than 6.2e-5 (roundings of 2^-24 of it, six
// in all, those under the root halved). Vectors in which a value lies that near an integer are done
// again exactly. Between 0.5, below which all is 0, and 255.5, adding 2^23 - 0.5 rounds a value
// that lies between integers down, and leaves the integer in the lowest bits.
void magnitude_to_u8(const float* from, std::uint8_t* to, std::size_t pixels, double scale) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToUnsigned<decltype(tag)> words;
    const hn::Rebind<std::uint8_t, decltype(tag)> bytes;
    const auto factor = hn::Set(tag, static_cast<float>(scale));
    const auto shift = hn::Set(tag, 0x1p23F - 0.5F);
    const auto step = [&](const float* source, std::uint8_t* target) HWY_ATTR {
        hn::Vec<decltype(tag)> re, im;
        hn::LoadInterleaved2(tag, source, re, im);
        const auto root = hn::Sqrt(hn::Add(hn::Mul(re, re), hn::Mul(im, im)));
        const auto value = clamp(hn::Mul(root, factor), 0.5F, 255.5F);
        const auto shifted = hn::Add(value, shift);
        const auto from_middle = hn::Abs(hn::Sub(value, hn::Sub(shifted, shift)));
        const auto is_near = hn::Gt(from_middle, hn::Set(tag, 0.5F - 1.0F / (1 << 13)));
        if (HWY_UNLIKELY(!hn::AllFalse(tag, is_near))) {
            exact_magnitude_to_u8(source, target, hn::Lanes(tag), scale);
        } else {
            hn::StoreU(hn::TruncateTo(bytes, hn::BitCast(words, shifted)), bytes, target);
        }
    };
    for_each_vector<2>(from, to, pixels, hn::Lanes(tag), step);
}

void magnitude_to_i16(const float* from, std::int16_t* to, std::size_t pixels) {
    const hn::ScalableTag<double> tag;
    const hn::Rebind<std::int32_t, decltype(tag)> words;
    const hn::Rebind<std::int16_t, decltype(tag)> halves;
    map_magnitudes(halves, from, to, pixels, [&](auto magnitude) HWY_ATTR {
        return hn::DemoteTo(halves, hn::DemoteTo(words, clamp(magnitude, -32768.0, 32767.0)));
    });
}

void magnitude_to_u16(const float* from, std::uint16_t* to, std::size_t pixels) {
    const hn::ScalableTag<double> tag;
    const hn::Rebind<std::int32_t, decltype(tag)> words;
    const hn::Rebind<std::uint16_t, decltype(tag)> halves;
    map_magnitudes(halves, from, to, pixels, [&](auto magnitude) HWY_ATTR {
        return hn::DemoteTo(halves, hn::DemoteTo(words, clamp(magnitude, 0.0, 65535.0)));
    });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

ZQ_EXPORT_ROW_KERNEL(f32_to_u8, float, std::uint8_t);
ZQ_EXPORT_ROW_KERNEL(f32_to_i16, float, std::int16_t);
ZQ_EXPORT_ROW_KERNEL(f32_to_u16, float, std::uint16_t);
ZQ_EXPORT_WIDE_ROW_KERNEL(f32_to_complex, float, float);
ZQ_EXPORT_ROW_KERNEL(magnitude_to_i16, float, std::int16_t);
ZQ_EXPORT_ROW_KERNEL(magnitude_to_u16, float, std::uint16_t);
ZQ_EXPORT_ROW_KERNEL(magnitude_to_f32, float, float);

HWY_EXPORT(magnitude_to_u8);

void magnitude_to_u8(const float* from, std::uint8_t* to, std::size_t pixels, double scale) {
    HWY_DYNAMIC_DISPATCH(magnitude_to_u8)(from, to, pixels, scale);
}

}  // namespace zq
#endif
