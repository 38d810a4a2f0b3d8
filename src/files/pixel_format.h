// Codes by which a read tells how the file itself held its pixels.
#pragma once

#include <cstdint>

namespace zq {

enum class PixelFormat : std::int32_t {
    kGrey1 = 0,
    kGrey2 = 1,
    kGrey4 = 2,
    kGrey8 = 3,  // also palette indices of 8 bits
    kUnsigned16 = 5,
    kGrey16 = 6,
    kRgb565 = 7,
    kRgb24 = 8,
    kUnsigned32 = 10,
    kSigned32 = 11,
    kRgb32 = 12,
    kFloat = 13,
    kRgb48Native = 14,  // three 16-bit samples in the machine's byte order
    kComplex = 15,
    kHsl = 17,
    kRgb48 = 18,
    kRgb64 = 19,
};

}  // namespace zq
