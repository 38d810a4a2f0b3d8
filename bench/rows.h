// Memory that pixels are read into where there is no image.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>

namespace zqbench {

// Rows of pixels made anew, in one block with room between them, as an image's are.
struct Rows {
    static constexpr std::size_t kBetween = 64;
    std::size_t row_bytes, stride;
    std::unique_ptr<std::uint8_t[]> pixels;

    Rows(std::size_t bytes, std::size_t height)
        : row_bytes(bytes), stride(bytes + kBetween), pixels(new std::uint8_t[stride * height]) {}
    std::uint8_t* row(std::size_t y) const { return pixels.get() + stride * y; }
};

}  // namespace zqbench
