// Hues are coded as angles, yet an image holds them as bytes: where 255 and 0 meet, a small error
// would come back as the largest one. The hues that would are listed, and come back as the last
// byte on their own side of the seam.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "image/image.h"
#include "serialize/quality_stream.h"

namespace zq {

inline constexpr std::ptrdiff_t kHueByte = 2;  // of an HSL pixel

// Whether a hue came back nearer across the seam than along the bytes.
inline bool crossed_seam(std::uint8_t hue, std::uint8_t decoded) {
    const int distance = hue > decoded ? hue - decoded : decoded - hue;
    return distance > 128;
}
inline std::uint8_t own_side(std::uint8_t decoded) {
    return decoded < 128 ? 255 : 0;
}

// The pixels whose hues crossed; both images are HSL and of one size.
std::vector<std::uint64_t> crossed_hues(const Image& image, const Image& decoded);

// A section of them, deflated; the indices rise.
void put_crossed_hues(Bytes& out, std::span<const std::uint64_t> indices);
// The list, checked. Throws kInitializationError, kNotEnoughMemory.
Bytes read_crossed_hues(StreamReader& reader, const Image& image);
void bring_back_hues(std::span<const std::uint8_t> list, const Image& image);

}  // namespace zq
