// Reads a PNG stream into an image through libpng: header, limits, colour table, pixels.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "files/input_file.h"
#include "files/pixel_format.h"
#include "files/png_extras.h"
#include "files/png_session.h"
#include "image/image.h"

namespace zq {

class PngReader {
  public:
    // The file stands behind its signature. It must outlive the reader. `sample_offset` is what
    // the file says that was subtracted from its 16-bit samples.
    PngReader(InputFile& file, std::optional<std::int16_t> sample_offset);

    // All chunks up to the pixels. Throws kInvalidFileHeader, and kUnableToReadData when the file
    // ends early or cannot hold the pixels that it announces.
    void read_info();

    std::int32_t width() const { return static_cast<std::int32_t>(width_); }
    std::int32_t height() const { return static_cast<std::int32_t>(height_); }
    std::int32_t bits_per_pixel() const { return channels_ * depth_; }
    PixelType pixel_type() const;
    PixelFormat pixel_format() const;
    // 256 entries 0xAARRGGBB, those that the file lacks 0; empty when the file has no palette.
    std::vector<std::uint32_t> colour_table() const;

    // Pixels and everything behind them, into an image of the file's type and size. Stores the
    // sample offset of 16-bit grey in the image.
    void read_pixels(Image& image);

  private:
    void check_plausible() const;
    bool is_plain_rgb() const;
    void read_row(std::uint8_t* row);
    void set_transformations();
    void apply_sample_offset(Image& image, bool samples_above_signed) const;

    InputFile& file_;
    PngSession session_;
    std::uint32_t width_ = 0;
    std::uint32_t height_ = 0;
    int depth_ = 0;  // bits per sample
    int colour_type_ = 0;
    int channels_ = 0;
    bool interlaced_ = false;
    std::vector<std::uint8_t> packed_;  // a row as the file holds it; empty when not needed
    std::optional<std::int16_t> sample_offset_;
};

}  // namespace zq
