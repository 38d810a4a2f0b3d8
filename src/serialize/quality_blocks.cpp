// Counting equal blocks.
#include "serialize/quality_blocks.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <iterator>
#include <unordered_map>

namespace zq {

namespace {

// As many as an image of 2^20 pixels has.
constexpr std::int64_t kMostBlocks = std::int64_t{1} << 14;

// While there are few, so many that are equal are taken, for touches to have pixels to differ by.
constexpr std::size_t kFewBlocks = 512;
constexpr int kMostEquals = 16;
struct Equals {
    std::size_t last = 0;  // of those taken
    int taken = 0;
};

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
        return {static_cast<std::int32_t>(x), static_cast<std::int32_t>(y),
                static_cast<std::int32_t>(std::min(kBlockSide, width_ - x)),
                static_cast<std::int32_t>(std::min(kBlockSide, height_ - y)), 1};
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
    std::unordered_map<std::uint64_t, Equals> known;
    for (std::int64_t i = 0; i < grid.size(); ++i) {
        const JpegBlock block = grid[i];
        Equals& equals = known[hash_of(image, block)];
        if (std::ssize(known) > most) return {};
        if (equals.taken == 0 || (equals.taken < kMostEquals && blocks.size() < kFewBlocks)) {
            ++equals.taken;
            equals.last = blocks.size();
            blocks.push_back(block);
        } else {
            ++blocks[equals.last].count;
        }
    }
    return blocks;
}

std::vector<JpegBlock> spread_blocks(const Image& image, std::int64_t count) {
    const BlockGrid grid(image);
    std::vector<JpegBlock> blocks;
    for (std::int64_t i = 0; i < count; ++i) blocks.push_back(grid[i * grid.size() / count]);
    return blocks;
}

bool has_few_values(const Image& image) {
    constexpr std::ptrdiff_t kFewValues = 32;
    std::array<bool, 256> seen{};
    const std::ptrdiff_t pixel = bytes_per_pixel(image.type());
    const std::ptrdiff_t channels = std::min<std::ptrdiff_t>(pixel, 3);  // not alpha
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        const std::uint8_t* at = image.row(y);
        for (std::int32_t x = 0; x < image.record().width; ++x, at += pixel) {
            for (std::ptrdiff_t i = 0; i < channels; ++i) seen[at[i]] = true;
        }
        if (std::ranges::count(seen, true) > kFewValues) return false;
    }
    return true;
}

}  // namespace zq
