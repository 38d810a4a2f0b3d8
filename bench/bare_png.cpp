// libpng and nothing else.
#include "bare_png.h"

#include <png.h>

#include <vector>

#include "file.h"

namespace zqbench {

namespace {

void set_palette(png_structp png, png_infop info, int depth) {
    std::vector<png_color> colours(std::size_t{1} << depth);
    png_byte shade = 0;
    for (png_color& colour : colours) colour = {shade++, 1, 2};
    png_set_PLTE(png, info, colours.data(), static_cast<int>(colours.size()));
}

// Either way: rows of memory are those of an image.
void set_order(png_structp png, const PngShape& shape) {
    if (shape.depth == 16) png_set_swap(png);
    if (shape.depth < 8) png_set_packing(png);
    const bool is_grey = (shape.colour_type & PNG_COLOR_MASK_COLOR) == 0;
    if (!is_grey && shape.colour_type != PNG_COLOR_TYPE_PALETTE) png_set_bgr(png);
}

}  // namespace

void bare_png_write(const std::string& path, const Image& image, const PngShape& shape,
                    const PngStrength& strength) {
    const File file = open(path, "wb");
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_set_IHDR(png, info, kPhotoWidth, kPhotoHeight, shape.depth, shape.colour_type,
                 shape.interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    if (shape.colour_type == PNG_COLOR_TYPE_PALETTE) set_palette(png, info, shape.depth);
    png_set_compression_level(png, strength.level);
    png_set_filter(png, PNG_FILTER_TYPE_BASE, strength.filters);
    png_write_info(png, info);
    set_order(png, shape);
    if (shape.colour_type == PNG_COLOR_TYPE_RGB) png_set_filler(png, 0, PNG_FILLER_AFTER);
    for (int passes = png_set_interlace_handling(png); passes > 0; --passes) {
        for (std::int32_t y = 0; y < kPhotoHeight; ++y) png_write_row(png, image.row(y));
    }
    png_write_end(png, info);
    png_destroy_write_struct(&png, &info);
}

Rows bare_png_read(const std::string& path) {
    const File file = open(path, "rb");
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_read_info(png, info);
    const PngShape shape = {png_get_color_type(png, info), png_get_bit_depth(png, info)};
    if (shape.colour_type == PNG_COLOR_TYPE_GRAY_ALPHA) png_set_gray_to_rgb(png);
    if (shape.colour_type == PNG_COLOR_TYPE_GRAY) png_set_expand_gray_1_2_4_to_8(png);
    if (shape.colour_type == PNG_COLOR_TYPE_RGB) png_set_filler(png, 0, PNG_FILLER_AFTER);
    set_order(png, shape);
    const int passes = png_set_interlace_handling(png);
    png_read_update_info(png, info);
    Rows picture(png_get_rowbytes(png, info), kPhotoHeight);
    for (int pass = 0; pass < passes; ++pass) {
        for (std::size_t y = 0; y < std::size_t{kPhotoHeight}; ++y)
            png_read_row(png, picture.row(y), nullptr);
    }
    png_read_end(png, nullptr);
    png_destroy_read_struct(&png, &info, nullptr);
    return picture;
}

}  // namespace zqbench
