// 16-bit samples to other pixels.
#include "kernels/from_i16.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/from_i16.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/export_kernel.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

using Samples = hn::ScalableTag<std::uint16_t>;
using SignedSamples = hn::RebindToSigned<Samples>;
using SampleBytes = hn::Rebind<std::uint8_t, Samples>;

// The sum saturates: what would overflow is 255 anyhow.
HWY_INLINE hn::Vec<SampleBytes> reduce(hn::Vec<Samples> sample, Reduction reduction) {
    const Samples tag;
    const auto half = hn::Set(tag, static_cast<std::uint16_t>(reduction.half));
    const auto rounded = hn::SaturatedAdd(sample, half);
    // What is above 255 must not look negative to DemoteTo.
    const auto value = hn::Min(hn::ShiftRightSame(rounded, reduction.shift), hn::Set(tag, 255));
    return hn::DemoteTo(SampleBytes(), hn::BitCast(SignedSamples(), value));
}

void i16_to_u8(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
               Reduction reduction) {
    map_row(SignedSamples(), SampleBytes(), from, to, pixels, [&](auto sample) HWY_ATTR {
        const auto positive = hn::Max(sample, hn::Zero(SignedSamples()));
        return reduce(hn::BitCast(Samples(), positive), reduction);
    });
}

void u16_to_u8(const std::uint16_t* from, std::uint8_t* to, std::size_t samples,
               Reduction reduction) {
    map_row(Samples(), SampleBytes(), from, to, samples,
            [&](auto sample) HWY_ATTR { return reduce(sample, reduction); });
}

void i16_to_f32(const std::int16_t* from, float* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    map_wide_row(hn::Rebind<std::int16_t, decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto sample)
                     HWY_ATTR { return hn::ConvertTo(tag, hn::PromoteTo(words, sample)); });
}

void i16_to_u16(const std::int16_t* from, std::uint16_t* to, std::size_t pixels) {
    const hn::ScalableTag<std::int16_t> tag;
    const hn::RebindToUnsigned<decltype(tag)> unsigned_tag;
    map_row(tag, unsigned_tag, from, to, pixels, [&](auto sample) HWY_ATTR {
        return hn::BitCast(unsigned_tag, hn::Max(sample, hn::Zero(tag)));
    });
}

void u16_to_grey64(const std::uint16_t* from, std::uint64_t* to, std::size_t pixels,
                   Stores stores) {
    const hn::ScalableTag<std::uint64_t> tag;
    const hn::Rebind<std::uint32_t, decltype(tag)> words;
    map_wide_row(hn::Rebind<std::uint16_t, decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto value) HWY_ATTR {
                     const auto blue = hn::PromoteTo(tag, hn::PromoteTo(words, value));
                     return hn::Or(hn::Or(blue, hn::ShiftLeft<16>(blue)), hn::ShiftLeft<32>(blue));
                 });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

ZQ_EXPORT_WIDE_ROW_KERNEL(i16_to_f32, std::int16_t, float);
ZQ_EXPORT_ROW_KERNEL(i16_to_u16, std::int16_t, std::uint16_t);
ZQ_EXPORT_WIDE_ROW_KERNEL(u16_to_grey64, std::uint16_t, std::uint64_t);

HWY_EXPORT(i16_to_u8);
HWY_EXPORT(u16_to_u8);

void i16_to_u8(const std::int16_t* from, std::uint8_t* to, std::size_t pixels,
               Reduction reduction) {
    HWY_DYNAMIC_DISPATCH(i16_to_u8)(from, to, pixels, reduction);
}

void u16_to_u8(const std::uint16_t* from, std::uint8_t* to, std::size_t samples,
               Reduction reduction) {
    HWY_DYNAMIC_DISPATCH(u16_to_u8)(from, to, samples, reduction);
}

}  // namespace zq
#endif
