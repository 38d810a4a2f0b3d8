// The chunks of a PNG file beside the picture, read before libpng reads the picture and skips them.
#pragma once

#include <cstdint>
#include <optional>

#include "files/input_file.h"
#include "files/pixel_view.h"
#include "files/png_vision.h"

namespace zq {

inline constexpr std::size_t kPngSignatureBytes = 8;

// What describes the picture; absent where the file does not say it, or says nonsense.
struct PngExtras {
    std::optional<Calibration> calibration;
    std::optional<std::int16_t> sample_offset;
    std::optional<std::uint32_t> significant_bits;
};

// Reads from behind the signature and leaves the file there. Without `vision` only as far as the
// picture; otherwise to the end, since texts may follow it. A chunk that is damaged counts as
// absent, and one that has no end ends the reading: what that means is for the picture's reader to
// say. Throws kInvalidFileHeader for a private chunk in front of the header, kUnableToReadData,
// kNotEnoughMemory and std::bad_alloc.
PngExtras read_png_extras(InputFile& file, PngVision* vision);

}  // namespace zq
