// The chunks that describe a picture being written: what libpng knows, set in its structures, and
// what stands behind that, as finished chunks.
#pragma once

#include <png.h>

#include <cstdint>
#include <span>
#include <vector>

#include "files/png_chunks.h"
#include "files/png_vision.h"
#include "files/write_job.h"

namespace zq {

// How the file holds its samples.
struct PngLayout {
    int colour_type = 0;
    int depth = 8;                   // bits per sample
    bool table_has_alpha = false;    // of a palette
    std::int32_t sample_offset = 0;  // subtracted from signed 16-bit values
};

// Palette, calibration, significant bits, background and colour space. Called inside a step of the
// session, and owns nothing.
void set_png_description(png_structp png, png_infop info, const WriteJob& job,
                         const PngLayout& layout, const ZqPngSettings& settings);

// The chunks that libpng does not know, in their order, and the texts behind them. `vision` may be
// null. Throws kUnableToWriteData for what a chunk cannot hold, kNotEnoughMemory, std::bad_alloc.
std::vector<PngChunk> make_png_chunks(const PixelView& pixels, const PngLayout& layout,
                                      const PngVision* vision);

}  // namespace zq
