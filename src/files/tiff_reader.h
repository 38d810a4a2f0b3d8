// Reads the first page of a TIFF file into an image: layout, colour table, pixels.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "files/pixel_view.h"
#include "files/tiff_layout.h"
#include "files/tiff_samples.h"
#include "files/tiff_session.h"
#include "files/unsigned_grey.h"

namespace zq {

class TiffReader {
  public:
    // The first directory; throws as TiffSession and read_tiff_layout do. The file must outlive the
    // reader.
    explicit TiffReader(InputFile& file);

    const TiffLayout& layout() const { return layout_; }
    // Of the picture as it is to be seen.
    std::int32_t width() const;
    std::int32_t height() const;
    // From a resolution with a unit.
    std::optional<Calibration> calibration() const;
    // 256 entries 0x00RRGGBB, those that the file lacks 0; empty when the file has no palette.
    // Throws kInvalidFileHeader.
    std::vector<std::uint32_t> colour_table() const;

    // Into an image of the layout's type and this size. Stores the sample offset of 16-bit grey.
    // Throws kUnableToReadData.
    void read_pixels(Image& image);

  private:
    // Rows of samples that follow each other in the file.
    struct FileRows {
        std::uint64_t start;
        std::uint32_t count;
    };

    std::uint8_t* pixel_of(const Image& image, std::uint32_t x, std::uint32_t y) const;
    void read_stored(Image& image);
    void read_foreign(const Image& image);
    void read_plane_of_strips(const Image& image, int plane);
    FileRows place_of_rows(int plane, std::uint32_t y, std::uint32_t strip_rows) const;
    void read_uncompressed_plane(const Image& image, int plane, std::uint32_t strip_rows);
    void read_uncompressed(const Image& image, int plane, std::uint32_t y, FileRows place);
    void read_packed(const Image& image, int plane, std::uint32_t y, std::uint32_t rows);
    void read_deflated(const Image& image, int plane, std::uint32_t y, std::uint32_t rows);
    void read_strip(const Image& image, int plane, std::uint32_t y, std::uint32_t rows);
    void read_lines(const Image& image, int plane, std::uint32_t y, std::uint32_t rows);
    void read_plane_of_tiles(const Image& image, int plane);
    void put_rows(const Image& image, int plane, std::uint32_t y, std::uint32_t rows);
    void rows_done(std::uint32_t y, std::uint32_t rows);

    TiffSession session_;
    TiffLayout layout_;
    TiffSampleSink sink_;
    std::optional<UnsignedGreyRows> unsigned_rows_;  // of the image being read
    std::vector<std::uint8_t> buffer_;  // a row, a strip or a tile as libtiff delivers it
};

}  // namespace zq
