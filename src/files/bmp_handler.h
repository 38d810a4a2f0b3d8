// BMP among the file formats: reads all common variants, writes 8 bits with a palette, and 24.
#pragma once

#include <optional>

#include "files/bmp_header.h"
#include "files/bmp_rows.h"
#include "files/handler.h"

namespace zq {

class BmpFileHandler final : public ImageFileHandler {
  public:
    BmpFileHandler(std::int32_t type_code, unsigned name_id)
        : ImageFileHandler(type_code, name_id) {}

  protected:
    bool read_header() override;
    void seek_to_data() override;
    std::vector<std::uint32_t> read_colour_table() override;
    bool may_read_in_place() const override;
    void read_lines(Image& image) override;

    void check_job() const override;
    void write_header() override;
    void write_colour_table() override;
    void write_lines() override;

  private:
    PixelFormat pixel_format() const;
    void read_plain_lines(Image& image);
    // Whether lines can go straight from the file into the image's rows.
    bool is_direct(const BmpRowDecoder& decoder, const Image& image) const;

    BmpHeader bmp_;
};

}  // namespace zq
