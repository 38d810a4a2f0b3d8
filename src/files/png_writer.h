// Writes pixels as a PNG stream through libpng.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "files/output_file.h"
#include "files/png_description.h"
#include "files/png_pixel_writer.h"
#include "files/png_session.h"
#include "files/write_job.h"

namespace zq {

// `setting` is 0 (smallest file) to 100 (no compression).
PngCompression png_compression(std::int32_t setting, int colour_type, bool has_transparency);

class PngWriter {
  public:
    // All must outlive the writer; `vision` may be null. Throws kUnableToWriteData for vision
    // information that no file can hold, kNotEnoughMemory, std::bad_alloc.
    PngWriter(OutputFile& file, const WriteJob& job, const PngVision* vision);

    // Throw the mapped error number.
    void write_info();
    void write_rows();
    void write_end();

    // Throws kInvalidParameter, kIncompatibleImageType or kImageTooSmall for what no PNG can hold.
    static void check(const WriteJob& job);

  private:
    void choose_layout();
    void set_header();
    PngCompression compression() const;
    void set_compression();
    void write_chunks();
    void set_transformations();
    const std::uint8_t* samples_of_row(std::int32_t y);
    void put_row(std::int32_t y, std::uint8_t* to);
    bool is_photograph(std::size_t row_bytes, std::size_t step);

    OutputFile& file_;
    const WriteJob& job_;
    PngSession session_;
    PngLayout layout_;
    ZqPngSettings settings_{};
    std::vector<PngChunk> chunks_;
    std::vector<std::uint16_t> shifted_;    // one row less the sample offset; empty when that is 0
    std::optional<PngPixelWriter> pixels_;  // none: libpng writes the pixels
};

}  // namespace zq
