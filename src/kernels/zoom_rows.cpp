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
// loop.
template <class T>
HWY_INLINE void every_second(const T* HWY_RESTRICT from, T* HWY_RESTRICT to, std::size_t pixels) {
    const hn::ScalableTag<T> tag;
    std::size_t done = 0;
    for (; done + hn::Lanes(tag) < pixels; done += hn::Lanes(tag)) {
        hn::Vec<decltype(tag)> even, odd;
        hn::LoadInterleaved2(tag, from + 2 * done, even, odd);
        hn::StoreU(even, tag, to + done);
    }
    for (; done < pixels; ++done) to[done] = from[2 * done];
}

void every_second_u8(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
    every_second(from, to, pixels);
}

void every_second_u32(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels) {
    every_second(from, to, pixels);
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
ZQ_EXPORT_ROW_KERNEL(every_second_u32, std::uint32_t, std::uint32_t);

HWY_EXPORT(repeat_u32);

void repeat_u32(const std::uint32_t* from, std::uint32_t* to, std::size_t pixels,
                std::size_t times) {
    HWY_DYNAMIC_DISPATCH(repeat_u32)(from, to, pixels, times);
}

}  // namespace zq
#endif
