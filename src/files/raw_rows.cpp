// Lines of headerless files into rows of an image.
#include "files/raw_rows.h"

#include <algorithm>
#include <cstring>

#include "kernels/colour_rows.h"

namespace zq {

namespace {

// The first pixel is in the highest bits. Grey of few bits is spread over the whole range.
void unpack_bits_of_grey(const std::uint8_t* line, std::uint8_t* row, std::size_t pixels,
                         std::size_t bits) {
    const std::size_t per_byte = 8 / bits;
    const unsigned most = (1U << bits) - 1;
    for (std::size_t x = 0; x < pixels; ++x) {
        const std::size_t shift = 8 - bits * (x % per_byte + 1);
        const unsigned value = line[x / per_byte] >> shift & most;
        row[x] = static_cast<std::uint8_t>(value * 255 / most);
    }
}

void unpack_565(const std::uint8_t* line, std::uint8_t* row, std::size_t pixels) {
    for (std::size_t x = 0; x < pixels; ++x, line += 2, row += 4) {
        std::uint16_t value;
        std::memcpy(&value, line, sizeof value);
        row[0] = static_cast<std::uint8_t>(((value & 31U) * 255 + 15) / 31);
        row[1] = static_cast<std::uint8_t>(((value >> 5U & 63U) * 255 + 31) / 63);
        row[2] = static_cast<std::uint8_t>(((value >> 11U) * 255 + 15) / 31);
        row[3] = 0;
    }
}

void unpack_48(const std::uint8_t* line, std::uint8_t* row, std::size_t pixels) {
    for (std::size_t x = 0; x < pixels; ++x, line += 6, row += 8) {
        std::memcpy(row, line, 6);
        std::memset(row + 6, 0, 2);
    }
}

template <class Integer>
void integers_to_float(const std::uint8_t* line, std::uint8_t* row, std::size_t pixels) {
    for (std::size_t x = 0; x < pixels; ++x, line += 4, row += 4) {
        Integer value;
        std::memcpy(&value, line, sizeof value);
        const auto number = static_cast<float>(value);
        std::memcpy(row, &number, sizeof number);
    }
}

}  // namespace

void swap_samples(std::span<std::uint8_t> line, std::int32_t sample_bytes) {
    const auto bytes = static_cast<std::size_t>(sample_bytes);
    for (std::size_t i = 0; bytes > 1 && i + bytes <= line.size(); i += bytes) {
        std::reverse(line.data() + i, line.data() + i + bytes);
    }
}

void unpack_raw_row(const RawLayout& layout, const std::uint8_t* line, std::uint8_t* row,
                    std::size_t pixels) {
    switch (layout.format) {
        case PixelFormat::kGrey1:
        case PixelFormat::kGrey2:
        case PixelFormat::kGrey4:
            unpack_bits_of_grey(line, row, pixels, static_cast<std::size_t>(layout.bits_per_pixel));
            break;
        case PixelFormat::kRgb565:
            unpack_565(line, row, pixels);
            break;
        case PixelFormat::kRgb24:
            rgb_to_bgra(line, row, pixels);
            break;
        case PixelFormat::kUnsigned32:
            integers_to_float<std::uint32_t>(line, row, pixels);
            break;
        case PixelFormat::kSigned32:
            integers_to_float<std::int32_t>(line, row, pixels);
            break;
        case PixelFormat::kRgb48Native:
            unpack_48(line, row, pixels);
            break;
        default:
            std::memcpy(row, line, pixels * static_cast<std::size_t>(layout.bits_per_pixel) / 8);
            break;
    }
}

}  // namespace zq
