// Lines of BMP files to rows of images, through tables where the bits are not bytes.
#include "files/bmp_rows.h"

#include <algorithm>
#include <bit>
#include <cstring>

#include "kernels/alpha_rows.h"
#include "kernels/colour_rows.h"

namespace zq {

namespace {

constexpr int kByteBits = 8;
constexpr std::uint32_t kShades = 255;

// kPixels a byte, the first in the highest bits; the last byte may be used in part.
template <std::size_t kPixels>
void unpack(const std::array<std::array<std::uint8_t, 8>, 256>& table, const std::uint8_t* line,
            std::uint8_t* row, std::size_t width) {
    for (; width >= kPixels; width -= kPixels, row += kPixels) {
        std::memcpy(row, table[*line++].data(), kPixels);
    }
    if (width > 0) std::memcpy(row, table[*line].data(), width);
}

std::uint32_t load_pixel(const std::uint8_t* bytes, std::size_t count) {
    std::uint32_t pixel = 0;
    std::memcpy(&pixel, bytes, count);  // little-endian, as all machines there are
    return pixel;
}

}  // namespace

bool is_grey_ramp(const BmpHeader& header) {
    const std::size_t count = header.palette.size();
    if (count < 2 || count != std::size_t{1} << header.bits_per_pixel) return false;
    for (std::size_t i = 0; i < count; ++i) {
        if (header.palette[i] != i * kShades / (count - 1) * 0x010101) return false;
    }
    return true;
}

std::array<std::uint8_t, 256> index_values(const BmpHeader& header) {
    std::array<std::uint8_t, 256> values{};
    const std::size_t factor = is_grey_ramp(header) ? kShades / (header.palette.size() - 1) : 1;
    for (std::size_t i = 0; i < values.size(); ++i) {
        values[i] = static_cast<std::uint8_t>(i * factor);
    }
    return values;
}

BmpRowDecoder::BmpRowDecoder(const BmpHeader& header)
    : width_(static_cast<std::size_t>(header.width)) {
    switch (header.bits_per_pixel) {
        case 8:
            row_bytes_ = width_;
            break;
        case 16:
        case 32:
            choose_for_masks(header);
            break;
        case 24:
            how_ = How::kBgr;
            break;
        default:
            how_ = How::kIndices;
            fill_indices(header);
            break;
    }
}

void BmpRowDecoder::fill_indices(const BmpHeader& header) {
    const std::array<std::uint8_t, 256> values = index_values(header);
    const std::uint32_t bits = header.bits_per_pixel;
    indices_a_byte_ = kByteBits / bits;
    for (std::size_t byte = 0; byte < indices_.size(); ++byte) {
        for (std::size_t i = 0; i < indices_a_byte_; ++i) {
            const std::size_t shift = kByteBits - bits * (i + 1);
            indices_[byte][i] = values[byte >> shift & ((1U << bits) - 1)];
        }
    }
}

void BmpRowDecoder::choose_for_masks(const BmpHeader& header) {
    using Masks = std::array<std::uint32_t, 4>;
    row_bytes_ = 4 * width_;
    if (header.bits_per_pixel == 32) {
        if (header.masks == Masks{0xFF, 0xFF00, 0xFF0000, 0xFF000000}) return;
        how_ = header.masks == Masks{0xFF, 0xFF00, 0xFF0000, 0} ? How::kBgrx : How::kMasks32;
    } else {
        how_ = How::kMasks16;
    }
    std::transform(header.masks.begin(), header.masks.end(), channels_.begin(), make_channel);
}

BmpRowDecoder::Channel BmpRowDecoder::make_channel(std::uint32_t mask) {
    Channel channel;
    if (mask == 0) return channel;
    const int bits = std::min(std::popcount(mask), kByteBits);
    channel.shift = std::countr_zero(mask) + std::popcount(mask) - bits;
    channel.mask = (1U << bits) - 1;
    for (std::uint32_t i = 0; i <= channel.mask; ++i) {
        channel.shades[i] =
            static_cast<std::uint8_t>((i * kShades + channel.mask / 2) / channel.mask);
    }
    return channel;
}

void BmpRowDecoder::decode(const std::uint8_t* line, std::uint8_t* row) const {
    switch (how_) {
        case How::kCopy:
            std::memcpy(row, line, row_bytes_);
            break;
        case How::kIndices:
            decode_indices(line, row);
            break;
        case How::kBgr:
            bgr_to_bgra(line, row, width_);
            break;
        case How::kBgrx:
            copy_with_alpha(reinterpret_cast<const std::uint32_t*>(line),
                            reinterpret_cast<std::uint32_t*>(row), width_, 0, Stores::kCached);
            break;
        case How::kMasks16:
            decode_masks<2>(line, row);
            break;
        case How::kMasks32:
            decode_masks<4>(line, row);
            break;
    }
}

void BmpRowDecoder::decode_indices(const std::uint8_t* line, std::uint8_t* row) const {
    if (indices_a_byte_ == 8) {
        unpack<8>(indices_, line, row, width_);
    } else if (indices_a_byte_ == 4) {
        unpack<4>(indices_, line, row, width_);
    } else {
        unpack<2>(indices_, line, row, width_);
    }
}

template <std::size_t kBytes>
void BmpRowDecoder::decode_masks(const std::uint8_t* line, std::uint8_t* row) const {
    for (std::size_t x = 0; x < width_; ++x, line += kBytes, row += 4) {
        const std::uint32_t pixel = load_pixel(line, kBytes);
        for (std::size_t i = 0; i < channels_.size(); ++i) {
            const Channel& channel = channels_[i];
            row[i] = channel.shades[pixel >> channel.shift & channel.mask];
        }
    }
}

}  // namespace zq
