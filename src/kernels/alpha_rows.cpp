// Alpha by mask and or.
#include "kernels/alpha_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/alpha_rows.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

void copy_with_alpha(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                     std::uint8_t alpha, Stores stores) {
    const hn::ScalableTag<std::uint32_t> tag;
    const auto colours = hn::Set(tag, 0x00FFFFFFU);
    const auto wanted = hn::Set(tag, std::uint32_t{alpha} << 24);
    map_wide_row(tag, tag, from, to, pixels, stores,
                 [&](auto pixel) HWY_ATTR { return hn::Or(hn::And(pixel, colours), wanted); });
}

void gather_bits(const std::uint32_t* pixels, std::size_t count, CommonBits& bits) {
    const hn::ScalableTag<std::uint32_t> tag;
    auto all = hn::Set(tag, bits.all);
    auto any = hn::Set(tag, bits.any);
    std::size_t i = 0;
    for (; i + hn::Lanes(tag) <= count; i += hn::Lanes(tag)) {
        const auto pixel = hn::LoadU(tag, pixels + i);
        all = hn::And(all, pixel);
        any = hn::Or(any, pixel);
    }
    HWY_ALIGN std::uint32_t all_lanes[HWY_MAX_BYTES / sizeof(std::uint32_t)];
    HWY_ALIGN std::uint32_t any_lanes[HWY_MAX_BYTES / sizeof(std::uint32_t)];
    hn::Store(all, tag, all_lanes);
    hn::Store(any, tag, any_lanes);
    for (std::size_t lane = 0; lane < hn::Lanes(tag); ++lane) {
        bits.all &= all_lanes[lane];
        bits.any |= any_lanes[lane];
    }
    for (; i < count; ++i) {
        bits.all &= pixels[i];
        bits.any |= pixels[i];
    }
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(copy_with_alpha);
HWY_EXPORT(gather_bits);

void copy_with_alpha(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                     std::uint8_t alpha, Stores stores) {
    HWY_DYNAMIC_DISPATCH(copy_with_alpha)(from, to, pixels, alpha, stores);
}

void gather_bits(const std::uint32_t* pixels, std::size_t count, CommonBits& bits) {
    HWY_DYNAMIC_DISPATCH(gather_bits)(pixels, count, bits);
}

}  // namespace zq
#endif
