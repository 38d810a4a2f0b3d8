// The least that can be done with libjpeg: its own loop over rows in memory. What the quality codec
// (with the tables of a stream that exists) and JPEG files (with libjpeg's own) are measured
// against.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <string>

#include "rows.h"

namespace zqbench {

// Bytes before the first JPEG stream in a block of the quality codec: its header, the section of
// touches (a length and as many bytes) and the length of the stream.
inline std::size_t jpeg_start(std::span<const std::uint8_t> block) {
    const std::size_t touches = block[24] | std::size_t{block[25]} << 8 |
                                std::size_t{block[26]} << 16 | std::size_t{block[27]} << 24;
    return 24 + 4 + touches + 4;
}

// Rows of 8-bit grey, or of blue, green, red, filler. `stride` is in bytes.
struct JpegRows {
    std::uint8_t* first;
    std::ptrdiff_t stride;
    std::uint32_t width, height;
    bool colour;
};

// Returns the size of the encoded stream, which is thrown away.
std::size_t bare_encode(const JpegRows& rows, std::span<const std::uint8_t> stream_with_tables);
void bare_decode(const JpegRows& rows, std::span<const std::uint8_t> stream);

void bare_jpeg_write(const std::string& path, const JpegRows& rows);
// Grey, or blue, green, red, filler.
Rows bare_jpeg_read(const std::string& path);

}  // namespace zqbench
