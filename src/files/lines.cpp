// Plain pixel lines. Rows lie apart in memory and together in the file, and one stream call a row
// would cost more than the copy: so short rows pass through a block that stays in the cache.
#include "files/lines.h"

#include <algorithm>
#include <cstring>
#include <vector>

namespace zq {

namespace {

constexpr std::size_t kBlockBytes = std::size_t{256} * 1024;

// Rows that share a block; 1 means that rows are long enough to go alone.
std::int32_t rows_a_block(std::size_t line) {
    return static_cast<std::int32_t>(std::max<std::size_t>(kBlockBytes / line, 1));
}

}  // namespace

void read_lines(InputFile& file, Image& image, std::size_t line) {
    const std::int32_t height = image.record().height;
    if (height == 0 || line == 0) return;
    if (static_cast<std::size_t>(image.row_stride()) == line) {
        file.read(image.row(0), line * static_cast<std::size_t>(height), kUnableToReadData);
        return;
    }
    const std::int32_t step = rows_a_block(line);
    std::vector<std::uint8_t> block(step == 1 ? 0 : line * static_cast<std::size_t>(step));
    for (std::int32_t y = 0; y < height; y += step) {
        if (step == 1) {
            file.read(image.row(y), line, kUnableToReadData);
            continue;
        }
        const std::int32_t rows = std::min(step, height - y);
        file.read(block.data(), line * static_cast<std::size_t>(rows), kUnableToReadData);
        for (std::int32_t i = 0; i < rows; ++i) {
            std::memcpy(image.row(y + i), block.data() + static_cast<std::size_t>(i) * line, line);
        }
    }
}

void write_lines(OutputFile& file, const PixelView& pixels, std::size_t line) {
    const std::int32_t height = pixels.height;
    if (height == 0 || line == 0) return;
    if (static_cast<std::size_t>(pixels.stride) == line) {
        file.write(pixels.first, line * static_cast<std::size_t>(height));
        return;
    }
    const std::int32_t step = rows_a_block(line);
    std::vector<std::uint8_t> block(step == 1 ? 0 : line * static_cast<std::size_t>(step));
    for (std::int32_t y = 0; y < height; y += step) {
        if (step == 1) {
            file.write(pixels.row(y), line);
            continue;
        }
        const std::int32_t rows = std::min(step, height - y);
        for (std::int32_t i = 0; i < rows; ++i) {
            std::memcpy(block.data() + static_cast<std::size_t>(i) * line, pixels.row(y + i), line);
        }
        file.write(block.data(), line * static_cast<std::size_t>(rows));
    }
}

}  // namespace zq
