// Reads a JPEG stream into an image through libjpeg: header, limits, pixels.
#pragma once

#include <cstdint>
#include <optional>

#include "codecs/jpeg_session.h"
#include "files/input_file.h"
#include "files/jpeg_streams.h"
#include "files/pixel_view.h"
#include "image/image.h"

namespace zq {

class JpegReader {
  public:
    // The file stands at its start. It must outlive the reader.
    explicit JpegReader(InputFile& file);

    // Everything up to the pixels. Throws kInvalidFileHeader, and kUnableToReadData when the file
    // ends early or cannot hold the pixels that it announces.
    void read_info();

    std::int32_t width() { return static_cast<std::int32_t>(jpeg().image_width); }
    std::int32_t height() { return static_cast<std::int32_t>(jpeg().image_height); }
    bool is_grey() { return jpeg().num_components == 1; }
    // The density of a JFIF header; none when there is no such header, or it says 0.
    std::optional<Calibration> calibration();

    // Pixels and everything behind them, into an image of the file's type and size. Throws
    // kUnableToReadData for a file that is cut short or whose pixels are damaged.
    void read_pixels(Image& image);

  private:
    jpeg_decompress_struct& jpeg() { return session_.jpeg(); }
    void check_plausible();
    void start();
    void read_row(const Image& image, std::uint32_t* between);

    InputFile& file_;
    JpegFileSource source_;
    jpeg_progress_mgr progress_{};
    JpegDecompressor session_;
};

}  // namespace zq
