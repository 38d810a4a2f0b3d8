// Writes pixels as a JPEG stream through libjpeg.
#pragma once

#include <optional>

#include "codecs/jpeg_session.h"
#include "convert/jpeg_planes.h"
#include "files/jpeg_streams.h"
#include "files/output_file.h"
#include "files/write_job.h"

namespace zq {

class JpegWriter {
  public:
    // Both must outlive the writer.
    JpegWriter(OutputFile& file, const WriteJob& job);

    // Throw the mapped error number.
    void write_info();
    void write_rows();
    void write_end();

    // Throws kInvalidParameter, kIncompatibleImageType, kImageTooSmall or kIncompatibleImageSize
    // for what no JPEG can hold.
    static void check(const WriteJob& job);

  private:
    jpeg_compress_struct& jpeg() { return session_.jpeg(); }
    void configure();
    void set_density();

    JpegFileSink sink_;
    const WriteJob& job_;
    JpegCompressor session_;
    std::optional<EncoderBand> band_;  // where the planes have the pixels' full resolution
};

}  // namespace zq
