// Rows of JPEG's luminance and chrominance as pixels.
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

// Pixels 0xAARRGGBB by the equations of JFIF (ITU-T T.871), in libjpeg's arithmetic of 16 binary
// places, each sum rounded half up and held to 0 to 255:
//   R = Y + 1.402 (Cr - 128)
//   G = Y - 0.34414 (Cb - 128) - 0.71414 (Cr - 128)
//   B = Y + 1.772 (Cb - 128)
// Nothing is read or written beyond the row; `to` at any multiple of 4 bytes, apart from the rows.
void ycc_to_bgra(const YccRow& from, std::uint32_t* to, std::size_t pixels, Stores stores);

}  // namespace zq
