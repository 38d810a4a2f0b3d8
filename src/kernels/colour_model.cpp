// The colour model with the widest vectors that the processor has. Single precision does nearly all
// of the work: where it could not tell on which side of a rounding boundary the double-precision
// formula comes out, that formula decides.
#include "kernels/colour_model.h"

#include <array>
#include <cstring>

#include "kernels/colour_model_sectors.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/colour_model.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using Floats = hn::ScalableTag<float>;
using Pixels = hn::RebindToUnsigned<Floats>;  // one 4-byte pixel a lane, the first byte lowest
using Doubles = hn::ScalableTag<double>;
using DoublePixels = hn::Rebind<std::uint32_t, Doubles>;  // as many pixels as there are doubles

constexpr std::size_t kMaxLanes = HWY_MAX_BYTES / 4;

// Added to a float below 2^22 in magnitude, rounds it to an integer, found in the low bits of the
// sum's representation.
constexpr float kRound = 0x1.8p23F;

template <int kByte, class PixelTag>
HWY_INLINE hn::Vec<PixelTag> byte_of(PixelTag tag, hn::Vec<PixelTag> pixels) {
    return hn::And(hn::ShiftRight<8 * kByte>(pixels), hn::Set(tag, 255));
}

HWY_INLINE hn::Vec<Floats> to_float(hn::Vec<Pixels> values) {
    return hn::ConvertTo(Floats(), hn::BitCast(hn::RebindToSigned<Floats>(), values));
}

// Luminance and saturation of one vector of doubles, every operation as the formula has it.
HWY_INLINE hn::Vec<DoublePixels> exact_luminance_saturation(hn::Vec<DoublePixels> pixels) {
    const Doubles tag;
    const DoublePixels pixel_tag;
    const hn::RebindToSigned<DoublePixels> integer_tag;
    const auto widened = [&](hn::Vec<DoublePixels> byte) HWY_ATTR {
        return hn::Mul(hn::PromoteTo(tag, hn::BitCast(integer_tag, byte)), hn::Set(tag, 257.0));
    };
    const auto truncated = [&](auto value) HWY_ATTR {
        return hn::BitCast(pixel_tag, hn::DemoteTo(integer_tag, value));
    };
    const auto blue = widened(byte_of<0>(pixel_tag, pixels));
    const auto green = widened(byte_of<1>(pixel_tag, pixels));
    const auto red = widened(byte_of<2>(pixel_tag, pixels));
    const auto weighted =
        hn::Add(hn::Add(hn::Mul(hn::Set(tag, 0.299), red), hn::Mul(hn::Set(tag, 0.587), green)),
                hn::Mul(hn::Set(tag, 0.114), blue));
    const auto luminance =
        hn::Mul(hn::Add(hn::Add(weighted, hn::Set(tag, 0.5)), hn::Set(tag, 128.0)),
                hn::Set(tag, 0.0038910505836575876));

    const auto sum = hn::Add(hn::Add(red, green), blue);
    const auto least = hn::Min(hn::Min(red, green), blue);
    const auto grey = hn::Div(hn::Mul(hn::Set(tag, 3.0), least), sum);
    const auto saturation =
        hn::Add(hn::Mul(hn::Sub(hn::Set(tag, 1.0), grey), hn::Set(tag, 255.0)), hn::Set(tag, 0.5));
    const auto coloured = hn::IfThenElseZero(hn::Gt(sum, hn::Zero(tag)), saturation);
    return hn::Or(truncated(luminance), hn::ShiftLeft<8>(truncated(coloured)));
}

// The same for a vector of pixels, as the two low bytes of each lane.
HWY_NOINLINE hn::Vec<Pixels> exact_luminance_saturation_of_all(hn::Vec<Pixels> pixels) {
    const DoublePixels tag;
    HWY_ALIGN std::uint32_t lanes[kMaxLanes];
    hn::Store(pixels, Pixels(), lanes);
    for (std::size_t i = 0; i < hn::Lanes(Pixels()); i += hn::Lanes(tag)) {
        hn::Store(exact_luminance_saturation(hn::Load(tag, lanes + i)), tag, lanes + i);
    }
    return hn::Load(Pixels(), lanes);
}

struct Planes {
    hn::Vec<Floats> blue, green, red;
};

// An integer in the low bits of each lane, and where it may be off by one.
struct Rounded {
    hn::Vec<Floats> value;  // kRound and the integer
    hn::Mask<Floats> unsure;
};

// With x and y whole numbers: only a luminance that ends in exactly one half is unsure, any other
// is at least 1/1000 away from that.
HWY_INLINE Rounded luminance(const Planes& p) {
    const Floats tag;
    const auto thousands = hn::MulAdd(
        p.red, hn::Set(tag, 299.0F),
        hn::MulAdd(p.green, hn::Set(tag, 587.0F), hn::Mul(p.blue, hn::Set(tag, 114.0F))));
    const auto round = hn::Set(tag, kRound);
    const auto value = hn::MulAdd(thousands, hn::Set(tag, 0.001F), round);
    const auto rest = hn::NegMulAdd(hn::Sub(value, round), hn::Set(tag, 1000.0F), thousands);
    return {value, hn::Eq(hn::Abs(rest), hn::Set(tag, 500.0F))};
}

// Numerator and denominator are whole numbers below 2^24, hence the quotient is rounded once and a
// tie is seen exactly.
HWY_INLINE Rounded saturation(const Planes& p) {
    const Floats tag;
    const auto round = hn::Set(tag, kRound);
    const auto sum = hn::Add(hn::Add(p.red, p.green), p.blue);
    const auto least = hn::Min(hn::Min(p.red, p.green), p.blue);
    const auto divisor = hn::Max(sum, hn::Set(tag, 1.0F));
    const auto coloured =
        hn::Mul(hn::NegMulAdd(hn::Set(tag, 3.0F), least, sum), hn::Set(tag, 255.0F));
    const auto value = hn::Add(hn::Div(coloured, divisor), round);
    const auto rest = hn::NegMulAdd(hn::Sub(value, round), divisor, coloured);
    return {value, hn::Eq(hn::Add(hn::Abs(rest), hn::Abs(rest)), divisor)};
}

// atan(tangent) in 256ths of a circle for tangents up to 1, within 2e-6.
HWY_INLINE hn::Vec<Floats> arc(hn::Vec<Floats> tangent) {
    constexpr float kCoefficients[] = {-0.165197935F, 0.890777065F, -2.2780732F,  3.92858473F,
                                       -5.66688564F,  8.1269622F,   -13.5798073F, 40.7436395F};
    const Floats tag;
    const auto square = hn::Mul(tangent, tangent);
    auto sum = hn::Set(tag, kCoefficients[0]);
    for (std::size_t i = 1; i < std::size(kCoefficients); ++i) {
        sum = hn::MulAdd(sum, square, hn::Set(tag, kCoefficients[i]));
    }
    return hn::Mul(sum, tangent);
}

// kRound and the hue. No colour's hue lies nearer than 1.3e-5 to a rounding boundary, and single
// precision is nearer than that to the true hue: the arc, at most 32, is rounded before the
// axis from which it is counted is added.
HWY_INLINE hn::Vec<Floats> hue(const Planes& p) {
    const Floats tag;
    const auto zero = hn::Zero(tag);
    const auto x = hn::Mul(hn::Sub(p.green, p.blue), hn::Set(tag, 1.732050807569F));
    const auto y = hn::Sub(hn::Add(p.red, p.red), hn::Add(p.green, p.blue));
    const auto width = hn::Abs(x), height = hn::Abs(y);
    const auto steep = hn::Gt(width, height);  // counted from the y axis of the plane
    const auto tangent =
        hn::Div(hn::Min(width, height), hn::Max(hn::Max(width, height), hn::Set(tag, 1.0F)));

    const auto left = hn::Lt(x, zero), below = hn::Lt(y, zero);
    const auto vertical = hn::IfThenElse(left, hn::Set(tag, 192.0F), hn::Set(tag, 64.0F));
    const auto horizontal =
        hn::IfThenElse(below, hn::Set(tag, 128.0F), hn::IfThenElseZero(left, hn::Set(tag, 256.0F)));
    const auto axis = hn::IfThenElse(steep, vertical, horizontal);
    const auto sign_bit = hn::SignBit(tag);
    const auto backwards =
        hn::And(hn::Xor(hn::Xor(x, y), hn::IfThenElseZero(steep, sign_bit)), sign_bit);

    // The formula's factor makes a circle of slightly more than 256.
    constexpr float kExcess = 2.7297e-8F;
    const auto from_axis =
        hn::MulAdd(axis, hn::Set(tag, kExcess), hn::Xor(arc(tangent), backwards));
    const auto round = hn::Set(tag, kRound);
    return hn::Min(hn::Add(hn::Add(from_axis, round), axis), hn::Set(tag, kRound + 255.0F));
}

HWY_INLINE hn::Vec<Pixels> hsl_of(hn::Vec<Pixels> pixels) {
    const Pixels tag;
    const Planes planes = {to_float(byte_of<0>(tag, pixels)), to_float(byte_of<1>(tag, pixels)),
                           to_float(byte_of<2>(tag, pixels))};
    const Rounded l = luminance(planes), s = saturation(planes);
    const auto byte_mask = hn::Set(tag, 255);
    auto luminance_saturation =
        hn::Or(hn::And(hn::BitCast(tag, l.value), byte_mask),
               hn::ShiftLeft<8>(hn::And(hn::BitCast(tag, s.value), byte_mask)));
    const auto h = hn::ShiftLeft<16>(hn::And(hn::BitCast(tag, hue(planes)), byte_mask));
    if (!hn::AllFalse(Floats(), hn::Or(l.unsure, s.unsure))) {
        luminance_saturation = exact_luminance_saturation_of_all(pixels);
    }
    const auto alpha = hn::And(pixels, hn::Set(tag, 0xFF000000U));
    return hn::Or(hn::Or(luminance_saturation, h), alpha);
}

// m for the formula's quotient: luminance * 2^22 / weight, rounded half up.
HWY_INLINE hn::Vec<Pixels> scale_of(hn::Vec<Pixels> luminance, hn::Vec<Pixels> weight) {
    const Floats tag;
    const Pixels pixel_tag;
    const hn::RebindToSigned<Pixels> integer_tag;
    const auto dividend = hn::ShiftLeft<22>(luminance);
    const auto quotient = hn::Div(to_float(dividend), to_float(weight));
    // Enlarged by two units of its last place, so that no quotient from one half up is rounded
    // down; one that was rounded up wrongly leaves too large a rest.
    const auto rounded = hn::MulAdd(quotient, hn::Set(tag, 1 + 0x1p-22F), hn::Set(tag, kRound));
    const auto candidate = hn::And(hn::BitCast(pixel_tag, rounded), hn::Set(pixel_tag, 0x3FF));
    const auto excess = hn::BitCast(integer_tag, hn::Sub(hn::Mul(candidate, weight), dividend));
    const auto too_large = hn::Gt(hn::Add(excess, excess), hn::BitCast(integer_tag, weight));
    return hn::Add(candidate, hn::BitCast(pixel_tag, hn::VecFromMask(integer_tag, too_large)));
}

HWY_INLINE hn::Vec<Pixels> rgb_of(hn::Vec<Pixels> pixels) {
    const Pixels tag;
    const hn::RebindToSigned<Pixels> integer_tag;
    const auto saturation = byte_of<1>(tag, pixels);
    const auto slopes =
        hn::GatherIndex(tag, kHueSlopes.data(), hn::BitCast(integer_tag, byte_of<2>(tag, pixels)));
    const auto mask = hn::Set(tag, kSlopeMask);
    const auto red_slope = hn::And(slopes, mask);
    const auto green_slope = hn::And(hn::ShiftRight<kGreenShift>(slopes), mask);
    const auto sum = hn::Add(hn::ShiftRight<kSumShift>(slopes), hn::Set(tag, kLeastSum));
    const auto blue_slope = hn::Sub(sum, hn::Add(red_slope, green_slope));
    const auto least = hn::Sub(hn::Set(tag, kUnsaturated), hn::ShiftLeft<13>(saturation));
    const auto channel = [&](auto slope) HWY_ATTR {
        return hn::ShiftRight<10>(hn::Add(hn::Mul(slope, saturation), least));
    };
    const auto red = channel(red_slope), green = channel(green_slope), blue = channel(blue_slope);
    const auto weight =
        hn::Add(hn::Add(hn::Mul(red, hn::Set(tag, 612)), hn::Mul(green, hn::Set(tag, 1202))),
                hn::Mul(blue, hn::Set(tag, 233)));
    const auto scale = hn::ShiftLeft<5>(scale_of(byte_of<0>(tag, pixels), weight));
    const auto scaled = [&](auto value) HWY_ATTR {
        return hn::Min(hn::ShiftRight<16>(hn::Mul(scale, value)), hn::Set(tag, 255));
    };
    const auto colour = hn::Or(hn::Or(scaled(blue), hn::ShiftLeft<8>(scaled(green))),
                               hn::ShiftLeft<16>(scaled(red)));
    return hn::Or(colour, hn::And(pixels, hn::Set(tag, 0xFF000000U)));
}

HWY_INLINE hn::Vec<Pixels> load(const std::uint8_t* bytes) {
#if HWY_TARGET == HWY_SCALAR
    std::uint32_t pixel;
    std::memcpy(&pixel, bytes, sizeof pixel);
    return hn::Set(Pixels(), pixel);
#else
    return hn::BitCast(Pixels(), hn::LoadU(hn::Repartition<std::uint8_t, Pixels>(), bytes));
#endif
}

HWY_INLINE void store(hn::Vec<Pixels> pixels, std::uint8_t* bytes) {
#if HWY_TARGET == HWY_SCALAR
    const std::uint32_t pixel = hn::GetLane(pixels);
    std::memcpy(bytes, &pixel, sizeof pixel);
#else
    const hn::Repartition<std::uint8_t, Pixels> tag;
    hn::StoreU(hn::BitCast(tag, pixels), tag, bytes);
#endif
}

template <class Kernel>
HWY_INLINE void for_each_vector(const std::uint8_t* source, std::uint8_t* destination,
                                std::size_t pixels, const Kernel& kernel) {
    const Pixels tag;
    const std::size_t lanes = hn::Lanes(tag);
    std::size_t done = 0;
    for (; done + lanes <= pixels; done += lanes) {
        store(kernel(load(source + 4 * done)), destination + 4 * done);
    }
    if (done == pixels) return;
    HWY_ALIGN std::uint32_t rest[kMaxLanes] = {};
    std::memcpy(rest, source + 4 * done, 4 * (pixels - done));
    hn::Store(kernel(hn::Load(tag, rest)), tag, rest);
    std::memcpy(destination + 4 * done, rest, 4 * (pixels - done));
}

void rgb_to_hsl_row(const std::uint8_t* bgra, std::uint8_t* lsha, std::size_t pixels) {
    for_each_vector(bgra, lsha, pixels, [](auto v) HWY_ATTR { return hsl_of(v); });
}

void hsl_to_rgb_row(const std::uint8_t* lsha, std::uint8_t* bgra, std::size_t pixels) {
    for_each_vector(lsha, bgra, pixels, [](auto v) HWY_ATTR { return rgb_of(v); });
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(rgb_to_hsl_row);
HWY_EXPORT(hsl_to_rgb_row);

void rgb_to_hsl(const std::uint8_t* bgra, std::uint8_t* lsha, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(rgb_to_hsl_row)(bgra, lsha, pixels);
}

void hsl_to_rgb(const std::uint8_t* lsha, std::uint8_t* bgra, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(hsl_to_rgb_row)(lsha, bgra, pixels);
}

}  // namespace zq
#endif
