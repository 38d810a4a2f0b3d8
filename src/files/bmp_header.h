// The headers of a BMP file: what they say, checked, in one form for all variants.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

#include "files/input_file.h"

namespace zq {

enum class BmpCompression : std::uint32_t {
    kNone = 0,
    kRle8 = 1,
    kRle4 = 2,
    kBitFields = 3,
    kAlphaBitFields = 6,  // bit fields with a fourth mask behind a short header
};

struct BmpHeader {
    std::int32_t width = 0;   // pixels, above 0
    std::int32_t height = 0;  // rows, above 0
    bool top_down = false;    // the first line in the file is the top one
    std::uint32_t bits_per_pixel = 0;
    BmpCompression compression = BmpCompression::kNone;
    std::int32_t x_resolution = 0;  // pixels a metre; 0 or less: not said
    std::int32_t y_resolution = 0;
    // Blue, green, red, alpha of pixels of 16 and 32 bits, each one run of bits inside the pixel or
    // 0; all 0 for other pixels.
    std::array<std::uint32_t, 4> masks{};
    std::vector<std::uint32_t> palette;  // 0x00RRGGBB, at most 2 to the power of bits_per_pixel
    std::uint32_t data_offset = 0;       // of the pixels, from the start of the file
    std::uint32_t data_bytes = 0;        // of compressed pixels; 0: not said

    bool is_rle() const {
        return compression == BmpCompression::kRle8 || compression == BmpCompression::kRle4;
    }
    // Of a line that is not compressed, with the bytes that fill it up to a multiple of 4.
    std::uint64_t line_bytes() const {
        return (std::uint64_t{bits_per_pixel} * static_cast<std::uint64_t>(width) + 31) / 32 * 4;
    }
};

// The file stands at its start. None: not a BMP file. Throws the mapped error number when the first
// 18 bytes are not there, kUnsupportedFileType for an unknown variant, kInvalidFileHeader, and
// kUnableToReadData for a header or palette cut short.
std::optional<BmpHeader> read_bmp_header(InputFile& file);

// Layout of the files that are written.
inline constexpr std::uint32_t kBmpFileHeaderBytes = 14;
inline constexpr std::uint32_t kBmpInfoHeaderBytes = 40;

}  // namespace zq
