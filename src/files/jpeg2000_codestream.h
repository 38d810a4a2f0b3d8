// The markers of a JPEG 2000 code stream (ITU-T T.800, annex A), looked at before OpenJPEG does,
// which believes what they announce.
#pragma once

#include <cstdint>
#include <vector>

#include "files/jpeg2000_bytes.h"

namespace zq {

struct Jpeg2000Component {
    int bits = 0;
    bool is_signed = false;
    std::uint32_t dx = 1, dy = 1;  // reference grid points from one sample to the next
};

// Positions on the reference grid; the picture is [left, right) x [top, bottom).
struct Jpeg2000Grid {
    std::uint32_t left = 0, top = 0, right = 0, bottom = 0;
    std::uint32_t tile_left = 0, tile_top = 0, tile_width = 0, tile_height = 0;
};

struct Jpeg2000Codestream {
    std::uint64_t start = 0;   // in the file
    std::uint64_t length = 0;  // bytes
    Jpeg2000Grid grid;
    std::vector<Jpeg2000Component> components;

    // Samples of a component.
    std::uint64_t width(const Jpeg2000Component& component) const;
    std::uint64_t height(const Jpeg2000Component& component) const;
};

// The cursor stands at the code stream, and behind it afterwards. Throws kInvalidFileHeader,
// kMoreThanOneLayer, and kUnableToReadData for a stream that is cut short or cannot hold what it
// announces.
Jpeg2000Codestream read_jpeg2000_codestream(Jpeg2000Cursor& cursor);

}  // namespace zq
