// JPEG among the file formats.
#pragma once

#include <optional>

#include "files/handler.h"
#include "files/jpeg_reader.h"
#include "files/jpeg_writer.h"

namespace zq {

class JpegFileHandler final : public ImageFileHandler {
  public:
    JpegFileHandler(std::int32_t type_code, unsigned name_id)
        : ImageFileHandler(type_code, name_id) {}

  protected:
    bool read_header() override;
    void read_lines(Image& image) override { reader_->read_pixels(image); }

    void check_job() const override { JpegWriter::check(job()); }
    void write_header() override;
    void write_lines() override { writer_->write_rows(); }
    void write_end() override { writer_->write_end(); }

  private:
    std::optional<JpegReader> reader_;
    std::optional<JpegWriter> writer_;
};

}  // namespace zq
