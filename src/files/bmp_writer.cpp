// BMP: writing, bottom line first, as every reader expects it.
#include <algorithm>
#include <array>
#include <cmath>
#include <cstring>
#include <limits>

#include "base/byte_order.h"
#include "files/bmp_handler.h"
#include "kernels/colour_rows.h"

namespace zq {

namespace {

constexpr std::size_t kHeaderBytes = kBmpFileHeaderBytes + kBmpInfoHeaderBytes;
constexpr std::size_t kPaletteBytes = 4 * kColourTableSize;
constexpr std::size_t kBand = std::size_t{128} * 1024;  // bytes written at once, at least a line

struct Sizes {
    std::uint64_t line;   // bytes, a multiple of 4
    std::uint64_t data;   // of all lines
    std::uint64_t start;  // of the lines
};

Sizes sizes_of(const PixelView& pixels) {
    const bool indexed = pixels.type == PixelType::kU8;
    const std::uint64_t bytes = indexed ? 1 : 3;
    const std::uint64_t line = (static_cast<std::uint64_t>(pixels.width) * bytes + 3) / 4 * 4;
    return {line, line * static_cast<std::uint64_t>(pixels.height),
            kHeaderBytes + (indexed ? kPaletteBytes : 0)};
}

// Pixels a metre, 0 where the unit or the step says nothing of the kind.
std::uint32_t resolution_of(std::int32_t unit, float step) {
    double metres = 0;
    if (unit == 4) metres = 0.01;
    if (unit == 5) metres = 1;
    if (unit == 8) metres = 0.0254;
    const double resolution = std::round(1 / (metres * static_cast<double>(step)));
    const bool possible = resolution >= 1 && resolution <= std::numeric_limits<std::int32_t>::max();
    return possible ? static_cast<std::uint32_t>(resolution) : 0;
}

void pack_row(const PixelView& pixels, const std::uint8_t* row, std::uint8_t* line) {
    const auto width = static_cast<std::size_t>(pixels.width);
    if (pixels.type == PixelType::kU8) {
        std::memcpy(line, row, width);
    } else if (pixels.packing == Packing::kPacked24) {
        std::memcpy(line, row, 3 * width);
    } else {
        bgra_to_bgr(row, line, width);
    }
}

}  // namespace

void BmpFileHandler::check_job() const {
    const PixelView& pixels = job().pixels;
    if (pixels.type != PixelType::kU8 && pixels.type != PixelType::kRgb) {
        throw kIncompatibleImageType;
    }
    if (pixels.width == 0 || pixels.height == 0) throw kImageTooSmall;
    // The header has 32 bits for the file's size.
    const Sizes sizes = sizes_of(pixels);
    constexpr std::uint64_t kMost = std::numeric_limits<std::uint32_t>::max();
    if (sizes.data > kMost - sizes.start) throw kIncompatibleImageSize;
}

void BmpFileHandler::write_header() {
    const PixelView& pixels = job().pixels;
    const Sizes sizes = sizes_of(pixels);
    const bool indexed = pixels.type == PixelType::kU8;
    const Calibration& calibration = pixels.calibration;
    std::uint32_t x_resolution = resolution_of(calibration.unit, calibration.x_step);
    std::uint32_t y_resolution = resolution_of(calibration.unit, calibration.y_step);
    if (x_resolution == 0 || y_resolution == 0) x_resolution = y_resolution = 0;

    std::array<std::uint8_t, kHeaderBytes> bytes{};
    bytes[0] = 'B';
    bytes[1] = 'M';
    store_le32(&bytes[2], static_cast<std::uint32_t>(sizes.start + sizes.data));
    store_le32(&bytes[10], static_cast<std::uint32_t>(sizes.start));
    std::uint8_t* const info = &bytes[kBmpFileHeaderBytes];
    store_le32(info, kBmpInfoHeaderBytes);
    store_le32(info + 4, static_cast<std::uint32_t>(pixels.width));
    store_le32(info + 8, static_cast<std::uint32_t>(pixels.height));
    store_le16(info + 12, 1);  // planes
    store_le16(info + 14, indexed ? 8 : 24);
    store_le32(info + 20, static_cast<std::uint32_t>(sizes.data));
    store_le32(info + 24, x_resolution);
    store_le32(info + 28, y_resolution);
    store_le32(info + 32, indexed ? kColourTableSize : 0);
    output().write(bytes.data(), bytes.size());
}

// Without a table: the greys. The format has no alpha here.
void BmpFileHandler::write_colour_table() {
    if (job().pixels.type != PixelType::kU8) return;
    std::array<std::uint8_t, kPaletteBytes> bytes;
    for (std::uint32_t i = 0; i < kColourTableSize; ++i) {
        const std::uint32_t colour =
            job().colour_table.empty() ? i * 0x010101 : job().colour_table[i] & 0xFFFFFF;
        store_le32(&bytes[std::size_t{4} * i], colour);
    }
    output().write(bytes.data(), bytes.size());
}

void BmpFileHandler::write_lines() {
    const PixelView& pixels = job().pixels;
    const auto line = static_cast<std::size_t>(sizes_of(pixels).line);
    const auto band = static_cast<std::int32_t>(std::min<std::size_t>(
        std::max<std::size_t>(kBand / line, 1), static_cast<std::size_t>(pixels.height)));
    // Cleared once: nothing is ever written to the bytes that fill lines up.
    std::vector<std::uint8_t> bytes(line * static_cast<std::size_t>(band));
    for (std::int32_t left = pixels.height; left > 0;) {
        const std::int32_t count = std::min(band, left);
        std::uint8_t* to = bytes.data();
        for (std::int32_t i = 0; i < count; ++i, to += line) {
            pack_row(pixels, pixels.row(--left), to);
        }
        output().write(bytes.data(), line * static_cast<std::size_t>(count));
    }
}

}  // namespace zq
