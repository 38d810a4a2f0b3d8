// The native format. Fields of its header are big-endian, but for the significant bits, which lie
// in the order of the machine that wrote them: little-endian on all machines there are.
#include "files/aipd_handler.h"

#include <array>
#include <bit>
#include <cstring>
#include <vector>

#include "base/byte_order.h"
#include "base/checked.h"

namespace zq {

namespace {

static_assert(std::endian::native == std::endian::little,
              "pixels are stored as they lie in memory");

constexpr std::array<char, 4> kMagic = {'A', 'I', 'P', 'D'};
constexpr std::size_t kHeaderBytes = 512;
constexpr std::uint16_t kNewestVersion = 3;
constexpr std::int32_t kShallowestDepth = 8;
constexpr std::int32_t kDeepestDepth = 16;

// Offsets of the header's fields.
constexpr std::size_t kVersion = 4;
constexpr std::size_t kKind = 6;
constexpr std::size_t kBitsPerPixel = 8;
constexpr std::size_t kSampleClass = 10;
constexpr std::size_t kConstant2 = 12;
constexpr std::size_t kWidth = 16;
constexpr std::size_t kHeight = 18;
constexpr std::size_t kSignificantBits = 48;

using HeaderBytes = std::array<std::uint8_t, kHeaderBytes>;

// What a pixel kind means. `written` is false for the kind that is only read.
struct Kind {
    std::uint16_t code;
    PixelType type;
    std::uint16_t bits_per_pixel;
    std::uint16_t sample_class;  // 1 grey, 2 complex, 3 colour
    PixelFormat format;
    std::uint16_t version;  // the oldest that has the kind
    bool written = true;
};

constexpr std::uint16_t kColour48 = 3;

constexpr std::array<Kind, 8> kKinds = {{
    {1, PixelType::kU8, 8, 1, PixelFormat::kGrey8, 1},
    {2, PixelType::kRgb, 32, 3, PixelFormat::kRgb32, 1},
    {kColour48, PixelType::kRgbU64, 48, 3, PixelFormat::kRgb48Native, 1, false},
    {4, PixelType::kI16, 16, 1, PixelFormat::kGrey16, 1},
    {5, PixelType::kComplex, 64, 2, PixelFormat::kComplex, 1},
    {6, PixelType::kSgl, 32, 1, PixelFormat::kFloat, 1},
    {7, PixelType::kHsl, 32, 3, PixelFormat::kHsl, 2},
    {8, PixelType::kRgbU64, 64, 3, PixelFormat::kRgb64, 3},
}};

// Throws kInvalidFileHeader.
const Kind& kind_of_file(std::uint16_t version, std::uint16_t code) {
    if (version < 1 || version > kNewestVersion || code < 1 || code > kKinds.size()) {
        throw kInvalidFileHeader;
    }
    const Kind& kind = kKinds[code - 1U];
    if (version < kind.version) throw kInvalidFileHeader;
    return kind;
}

const Kind& kind_of_image(PixelType type) {
    for (const Kind& kind : kKinds) {
        if (kind.written && kind.type == type) return kind;
    }
    throw kInvalidFileHeader;
}

// Old files and foreign writers leave anything in this field: what is no bit depth counts as none.
std::int32_t bit_depth_of_file(const Kind& kind, std::uint32_t significant_bits) {
    const bool valid = significant_bits >= kShallowestDepth && significant_bits <= kDeepestDepth;
    return valid && has_bit_depth(kind.type) ? static_cast<std::int32_t>(significant_bits) : 0;
}

HeaderBytes make_header(const Kind& kind, const PixelView& pixels) {
    HeaderBytes bytes{};
    std::memcpy(bytes.data(), kMagic.data(), kMagic.size());
    store_be16(&bytes[kVersion], kind.version);
    store_be16(&bytes[kKind], kind.code);
    store_be16(&bytes[kBitsPerPixel], kind.bits_per_pixel);
    store_be16(&bytes[kSampleClass], kind.sample_class);
    store_be16(&bytes[kConstant2], 2);
    // A larger image loses the upper bits of its size: the format has no room for them.
    store_be16(&bytes[kWidth], static_cast<std::uint16_t>(pixels.width));
    store_be16(&bytes[kHeight], static_cast<std::uint16_t>(pixels.height));
    if (has_bit_depth(pixels.type)) {
        store_le32(&bytes[kSignificantBits], static_cast<std::uint32_t>(pixels.bit_depth));
    }
    return bytes;
}

}  // namespace

bool AipdFileHandler::read_header() {
    HeaderBytes bytes;
    input().read_header_bytes(bytes.data(), kMagic.size());
    if (std::memcmp(bytes.data(), kMagic.data(), kMagic.size()) != 0) return false;
    input().read_header_bytes(&bytes[kMagic.size()], kHeaderBytes - kMagic.size());

    const Kind& kind = kind_of_file(load_be16(&bytes[kVersion]), load_be16(&bytes[kKind]));
    colour48_ = kind.code == kColour48;
    header_ = {.pixel_format = kind.format,
               .type = kind.type,
               .width = load_be16(&bytes[kWidth]),
               .height = load_be16(&bytes[kHeight]),
               .bits_per_pixel = kind.bits_per_pixel,
               .bit_depth = bit_depth_of_file(kind, load_le32(&bytes[kSignificantBits]))};
    return true;
}

void AipdFileHandler::seek_to_data() {
    const auto height = static_cast<std::uint64_t>(header_.height);
    input().require(kHeaderBytes, checked_mul<std::uint64_t>(header_.bytes_per_line(), height));
    input().seek(kHeaderBytes);
}

bool AipdFileHandler::may_read_in_place() const {
    return input().size() != InputFile::kUnknownSize && !colour48_;
}

void AipdFileHandler::read_lines(Image& image) {
    if (colour48_) {
        read_colour48_lines(image);
    } else {
        ImageFileHandler::read_lines(image);
    }
}

void AipdFileHandler::read_colour48_lines(Image& image) {
    const std::size_t line = header_.bytes_per_line();
    const std::int32_t width = image.record().width;
    std::vector<std::uint8_t> samples(line);
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        input().read(samples.data(), line, kUnableToReadData);
        std::uint8_t* pixel = image.row(y);
        for (std::int32_t x = 0; x < width; ++x, pixel += 8) {
            std::memcpy(pixel, &samples[static_cast<std::size_t>(x) * 6], 6);
            std::memset(pixel + 6, 0, 2);  // alpha
        }
    }
}

void AipdFileHandler::check_job() const {
    // Packings that no image has cannot be told in the header.
    if (job().pixels.packing != Packing::kNative) throw kIncompatibleImageType;
}

void AipdFileHandler::write_header() {
    const PixelView& pixels = job().pixels;
    const Kind& kind = kind_of_image(pixels.type);
    header_ = {.pixel_format = kind.format,
               .type = pixels.type,
               .width = pixels.width,
               .height = pixels.height,
               .bits_per_pixel = kind.bits_per_pixel};
    const HeaderBytes bytes = make_header(kind, pixels);
    // Flushed, so that a full disk is seen while it still is the header's failure.
    if (!output().try_write(bytes.data(), bytes.size()) || !output().try_flush()) {
        output().abandon_in_place();
        throw kUnableToWriteData;
    }
}

}  // namespace zq
