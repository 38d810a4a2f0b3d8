// PNG among the file formats.
#pragma once

#include <optional>

#include "files/handler.h"
#include "files/png_reader.h"
#include "files/png_writer.h"

namespace zq {

class PngFileHandler final : public ImageFileHandler {
  public:
    PngFileHandler(std::int32_t type_code, unsigned name_id)
        : ImageFileHandler(type_code, name_id) {}

  protected:
    bool read_header() override;
    std::vector<std::uint32_t> read_colour_table() override { return reader_->colour_table(); }
    void read_lines(Image& image) override { reader_->read_pixels(image); }

    void check_job() const override { PngWriter::check(job()); }
    void write_header() override;
    void write_lines() override { writer_->write_rows(); }
    void write_end() override { writer_->write_end(); }

  private:
    std::optional<PngReader> reader_;
    std::optional<PngWriter> writer_;
};

}  // namespace zq
