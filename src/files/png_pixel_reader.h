// The pixels of a PNG file being read: IDAT chunks, inflate and filters.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "codecs/inflate_stream.h"
#include "files/input_file.h"

namespace zq {

class PngPixelReader {
  public:
    using Head = std::array<std::uint8_t, 8>;  // of a chunk: length and name

    // The file stands behind the head of the first IDAT chunk, and must outlive this. `step` is the
    // bytes of a pixel.
    PngPixelReader(InputFile& file, const Head& head, std::size_t row_bytes, std::size_t step);

    // All throw kUnableToReadData for what is damaged or missing.
    void read_row(const std::uint8_t* above, std::uint8_t* to);
    // Reads to the end of the last IDAT chunk, and the head of the chunk behind it. Pixels that are
    // too many are passed over; the stream's check sum must be right.
    Head finish();

  private:
    bool is_pixels() const;
    void open_chunk();
    void close_chunk();
    bool fetch();
    std::size_t inflate(std::span<std::uint8_t> room);
    void fill(std::size_t wanted);

    InputFile& file_;
    Head head_;
    std::size_t row_bytes_;
    std::size_t step_;
    InflateStream stream_;
    std::uint32_t left_ = 0;  // bytes of the chunk that were not read yet
    std::uint32_t sum_ = 0;   // CRC-32 of the others and of the name
    std::vector<std::uint8_t> deflated_;
    std::span<const std::uint8_t> in_;  // of those
    std::vector<std::uint8_t> rows_;
    std::size_t begin_ = 0, end_ = 0;  // of what is inflated in `rows_`
};

}  // namespace zq
