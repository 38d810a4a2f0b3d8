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

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(copy_with_alpha);

void copy_with_alpha(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                     std::uint8_t alpha, Stores stores) {
    HWY_DYNAMIC_DISPATCH(copy_with_alpha)(from, to, pixels, alpha, stores);
}

}  // namespace zq
#endif
