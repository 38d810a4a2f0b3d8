// Rows of a canvas.
#include "kernels/zoom_rows.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/zoom_rows.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <algorithm>

#include "kernels/export_kernel.h"
#include "kernels/row_loop-inl.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

void bgra_to_bgr0(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels) {
    const hn::ScalableTag<std::uint32_t> tag;
    map_row(tag, tag, from, to, pixels,
            [&](auto pixel) HWY_ATTR { return hn::And(pixel, hn::Set(tag, 0xFFFFFFU)); });
}

// The pixel behind the last one that is wanted may not be there, so the last is left to the plain
// loops.
void every_second_u8(const std::uint8_t* HWY_RESTRICT from, std::uint8_t* HWY_RESTRICT to,
                     std::size_t pixels) {
    const hn::ScalableTag<std::uint8_t> tag;
    std::size_t done = 0;
    for (; done + hn::Lanes(tag) < pixels; done += hn::Lanes(tag)) {
        hn::Vec<decltype(tag)> even, odd;
        hn::LoadInterleaved2(tag, from + 2 * done, even, odd);
        hn::StoreU(even, tag, to + done);
    }
    for (; done < pixels; ++done) to[done] = from[2 * done];
}

void every_second_bgra(const std::uint32_t* HWY_RESTRICT from, std::uint32_t* HWY_RESTRICT to,
                       std::size_t pixels) {
    const hn::ScalableTag<std::uint32_t> tag;
    const auto colour = hn::Set(tag, 0xFFFFFFU);
    std::size_t done = 0;
    for (; done + hn::Lanes(tag) < pixels; done += hn::Lanes(tag)) {
        hn::Vec<decltype(tag)> even, odd;
        hn::LoadInterleaved2(tag, from + 2 * done, even, odd);
        hn::StoreU(hn::And(even, colour), tag, to + done);
    }
    for (; done < pixels; ++done) to[done] = from[2 * done] & 0xFFFFFFU;
}

// Two pixels are three 16-bit words: blue and green, red and the next blue, the rest.
void every_second_bgr(const std::uint8_t* HWY_RESTRICT from, std::uint32_t* HWY_RESTRICT to,
                      std::size_t pixels) {
    std::size_t done = 0;
#if HWY_TARGET != HWY_SCALAR
    const hn::ScalableTag<std::uint16_t> tag;
    const auto low = hn::Set(tag, 0xFFU);
    for (; done + hn::Lanes(tag) < pixels; done += hn::Lanes(tag)) {
        hn::Vec<decltype(tag)> blue_green, red, other;
        hn::LoadInterleaved3(tag, reinterpret_cast<const std::uint16_t*>(from + 6 * done),
                             blue_green, red, other);
        hn::StoreInterleaved2(blue_green, hn::And(red, low), tag,
                              reinterpret_cast<std::uint16_t*>(to + done));
    }
#endif
    for (; done < pixels; ++done) {
        const std::uint8_t* at = from + 6 * done;
        to[done] = std::uint32_t{at[0]} | std::uint32_t{at[1]} << 8U | std::uint32_t{at[2]} << 16U;
    }
}

HWY_INLINE std::size_t repeat_twice(const std::uint32_t* HWY_RESTRICT from,
                                    std::uint32_t* HWY_RESTRICT to, std::size_t pixels) {
    const hn::ScalableTag<std::uint32_t> tag;
    std::size_t done = 0;
    for (; done + hn::Lanes(tag) <= pixels; done += hn::Lanes(tag)) {
        const auto pixel = hn::LoadU(tag, from + done);
        hn::StoreInterleaved2(pixel, pixel, tag, to + 2 * done);
    }
    return done;
}

// Each pixel is stored in whole vectors; what goes past its end is overwritten by the next one's.
// The last few, which would go past the row, one by one.
void repeat_u32(const std::uint32_t* HWY_RESTRICT from, std::uint32_t* HWY_RESTRICT to,
                std::size_t pixels, std::size_t times) {
    const hn::ScalableTag<std::uint32_t> tag;
    const std::size_t lanes = hn::Lanes(tag);
    const std::size_t stored = (times + lanes - 1) / lanes * lanes;
    const std::size_t end = pixels * times;
    std::size_t done = times == 2 ? repeat_twice(from, to, pixels) : 0;
    for (; done * times + stored <= end; ++done) {
        const auto pixel = hn::Set(tag, from[done]);
        for (std::size_t i = 0; i < times; i += lanes) {
            hn::StoreU(pixel, tag, to + done * times + i);
        }
    }
    for (; done < pixels; ++done) std::fill_n(to + done * times, times, from[done]);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

ZQ_EXPORT_ROW_KERNEL(bgra_to_bgr0, std::uint32_t, std::uint32_t);
ZQ_EXPORT_ROW_KERNEL(every_second_u8, std::uint8_t, std::uint8_t);
ZQ_EXPORT_ROW_KERNEL(every_second_bgr, std::uint8_t, std::uint32_t);
ZQ_EXPORT_ROW_KERNEL(every_second_bgra, std::uint32_t, std::uint32_t);

HWY_EXPORT(repeat_u32);

void repeat_u32(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                std::size_t times) {
    HWY_DYNAMIC_DISPATCH(repeat_u32)(from, to, pixels, times);
}

}  // namespace zq
#endif
