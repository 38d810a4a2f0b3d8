// The loop that row kernels share: whole vectors, then the rest through a buffer on the stack, so
// that there is one code path for every length and nothing is touched beyond a row. Included once
// for each set of vector instructions.
#if defined(ZQ_KERNELS_ROW_LOOP_INL_H_) == defined(HWY_TARGET_TOGGLE)
#ifdef ZQ_KERNELS_ROW_LOOP_INL_H_
#undef ZQ_KERNELS_ROW_LOOP_INL_H_
#else
#define ZQ_KERNELS_ROW_LOOP_INL_H_
#endif

#include <hwy/cache_control.h>
#include <hwy/highway.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

#include "kernels/stores.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Calls step(from, to) for every `lanes` pixels; it reads and writes exactly that many elements,
// kElements of From for each of To, at any alignment.
template <std::size_t kElements, class From, class To, class Step>
HWY_INLINE void for_each_vector(const From* HWY_RESTRICT from, To* HWY_RESTRICT to,
                                std::size_t pixels, std::size_t lanes, const Step& step) {
    std::size_t done = 0;
    for (; done + lanes <= pixels; done += lanes) step(from + done * kElements, to + done);
    const std::size_t left = pixels - done;
    if (left == 0) return;
    HWY_ALIGN From last_from[HWY_MAX_BYTES * kElements] = {};
    HWY_ALIGN To last_to[HWY_MAX_BYTES];
    std::memcpy(last_from, from + done * kElements, left * kElements * sizeof(From));
    step(last_from, last_to);
    std::memcpy(to + done, last_to, left * sizeof(To));
}

// to[i] = function(from[i]): `function` makes a vector of ToTag from one of FromTag, which have the
// same number of lanes.
template <class FromTag, class ToTag, class Function>
HWY_INLINE void map_row(FromTag from_tag, ToTag to_tag,
                        const hn::TFromD<FromTag>* HWY_RESTRICT from,
                        hn::TFromD<ToTag>* HWY_RESTRICT to, std::size_t pixels,
                        const Function& function) {
    for_each_vector<1>(from, to, pixels, hn::Lanes(to_tag),
                       [&](const hn::TFromD<FromTag>* source, hn::TFromD<ToTag>* target) HWY_ATTR {
                           hn::StoreU(function(hn::LoadU(from_tag, source)), to_tag, target);
                       });
}

// map_row for targets of whole vectors, which may be written past the cache: all but the ends of
// the row, as that wants aligned addresses.
template <class FromTag, class ToTag, class Function>
HWY_INLINE void map_wide_row(FromTag from_tag, ToTag to_tag,
                             const hn::TFromD<FromTag>* HWY_RESTRICT from,
                             hn::TFromD<ToTag>* HWY_RESTRICT to, std::size_t pixels, Stores stores,
                             const Function& function) {
    const std::size_t lanes = hn::Lanes(to_tag);
    const bool aligned = reinterpret_cast<std::uintptr_t>(to) % sizeof(*to) == 0;
    if (stores == Stores::kStreamed && aligned && pixels >= 2 * lanes) {
        const std::size_t bytes = lanes * sizeof(*to);
        const std::size_t head = (0 - reinterpret_cast<std::uintptr_t>(to)) % bytes / sizeof(*to);
        map_row(from_tag, to_tag, from, to, head, function);
        // Streams hold up the processor's own fetching ahead, most of all across pages.
        const std::size_t ahead = 1024 / sizeof(*from);
        std::size_t done = head;
        for (; done + lanes <= pixels; done += lanes) {
            hwy::Prefetch(from + done + ahead);
            hn::Stream(function(hn::LoadU(from_tag, from + done)), to_tag, to + done);
        }
        from += done;
        to += done;
        pixels -= done;
    }
    map_row(from_tag, to_tag, from, to, pixels, function);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
