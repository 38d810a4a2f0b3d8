// From tags to a layout: what is read, and what a file of its size can hold.
#include "files/tiff_layout.h"

#include <algorithm>
#include <array>

#include "base/checked.h"

namespace zq {

namespace {

// The codecs that every build of libtiff here has. Expansion: how many bytes can come of one. 0: a
// bit can stand for a whole row of any width.
struct Codec {
    std::uint16_t tag;
    std::uint32_t expansion;
};
constexpr std::array kCodecs = {
    Codec{COMPRESSION_NONE, 1},
    Codec{COMPRESSION_CCITTRLE, 0},
    Codec{COMPRESSION_CCITTFAX3, 0},
    Codec{COMPRESSION_CCITTFAX4, 0},
    Codec{COMPRESSION_LZW, 4096},
    Codec{COMPRESSION_OJPEG, 1400},
    Codec{COMPRESSION_JPEG, 1400},
    Codec{COMPRESSION_NEXT, 64},
    Codec{COMPRESSION_CCITTRLEW, 0},
    Codec{COMPRESSION_PACKBITS, 64},
    Codec{COMPRESSION_THUNDERSCAN, 64},
    Codec{COMPRESSION_PIXARLOG, 1032},
    Codec{COMPRESSION_DEFLATE, 1032},
    Codec{COMPRESSION_SGILOG, 64},
    Codec{COMPRESSION_ADOBE_DEFLATE, 1032},
    Codec{COMPRESSION_SGILOG24, 1},
};

// Wider than any scanner: nothing but this limits what a bit of theirs can stand for.
constexpr std::uint32_t kWidestFaxRow = 131072;
constexpr int kMostBits = 64;

// A tile above this must be no larger than the picture, or explained by the file's size as pictures
// are.
constexpr std::uint64_t kLargestSpareTile = std::uint64_t{16} << 20;

const Codec& codec_of(std::uint16_t compression) {
    const auto* const found =
        std::find_if(kCodecs.begin(), kCodecs.end(),
                     [compression](const Codec& codec) { return codec.tag == compression; });
    if (found == kCodecs.end()) throw kUnsupportedFileType;
    return *found;
}

// Absent tags have the defaults of the format.
template <class T>
T defaulted(TIFF* tiff, ttag_t tag) {
    T value{};
    TIFFGetFieldDefaulted(tiff, tag, &value);
    return value;
}

TiffNumber number_of(TIFF* tiff) {
    switch (defaulted<std::uint16_t>(tiff, TIFFTAG_SAMPLEFORMAT)) {
        case SAMPLEFORMAT_UINT:
        case SAMPLEFORMAT_VOID:
            return TiffNumber::kUnsigned;
        case SAMPLEFORMAT_INT:
            return TiffNumber::kSigned;
        case SAMPLEFORMAT_IEEEFP:
            return TiffNumber::kFloat;
        default:
            throw kUnsupportedFileType;
    }
}

// Old writers leave the photometric interpretation out.
std::uint16_t photometric_of(TIFF* tiff, const TiffLayout& layout) {
    std::uint16_t value = 0;
    if (TIFFGetField(tiff, TIFFTAG_PHOTOMETRIC, &value) == 1) return value;
    switch (layout.compression) {
        case COMPRESSION_CCITTRLE:
        case COMPRESSION_CCITTRLEW:
        case COMPRESSION_CCITTFAX3:
        case COMPRESSION_CCITTFAX4:
            return PHOTOMETRIC_MINISWHITE;
        default:
            return layout.samples >= 3 ? PHOTOMETRIC_RGB : PHOTOMETRIC_MINISBLACK;
    }
}

// libjpeg itself makes RGB of its YCbCr, row by row; any other is left to libtiff as a whole.
TiffColour colour_of_ycbcr(TIFF* tiff, const TiffLayout& layout) {
    const bool by_libjpeg = layout.compression == COMPRESSION_JPEG && !layout.separate &&
                            layout.samples == 3 && layout.bits == 8;
    if (!by_libjpeg) return TiffColour::kForeign;
    TIFFSetField(tiff, TIFFTAG_JPEGCOLORMODE, JPEGCOLORMODE_RGB);
    return TiffColour::kRgb;
}

TiffColour colour_of(TIFF* tiff, const TiffLayout& layout) {
    switch (photometric_of(tiff, layout)) {
        case PHOTOMETRIC_MINISBLACK:
        case PHOTOMETRIC_MASK:
            return TiffColour::kGrey;
        case PHOTOMETRIC_MINISWHITE:
            return TiffColour::kInvertedGrey;
        case PHOTOMETRIC_PALETTE:
            return TiffColour::kPalette;
        case PHOTOMETRIC_RGB:
            return TiffColour::kRgb;
        case PHOTOMETRIC_SEPARATED:
            if (defaulted<std::uint16_t>(tiff, TIFFTAG_INKSET) != INKSET_CMYK)
                throw kUnsupportedFileType;
            return TiffColour::kCmyk;
        case PHOTOMETRIC_YCBCR:
            return colour_of_ycbcr(tiff, layout);
        case PHOTOMETRIC_CIELAB:
        case PHOTOMETRIC_LOGL:
        case PHOTOMETRIC_LOGLUV:
            return TiffColour::kForeign;
        default:
            throw kUnsupportedFileType;
    }
}

TiffAlpha alpha_of(TIFF* tiff, const TiffLayout& layout) {
    std::uint16_t count = 0;
    const std::uint16_t* kinds = nullptr;
    TIFFGetFieldDefaulted(tiff, TIFFTAG_EXTRASAMPLES, &count, &kinds);
    const bool whole_bytes = layout.bits == 8 || layout.bits == 16;
    const bool has_place = layout.colour == TiffColour::kGrey || layout.colour == TiffColour::kRgb;
    if (count == 0 || kinds == nullptr || !whole_bytes || !has_place ||
        layout.number != TiffNumber::kUnsigned || layout.samples <= layout.colour_samples()) {
        return TiffAlpha::kNone;
    }
    switch (kinds[0]) {
        case EXTRASAMPLE_ASSOCALPHA:
            return TiffAlpha::kPremultiplied;
        case EXTRASAMPLE_UNASSALPHA:
            return TiffAlpha::kStraight;
        default:
            return TiffAlpha::kNone;
    }
}

bool is_supported_grey(const TiffLayout& layout) {
    switch (layout.number) {
        case TiffNumber::kUnsigned:
            return layout.bits <= 16 || layout.bits == 32;
        case TiffNumber::kSigned:
            return layout.bits == 8 || layout.bits == 16 || layout.bits == 32;
        default:
            return layout.bits == 32 || layout.bits == 64;
    }
}

bool is_supported(const TiffLayout& layout) {
    const bool is_fax = codec_of(layout.compression).expansion == 0;
    if (is_fax && (layout.bits != 1 || layout.samples != 1)) return false;
    const bool is_unsigned = layout.number == TiffNumber::kUnsigned;
    switch (layout.colour) {
        case TiffColour::kGrey:
            return is_supported_grey(layout);
        case TiffColour::kInvertedGrey:
            return is_unsigned && layout.bits <= 16;
        case TiffColour::kPalette:
            return is_unsigned && layout.bits <= 8;
        case TiffColour::kRgb:
            return is_unsigned && layout.bits <= 16;
        case TiffColour::kCmyk:
            return is_unsigned && (layout.bits == 8 || layout.bits == 16);
        default:
            return true;
    }
}

// The most bytes that a byte of the file can stand for; 0 for fax, which knows no such bound.
std::uint64_t expansion_of(const TiffLayout& layout) {
    // Subsampled colour is what expands most easily.
    return codec_of(layout.compression).expansion *
           (layout.colour == TiffColour::kForeign ? std::uint64_t{3} : 1);
}

// No picture that the file's bytes cannot make, whatever its tags announce.
void check_plausible(const TiffLayout& layout, const TiffSession& session) {
    const std::uint64_t size = session.file_size();
    const std::uint64_t expansion = expansion_of(layout);
    if (expansion == 0) {
        if (layout.height / 8 > size || layout.width > kWidestFaxRow) throw kUnableToReadData;
        return;
    }
    const int planes = layout.separate ? layout.samples : 1;
    const std::uint64_t bytes =
        checked_mul<std::uint64_t>(layout.row_bytes(layout.width), layout.height);
    if (checked_mul<std::uint64_t>(bytes, static_cast<std::uint64_t>(planes)) / expansion > size)
        throw kUnableToReadData;
}

void check_tiles(const TiffLayout& layout, const TiffSession& session) {
    if (!layout.tiled) return;
    const auto tile = static_cast<std::uint64_t>(TIFFTileSize(session.tiff()));
    if (tile == 0) throw kInvalidFileHeader;
    const std::uint64_t picture = layout.row_bytes(layout.width) * layout.height;
    if (tile <= std::max(picture, kLargestSpareTile)) return;
    // Tiles are filled up to their size, also the only one of a picture.
    const std::uint64_t expansion = expansion_of(layout);
    if (expansion == 0 || tile / expansion > session.file_size()) throw kUnableToReadData;
}

}  // namespace

int TiffLayout::colour_samples() const {
    switch (colour) {
        case TiffColour::kRgb:
            return 3;
        case TiffColour::kCmyk:
            return 4;
        default:
            return 1;
    }
}

std::uint64_t TiffLayout::row_bytes(std::uint64_t pixels) const {
    const auto bits_each = static_cast<std::uint64_t>(separate ? bits : bits * samples);
    return (checked_mul<std::uint64_t>(pixels, bits_each) + 7) / 8;
}

PixelType TiffLayout::pixel_type() const {
    const bool grey = colour == TiffColour::kGrey || colour == TiffColour::kInvertedGrey;
    if (colour == TiffColour::kForeign) return PixelType::kRgb;
    if (!grey && colour != TiffColour::kPalette)
        return bits > 8 ? PixelType::kRgbU64 : PixelType::kRgb;
    if (alpha != TiffAlpha::kNone) return bits > 8 ? PixelType::kRgbU64 : PixelType::kRgb;
    if (bits > 16) return PixelType::kSgl;
    return bits > 8 || number == TiffNumber::kSigned ? PixelType::kI16 : PixelType::kU8;
}

PixelFormat TiffLayout::pixel_format() const {
    const bool has_alpha = alpha != TiffAlpha::kNone;
    switch (pixel_type()) {
        case PixelType::kRgb:
            return has_alpha ? PixelFormat::kRgb32 : PixelFormat::kRgb24;
        case PixelType::kRgbU64:
            return has_alpha ? PixelFormat::kRgb64 : PixelFormat::kRgb48;
        case PixelType::kSgl:
            return PixelFormat::kFloat;
        case PixelType::kI16:
            return bits > 8 ? PixelFormat::kGrey16 : PixelFormat::kGrey8;
        default:
            return bits > 4   ? PixelFormat::kGrey8
                   : bits > 2 ? PixelFormat::kGrey4
                   : bits > 1 ? PixelFormat::kGrey2
                              : PixelFormat::kGrey1;
    }
}

int TiffLayout::bit_depth() const {
    return pixel_type() == PixelType::kI16 && bits > 8 && bits < 16 ? bits : 0;
}

TiffLayout read_tiff_layout(const TiffSession& session) {
    TIFF* const tiff = session.tiff();
    TiffLayout layout;
    layout.width = defaulted<std::uint32_t>(tiff, TIFFTAG_IMAGEWIDTH);
    layout.height = defaulted<std::uint32_t>(tiff, TIFFTAG_IMAGELENGTH);
    layout.bits = defaulted<std::uint16_t>(tiff, TIFFTAG_BITSPERSAMPLE);
    layout.samples = defaulted<std::uint16_t>(tiff, TIFFTAG_SAMPLESPERPIXEL);
    layout.compression = defaulted<std::uint16_t>(tiff, TIFFTAG_COMPRESSION);
    layout.separate = layout.samples > 1 &&
                      defaulted<std::uint16_t>(tiff, TIFFTAG_PLANARCONFIG) == PLANARCONFIG_SEPARATE;
    layout.tiled = TIFFIsTiled(tiff) != 0;
    const int orientation = defaulted<std::uint16_t>(tiff, TIFFTAG_ORIENTATION);
    layout.orientation = orientation >= 1 && orientation <= 8 ? orientation : 1;
    if (layout.width == 0 || layout.height == 0 || layout.bits == 0 || layout.samples == 0)
        throw kInvalidFileHeader;

    if (layout.bits > kMostBits) throw kUnsupportedFileType;
    layout.number = number_of(tiff);
    layout.colour = colour_of(tiff, layout);
    if (!is_supported(layout)) throw kUnsupportedFileType;
    if (layout.colour != TiffColour::kForeign && layout.samples < layout.colour_samples())
        throw kInvalidFileHeader;
    layout.alpha = alpha_of(tiff, layout);
    check_plausible(layout, session);
    check_tiles(layout, session);
    return layout;
}

}  // namespace zq
