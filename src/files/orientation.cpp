// Flips in place, and the exchange of rows and columns.
#include "files/orientation.h"

#include <algorithm>
#include <array>

namespace zq {

namespace {

template <std::size_t kBytes>
using Pixel = std::array<std::uint8_t, kBytes>;

template <std::size_t kBytes>
Pixel<kBytes>* row_of(const Image& image, std::int32_t y) {
    return reinterpret_cast<Pixel<kBytes>*>(image.row(y));
}

// Calls `action` with a pixel's size in bytes as a constant.
template <class Action>
void with_pixel_bytes(const Image& image, Action action) {
    switch (bytes_per_pixel(image.type())) {
        case 1:
            return action(std::integral_constant<std::size_t, 1>());
        case 2:
            return action(std::integral_constant<std::size_t, 2>());
        case 4:
            return action(std::integral_constant<std::size_t, 4>());
        default:
            return action(std::integral_constant<std::size_t, 8>());
    }
}

}  // namespace

// In squares, so that the lines of the cache that the columns go to are used up.
void Orientation::transpose(const Image& stored, Image& upright) {
    constexpr std::int32_t kSquare = 32;
    const std::int32_t width = stored.record().width;
    const std::int32_t height = stored.record().height;
    with_pixel_bytes(stored, [&](auto bytes) {
        for (std::int32_t top = 0; top < height; top += kSquare) {
            for (std::int32_t x = 0; x < width; ++x) {
                auto* const column = row_of<bytes()>(upright, x);
                const std::int32_t bottom = std::min(height, top + kSquare);
                for (std::int32_t y = top; y < bottom; ++y)
                    column[y] = row_of<bytes()>(stored, y)[x];
            }
        }
    });
}

void Orientation::flip(Image& image) const {
    const std::int32_t width = image.record().width;
    const std::int32_t height = image.record().height;
    with_pixel_bytes(image, [&](auto bytes) {
        for (std::int32_t y = 0; is_mirrored() && y < height; ++y) {
            auto* const row = row_of<bytes()>(image, y);
            std::reverse(row, row + width);
        }
        for (std::int32_t y = 0; is_upside_down() && y < height / 2; ++y) {
            auto* const row = row_of<bytes()>(image, y);
            std::swap_ranges(row, row + width, row_of<bytes()>(image, height - 1 - y));
        }
    });
}

}  // namespace zq
