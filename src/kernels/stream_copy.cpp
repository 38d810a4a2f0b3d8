// Copying with non-temporal stores.
#include "kernels/stream_copy.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/stream_copy.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/cache_control.h>
#include <hwy/highway.h>

#include <algorithm>
#include <cstdint>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Whole cache lines by vectors, what is before and after by plain stores.
void stream_copy(std::uint8_t* to, const std::uint8_t* from, std::size_t bytes) {
    constexpr std::size_t kLine = 64;
    const hn::ScalableTag<std::uint8_t> tag;
    const std::size_t before = (0 - reinterpret_cast<std::uintptr_t>(to)) % kLine;
    std::size_t done = std::min(before, bytes);
    std::memcpy(to, from, done);
    for (; done + kLine <= bytes; done += kLine) {
        for (std::size_t i = 0; i < kLine; i += hn::Lanes(tag)) {
            hn::Stream(hn::LoadU(tag, from + done + i), tag, to + done + i);
        }
    }
    std::memcpy(to + done, from + done, bytes - done);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(stream_copy);

void stream_copy(void* to, const void* from, std::size_t bytes) {
    HWY_DYNAMIC_DISPATCH(stream_copy)
    (static_cast<std::uint8_t*>(to), static_cast<const std::uint8_t*>(from), bytes);
}

void finish_streaming() {
    hwy::FlushStream();
}

}  // namespace zq
#endif
