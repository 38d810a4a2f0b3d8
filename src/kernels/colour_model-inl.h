// What both directions of the colour model share, once per set of vector instructions.

// Included once for every target, as Highway's own headers are.
#if defined(ZQ_COLOUR_MODEL_INL_H) == defined(HWY_TARGET_TOGGLE)
#ifdef ZQ_COLOUR_MODEL_INL_H
#undef ZQ_COLOUR_MODEL_INL_H
#else
#define ZQ_COLOUR_MODEL_INL_H
#endif

#include <hwy/highway.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

HWY_BEFORE_NAMESPACE();
namespace zq::HWY_NAMESPACE {

namespace hn = hwy::HWY_NAMESPACE;

using Floats = hn::ScalableTag<float>;
using Pixels = hn::RebindToUnsigned<Floats>;  // one 4-byte pixel a lane, its first byte lowest

// HWY_ALIGN is a wish: on Windows GCC lays out the stack for 16 bytes whatever a variable asks.
constexpr std::size_t kMaxLanes = HWY_MAX_BYTES / 4;
constexpr std::size_t kBlock = 256;  // pixels, a multiple of every vector
constexpr std::uint32_t kAlphaMask = 0xFF000000U;

// Added to a float below 2^22 in magnitude, rounds it to a whole number, which the low bits of the
// sum then show.
constexpr float kRound = 0x1.8p23F;
// Enlarges a quotient by two units of its last place, so that none of one half or more is rounded
// down when kRound is added.
constexpr float kUpwards = 1 + 0x1p-22F;

template <int kByte, class Tag>
HWY_INLINE hn::Vec<Tag> byte_of(Tag tag, hn::Vec<Tag> pixels) {
    return hn::And(hn::ShiftRight<8 * kByte>(pixels), hn::Set(tag, 255));
}

HWY_INLINE hn::Vec<Floats> to_float(hn::Vec<Pixels> values) {
    return hn::ConvertTo(Floats(), hn::BitCast(hn::RebindToSigned<Floats>(), values));
}

HWY_INLINE hn::Vec<Pixels> load(const std::uint8_t* bytes) {
#if HWY_TARGET == HWY_SCALAR  // has no vector of 4 bytes
    std::uint32_t pixel;
    std::memcpy(&pixel, bytes, sizeof pixel);
    return hn::Set(Pixels(), pixel);
#else
    return hn::BitCast(Pixels(), hn::LoadU(hn::Repartition<std::uint8_t, Pixels>(), bytes));
#endif
}

HWY_INLINE void store(hn::Vec<Pixels> pixels, std::uint8_t* bytes) {
#if HWY_TARGET == HWY_SCALAR
    const std::uint32_t pixel = hn::GetLane(pixels);
    std::memcpy(bytes, &pixel, sizeof pixel);
#else
    const hn::Repartition<std::uint8_t, Pixels> tag;
    hn::StoreU(hn::BitCast(tag, pixels), tag, bytes);
#endif
}

// Calls `convert_block(source, destination, pixels)` for blocks of at most kBlock pixels, all whole
// vectors, the last of them padded.
template <class ConvertBlock>
HWY_INLINE void convert_padded(const std::uint8_t* source, std::uint8_t* destination,
                               std::size_t pixels, const ConvertBlock& convert_block) {
    const std::size_t lanes = hn::Lanes(Pixels());
    const std::size_t left = pixels % lanes;
    const std::size_t whole = pixels - left;
    for (std::size_t done = 0; done < whole; done += kBlock) {
        convert_block(source + 4 * done, destination + 4 * done, HWY_MIN(kBlock, whole - done));
    }
    if (left == 0) return;
    std::uint8_t padded[4 * kMaxLanes] = {};
    std::memcpy(padded, source + 4 * whole, 4 * left);
    convert_block(padded, padded, lanes);
    std::memcpy(destination + 4 * whole, padded, 4 * left);
}

}  // namespace zq::HWY_NAMESPACE
HWY_AFTER_NAMESPACE();

#endif
