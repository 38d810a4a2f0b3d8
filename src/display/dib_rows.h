// Images as bitmaps that a device context takes: in place where their rows allow it.
#pragma once

#include <cstdint>
#include <memory>

#include "image/image.h"
#include "platform/device_context.h"

namespace zq {

// Pixels to show; of an image or of a caller's buffer.
struct PixelView {
    const std::uint8_t* pixels = nullptr;
    PixelType type = PixelType::kU8;
    bool packed_colour = false;  // kRgb alone: 3 bytes a pixel
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::int32_t line_width = 0;   // pixels from one row to the next
    std::int32_t right_shift = 0;  // kI16 alone: above 0 the bits to drop
    std::int32_t bit_depth = 0;

    static PixelView of(const Image& image);
    std::size_t pixel_bytes() const {
        return packed_colour ? 3 : static_cast<std::size_t>(bytes_per_pixel(type));
    }
    const std::uint8_t* row(std::int32_t y) const {
        return pixels +
               static_cast<std::size_t>(y) * static_cast<std::size_t>(line_width) * pixel_bytes();
    }
};

// What is between the end of a row and the next one is not set.
using DibScratch = std::unique_ptr<std::uint8_t[]>;

// The bitmap of a view that has pixels. `scratch` gets the rows that cannot be shown in place and
// must live as long as the bitmap. Throws kNotEnoughMemory.
Dib make_dib(const PixelView& view, DibScratch& scratch);

}  // namespace zq
