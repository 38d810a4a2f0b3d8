// The frame of a block: header, check sum, filling; and the border of a rebuilt image.
#include "serialize/quality_codec.h"

#include <zlib.h>

#include <algorithm>
#include <cstring>

#include "serialize/quality_choice.h"
#include "serialize/quality_payload.h"
#include "serialize/quality_seam.h"
#include "serialize/quality_stream.h"
#include "serialize/quality_touches.h"

namespace zq {

namespace {

constexpr std::uint32_t kMagic = 0x4C51515A;  // "ZQQL"
constexpr std::uint8_t kVersion = 1;
constexpr std::size_t kHeader = 24;
constexpr std::size_t kLengthAt = 16;
constexpr std::size_t kSumAt = 20;

bool has_pixels(const Image& image) {
    return image.record().width > 0 && image.record().height > 0;
}

// At least what the image takes in the library's own row layout.
std::uint64_t buffer_bytes(const Extent& extent) {
    const auto border = 2 * std::uint64_t{static_cast<std::uint32_t>(extent.border)};
    const std::uint64_t width = static_cast<std::uint32_t>(extent.width) + border;
    const std::uint64_t height = static_cast<std::uint32_t>(extent.height) + border;
    const auto pixel = static_cast<std::uint64_t>(bytes_per_pixel(extent.type));
    return (width * pixel + kRowAlignment) * height + kPlacementSlack;
}

std::uint32_t check_sum(std::span<const std::uint8_t> block, std::size_t payload) {
    const uLong start = adler32(1, block.data(), kSumAt);
    return static_cast<std::uint32_t>(adler32_z(start, block.data() + kHeader, payload));
}

// Length and check sum come when the payload is there.
Bytes start_block(const Image& image, int quality) {
    Bytes block(kHeader);
    store_le32(block.data(), kMagic);
    block[4] = kVersion;
    block[5] = static_cast<std::uint8_t>(image.type());
    block[6] = static_cast<std::uint8_t>(quality);
    store_le32(block.data() + 8, static_cast<std::uint32_t>(image.record().width));
    store_le32(block.data() + 12, static_cast<std::uint32_t>(image.record().height));
    return block;
}

// Everything that is wrong without looking into the payload; returns the payload.
std::span<const std::uint8_t> checked_payload(const Image& image,
                                              std::span<const std::uint8_t> block) {
    StreamReader reader(block);
    const ImageRecord& record = image.record();
    bool good = reader.u32() == kMagic && reader.u8() == kVersion && reader.u8() == record.type;
    const int quality = reader.u8();
    good = good && quality >= 1 && quality <= 100 && reader.u8() == 0 &&
           reader.u32() == static_cast<std::uint32_t>(record.width) &&
           reader.u32() == static_cast<std::uint32_t>(record.height);
    if (!good) throw kInitializationError;
    const std::uint32_t length = reader.u32();
    const std::uint32_t sum = reader.u32();
    const auto payload = reader.bytes(length);
    const auto filling = block.subspan(kHeader + length);
    const std::uint64_t pixels = std::uint64_t{static_cast<std::uint32_t>(record.width)} *
                                 static_cast<std::uint32_t>(record.height);
    const auto pixel = static_cast<std::uint64_t>(bytes_per_pixel(image.type()));
    const bool too_short = pixels > kMostExpansion * block.size() / pixel;
    const auto is_zero = [](std::uint8_t byte) { return byte == 0; };
    if (too_short || sum != check_sum(block, length) ||
        !std::all_of(filling.begin(), filling.end(), is_zero)) {
        throw kInitializationError;
    }
    return payload;
}

void replicate_pixel(std::uint8_t* out, const std::uint8_t* pixel, std::size_t bytes,
                     std::int32_t count) {
    for (std::int32_t i = 0; i < count; ++i, out += bytes) std::memcpy(out, pixel, bytes);
}

void rebuild_border(const Image& image) {
    const Extent extent = image.extent();
    if (extent.border == 0) return;
    const auto bytes = static_cast<std::size_t>(bytes_per_pixel(extent.type));
    const auto side = static_cast<std::ptrdiff_t>(bytes) * extent.border;
    const auto line = static_cast<std::ptrdiff_t>(bytes) * extent.width;
    for (std::int32_t y = 0; y < extent.height; ++y) {
        std::uint8_t* row = image.row(y);
        replicate_pixel(row - side, row, bytes, extent.border);
        replicate_pixel(row + line, row + line - bytes, bytes, extent.border);
    }
    const auto whole = static_cast<std::size_t>(line + 2 * side);
    const std::uint8_t* top = image.row(0) - side;
    const std::uint8_t* bottom = image.row(extent.height - 1) - side;
    for (std::int32_t i = 1; i <= extent.border; ++i) {
        std::memcpy(image.row(-i) - side, top, whole);
        std::memcpy(image.row(extent.height - 1 + i) - side, bottom, whole);
    }
}

// Encodes and decodes once more to find out, for images that were not tried as a whole.
void put_whole_hsl(Bytes& block, const Image& image, QualityChoice& choice) {
    if (!choice.payload) {
        put_payload(choice.payload.emplace(), image, choice.quality);
        const ImageRecord& record = image.record();
        Image decoded(Variant::kPrivate, {});
        decoded.reinitialise(
            {.type = record.type, .width = record.width, .height = record.height, .border = 0});
        StreamReader reader(*choice.payload);
        read_payload(reader, decoded, PixelMemory::kUsed);
        choice.crossed_hues = crossed_hues(image, decoded);
    }
    put_crossed_hues(block, choice.crossed_hues);
    put_bytes(block, *choice.payload);
}

// The single pixels come first, as nothing can fail any more when pixels change.
void put_pixels(Bytes& block, const Image& image, int quality) {
    QualityChoice choice = choose_quality(image, quality);
    put_touches(block, image, choice.errors, quality);
    if (image.type() == PixelType::kHsl) {
        put_whole_hsl(block, image, choice);
    } else if (choice.payload) {
        put_bytes(block, *choice.payload);
    } else {
        put_payload(block, image, choice.quality);
    }
}

}  // namespace

std::vector<std::uint8_t> compress_pixels(const Image& image, int quality) {
    const int used = std::clamp(quality, 1, 100);
    Bytes block = start_block(image, used);
    if (has_pixels(image)) put_pixels(block, image, used);
    const std::size_t payload = block.size() - kHeader;
    store_le32(block.data() + kLengthAt, checked_narrow<std::uint32_t>(payload));
    store_le32(block.data() + kSumAt, check_sum(block, payload));
    const std::uint64_t least = buffer_bytes(image.extent()) / kMostExpansion + 1;
    block.resize(std::max(block.size(), checked_narrow<std::size_t>(least)));
    return block;
}

void decompress_pixels(Image& image, std::span<const std::uint8_t> block, PixelMemory memory) {
    StreamReader reader(checked_payload(image, block));
    if (!has_pixels(image)) {
        reader.expect_end();
        return;
    }
    const auto touches = read_touches(reader, image);
    const bool is_hsl = image.type() == PixelType::kHsl;
    const Bytes crossed = is_hsl ? read_crossed_hues(reader, image) : Bytes{};
    read_payload(reader, image, memory);
    bring_back_hues(crossed, image);
    apply_touches(touches, image);
    rebuild_border(image);
}

}  // namespace zq
