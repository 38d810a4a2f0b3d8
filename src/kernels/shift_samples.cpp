// Unsigned samples to signed pixels.
#include "kernels/shift_samples.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/shift_samples.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include <algorithm>
#include <limits>

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// With the highest bit turned a sample is itself less 32768, and signed. What is left to add is not
// negative, so that parts of it, each of which fits, can be added one after the other.
void shift_samples(std::uint16_t* samples, std::size_t count, std::int32_t offset) {
    constexpr std::int32_t kMost = std::numeric_limits<std::int16_t>::max();
    constexpr std::uint16_t kHighest = 0x8000;
    const hn::ScalableTag<std::uint16_t> words;
    const hn::RebindToSigned<decltype(words)> tag;
    const std::int32_t rest = offset + kHighest;
    const std::int32_t part = std::min(rest, kMost);
    const auto turned = hn::Set(words, kHighest);
    const auto first = hn::Set(tag, static_cast<std::int16_t>(part));
    const auto second = hn::Set(tag, static_cast<std::int16_t>(std::min(rest - part, kMost)));
    const auto last = hn::Set(tag, static_cast<std::int16_t>(rest == 2 * kMost + 1 ? 1 : 0));
    const std::size_t lanes = hn::Lanes(words);
    std::size_t done = 0;
    for (; done + lanes <= count; done += lanes) {
        const auto lowest = hn::BitCast(tag, hn::Xor(hn::LoadU(words, samples + done), turned));
        const auto shifted =
            hn::SaturatedAdd(hn::SaturatedAdd(hn::SaturatedAdd(lowest, first), second), last);
        hn::StoreU(hn::BitCast(words, shifted), words, samples + done);
    }
    for (; done < count; ++done) {
        const std::int32_t shifted = std::clamp(samples[done] + offset, -kMost - 1, kMost);
        samples[done] = static_cast<std::uint16_t>(shifted);
    }
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

HWY_EXPORT(shift_samples);

void shift_samples(std::uint16_t* samples, std::size_t count, std::int32_t offset) {
    HWY_DYNAMIC_DISPATCH(shift_samples)(samples, count, offset);
}

}  // namespace zq
#endif
