// Sums of squares in 32-bit lanes, for as many vectors as surely fit.
#include "kernels/squared_error.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/squared_error.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <algorithm>
#include <type_traits>

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

template <std::size_t kBytes>
HWY_INLINE SquaredError plain(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    constexpr std::size_t kSamples = std::min<std::size_t>(kBytes, 3);
    SquaredError error{};
    for (std::size_t i = 0; i < pixels; ++i) {
        std::uint32_t squares = 0;
        for (std::size_t k = 0; k < kSamples; ++k) {
            const int difference = a[i * kBytes + k] - b[i * kBytes + k];
            squares += static_cast<std::uint32_t>(difference * difference);
        }
        error.total += squares;
        error.pixels += squares != 0 ? 1 : 0;
    }
    return error;
}

#if HWY_TARGET == HWY_SCALAR

template <std::size_t kBytes>
SquaredError squared_error(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    return plain<kBytes>(a, b, pixels);
}

#else

using Bytes = hn::ScalableTag<std::uint8_t>;
using Words = hn::Repartition<std::int16_t, Bytes>;
using Sums = hn::Repartition<std::int32_t, Bytes>;
using Byte = hn::Vec<Bytes>;
using Sum = hn::Vec<Sums>;

// Each vector adds up to 4 * 255^2 to a lane.
constexpr std::size_t kMostVectors = 8000;

// Over both halves of what is left when the smaller bytes are taken from the larger.
HWY_INLINE Sum with_squares(Byte difference, Sum sum, Sum& rest) {
    const auto even =
        hn::BitCast(Words(), hn::And(difference, hn::BitCast(Bytes(), hn::Set(Words(), 255))));
    const auto odd = hn::BitCast(
        Words(), hn::ShiftRight<8>(hn::BitCast(hn::RebindToUnsigned<Words>(), difference)));
    sum = hn::ReorderWidenMulAccumulate(Sums(), even, even, sum, rest);
    return hn::ReorderWidenMulAccumulate(Sums(), odd, odd, sum, rest);
}

template <std::size_t kBytes>
SquaredError squared_error(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    using Pixels =
        hn::Repartition<std::conditional_t<kBytes == 1, std::uint8_t, std::uint32_t>, Bytes>;
    const auto counted =
        hn::BitCast(Bytes(), hn::Set(Pixels(), kBytes == 1 ? hn::TFromD<Pixels>{255} : 0xFFFFFFU));
    const std::size_t step = hn::Lanes(Pixels());
    SquaredError error{};
    while (pixels >= step) {
        const std::size_t vectors = std::min(pixels / step, kMostVectors);
        Sum sum = hn::Zero(Sums()), rest = hn::Zero(Sums());
        for (std::size_t i = 0; i < vectors; ++i) {
            const Byte left = hn::LoadU(Bytes(), a), right = hn::LoadU(Bytes(), b);
            const Byte difference =
                hn::And(hn::Sub(hn::Max(left, right), hn::Min(left, right)), counted);
            sum = with_squares(difference, sum, rest);
            error.pixels += hn::CountTrue(
                Pixels(), hn::Ne(hn::BitCast(Pixels(), difference), hn::Zero(Pixels())));
            a += step * kBytes;
            b += step * kBytes;
        }
        HWY_ALIGN std::int32_t lanes[HWY_MAX_BYTES / sizeof(std::int32_t)];
        hn::Store(hn::Add(sum, rest), Sums(), lanes);
        for (std::size_t i = 0; i < hn::Lanes(Sums()); ++i) {
            error.total += static_cast<std::uint32_t>(lanes[i]);
        }
        pixels -= vectors * step;
    }
    const SquaredError last = plain<kBytes>(a, b, pixels);
    return {error.total + last.total, error.pixels + last.pixels};
}

#endif

SquaredError squared_error_u8(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    return squared_error<1>(a, b, pixels);
}

SquaredError squared_error_bgrx(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    return squared_error<4>(a, b, pixels);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(squared_error_u8);
HWY_EXPORT(squared_error_bgrx);

SquaredError squared_error_u8(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    return HWY_DYNAMIC_DISPATCH(squared_error_u8)(a, b, pixels);
}

SquaredError squared_error_bgrx(const std::uint8_t* a, const std::uint8_t* b, std::size_t pixels) {
    return HWY_DYNAMIC_DISPATCH(squared_error_bgrx)(a, b, pixels);
}

}  // namespace zq
#endif
