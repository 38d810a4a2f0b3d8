// How a TIFF file holds its first page, and what kind of image that becomes.
#pragma once

#include <cstddef>
#include <cstdint>

#include "files/pixel_format.h"
#include "files/tiff_session.h"
#include "image/image.h"

namespace zq {

enum class TiffColour {
    kGrey,
    kInvertedGrey,  // 0 is white
    kPalette,
    kRgb,
    kCmyk,
    kForeign,  // left to libtiff, which makes 8-bit RGB of it
};
enum class TiffNumber { kUnsigned, kSigned, kFloat };
enum class TiffAlpha { kNone, kStraight, kPremultiplied };

struct TiffLayout {
    std::uint32_t width = 0;  // as stored, before the orientation turns it
    std::uint32_t height = 0;
    int bits = 1;     // per sample
    int samples = 1;  // per pixel, those that are passed over included
    TiffColour colour = TiffColour::kGrey;
    TiffNumber number = TiffNumber::kUnsigned;
    TiffAlpha alpha = TiffAlpha::kNone;  // behind the samples of the colour
    bool separate = false;               // a plane for each sample
    bool tiled = false;
    std::uint16_t compression = 1;
    int orientation = 1;  // 1 to 8, the tag's numbers

    // The samples in use, which are the first ones of a pixel.
    int colour_samples() const;
    int used_samples() const { return colour_samples() + (alpha != TiffAlpha::kNone ? 1 : 0); }

    PixelType pixel_type() const;
    PixelFormat pixel_format() const;
    int bits_per_pixel() const { return bits * samples; }
    // Of the pixels, where the file has fewer bits than they; else 0.
    int bit_depth() const;
    // Of `pixels` neighbours of one plane, padded to a whole byte.
    std::uint64_t row_bytes(std::uint64_t pixels) const;
};

// Throws kInvalidFileHeader for what no file can mean, kUnsupportedFileType for what is not read
// here, kUnableToReadData when the file is too short for the picture, before memory is taken.
TiffLayout read_tiff_layout(const TiffSession& session);

}  // namespace zq
