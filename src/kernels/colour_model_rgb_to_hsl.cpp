// Red, green, blue to luminance, saturation, hue with the widest vectors that the processor has.
// Single precision gives the double-precision formula's bytes except in ties: those of the
// saturation come from a table, those of the luminance are computed by the formula.
#include "kernels/colour_model.h"
#include "kernels/colour_model_ties.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/colour_model_rgb_to_hsl.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include "kernels/colour_model-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

using Doubles = hn::ScalableTag<double>;
using DoublePixels = hn::Rebind<std::uint32_t, Doubles>;  // as many pixels as there are doubles

// Every operation as the formula has it.
HWY_INLINE hn::Vec<DoublePixels> exact_luminance(hn::Vec<DoublePixels> pixels) {
    const Doubles tag;
    const DoublePixels pixel_tag;
    const hn::RebindToSigned<DoublePixels> integer_tag;
    const auto weighted = [&](hn::Vec<DoublePixels> byte, double weight) HWY_ATTR {
        const auto widened = hn::PromoteTo(tag, hn::BitCast(integer_tag, byte));
        return hn::Mul(hn::Set(tag, weight), hn::Mul(widened, hn::Set(tag, 257.0)));
    };
    auto sum = hn::Add(weighted(byte_of<2>(pixel_tag, pixels), 0.299),
                       weighted(byte_of<1>(pixel_tag, pixels), 0.587));
    sum = hn::Add(sum, weighted(byte_of<0>(pixel_tag, pixels), 0.114));
    sum = hn::Add(hn::Add(sum, hn::Set(tag, 0.5)), hn::Set(tag, 128.0));
    const auto luminance = hn::Mul(sum, hn::Set(tag, 0.0038910505836575876));
    return hn::BitCast(pixel_tag, hn::DemoteTo(integer_tag, luminance));
}

// HSL pixels with the exact luminance.
HWY_INLINE hn::Vec<Pixels> with_exact_luminance(hn::Vec<Pixels> hsl, hn::Vec<Pixels> rgb) {
    const Pixels tag;
    const DoublePixels part_tag;
    HWY_ALIGN std::uint32_t lanes[kMaxLanes];
    hn::StoreU(rgb, tag, lanes);
    for (std::size_t i = 0; i < hn::Lanes(tag); i += hn::Lanes(part_tag)) {
        hn::StoreU(exact_luminance(hn::LoadU(part_tag, lanes + i)), part_tag, lanes + i);
    }
    return hn::Or(hn::AndNot(hn::Set(tag, 255), hsl), hn::LoadU(tag, lanes));
}

struct Planes {
    hn::Vec<Floats> blue, green, red;
};

struct Luminance {
    hn::Vec<Floats> value;  // kRound and the luminance, ties rounded up
    hn::Mask<Floats> tie;
};

HWY_INLINE Luminance luminance_of(const Planes& p) {
    const Floats tag;
    const auto thousandths = hn::MulAdd(
        p.red, hn::Set(tag, 299.0F),
        hn::MulAdd(p.green, hn::Set(tag, 587.0F), hn::Mul(p.blue, hn::Set(tag, 114.0F))));
    const auto round = hn::Set(tag, kRound);
    // What is no tie is at least 0.001 away from one: far more than the factor is too large.
    const auto value = hn::MulAdd(thousandths, hn::Set(tag, 0.0010000005F), round);
    const auto excess = hn::MulSub(hn::Sub(value, round), hn::Set(tag, 1000.0F), thousandths);
    return {value, hn::Eq(excess, hn::Set(tag, 500.0F))};
}

// All bits set where a saturation is not in kTiesRoundedDown.
HWY_INLINE hn::Vec<Pixels> is_rounded_up_in_tie(hn::Vec<Pixels> saturation) {
    const Pixels tag;
#if HWY_TARGET == HWY_SCALAR  // has no vector of 4 bytes
    const std::uint32_t n = hn::GetLane(saturation);
    const auto bit = hn::Set(
        tag, (n < 128 ? kTiesRoundedDown : kTiesRoundedDownFrom128)[n % 16] & 1U << n / 16 % 8);
#else
    alignas(16) static constexpr std::uint8_t kBits[16] = {1, 2, 4, 8, 16, 32, 64, 128};
    alignas(16) static constexpr std::uint8_t kBitsFrom128[16] = {0, 0, 0, 0, 0,  0,  0,  0,
                                                                  1, 2, 4, 8, 16, 32, 64, 128};
    const hn::Repartition<std::uint8_t, Pixels> byte_tag;
    const auto row = hn::BitCast(byte_tag, hn::And(saturation, hn::Set(tag, 15)));
    const auto column = hn::BitCast(byte_tag, hn::ShiftRight<4>(saturation));
    const auto look_up = [&](const std::uint8_t* rows, const std::uint8_t* columns) HWY_ATTR {
        return hn::And(hn::TableLookupBytes(hn::LoadDup128(byte_tag, rows), row),
                       hn::TableLookupBytes(hn::LoadDup128(byte_tag, columns), column));
    };
    // The upper three bytes of a lane look up saturation 0, whose bit is not set.
    const auto bit =
        hn::BitCast(tag, hn::Or(look_up(kTiesRoundedDown.data(), kBits),
                                look_up(kTiesRoundedDownFrom128.data(), kBitsFrom128)));
#endif
    return hn::VecFromMask(tag, hn::Eq(bit, hn::Zero(tag)));
}

// In the low byte. Dividend and divisor are whole numbers below 2^18: a quotient that is no tie is
// at least 1/1530 away from one, and a tie is known by its excess.
HWY_INLINE hn::Vec<Pixels> saturation_of(const Planes& p) {
    const Floats tag;
    const Pixels pixel_tag;
    const auto round = hn::Set(tag, kRound);
    const auto sum = hn::Add(hn::Add(p.red, p.green), p.blue);
    const auto least = hn::Min(hn::Min(p.red, p.green), p.blue);
    const auto divisor = hn::Max(sum, hn::Set(tag, 1.0F));
    const auto dividend =
        hn::Mul(hn::NegMulAdd(hn::Set(tag, 3.0F), least, sum), hn::Set(tag, 255.0F));
    const auto value = hn::MulAdd(hn::Div(dividend, divisor), hn::Set(tag, kUpwards), round);
    const auto excess = hn::MulSub(hn::Sub(value, round), divisor, dividend);
    const auto tie = hn::VecFromMask(
        pixel_tag, hn::RebindMask(pixel_tag, hn::Eq(hn::Add(excess, excess), divisor)));
    const auto saturation = hn::And(hn::BitCast(pixel_tag, value), hn::Set(pixel_tag, 255));
    const auto minus_one = hn::AndNot(is_rounded_up_in_tie(saturation), tie);
    return hn::Add(saturation, minus_one);
}

// atan(tangent) in 256ths of a circle for tangents between -1 and 1, within 2e-6 of the formula's.
HWY_INLINE hn::Vec<Floats> arc_of(hn::Vec<Floats> tangent) {
    const Floats tag;
    const auto square = hn::Mul(tangent, tangent);
    auto sum = hn::MulAdd(hn::Set(tag, -0.165197935F), square, hn::Set(tag, 0.890777065F));
    sum = hn::MulAdd(sum, square, hn::Set(tag, -2.2780732F));
    sum = hn::MulAdd(sum, square, hn::Set(tag, 3.92858473F));
    sum = hn::MulAdd(sum, square, hn::Set(tag, -5.66688564F));
    sum = hn::MulAdd(sum, square, hn::Set(tag, 8.1269622F));
    sum = hn::MulAdd(sum, square, hn::Set(tag, -13.5798073F));
    sum = hn::MulAdd(sum, square, hn::Set(tag, 40.7436395F));
    return hn::Mul(sum, tangent);
}

// kRound and the hue: the angle of (x, y) from the y axis. No colour's hue lies nearer than 1.3e-5
// to a rounding boundary, and the arc is nearer than that to the formula's: it is at most 32, and
// rounded before the axis from which it is counted is added.
HWY_INLINE hn::Vec<Floats> hue_of(const Planes& p) {
    const Floats tag;
    const auto both = hn::Add(p.green, p.blue);
    const auto x = hn::Mul(hn::Sub(p.green, p.blue), hn::Set(tag, 1.732050807569F));
    // A whole number, or next to nothing instead of 0, so that grey is 0 / y and not 0 / 0.
    const auto y = hn::Add(hn::Sub(hn::Add(p.red, p.red), both), hn::Set(tag, 1e-10F));
    const auto steep = hn::Gt(hn::Abs(x), hn::Abs(y));
    const auto tangent = hn::Div(hn::IfThenElse(steep, y, x), hn::IfThenElse(steep, hn::Neg(x), y));

    const auto left = hn::Lt(x, hn::Zero(tag)), below = hn::Lt(y, hn::Zero(tag));
    const auto of_x = hn::IfThenElse(left, hn::Set(tag, 192.0F), hn::Set(tag, 64.0F));
    const auto of_y =
        hn::IfThenElse(below, hn::Set(tag, 128.0F), hn::IfThenElseZero(left, hn::Set(tag, 256.0F)));
    const auto axis = hn::IfThenElse(steep, of_x, of_y);

    // The formula's factor makes slightly more than 256 of a whole circle.
    const auto from_axis = hn::MulAdd(axis, hn::Set(tag, 2.7297e-8F), arc_of(tangent));
    const auto hue = hn::Add(hn::Add(from_axis, hn::Set(tag, kRound)), axis);
    return hn::Min(hue, hn::Set(tag, kRound + 255.0F));
}

struct Converted {
    hn::Vec<Pixels> hsl;
    bool tie;  // some luminance is yet to be computed exactly
};

HWY_INLINE Converted convert(hn::Vec<Pixels> rgb) {
    const Pixels tag;
    const Planes planes = {to_float(byte_of<0>(tag, rgb)), to_float(byte_of<1>(tag, rgb)),
                           to_float(byte_of<2>(tag, rgb))};
    const Luminance l = luminance_of(planes);
    const auto luminance = hn::And(hn::BitCast(tag, l.value), hn::Set(tag, 255));
    const auto saturation = hn::ShiftLeft<8>(saturation_of(planes));
    const auto hue = hn::ShiftLeft<16>(hn::BitCast(tag, hue_of(planes)));  // kRound falls out
    const auto alpha = hn::And(rgb, hn::Set(tag, kAlphaMask));
    const auto hsl = hn::Or(hn::Or(luminance, saturation), hn::Or(hue, alpha));
    return {hsl, !hn::AllFalse(Floats(), l.tie)};
}

// Up to kBlock pixels, a multiple of the vector. Ties are few but come at no time that the
// processor could foresee: they are put aside, with no branch, and settled at the end.
HWY_INLINE void convert_rgb_block(const std::uint8_t* bgra, std::uint8_t* lsha,
                                  std::size_t pixels) {
    const Pixels tag;
    const std::size_t lanes = hn::Lanes(tag);
    HWY_ALIGN std::uint32_t rgb_of_ties[kBlock];
    std::uint8_t* hsl_of_ties[kBlock];
    std::size_t ties = 0;
    for (std::size_t i = 0; i < pixels; i += lanes) {
        const auto rgb = load(bgra + 4 * i);
        const Converted converted = convert(rgb);
        store(converted.hsl, lsha + 4 * i);
        hn::StoreU(rgb, tag, rgb_of_ties + ties * lanes);
        hsl_of_ties[ties] = lsha + 4 * i;
        ties += converted.tie ? 1 : 0;
    }
    for (std::size_t i = 0; i < ties; ++i) {
        const auto rgb = hn::LoadU(tag, rgb_of_ties + i * lanes);
        store(with_exact_luminance(load(hsl_of_ties[i]), rgb), hsl_of_ties[i]);
    }
}

void rgb_to_hsl(const std::uint8_t* bgra, std::uint8_t* lsha, std::size_t pixels) {
    convert_padded(bgra, lsha, pixels, convert_rgb_block);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(rgb_to_hsl);

void rgb_to_hsl(const std::uint8_t* bgra, std::uint8_t* lsha, std::size_t pixels) {
    HWY_DYNAMIC_DISPATCH(rgb_to_hsl)(bgra, lsha, pixels);
}

}  // namespace zq
#endif
