// Counting equal blocks.
#include "serialize/quality_blocks.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <iterator>
#include <unordered_map>
#include <utility>

namespace zq {

namespace {

// As many as an image of 2^20 pixels has.
constexpr std::int64_t kMostBlocks = std::int64_t{1} << 14;

// For touches to have pixels to differ by.
constexpr std::size_t kFewBlocks = 512;
constexpr std::size_t kMostOthers = 255;

// Two pixels without their alpha, which is no part of a block.
constexpr std::uint64_t kColours = 0x00FFFFFF00FFFFFF;

// Row by row from the top left.
class BlockGrid {
  public:
    explicit BlockGrid(const Image& image)
        : width_(image.record().width), height_(image.record().height) {}
    std::int64_t size() const { return across_ * ((height_ + kBlockSide - 1) / kBlockSide); }
    JpegBlock operator[](std::int64_t index) const {
        const std::int64_t x = index % across_ * kBlockSide;
        const std::int64_t y = index / across_ * kBlockSide;
        return {static_cast<std::int32_t>(x),
                static_cast<std::int32_t>(y),
                static_cast<std::int32_t>(std::min(kBlockSide, width_ - x)),
                static_cast<std::int32_t>(std::min(kBlockSide, height_ - y)),
                static_cast<std::uint64_t>(y * width_ + x),
                1,
                {}};
    }

  private:
    std::int64_t width_, height_;
    std::int64_t across_ = (width_ + kBlockSide - 1) / kBlockSide;
};

std::uint64_t mixed(std::uint64_t hash, std::uint64_t word) {
    constexpr std::uint64_t kOdd = 0x9E3779B97F4A7C15U;
    return std::rotl((hash ^ word) * kOdd, 29);
}

std::uint64_t hash_of(const Image& image, const JpegBlock& block) {
    const std::ptrdiff_t pixel = bytes_per_pixel(image.type());
    const auto line = static_cast<std::size_t>(block.width * pixel);
    const std::uint64_t mask = image.type() == PixelType::kRgb ? kColours : ~std::uint64_t{0};
    auto hash = static_cast<std::uint64_t>(block.width * kBlockSide + block.height);
    for (std::int32_t y = 0; y < block.height; ++y) {
        const std::uint8_t* row = image.row(block.y + y) + block.x * pixel;
        for (std::size_t at = 0; at < line; at += sizeof(hash)) {
            std::uint64_t word = 0;
            std::memcpy(&word, row + at, std::min(sizeof(word), line - at));
            hash = mixed(hash, word & mask);
        }
    }
    return hash ^ hash >> 32;
}

}  // namespace

std::vector<JpegBlock> different_blocks(const Image& image) {
    const BlockGrid grid(image);
    const std::int64_t most = std::min(kMostBlocks, grid.size() / 2);
    std::vector<JpegBlock> blocks;
    std::unordered_map<std::uint64_t, std::size_t> known;
    for (std::int64_t i = 0; i < grid.size(); ++i) {
        JpegBlock block = grid[i];
        const auto [at, is_new] = known.try_emplace(hash_of(image, block), blocks.size());
        if (is_new) {
            if (std::ssize(known) > most) return {};
            blocks.push_back(std::move(block));
            continue;
        }
        JpegBlock& equal = blocks[at->second];
        ++equal.count;
        if (at->second < kFewBlocks && equal.others.size() < kMostOthers) {
            equal.others.push_back(block.index);
        }
    }
    return blocks;
}

std::vector<JpegBlock> spread_blocks(const Image& image, std::int64_t most) {
    const BlockGrid grid(image);
    const std::int64_t count = std::min(most, grid.size() / 2);
    std::vector<JpegBlock> blocks;
    for (std::int64_t i = 0; i < count; ++i) {
        const std::int64_t from = i * grid.size() / count;
        const std::int64_t stretch = (i + 1) * grid.size() / count - from;
        const std::uint64_t scattered = mixed(0, static_cast<std::uint64_t>(i)) >> 1;
        blocks.push_back(grid[from + static_cast<std::int64_t>(scattered) % stretch]);
    }
    return blocks;
}

}  // namespace zq
