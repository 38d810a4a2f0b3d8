// The least that can be done with libjpeg: its own loop over rows in memory, with the tables of a
// stream that exists. What the quality codec is measured against.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace zqbench {

// Bytes before the first JPEG stream in a block of the quality codec.
inline constexpr std::size_t kJpegStart = 28;

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

}  // namespace zqbench
