// Reads a JPEG 2000 file into an image: layout, then OpenJPEG's samples, row by row to pixels.
#pragma once

#include <optional>

#include "files/jpeg2000_layout.h"
#include "files/jpeg2000_rows.h"
#include "files/jpeg2000_session.h"

namespace zq {

class Jpeg2000Reader {
  public:
    // The file stands at its start. It must outlive the reader.
    explicit Jpeg2000Reader(InputFile& file) : file_(file) {}

    // Everything up to the pixels; false for a file of another type. Throws what
    // read_jpeg2000_layout does, and kInvalidFileHeader for what OpenJPEG refuses.
    bool read_info();
    const Jpeg2000Layout& layout() const { return layout_; }

    // Into an image of the layout's type and size. Throws kUnableToReadData for damaged pixels.
    void read_pixels(Image& image);

  private:
    void decode();
    void check_component(std::size_t index) const;
    void read_grey(Image& image) const;
    void read_colour(Image& image) const;

    InputFile& file_;
    Jpeg2000Layout layout_;
    std::optional<Jpeg2000Source> source_;
    Jpeg2000Stream stream_;
    Jpeg2000Codec codec_;
    Jpeg2000Image samples_;
};

}  // namespace zq
