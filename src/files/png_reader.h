// Reads a PNG stream into an image: header, limits and colour table through libpng, and the pixels
// of uncommon layouts too.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <vector>

#include "files/input_file.h"
#include "files/pixel_format.h"
#include "files/png_extras.h"
#include "files/png_session.h"
#include "files/unsigned_grey.h"
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
    bool is_common() const;
    void read_common(Image& image);
    void place_row(const std::uint8_t* from, std::uint8_t* to) const;
    void read_uncommon(Image& image);
    static void read_bytes(png_structp png, png_bytep bytes, std::size_t count);
    void set_transformations();

    InputFile& file_;
    PngSession session_;
    std::uint32_t width_ = 0;
    std::uint32_t height_ = 0;
    int depth_ = 0;  // bits per sample
    int colour_type_ = 0;
    int channels_ = 0;
    bool interlaced_ = false;
    // The head of a chunk: the last that libpng read, or the next that it is to be given.
    std::array<std::uint8_t, 8> head_{};
    bool head_is_next_ = false;
    std::optional<std::int16_t> sample_offset_;
    std::optional<UnsignedGreyRows> unsigned_rows_;  // of the image being read
};

}  // namespace zq
