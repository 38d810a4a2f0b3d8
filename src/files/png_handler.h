// PNG among the file formats.
#pragma once

#include <optional>

#include "files/handler.h"
#include "files/png_reader.h"
#include "files/png_vision.h"
#include "files/png_writer.h"

namespace zq {

class PngFileHandler final : public ImageFileHandler {
  public:
    // `vision` is where vision information goes to and comes from; null: none is read or written.
    // It must outlive the handler.
    PngFileHandler(std::int32_t type_code, unsigned name_id, PngVision* vision = nullptr)
        : ImageFileHandler(type_code, name_id), vision_(vision) {}

  protected:
    bool read_header() override;
    std::vector<std::uint32_t> read_colour_table() override { return reader_->colour_table(); }
    void read_lines(Image& image) override { reader_->read_pixels(image); }

    void check_job() const override { PngWriter::check(job()); }
    void write_header() override;
    void write_lines() override { writer_->write_rows(); }
    void write_end() override { writer_->write_end(); }

  private:
    PngVision* vision_;
    std::optional<PngReader> reader_;
    std::optional<PngWriter> writer_;
};

}  // namespace zq
