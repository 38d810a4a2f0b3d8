// The boxes of a JP2 file (ITU-T T.800, annex I): where the code stream is, and what its components
// mean.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

#include "files/jpeg2000_bytes.h"

namespace zq {

enum class Jpeg2000Colour {
    kUnknown,  // by the number of components
    kGrey,
    kRgb,
    kYcc,
};

// A row of a channel definition box.
struct Jpeg2000Definition {
    std::uint16_t channel, type, association;
};

struct Jpeg2000Palette {
    std::vector<std::uint8_t> entries;  // by entry, then by column; spread over 0 to 255
    std::size_t columns = 0;
    std::uint16_t component = 0;         // whose samples are the indices
    std::vector<std::uint8_t> channels;  // column of each channel
};

struct Jpeg2000Boxes {
    std::uint64_t start = 0, end = 0;  // of the code stream in the file
    Jpeg2000Colour colour = Jpeg2000Colour::kUnknown;
    std::vector<Jpeg2000Definition> definitions;
    std::optional<Jpeg2000Palette> palette;
};

// Whether these are the first bytes of a JP2 file, or of a code stream without one.
inline constexpr std::size_t kJpeg2000Signature = 12;
using Jpeg2000FirstBytes = std::array<std::uint8_t, kJpeg2000Signature>;
bool is_jp2(const Jpeg2000FirstBytes& bytes);
bool is_jpeg2000_codestream(const Jpeg2000FirstBytes& bytes);

// Where the file ends; far away when its size is not known.
std::uint64_t jpeg2000_file_end(const InputFile& file);

// Throws kInvalidFileHeader, kUnableToReadData, kUnsupportedFileType for palettes that no colour
// table can hold, and kColourSpaceMethod for colours that nothing here can show.
Jpeg2000Boxes read_jp2_boxes(InputFile& file);

}  // namespace zq
