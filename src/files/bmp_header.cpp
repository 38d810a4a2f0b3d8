// Reading BMP headers: the variant by its size, then masks and palette, which follow the header.
#include "files/bmp_header.h"

#include <algorithm>
#include <bit>
#include <limits>

#include "base/byte_order.h"

namespace zq {

namespace {

constexpr std::uint32_t kCoreHeaderBytes = 12;
constexpr std::uint32_t kVersion4HeaderBytes = 108;
constexpr std::uint32_t kSizeBytes = 4;  // of the field that each variant begins with
constexpr std::uint32_t kMaskBytes = 4;
constexpr std::uint32_t kMostIndexBits = 8;

// Offsets inside the info header and version 4; the latter holds the masks where the former is
// followed by them.
constexpr std::size_t kWidth = 4;
constexpr std::size_t kHeight = 8;
constexpr std::size_t kBitsPerPixel = 14;
constexpr std::size_t kCompression = 16;
constexpr std::size_t kDataBytes = 20;
constexpr std::size_t kXResolution = 24;
constexpr std::size_t kYResolution = 28;
constexpr std::size_t kPaletteEntries = 32;
constexpr std::size_t kMasks = 40;  // red, green, blue, alpha

struct FileHeader {
    std::uint32_t file_bytes;
    std::uint32_t data_offset;
    std::uint32_t info_bytes;  // size of the header that follows
};

// What is needed to find what lies behind the header.
struct Raw {
    std::array<std::uint8_t, kVersion4HeaderBytes> bytes{};
    std::uint32_t size = 0;
    std::uint32_t end = 0;  // offset in the file behind headers and masks

    std::uint32_t word(std::size_t offset) const { return load_le32(&bytes[offset]); }
    std::int32_t number(std::size_t offset) const {
        return static_cast<std::int32_t>(word(offset));
    }
};

// The size that the file claims to have may be 0, or be wrong: what counts is that the file is
// longer than that size less the info header's, in exact arithmetic.
std::optional<FileHeader> probe(InputFile& file) {
    std::array<std::uint8_t, kBmpFileHeaderBytes + kSizeBytes> bytes{};
    file.read_header_bytes(bytes.data(), bytes.size());
    const FileHeader header = {load_le32(&bytes[2]), load_le32(&bytes[10]), load_le32(&bytes[14])};
    const std::int64_t least = std::int64_t{header.file_bytes} - header.info_bytes;
    const bool long_enough = file.size() == InputFile::kUnknownSize || least < file.size();
    if (bytes[0] != 'B' || bytes[1] != 'M' || !long_enough) return std::nullopt;
    return header;
}

void parse_core(const Raw& raw, BmpHeader& header) {
    header.width = load_le16(&raw.bytes[4]);
    header.height = load_le16(&raw.bytes[6]);
    header.bits_per_pixel = load_le16(&raw.bytes[10]);
}

void parse_info(const Raw& raw, BmpHeader& header) {
    const std::int64_t height = raw.number(kHeight);
    const std::int64_t rows = height < 0 ? -height : height;
    if (rows > std::numeric_limits<std::int32_t>::max()) throw kInvalidFileHeader;
    header.width = raw.number(kWidth);
    header.height = static_cast<std::int32_t>(rows);
    header.top_down = height < 0;
    header.bits_per_pixel = load_le16(&raw.bytes[kBitsPerPixel]);
    header.compression = static_cast<BmpCompression>(raw.word(kCompression));
    header.data_bytes = raw.word(kDataBytes);
    header.x_resolution = raw.number(kXResolution);
    header.y_resolution = raw.number(kYResolution);
}

bool is_known(std::uint32_t bits, BmpCompression compression) {
    switch (compression) {
        case BmpCompression::kNone:
            return bits == 1 || bits == 2 || bits == 4 || bits == 8 || bits == 16 || bits == 24 ||
                   bits == 32;
        case BmpCompression::kRle8:
            return bits == 8;
        case BmpCompression::kRle4:
            return bits == 4;
        case BmpCompression::kBitFields:
        case BmpCompression::kAlphaBitFields:
            return bits == 16 || bits == 32;
    }
    return false;
}

void check(const BmpHeader& header) {
    if (header.width <= 0 || header.height <= 0) throw kInvalidFileHeader;
    if (!is_known(header.bits_per_pixel, header.compression)) throw kInvalidFileHeader;
}

bool is_run_of_bits(std::uint32_t mask) {
    if (mask == 0) return true;
    const std::uint64_t run = std::uint64_t{mask} >> std::countr_zero(mask);
    return (run & (run + 1)) == 0;
}

void check_masks(const BmpHeader& header) {
    for (const std::uint32_t mask : header.masks) {
        const bool inside = header.bits_per_pixel == 32 || mask <= 0xFFFF;
        if (!inside || !is_run_of_bits(mask)) throw kInvalidFileHeader;
    }
}

void read_masks(InputFile& file, Raw& raw, BmpHeader& header) {
    if (header.bits_per_pixel != 16 && header.bits_per_pixel != 32) return;
    header.masks = header.bits_per_pixel == 16
                       ? std::array<std::uint32_t, 4>{0x001F, 0x03E0, 0x7C00, 0}
                       : std::array<std::uint32_t, 4>{0x0000FF, 0x00FF00, 0xFF0000, 0};
    if (header.compression == BmpCompression::kNone) return;
    const bool four = header.compression == BmpCompression::kAlphaBitFields;
    if (raw.size == kBmpInfoHeaderBytes) {
        const std::uint32_t count = four ? 4 : 3;
        file.read(&raw.bytes[kMasks], std::size_t{count} * kMaskBytes, kUnableToReadData);
        raw.end += count * kMaskBytes;
    }
    const std::uint32_t red = raw.word(kMasks), green = raw.word(kMasks + 4),
                        blue = raw.word(kMasks + 8);
    if ((red | green | blue) == 0) return;  // forgotten by the writer
    header.masks = {blue, green, red, raw.word(kMasks + 12)};
    check_masks(header);
}

// Some writers forget the palette in the offset of the pixels, others write none: whether both fit
// into the file.
bool has_room_for(std::uint32_t palette, const InputFile& file, const Raw& raw,
                  const BmpHeader& header) {
    if (file.size() == InputFile::kUnknownSize) return true;
    const std::uint64_t pixels =
        header.is_rle() ? header.data_bytes
                        : header.line_bytes() * static_cast<std::uint64_t>(header.height);
    return static_cast<std::uint64_t>(file.size()) >= raw.end + palette + pixels;
}

// A palette ends where the pixels begin, and has no more entries than there are indices.
void read_palette(InputFile& file, const Raw& raw, BmpHeader& header) {
    const bool core = raw.size == kCoreHeaderBytes;
    const std::uint32_t entry = core ? 3 : 4;
    const bool indexed = header.bits_per_pixel <= kMostIndexBits;
    const std::uint32_t full = indexed ? 1U << header.bits_per_pixel : 0;
    const std::uint32_t said = core ? 0 : raw.word(kPaletteEntries);
    std::uint32_t count = said == 0 ? full : std::min(said, full);
    if (header.data_offset == 0 || (indexed && header.data_offset == raw.end &&
                                    has_room_for(count * entry, file, raw, header))) {
        header.data_offset = raw.end + count * entry;
    }
    if (header.data_offset < raw.end) throw kInvalidFileHeader;
    count = std::min(count, (header.data_offset - raw.end) / entry);

    std::array<std::uint8_t, 4> bytes{};
    for (std::uint32_t i = 0; i < count; ++i) {
        file.read(bytes.data(), entry, kUnableToReadData);
        header.palette.push_back(load_le32(bytes.data()) & 0xFFFFFF);
    }
}

}  // namespace

std::optional<BmpHeader> read_bmp_header(InputFile& file) {
    const std::optional<FileHeader> start = probe(file);
    if (!start) return std::nullopt;
    Raw raw;
    raw.size = start->info_bytes;
    raw.end = kBmpFileHeaderBytes + raw.size;
    if (raw.size != kCoreHeaderBytes && raw.size != kBmpInfoHeaderBytes &&
        raw.size != kVersion4HeaderBytes) {
        throw kUnsupportedFileType;
    }
    file.read(&raw.bytes[kSizeBytes], raw.size - kSizeBytes, kUnableToReadData);

    BmpHeader header;
    header.data_offset = start->data_offset;
    if (raw.size == kCoreHeaderBytes) {
        parse_core(raw, header);
    } else {
        parse_info(raw, header);
    }
    check(header);
    read_masks(file, raw, header);
    read_palette(file, raw, header);
    return header;
}

}  // namespace zq
