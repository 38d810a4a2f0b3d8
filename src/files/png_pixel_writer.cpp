// Of the filters that may be used, each row takes the one whose results are smallest.
#include "files/png_pixel_writer.h"

#include <limits>
#include <utility>

namespace zq {

namespace {

constexpr std::size_t kChunkBytes = std::size_t{64} << 10;

}  // namespace

PngPixelWriter::PngPixelWriter(PngSession& session, const PngCompression& compression,
                               std::size_t row_bytes, std::size_t step)
    : session_(session),
      deflater_(compression.level),
      filters_(compression.filters),
      row_bytes_(row_bytes),
      step_(step),
      row_(kPngMostStep + row_bytes),
      above_(kPngMostStep + row_bytes),
      best_(1 + row_bytes),
      tried_(1 + row_bytes) {}

void PngPixelWriter::put_row() {
    std::uint64_t least = std::numeric_limits<std::uint64_t>::max();
    for (int filter = 0; filter < kPngFilters; ++filter) {
        if ((filters_ & PNG_FILTER_NONE << filter) == 0) continue;
        tried_[0] = static_cast<std::uint8_t>(filter);
        const std::uint64_t sum =
            png_filter(filter, row(), &above_[kPngMostStep], step_, tried_.data() + 1, row_bytes_);
        if (sum >= least) continue;
        least = sum;
        std::swap(tried_, best_);
    }
    deflater_.put(best_);
    std::swap(row_, above_);
    if (deflater_.out().size() >= kChunkBytes) write_chunk();
}

void PngPixelWriter::finish() {
    deflater_.finish();
    write_chunk();
}

void PngPixelWriter::write_chunk() {
    session_.run(kUnableToWriteData, [this] {
        png_write_chunk(session_.png(), reinterpret_cast<png_const_bytep>("IDAT"),
                        deflater_.out().data(), deflater_.out().size());
    });
    deflater_.out().clear();
}

}  // namespace zq
