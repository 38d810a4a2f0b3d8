// TIFF among the file formats.
#pragma once

#include <optional>

#include "files/handler.h"
#include "files/tiff_reader.h"
#include "files/tiff_writer.h"

namespace zq {

class TiffFileHandler final : public ImageFileHandler {
  public:
    TiffFileHandler(std::int32_t type_code, unsigned name_id)
        : ImageFileHandler(type_code, name_id) {}

  protected:
    bool read_header() override;
    std::vector<std::uint32_t> read_colour_table() override { return reader_->colour_table(); }
    void read_lines(Image& image) override { reader_->read_pixels(image); }

    void check_job() const override { TiffWriter::check(job()); }
    void write_header() override;
    void write_lines() override { writer_->write_rows(); }
    void write_end() override;

  private:
    std::optional<TiffReader> reader_;
    std::optional<TiffWriter> writer_;
};

}  // namespace zq
