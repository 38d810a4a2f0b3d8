// The native format: a header of 512 bytes, then the pixel lines as the image holds them. Keeps
// every pixel type without loss.
#pragma once

#include "files/handler.h"

namespace zq {

class AipdFileHandler final : public ImageFileHandler {
  public:
    AipdFileHandler(std::int32_t type_code, unsigned name_id)
        : ImageFileHandler(type_code, name_id) {}

  protected:
    bool read_header() override;
    void seek_to_data() override;
    bool may_read_in_place() const override;
    void read_lines(Image& image) override;
    void check_job() const override;
    void write_header() override;

  private:
    void read_colour48_lines(Image& image);

    bool colour48_ = false;
};

}  // namespace zq
