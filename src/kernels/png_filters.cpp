// Filters: whole vectors there; back, where each pixel waits for the one to its left, a pixel at a
// time with all its bytes at once.
#include "kernels/png_filters.h"

#include <algorithm>
#include <cstring>

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/png_filters.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/png_filters_scalar.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

#if HWY_TARGET != HWY_SCALAR
template <class V>
HWY_INLINE V distance(V a, V b) {
    return hn::Sub(hn::Max(a, b), hn::Min(a, b));
}

// In unsigned bytes. The distance to the corner is the sum or the difference of the two others; a
// sum that saturates is no less than either, which is all that counts.
template <class V>
HWY_INLINE V paeth(V left, V above, V corner) {
    const V to_left = distance(above, corner), to_above = distance(left, corner);
    const auto above_rises = hn::Eq(hn::Max(above, corner), above);
    const auto left_rises = hn::Eq(hn::Max(left, corner), left);
    const auto differ = hn::Xor(above_rises, left_rises);
    const V to_corner =
        hn::IfThenElse(differ, distance(to_left, to_above), hn::SaturatedAdd(to_left, to_above));
    const V least = hn::Min(to_left, hn::Min(to_above, to_corner));
    const V behind = hn::IfThenElse(hn::Eq(least, to_above), above, corner);
    return hn::IfThenElse(hn::Eq(least, to_left), left, behind);
}

template <int kFilter, class D, class V = hn::Vec<D>>
HWY_INLINE V prediction(D tag, V left, V above, V corner) {
    if constexpr (kFilter == 1) return left;
    if constexpr (kFilter == 2) return above;
    if constexpr (kFilter == 3) {
        const V odd = hn::And(hn::Xor(left, above), hn::Set(tag, std::uint8_t{1}));
        return hn::Sub(hn::AverageRound(left, above), odd);
    }
    if constexpr (kFilter == 4) return paeth(left, above, corner);
    return hn::Zero(tag);
}
#endif

template <int kFilter>
HWY_NOINLINE std::uint64_t filter_row(const std::uint8_t* HWY_RESTRICT row,
                                      const std::uint8_t* HWY_RESTRICT above, std::size_t step,
                                      std::uint8_t* HWY_RESTRICT to, std::size_t count) {
    std::size_t done = 0;
    std::uint64_t sum = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint8_t> tag;
    const hn::Repartition<std::uint64_t, decltype(tag)> sum_tag;
    auto sums = hn::Zero(sum_tag);
    for (; done + hn::Lanes(tag) <= count; done += hn::Lanes(tag)) {
        const auto here = hn::LoadU(tag, row + done);
        const auto guess =
            prediction<kFilter>(tag, hn::LoadU(tag, row + done - step),
                                hn::LoadU(tag, above + done), hn::LoadU(tag, above + done - step));
        const auto residual = hn::Sub(here, guess);
        hn::StoreU(residual, tag, to + done);
        const auto magnitude = hn::Min(residual, hn::Sub(hn::Zero(tag), residual));
        sums = hn::Add(sums, hn::SumsOf8(magnitude));
    }
    sum = hn::GetLane(hn::SumOfLanes(sum_tag, sums));
#endif
    return sum +
           scalar::png_filter(kFilter, row + done, above + done, step, to + done, count - done);
}

std::uint64_t png_filter(int filter, const std::uint8_t* HWY_RESTRICT row,
                         const std::uint8_t* HWY_RESTRICT above, std::size_t step,
                         std::uint8_t* HWY_RESTRICT to, std::size_t count) {
    switch (filter) {
        case 1:
            return filter_row<1>(row, above, step, to, count);
        case 2:
            return filter_row<2>(row, above, step, to, count);
        case 3:
            return filter_row<3>(row, above, step, to, count);
        case 4:
            return filter_row<4>(row, above, step, to, count);
        default:
            return filter_row<0>(row, above, step, to, count);
    }
}

void unfilter_up(const std::uint8_t* HWY_RESTRICT from, const std::uint8_t* HWY_RESTRICT above,
                 std::uint8_t* HWY_RESTRICT to, std::size_t count) {
    const hn::ScalableTag<std::uint8_t> tag;
    std::size_t done = 0;
    for (; done + hn::Lanes(tag) <= count; done += hn::Lanes(tag)) {
        hn::StoreU(hn::Add(hn::LoadU(tag, from + done), hn::LoadU(tag, above + done)), tag,
                   to + done);
    }
    scalar::png_unfilter(2, from, above, 1, to, done, count);
}

// Small pixels: plain arithmetic without branches, all bytes of a pixel at once.
template <int kFilter, std::size_t kStep>
HWY_NOINLINE void unfilter_small(const std::uint8_t* HWY_RESTRICT from,
                                 const std::uint8_t* HWY_RESTRICT above,
                                 std::uint8_t* HWY_RESTRICT to, std::size_t count) {
    int left[kStep] = {}, corner[kStep] = {};
    std::size_t done = 0;
    for (; done + kStep <= count; done += kStep) {
        for (std::size_t i = 0; i < kStep; ++i) {
            const int up = above[done + i];
            int guess = left[i];
            if constexpr (kFilter == 3) guess = (guess + up) >> 1;
            if constexpr (kFilter == 4) {
                const int rise = up - corner[i], shift = left[i] - corner[i];
                const int to_left = std::abs(rise), to_above = std::abs(shift);
                const int to_corner = std::abs(rise + shift);
                const int behind = to_above <= to_corner ? up : corner[i];
                guess = to_left <= std::min(to_above, to_corner) ? guess : behind;
            }
            left[i] = (from[done + i] + guess) & 0xFF;
            corner[i] = up;
            to[done + i] = static_cast<std::uint8_t>(left[i]);
        }
    }
    scalar::png_unfilter(kFilter, from, above, kStep, to, done, count);
}

// A vector holds one pixel and the beginning of the next, which is overwritten after it.
template <int kFilter, std::size_t kStep>
HWY_NOINLINE void unfilter_wide(const std::uint8_t* HWY_RESTRICT from,
                                const std::uint8_t* HWY_RESTRICT above,
                                std::uint8_t* HWY_RESTRICT to, std::size_t count) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::FixedTag<std::uint8_t, kPngMostStep> tag;
    auto left = hn::Zero(tag), corner = left;
    for (; done + kPngMostStep <= count; done += kStep) {
        const auto up = hn::LoadU(tag, above + done);
        left = hn::Add(hn::LoadU(tag, from + done), prediction<kFilter>(tag, left, up, corner));
        hn::StoreU(left, tag, to + done);
        corner = up;
    }
#endif
    scalar::png_unfilter(kFilter, from, above, kStep, to, done, count);
}

template <int kFilter>
void unfilter_by_step(const std::uint8_t* from, const std::uint8_t* above, std::size_t step,
                      std::uint8_t* to, std::size_t count) {
    switch (step) {
        case 1:
            return unfilter_small<kFilter, 1>(from, above, to, count);
        case 2:
            return unfilter_small<kFilter, 2>(from, above, to, count);
        case 3:
            return unfilter_wide<kFilter, 3>(from, above, to, count);
        case 4:
            return unfilter_wide<kFilter, 4>(from, above, to, count);
        case 6:
            return unfilter_wide<kFilter, 6>(from, above, to, count);
        case 8:
            return unfilter_wide<kFilter, 8>(from, above, to, count);
        default:
            return scalar::png_unfilter(kFilter, from, above, step, to, 0, count);
    }
}

void png_unfilter(int filter, const std::uint8_t* from, const std::uint8_t* above, std::size_t step,
                  std::uint8_t* to, std::size_t count) {
    switch (filter) {
        case 1:
            return unfilter_by_step<1>(from, above, step, to, count);
        case 2:
            return unfilter_up(from, above, to, count);
        case 3:
            return unfilter_by_step<3>(from, above, step, to, count);
        case 4:
            return unfilter_by_step<4>(from, above, step, to, count);
        default:
            if (count > 0) std::memcpy(to, from, count);
    }
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(png_filter);
HWY_EXPORT(png_unfilter);

std::uint64_t png_filter(int filter, const std::uint8_t* row, const std::uint8_t* above,
                         std::size_t step, std::uint8_t* to, std::size_t count) {
    return HWY_DYNAMIC_DISPATCH(png_filter)(filter, row, above, step, to, count);
}

void png_unfilter(int filter, const std::uint8_t* from, const std::uint8_t* above, std::size_t step,
                  std::uint8_t* to, std::size_t count) {
    HWY_DYNAMIC_DISPATCH(png_unfilter)(filter, from, above, step, to, count);
}

}  // namespace zq
#endif
