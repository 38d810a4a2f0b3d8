// Writes pixels as a JP2 file or as a plain code stream, through OpenJPEG.
#pragma once

#include <cstdint>

#include "files/jpeg2000_session.h"
#include "files/output_file.h"
#include "files/write_job.h"

namespace zq {

// How pixels become components.
struct Jpeg2000Samples {
    int colours = 1;  // 1 or 3
    bool alpha = false;
    int bits = 8;
    bool is_signed = false;
    std::int32_t offset = 0;  // sample = value - offset; not 0 for 16-bit grey only

    int count() const { return colours + (alpha ? 1 : 0); }
};

class Jpeg2000Writer {
  public:
    // All must outlive the writer. The name's extension says whether it is a plain code stream.
    Jpeg2000Writer(OutputFile& file, const WriteJob& job, const char* path);

    // Both throw the mapped error number.
    void write_boxes();
    void write_codestream();

    // Throws kInvalidParameter, kWaveletTransform and kLosslessFloat for options, and
    // kIncompatibleImageType, kImageTooSmall, kInvalidFileFormat for what the file cannot hold.
    static void check(const WriteJob& job, const char* path);

  private:
    Jpeg2000Image make_samples() const;
    void fill_row(opj_image_t& samples, std::int32_t y) const;

    OutputFile& file_;
    const WriteJob& job_;
    bool plain_;
    Jpeg2000Samples layout_;
};

}  // namespace zq
