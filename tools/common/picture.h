// A picture in the library: an image with its colour table, created, read, converted and written
// through the exported functions as any host would do it.
#ifndef ZQTOOLS_PICTURE_H
#define ZQTOOLS_PICTURE_H

#include <zqvissvc/display.h>
#include <zqvissvc/files.h>
#include <zqvissvc/types.h>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "refhost/refhost.h"

// What an image is, apart from its pixels.
struct Facts {
    int32_t type = ZQ_TYPE_U8;
    int32_t width = 0;
    int32_t height = 0;
    int32_t unit = 0;
    float x_step = 1;
    float y_step = 1;
    int32_t bit_depth = 0;  // 0: not set
    int32_t sample_offset = 0;
};

// How an image is flattened; the numbers are the library's.
struct Flattening {
    int32_t codec;
    int32_t kind;
    int32_t quality;  // counts for the quality codec alone
};

// The bytes of one flattened image.
struct Record {
    std::string_view bytes;
};

class Picture {
  public:
    // An image without name and border.
    Picture(int32_t type, int32_t width, int32_t height);
    // The file's image, of the type that the file holds.
    explicit Picture(const std::string& path);
    // The same with the vision information that a PNG holds.
    static std::unique_ptr<Picture> with_vision(const std::string& path);
    // The flattened image.
    explicit Picture(const Record& record);
    Picture(const Picture&) = delete;
    Picture& operator=(const Picture&) = delete;
    ~Picture();

    // Replaces the picture by the pixels of a file without a header, in the same size.
    void read_raw(const std::string& path, const ZqRawParameters& raw);

    Facts facts() const;
    const std::string& file_type() const { return file_type_; }  // empty unless it was read

    // 256 entries 0xAARRGGBB, or none.
    std::vector<uint32_t> colour_table() const { return colour_table_.elements(); }

    // Row y of the image proper, as stored, without padding. Valid while the picture lives.
    std::span<uint8_t> row(int32_t y) const;

    // Draws the picture in the zoomed and scrolled place of a window; dc: null for the window's
    // own.
    void draw(ZqWindow window, int32_t zoom, int32_t x_offset, int32_t y_offset,
              ZqDeviceContext dc = nullptr) const;

    // The custom data, by its keys.
    std::vector<std::string> keys() const;
    std::string value(const std::string& key) const;
    void set_value(const std::string& key, std::string_view value) const;
    void remove_value(const std::string& key) const;
    // Bytes of the objects that hang on the image, as the file held them (ZQ_VISION_...).
    size_t vision_bytes(int32_t part) const;

    // Each returns a new picture with the same calibration and vision information.
    std::unique_ptr<Picture> with_colours_applied() const;  // RGB, by the colour table
    std::unique_ptr<Picture> converted(int32_t type) const;

    // Writes the image with its colour table; returns the library's code.
    ZqError write(const std::string& path, const std::string& file_type,
                  const ZqWriteOptions& options);
    // The same as PNG, with the vision information.
    ZqError write_with_vision(const std::string& path, const ZqWriteOptions& options);

    // One record, without the colour table.
    std::string flattened(const Flattening& how) const;

  private:
    void copy_attributes(const Picture& source);

    ZqImageValue value_ = {};
    std::shared_ptr<ZqVisionFile> vision_;  // null for a picture without
    refhost::ArrayU32 colour_table_;
    std::string file_type_;
};

// Bytes of a pixel, 0 for a type that does not exist.
size_t bytes_per_pixel(int32_t type);

#endif
