// Writes a TIFF file of one page through libtiff.
#pragma once

#include <cstdint>
#include <vector>

#include "files/tiff_session.h"
#include "files/write_job.h"

namespace zq {

class TiffWriter {
  public:
    // Throws kIncompatibleImageType and kImageTooSmall for pixels, kInvalidFileFormat for a
    // compression, that no file can have.
    static void check(const WriteJob& job);

    // All three must outlive the writer. `name` is noted in the file.
    TiffWriter(OutputFile& file, const WriteJob& job, const char* name);

    // In this order. They throw the file's error code, or kUnableToWriteData.
    void write_tags();
    void write_rows();
    void write_end();

  private:
    enum class Grey16 { kAsIs, kSigned, kShifted };

    template <class Value>
    void set(ttag_t tag, Value value);
    void require(bool done) const;
    void set_layout();
    void set_colour_map();
    void set_resolution();
    void choose_grey16();
    bool is_direct() const;
    void write_strip(std::uint32_t index, std::int32_t y, std::uint32_t rows);
    void copy_row(std::int32_t y, std::uint8_t* to) const;

    OutputFile& file_;
    const WriteJob& job_;
    const char* name_;
    TiffSession session_;
    std::uint16_t compression_;
    int samples_;
    int bits_;  // per sample
    Grey16 grey16_ = Grey16::kAsIs;
    std::size_t row_bytes_;
    std::uint32_t strip_rows_ = 0;
    std::vector<std::uint8_t> strip_;
};

}  // namespace zq
