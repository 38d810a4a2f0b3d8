// A deflated strip of a TIFF file, inflated piece by piece: neither its bytes nor its rows need to
// be in memory as a whole.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

#include "codecs/inflate_stream.h"
#include "files/tiff_layout.h"
#include "files/tiff_strip_bytes.h"

namespace zq {

class TiffInflater {
  public:
    // Whether strips of this file are deflated, and in no way but those known here.
    static bool suits(TIFF* tiff, const TiffLayout& layout);

    // Session and layout must outlive this. Throws as TiffStripBytes does.
    TiffInflater(TiffSession& session, const TiffLayout& layout, std::uint32_t strip);

    // Both throw kUnableToReadData for what is damaged or missing.
    // Fills `rows` with the next ones, as libtiff would deliver them.
    void read_rows(std::span<std::uint8_t> rows);
    // Behind the last row: the check sum must be right. Some writers fill up the last strip with
    // rows that the picture does not have; so many bytes are passed over.
    void finish(std::uint64_t spare_bytes);

  private:
    std::span<std::uint8_t> inflate(std::span<std::uint8_t> room);
    void add_up_differences(std::uint8_t* row) const;

    TiffSession& session_;
    const TiffLayout& layout_;
    std::size_t row_bytes_;
    bool has_differences_;  // each sample is told by its difference from the one to its left
    TiffStripBytes deflated_;
    InflateStream stream_;
    std::span<const std::uint8_t> in_;
};

}  // namespace zq
