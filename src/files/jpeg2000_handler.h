// JPEG 2000 among the file formats: JP2 files and plain code streams.
#pragma once

#include <optional>

#include "files/handler.h"
#include "files/jpeg2000_reader.h"
#include "files/jpeg2000_writer.h"

namespace zq {

class Jpeg2000FileHandler final : public ImageFileHandler {
  public:
    Jpeg2000FileHandler(std::int32_t type_code, unsigned name_id)
        : ImageFileHandler(type_code, name_id) {}

  protected:
    bool read_header() override;
    std::vector<std::uint32_t> read_colour_table() override {
        return reader_->layout().colour_table;
    }
    void read_lines(Image& image) override { reader_->read_pixels(image); }

    void check_job() const override { Jpeg2000Writer::check(job(), output_path()); }
    void write_header() override;
    void write_lines() override { writer_->write_codestream(); }

  private:
    std::optional<Jpeg2000Reader> reader_;
    std::optional<Jpeg2000Writer> writer_;
};

}  // namespace zq
