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

// Widens three bytes a pixel, whose first is red or blue, as far as whole vectors go; returns the
// pixels that are done.
template <bool kRedFirst>
HWY_INLINE std::size_t widen_to_bgra([[maybe_unused]] const std::uint8_t* HWY_RESTRICT source,
                                     [[maybe_unused]] std::uint8_t* HWY_RESTRICT destination,
                                     [[maybe_unused]] std::size_t pixels) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint8_t> tag;
    const auto alpha = hn::Zero(tag);
    for (; done + hn::Lanes(tag) <= pixels; done += hn::Lanes(tag)) {
        auto first = alpha, green = alpha, last = alpha;
        hn::LoadInterleaved3(tag, source + 3 * done, first, green, last);
        const auto blue = kRedFirst ? last : first;
        const auto red = kRedFirst ? first : last;
        hn::StoreInterleaved4(blue, green, red, alpha, tag, destination + 4 * done);
    }
#endif
    return done;
}

void rgb_to_bgra(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    const std::size_t done = widen_to_bgra<true>(source, destination, pixels);
    scalar::rgb_to_bgra(source + 3 * done, destination + 4 * done, pixels - done);
}

void bgr_to_bgra(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    const std::size_t done = widen_to_bgra<false>(source, destination, pixels);
    scalar::bgr_to_bgra(source + 3 * done, destination + 4 * done, pixels - done);
}

// Drops the fourth byte; returns the pixels that are done.
template <bool kRedFirst>
HWY_INLINE std::size_t narrow_bgra([[maybe_unused]] const std::uint8_t* HWY_RESTRICT source,
                                   [[maybe_unused]] std::uint8_t* HWY_RESTRICT destination,
                                   [[maybe_unused]] std::size_t pixels) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint8_t> tag;
    for (; done + hn::Lanes(tag) <= pixels; done += hn::Lanes(tag)) {
        auto blue = hn::Zero(tag), green = blue, red = blue, alpha = blue;
        hn::LoadInterleaved4(tag, source + 4 * done, blue, green, red, alpha);
        hn::StoreInterleaved3(kRedFirst ? red : blue, green, kRedFirst ? blue : red, tag,
                              destination + 3 * done);
    }
#endif
    return done;
}

void bgra_to_bgr(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    const std::size_t done = narrow_bgra<false>(source, destination, pixels);
    scalar::bgra_to_bgr(source + 4 * done, destination + 3 * done, pixels - done);
}

void bgra_to_rgb(const std::uint8_t* HWY_RESTRICT source, std::uint8_t* HWY_RESTRICT destination,
                 std::size_t pixels) {
    const std::size_t done = narrow_bgra<true>(source, destination, pixels);
    scalar::bgra_to_rgb(source + 4 * done, destination + 3 * done, pixels - done);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(rgb_to_bgra);
HWY_EXPORT(bgr_to_bgra);
HWY_EXPORT(bgra_to_bgr);
HWY_EXPORT(bgra_to_rgb);

void rgb_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(rgb_to_bgra)(source, destination, pixels);
}

void bgr_to_bgra(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(bgr_to_bgra)(source, destination, pixels);
}

void bgra_to_bgr(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(bgra_to_bgr)(source, destination, pixels);
}

void bgra_to_rgb(const std::uint8_t* source, std::uint8_t* destination, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(bgra_to_rgb)(source, destination, pixels);
}

}  // namespace zq
#endif
