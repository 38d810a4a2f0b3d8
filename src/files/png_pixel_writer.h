// The pixels of a PNG file being written: filters, deflate and IDAT chunks.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "codecs/row_deflater.h"
#include "files/png_session.h"
#include "kernels/png_filters.h"

namespace zq {

// How hard a write tries.
struct PngCompression {
    int level = 6;  // of zlib
    int filters = PNG_ALL_FILTERS;
};

class PngPixelWriter {
  public:
    // The session has written all that stands in front of the pixels, and must outlive this. `step`
    // is the bytes of a pixel. Throws std::bad_alloc.
    PngPixelWriter(PngSession& session, const PngCompression& compression, std::size_t row_bytes,
                   std::size_t step);

    // The next row goes here, in the file's layout, and is then put.
    std::uint8_t* row() { return &row_[kPngMostStep]; }
    // Throw the error of the file, std::bad_alloc.
    void put_row();
    void finish();

  private:
    void write_chunk();

    PngSession& session_;
    RowDeflater deflater_;
    int filters_;
    std::size_t row_bytes_;
    std::size_t step_;
    // With zeros in front, as the filters want them.
    std::vector<std::uint8_t> row_, above_;
    // The filter's number and its result.
    std::vector<std::uint8_t> best_, tried_;
};

}  // namespace zq
