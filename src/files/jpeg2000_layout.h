// What the components of a JPEG 2000 file become in an image.
#pragma once

#include <array>
#include <cstdint>
#include <vector>

#include "files/input_file.h"
#include "files/jpeg2000_codestream.h"
#include "files/pixel_format.h"
#include "image/image.h"

namespace zq {

enum class Jpeg2000Alpha { kNone, kStraight, kPremultiplied };

struct Jpeg2000Layout {
    Jpeg2000Codestream stream;
    PixelType type = PixelType::kU8;
    PixelFormat format = PixelFormat::kGrey8;
    std::vector<std::uint32_t> colour_table;  // 256 entries, or none
    bool is_ycc = false;
    // Indices of components. Of grey the first counts; grey with alpha has it three times.
    std::array<std::size_t, 3> colours{};
    Jpeg2000Alpha alpha_kind = Jpeg2000Alpha::kNone;
    std::size_t alpha = 0;

    bool is_grey() const { return type == PixelType::kU8 || type == PixelType::kI16; }
    const Jpeg2000Component& main_component() const { return stream.components[colours[0]]; }
    // Of the picture: samples of its first component.
    std::int32_t width() const;
    std::int32_t height() const;
    int bits_per_pixel() const;
    std::int32_t bit_depth() const;  // attribute of the image; 0: none
};

// False for a file that is neither JP2 nor a code stream; it is read from its start. Throws
// kInvalidFileHeader, kUnableToReadData, kUnsupportedFileType, kColourSpaceMethod,
// kMoreThanOneLayer.
bool read_jpeg2000_layout(InputFile& file, Jpeg2000Layout& layout);

}  // namespace zq
