// Luminance, saturation, hue to red, green, blue with the widest vectors that the processor has.
#include "kernels/colour_model.h"
#include "kernels/colour_model_sectors.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/colour_model_hsl_to_rgb.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include "kernels/colour_model-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

struct Channels {
    hn::Vec<Pixels> red, green, blue;
};

// The colour before the luminance scales it.
HWY_INLINE Channels unscaled(hn::Vec<Pixels> saturation, hn::Vec<Pixels> slopes) {
    const Pixels tag;
    const auto mask = hn::Set(tag, kSlopeMask);
    const auto red = hn::And(slopes, mask);
    const auto green = hn::And(hn::ShiftRight<kGreenShift>(slopes), mask);
    const auto sum = hn::Add(hn::ShiftRight<kSumShift>(slopes), hn::Set(tag, kLeastSum));
    const auto blue = hn::Sub(sum, hn::Add(red, green));
    const auto least =
        hn::Sub(hn::Set(tag, kUnsaturated), hn::Mul(saturation, hn::Set(tag, -kFallingSlope)));
    const auto channel = [&](hn::Vec<Pixels> slope) HWY_ATTR {
        return hn::ShiftRight<10>(hn::Add(hn::Mul(slope, saturation), least));
    };
    return {channel(red), channel(green), channel(blue)};
}

// luminance * 2^22 / weight, rounded half up: exactly what the quotient in double precision gives,
// because none that is not a tie lies within 5e-8 of one.
HWY_INLINE hn::Vec<Pixels> scale_of(hn::Vec<Pixels> luminance, hn::Vec<Pixels> weight) {
    const Floats tag;
    const Pixels pixel_tag;
    const hn::RebindToSigned<Pixels> integer_tag;
    const auto dividend = hn::ShiftLeft<22>(luminance);
    const auto quotient = hn::Div(to_float(dividend), to_float(weight));
    const auto rounded = hn::MulAdd(quotient, hn::Set(tag, kUpwards), hn::Set(tag, kRound));
    const auto candidate = hn::And(hn::BitCast(pixel_tag, rounded), hn::Set(pixel_tag, 0x3FF));
    // One that was rounded up wrongly exceeds the dividend by more than half a weight.
    const auto excess = hn::BitCast(integer_tag, hn::Sub(hn::Mul(candidate, weight), dividend));
    const auto too_large = hn::Gt(hn::Add(excess, excess), hn::BitCast(integer_tag, weight));
    return hn::Add(candidate, hn::BitCast(pixel_tag, hn::VecFromMask(integer_tag, too_large)));
}

HWY_INLINE hn::Vec<Pixels> rgb_of(hn::Vec<Pixels> hsl, hn::Vec<Pixels> slopes) {
    const Pixels tag;
    const Channels c = unscaled(byte_of<1>(tag, hsl), slopes);
    const auto weight =
        hn::Add(hn::Add(hn::Mul(c.red, hn::Set(tag, 612)), hn::Mul(c.green, hn::Set(tag, 1202))),
                hn::Mul(c.blue, hn::Set(tag, 233)));
    const auto scale = hn::ShiftLeft<5>(scale_of(byte_of<0>(tag, hsl), weight));
    const auto scaled = [&](hn::Vec<Pixels> channel) HWY_ATTR {
        return hn::Min(hn::ShiftRight<16>(hn::Mul(scale, channel)), hn::Set(tag, 255));
    };
    const auto blue_green = hn::Or(scaled(c.blue), hn::ShiftLeft<8>(scaled(c.green)));
    const auto red_alpha =
        hn::Or(hn::ShiftLeft<16>(scaled(c.red)), hn::And(hsl, hn::Set(tag, kAlphaMask)));
    return hn::Or(blue_green, red_alpha);
}

// Up to kBlock pixels, a multiple of the vector. All slopes are looked up beforehand: gathering
// them by vector took twice the time with AVX-512.
HWY_INLINE void convert_hsl_block(const std::uint8_t* lsha, std::uint8_t* bgra,
                                  std::size_t pixels) {
    HWY_ALIGN std::uint32_t slopes[kBlock];
    for (std::size_t i = 0; i < pixels; ++i) slopes[i] = kHueSlopes[lsha[4 * i + 2]];
    for (std::size_t i = 0; i < pixels; i += hn::Lanes(Pixels())) {
        store(rgb_of(load(lsha + 4 * i), hn::LoadU(Pixels(), slopes + i)), bgra + 4 * i);
    }
}

void hsl_to_rgb(const std::uint8_t* lsha, std::uint8_t* bgra, std::size_t pixels) {
    convert_padded(lsha, bgra, pixels, convert_hsl_block);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(hsl_to_rgb);

void hsl_to_rgb(const std::uint8_t* lsha, std::uint8_t* bgra, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(hsl_to_rgb)(lsha, bgra, pixels);
}

}  // namespace zq
#endif
