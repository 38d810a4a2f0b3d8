// A strip of a TIFF file in the PackBits scheme (TIFF 6.0, section 9), unpacked row by row.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "files/tiff_layout.h"
#include "files/tiff_strip_bytes.h"

namespace zq {

class TiffUnpacker {
  public:
    // Whether strips of this file are packed so, and in no way but those known here.
    static bool suits(TIFF* tiff, const TiffLayout& layout);

    // As TiffStripBytes.
    TiffUnpacker(TiffSession& session, std::uint32_t strip) : bytes_(session, strip) {}

    // Fills a row with the bytes that come next; some writers let runs go on from row to row.
    // Throws kUnableToReadData when there are not enough.
    void read_row(std::span<std::uint8_t> row);

  private:
    std::span<std::uint8_t> unpack_whole_runs(std::span<std::uint8_t> room);
    void start_run();
    std::size_t copy(std::span<std::uint8_t> room);
    std::size_t repeat(std::span<std::uint8_t> room);
    std::uint8_t next_byte();

    TiffStripBytes bytes_;
    std::span<const std::uint8_t> in_;
    // Of the run under way, one of them 0: bytes to copy, and how often to repeat `value_`.
    std::size_t copied_ = 0, repeated_ = 0;
    std::uint8_t value_ = 0;
};

}  // namespace zq
