// Colour rows with the widest vectors that the processor has.
#include "kernels/colour_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/colour_rows.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/colour_rows_scalar.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

void rgb_to_bgra(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint8_t> tag;
    const auto alpha = hn::Zero(tag);
    for (; done + hn::Lanes(tag) <= pixels; done += hn::Lanes(tag)) {
        auto red = alpha, green = alpha, blue = alpha;
        hn::LoadInterleaved3(tag, source + 3 * done, red, green, blue);
        hn::StoreInterleaved4(blue, green, red, alpha, tag, destination + 4 * done);
    }
#endif
    scalar::rgb_to_bgra(source + 3 * done, destination + 4 * done, pixels - done);
}

void bgr_to_bgra(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint8_t> tag;
    const auto alpha = hn::Zero(tag);
    for (; done + hn::Lanes(tag) <= pixels; done += hn::Lanes(tag)) {
        auto blue = alpha, green = alpha, red = alpha;
        hn::LoadInterleaved3(tag, source + 3 * done, blue, green, red);
        hn::StoreInterleaved4(blue, green, red, alpha, tag, destination + 4 * done);
    }
#endif
    scalar::bgr_to_bgra(source + 3 * done, destination + 4 * done, pixels - done);
}

void bgra_to_bgr(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint8_t> tag;
    for (; done + hn::Lanes(tag) <= pixels; done += hn::Lanes(tag)) {
        auto blue = hn::Zero(tag), green = blue, red = blue, alpha = blue;
        hn::LoadInterleaved4(tag, source + 4 * done, blue, green, red, alpha);
        hn::StoreInterleaved3(blue, green, red, tag, destination + 3 * done);
    }
#endif
    scalar::bgra_to_bgr(source + 4 * done, destination + 3 * done, pixels - done);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(rgb_to_bgra);
HWY_EXPORT(bgr_to_bgra);
HWY_EXPORT(bgra_to_bgr);

void rgb_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(rgb_to_bgra)(source, destination, pixels);
}

void bgr_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(bgr_to_bgra)(source, destination, pixels);
}

void bgra_to_bgr(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(bgra_to_bgr)(source, destination, pixels);
}

}  // namespace zq
#endif
