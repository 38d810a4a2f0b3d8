// Bytes to wider pixels.
#include "kernels/from_u8.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/from_u8.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/export_kernel.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

// As many bytes as the wider tag has lanes.
template <class D>
using BytesFor = hn::Rebind<std::uint8_t, D>;

void u8_to_i16(const std::uint8_t* from, std::int16_t* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<std::int16_t> tag;
    map_wide_row(BytesFor<decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto value) HWY_ATTR { return hn::PromoteTo(tag, value); });
}

void u8_to_f32(const std::uint8_t* from, float* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<float> tag;
    const hn::RebindToSigned<decltype(tag)> words;
    map_wide_row(BytesFor<decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto value)
                     HWY_ATTR { return hn::ConvertTo(tag, hn::PromoteTo(words, value)); });
}

void u8_to_u32(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<std::uint32_t> tag;
    map_wide_row(BytesFor<decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto value) HWY_ATTR { return hn::PromoteTo(tag, value); });
}

void u8_to_grey32(const std::uint8_t* from, std::uint32_t* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<std::uint32_t> tag;
    map_wide_row(BytesFor<decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto value) HWY_ATTR {
                     const auto blue = hn::PromoteTo(tag, value);
                     return hn::Or(hn::Or(blue, hn::ShiftLeft<8>(blue)), hn::ShiftLeft<16>(blue));
                 });
}

void u8_to_grey64(const std::uint8_t* from, std::uint64_t* to, std::size_t pixels, Stores stores) {
    const hn::ScalableTag<std::uint64_t> tag;
    const hn::Rebind<std::uint32_t, decltype(tag)> words;
    map_wide_row(BytesFor<decltype(tag)>(), tag, from, to, pixels, stores,
                 [&](auto value) HWY_ATTR {
                     const auto blue = hn::PromoteTo(tag, hn::PromoteTo(words, value));
                     return hn::Or(hn::Or(blue, hn::ShiftLeft<16>(blue)), hn::ShiftLeft<32>(blue));
                 });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

ZQ_EXPORT_WIDE_ROW_KERNEL(u8_to_i16, std::uint8_t, std::int16_t);
ZQ_EXPORT_WIDE_ROW_KERNEL(u8_to_f32, std::uint8_t, float);
ZQ_EXPORT_WIDE_ROW_KERNEL(u8_to_u32, std::uint8_t, std::uint32_t);
ZQ_EXPORT_WIDE_ROW_KERNEL(u8_to_grey32, std::uint8_t, std::uint32_t);
ZQ_EXPORT_WIDE_ROW_KERNEL(u8_to_grey64, std::uint8_t, std::uint64_t);

}  // namespace zq
#endif
