// The loop that row kernels share: whole vectors, then the rest through a buffer on the stack, so
// that there is one code path for every length and nothing is touched beyond a row. Included once
// for each set of vector instructions.
#if defined(ZQ_KERNELS_ROW_LOOP_INL_H_) == defined(HWY_TARGET_TOGGLE)
#ifdef ZQ_KERNELS_ROW_LOOP_INL_H_
#undef ZQ_KERNELS_ROW_LOOP_INL_H_
#else
#define ZQ_KERNELS_ROW_LOOP_INL_H_
#endif

#include <hwy/highway.h>

#include <cstddef>
#include <cstring>

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

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
