// Bytes to bits and back.
#include "kernels/pack_bits.h"

#undef HWY_TARGET_INCLUDE
#define HWY_TARGET_INCLUDE "kernels/pack_bits.cpp"
#include <hwy/foreach_target.h>
// Must come after foreach_target.h.
#include <hwy/highway.h>

#include "kernels/export_kernel.h"

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

// Whole bytes of bits only: fewer lanes than that leave everything to the plain loops.
constexpr std::size_t kBits = 8;
// Masks are read and written as 8 bytes, however few lanes there are.
constexpr std::size_t kMaskPixels = HWY_MAX(64, HWY_MAX_BYTES);

void pack_bits(const std::uint8_t* HWY_RESTRICT from, std::uint8_t* HWY_RESTRICT to,
               std::size_t pixels) {
    const hn::ScalableTag<std::uint8_t> tag;
    const std::size_t lanes = hn::Lanes(tag);
    const std::size_t whole = pixels / kMaskPixels * kMaskPixels;
    std::size_t done = 0;
    for (; lanes >= kBits && done + kMaskPixels <= whole; done += lanes) {
        const auto set = hn::Ne(hn::LoadU(tag, from + done), hn::Zero(tag));
        hn::StoreMaskBits(tag, set, to + done / kBits);
    }
    for (; done < pixels; done += kBits) {
        unsigned bits = 0;
        for (std::size_t i = 0; i < kBits && done + i < pixels; ++i) {
            bits |= (from[done + i] != 0 ? 1U : 0U) << i;
        }
        to[done / kBits] = static_cast<std::uint8_t>(bits);
    }
}

void unpack_bits(const std::uint8_t* HWY_RESTRICT from, std::uint8_t* HWY_RESTRICT to,
                 std::size_t pixels) {
    const hn::ScalableTag<std::uint8_t> tag;
    const std::size_t lanes = hn::Lanes(tag);
    const std::size_t whole = pixels / kMaskPixels * kMaskPixels;
    std::size_t done = 0;
    for (; lanes >= kBits && done + kMaskPixels <= whole; done += lanes) {
        const auto set = hn::LoadMaskBits(tag, from + done / kBits);
        hn::StoreU(hn::VecFromMask(tag, set), tag, to + done);
    }
    for (; done < pixels; ++done) {
        to[done] = (from[done / kBits] >> done % kBits & 1) != 0 ? 255 : 0;
    }
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#if HWY_ONCE
namespace zq {

ZQ_EXPORT_ROW_KERNEL(pack_bits, std::uint8_t, std::uint8_t);
ZQ_EXPORT_ROW_KERNEL(unpack_bits, std::uint8_t, std::uint8_t);

}  // namespace zq
#endif
