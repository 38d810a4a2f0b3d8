// Images as bitmaps that a device context takes: in place where their rows allow it.
#pragma once

#include <cstdint>
#include <vector>

#include "image/image.h"
#include "platform/device_context.h"

namespace zq {

// Pixels to show; of an image or of a caller's buffer.
struct ShownPixels {
    const std::uint8_t* pixels = nullptr;
    PixelType type = PixelType::kU8;
    bool packed_colour = false;  // kRgb alone: 3 bytes a pixel
    std::int32_t width = 0;
    std::int32_t height = 0;
    std::int32_t line_width = 0;   // pixels from one row to the next
    std::int32_t right_shift = 0;  // kI16 alone: above 0 the bits to drop
    std::int32_t bit_depth = 0;

    static ShownPixels of(const Image& image);
    Box bounds() const { return {0, 0, width, height}; }
    std::size_t pixel_bytes() const {
        return packed_colour ? 3 : static_cast<std::size_t>(bytes_per_pixel(type));
    }
    const std::uint8_t* row(std::int32_t y) const {
        return pixels +
               static_cast<std::size_t>(y) * static_cast<std::size_t>(line_width) * pixel_bytes();
    }
};

// Whether a bitmap can show the view's own pixels.
bool fits_in_place(const ShownPixels& view);

// What a bitmap must hold of a view.
struct Part {
    Box box;                         // one pixel or more
    std::vector<std::int32_t> rows;  // of the box the only ones that are wanted; empty: all
};

// The bitmap of a view, at least of a part of it, by the range of the whole view. `scratch` gets
// the rows that cannot be shown in place, grows as it must, and must live as long as the bitmap;
// beside the part it is left as it was. Throws kNotEnoughMemory.
Dib make_dib(const ShownPixels& view, std::vector<std::uint8_t>& scratch, const Part& part);

}  // namespace zq
