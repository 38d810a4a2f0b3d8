// Rows of pixels as JPEG's luminance and chrominance, and back.
#pragma once

#include <cstddef>
#include <cstdint>

#include "kernels/stores.h"

namespace zq {

// Samples of one row, a byte each.
struct YccRow {
    const std::uint8_t* y;
    const std::uint8_t* cb;
    const std::uint8_t* cr;
    const std::uint8_t* alpha;
};
struct YccTarget {
    std::uint8_t* y;
    std::uint8_t* cb;
    std::uint8_t* cr;
};

// What the pixels seen so far have in common: bits that are set in all, and in any of them.
struct CommonBits {
    std::uint32_t all = 0xFFFFFFFF;
    std::uint32_t any = 0;
};

// Pixels 0xAARRGGBB by the equations of JFIF (ITU-T T.871), in libjpeg's arithmetic of 16 binary
// places, each sum rounded half up and held to 0 to 255:
//   R = Y + 1.402 (Cr - 128)
//   G = Y - 0.34414 (Cb - 128) - 0.71414 (Cr - 128)
//   B = Y + 1.772 (Cb - 128)
// Nothing is read or written beyond the row; `to` at any multiple of 4 bytes, apart from the rows.
void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores stores);

// Pixels 0xAARRGGBB by the same equations turned round, in libjpeg's arithmetic:
//   Y  = 0.299 R + 0.587 G + 0.114 B                     rounded half up
//   Cb = -0.168736 R - 0.331264 G + 0.5 B + 128          rounded half down
//   Cr = 0.5 R - 0.418688 G - 0.081312 B + 128           rounded half down
// `bits` takes in all pixels of the row. Nothing is read or written beyond it; the rows of `to`
// must not overlap each other or `from`.
void bgra_to_ycc(const std::uint32_t* from, const YccTarget& to, std::size_t pixels,
                 CommonBits& bits);

}  // namespace zq
