// The pixels that a writer reads: those of an image, or of a caller's buffer in a packing that no
// image has.
#pragma once

#include <cstddef>
#include <cstdint>

#include "image/image.h"

namespace zq {

// How samples lie in memory. The numbers are those of the buffer-level functions.
enum class Packing : std::int32_t {
    kNative = 0,      // as images of the type hold them
    kUnsigned16 = 2,  // kI16 only: 16-bit samples that are unsigned
    kPacked24 = 4,    // kRgb only: blue, green, red bytes without the fourth
};

// What a pixel measures.
struct Calibration {
    std::int32_t unit = 0;  // code of the image record
    float x_step = 1.0F;
    float y_step = 1.0F;
};

struct PixelView {
    PixelType type = PixelType::kU8;
    Packing packing = Packing::kNative;
    std::int32_t width = 0;   // pixels
    std::int32_t height = 0;  // rows
    const std::uint8_t* first = nullptr;
    std::ptrdiff_t stride = 0;  // bytes from one row to the next
    std::int32_t bit_depth = 0;
    std::int32_t sample_offset = 0;  // value = sample + offset, as the image was read
    Calibration calibration{};

    const std::uint8_t* row(std::int32_t y) const { return first + y * stride; }
};

// Formats that other programs read hold grey and colour of whole numbers. Throws
// kIncompatibleImageType for other pixels, kImageTooSmall for none.
inline void check_interchangeable(const PixelView& pixels) {
    switch (pixels.type) {
        case PixelType::kU8:
        case PixelType::kI16:
        case PixelType::kRgb:
        case PixelType::kRgbU64:
            break;
        default:
            throw kIncompatibleImageType;
    }
    if (pixels.width == 0 || pixels.height == 0) throw kImageTooSmall;
}

// Borrowed: valid while the image keeps its shape.
inline PixelView view_of(const Image& image) {
    const ImageRecord& record = image.record();
    return {.type = image.type(),
            .packing = Packing::kNative,
            .width = record.width,
            .height = record.height,
            .first = record.firstPixel,
            .stride = image.row_stride(),
            .bit_depth = image.bit_depth(),
            .sample_offset = image.sample_offset(),
            .calibration = {record.unit, record.xStep, record.yStep}};
}

}  // namespace zq
