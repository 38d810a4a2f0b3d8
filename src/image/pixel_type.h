// The seven pixel types: codes, sizes and display texts.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "base/error_codes.h"

namespace zq {

enum class PixelType : std::int32_t {
    kU8 = 0,
    kI16 = 1,
    kSgl = 2,
    kComplex = 3,
    kRgb = 4,
    kHsl = 5,
    kRgbU64 = 6
};

inline constexpr std::array<std::int32_t, 7> kBytesPerPixel = {1, 2, 4, 8, 4, 4, 8};

constexpr bool is_pixel_type(std::int32_t code) {
    return code >= 0 && code < 7;
}

// Throws kInvalidImageType for a code outside 0 to 6.
constexpr PixelType to_pixel_type(std::int32_t code) {
    if (!is_pixel_type(code)) {
        throw kInvalidImageType;
    }
    return static_cast<PixelType>(code);
}

constexpr std::int32_t bytes_per_pixel(PixelType type) {
    return kBytesPerPixel[static_cast<std::size_t>(type)];
}

constexpr bool has_bit_depth(PixelType type) {
    return type == PixelType::kI16 || type == PixelType::kRgbU64;
}

// "8 bits", ... ; "Unknown" for any other code.
const char* display_text(std::int32_t code);

}  // namespace zq
