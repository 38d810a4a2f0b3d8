// Colour pixels to other pixels.
#include "kernels/from_colour.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/from_colour.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/export_kernel.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

using Words = hn::ScalableTag<std::uint32_t>;
using SignedWords = hn::RebindToSigned<Words>;
using Floats = hn::Rebind<float, Words>;
using LongWords = hn::ScalableTag<std::uint64_t>;

HWY_INLINE hn::Vec<SignedWords> sum_of_rgb(hn::Vec<Words> pixel) {
    const auto low = hn::Set(Words(), 0xFFU);
    const auto blue = hn::And(pixel, low);
    const auto green = hn::And(hn::ShiftRight<8>(pixel), low);
    const auto red = hn::And(hn::ShiftRight<16>(pixel), low);
    return hn::BitCast(SignedWords(), hn::Add(hn::Add(blue, green), red));
}

// At most 196,605, so the sum is in the lower half.
HWY_INLINE hn::Vec<hn::Rebind<std::int32_t, LongWords>> sum_of_rgbu64(hn::Vec<LongWords> pixel) {
    const auto low = hn::Set(LongWords(), 0xFFFFU);
    const auto blue = hn::And(pixel, low);
    const auto green = hn::And(hn::ShiftRight<16>(pixel), low);
    const auto red = hn::And(hn::ShiftRight<32>(pixel), low);
    const auto sum = hn::Add(hn::Add(blue, green), red);
    const hn::Rebind<std::uint32_t, LongWords> words;
    return hn::BitCast(hn::RebindToSigned<decltype(words)>(), hn::TruncateTo(words, sum));
}

// A third of sums below 2^18, as the product with 1 / 3.0 in double precision gives it when rounded
// to a float: no third of an integer lies so near the middle of two floats that it matters.
template <class V>
HWY_INLINE auto third(V sum) {
    const hn::Rebind<float, hn::DFromV<V>> floats;
    return hn::Div(hn::ConvertTo(floats, sum), hn::Set(floats, 3.0F));
}

// For sums below 2^18 the quotient's distance to the next integer is more than a float's error.
template <class V>
HWY_INLINE V whole_third(V sum) {
    return hn::ConvertTo(hn::DFromV<V>(), third(sum));
}

void rgb_to_mean_u8(const std::uint32_t* from, std::uint8_t* to, std::size_t pixels) {
    const hn::Rebind<std::uint8_t, Words> bytes;
    map_row(Words(), bytes, from, to, pixels, [&](auto pixel) HWY_ATTR {
        // 21846 / 65536 is so little more than a third that it is exact up to 32,767.
        const auto third = hn::Mul(sum_of_rgb(pixel), hn::Set(SignedWords(), 21846));
        return hn::DemoteTo(bytes, hn::ShiftRight<16>(third));
    });
}

void rgb_to_mean_f32(const std::uint32_t* from, float* to, std::size_t pixels) {
    map_row(Words(), Floats(), from, to, pixels,
            [&](auto pixel) HWY_ATTR { return third(sum_of_rgb(pixel)); });
}

void rgb_to_rgbu64(const std::uint32_t* from, std::uint64_t* to, std::size_t pixels,
                   Stores stores) {
    const hn::ScalableTag<std::uint16_t> tag;
    map_wide_row(hn::Rebind<std::uint8_t, decltype(tag)>(), tag,
                 reinterpret_cast<const std::uint8_t*>(from), reinterpret_cast<std::uint16_t*>(to),
                 4 * pixels, stores,
                 [&](auto channel) HWY_ATTR { return hn::PromoteTo(tag, channel); });
}

void hsl_to_luminance(const std::uint32_t* from, std::uint8_t* to, std::size_t pixels) {
    const hn::Rebind<std::uint8_t, Words> bytes;
    map_row(Words(), bytes, from, to, pixels, [&](auto pixel) HWY_ATTR {
        return hn::U8FromU32(hn::And(pixel, hn::Set(Words(), 0xFFU)));
    });
}

void rgbu64_to_mean_i16(const std::uint64_t* from, std::int16_t* to, std::size_t pixels) {
    const hn::Rebind<std::int16_t, LongWords> halves;
    map_row(LongWords(), halves, from, to, pixels, [&](auto pixel) HWY_ATTR {
        return hn::DemoteTo(halves, whole_third(sum_of_rgbu64(pixel)));
    });
}

void rgbu64_to_mean_f32(const std::uint64_t* from, float* to, std::size_t pixels) {
    map_row(LongWords(), hn::Rebind<float, LongWords>(), from, to, pixels,
            [&](auto pixel) HWY_ATTR { return third(sum_of_rgbu64(pixel)); });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

ZQ_EXPORT_ROW_KERNEL(rgb_to_mean_u8, std::uint32_t, std::uint8_t);
ZQ_EXPORT_ROW_KERNEL(rgb_to_mean_f32, std::uint32_t, float);
ZQ_EXPORT_WIDE_ROW_KERNEL(rgb_to_rgbu64, std::uint32_t, std::uint64_t);
ZQ_EXPORT_ROW_KERNEL(hsl_to_luminance, std::uint32_t, std::uint8_t);
ZQ_EXPORT_ROW_KERNEL(rgbu64_to_mean_i16, std::uint64_t, std::int16_t);
ZQ_EXPORT_ROW_KERNEL(rgbu64_to_mean_f32, std::uint64_t, float);

}  // namespace zq
#endif
