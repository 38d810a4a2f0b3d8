// Rows go straight from the image to libjpeg and back, so that nothing is copied.
#include "serialize/quality_jpeg.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "codecs/jpeg_memory.h"
#include "codecs/jpeg_session.h"
#include "serialize/quality_lossless.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

// JPEG ends at 65500; whole blocks of 8.
constexpr std::int32_t kJpegSide = 65280;
constexpr JDIMENSION kRowsAtOnce = 16;

struct PixelTile {
    std::uint8_t* first;
    std::ptrdiff_t stride;  // bytes
    std::int32_t x, y, width, height;
};

// Calls `visit` for each tile, row by row of tiles.
template <class Visit>
void for_each_tile(const Image& image, Visit&& visit) {
    const ImageRecord& record = image.record();
    const std::ptrdiff_t pixel = bytes_per_pixel(image.type());
    for (std::int32_t y = 0; y < record.height; y += std::min(kJpegSide, record.height - y)) {
        for (std::int32_t x = 0; x < record.width; x += std::min(kJpegSide, record.width - x)) {
            visit(PixelTile{image.row(y) + x * pixel, image.row_stride(), x, y,
                            std::min(kJpegSide, record.width - x),
                            std::min(kJpegSide, record.height - y)});
        }
    }
}

bool is_one_tile(const Image& image) {
    return image.record().width <= kJpegSide && image.record().height <= kJpegSide;
}

// What all alpha bytes seen so far have in common.
struct AlphaBits {
    std::uint32_t all = 0xFFFFFFFF;
    std::uint32_t any = 0;

    void see(const std::uint8_t* row, std::int32_t width) {
        std::uint32_t row_all = all;
        std::uint32_t row_any = any;
        for (std::ptrdiff_t x = 0; x < width; ++x) {
            std::uint32_t pixel;
            std::memcpy(&pixel, row + 4 * x, sizeof(pixel));
            row_all &= pixel;
            row_any |= pixel;
        }
        all = row_all;
        any = row_any;
    }
    bool is_constant() const { return all >> 24 == any >> 24; }
    std::uint8_t value() const { return static_cast<std::uint8_t>(any >> 24); }
};

void configure(jpeg_compress_struct& jpeg, bool colour, const JpegSteps& luma,
               const JpegSteps& chroma) {
    jpeg.input_components = colour ? 4 : 1;
    jpeg.in_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg_set_defaults(&jpeg);
    jpeg.dct_method = JDCT_ISLOW;
    jpeg.write_JFIF_header = FALSE;
    for (int i = 0; i < jpeg.num_components; ++i) {
        jpeg.comp_info[i].h_samp_factor = 1;
        jpeg.comp_info[i].v_samp_factor = 1;
    }
    jpeg_add_quant_table(&jpeg, 0, luma.data(), 100, TRUE);
    if (colour) jpeg_add_quant_table(&jpeg, 1, chroma.data(), 100, TRUE);
}

void feed(jpeg_compress_struct& jpeg, const PixelTile& tile, AlphaBits* alpha) {
    std::array<JSAMPROW, kRowsAtOnce> rows;
    while (jpeg.next_scanline < jpeg.image_height) {
        const JDIMENSION count = std::min(kRowsAtOnce, jpeg.image_height - jpeg.next_scanline);
        for (JDIMENSION i = 0; i < count; ++i) {
            rows[i] = tile.first + (jpeg.next_scanline + i) * tile.stride;
            if (alpha != nullptr) alpha->see(rows[i], tile.width);
        }
        jpeg_write_scanlines(&jpeg, rows.data(), count);
    }
}

void put_tile(Bytes& out, const PixelTile& tile, int quality, AlphaBits* alpha) {
    const JpegSteps luma = alpha != nullptr ? luma_steps(quality) : grey_steps(quality);
    const JpegSteps chroma = chroma_steps(quality);
    JpegSink sink(static_cast<std::size_t>(tile.width) * static_cast<std::size_t>(tile.height) / 4);
    JpegCompressor session;
    jpeg_compress_struct& jpeg = session.jpeg();
    sink.attach(jpeg);
    session.run(kSystemError, [&] {
        jpeg.image_width = static_cast<JDIMENSION>(tile.width);
        jpeg.image_height = static_cast<JDIMENSION>(tile.height);
        configure(jpeg, alpha != nullptr, luma, chroma);
        jpeg_start_compress(&jpeg, TRUE);
        feed(jpeg, tile, alpha);
        jpeg_finish_compress(&jpeg);
    });
    const OpenSection section(out);
    put_bytes(out, sink.bytes());
    section.close();
}

void put_alpha(Bytes& out, const Image& image) {
    const auto width = static_cast<std::size_t>(image.record().width);
    const auto height = static_cast<std::size_t>(image.record().height);
    BytePlanes planes(width, height, 1);
    for (std::size_t y = 0; y < height; ++y) {
        const std::uint8_t* pixels = image.row(static_cast<std::int32_t>(y));
        std::uint8_t* row = planes.row(0, y);
        for (std::size_t x = 0; x < width; ++x) row[x] = pixels[4 * x + 3];
    }
    put_planes(out, planes);
}

// A single scan whose components all have the full size: it comes out row by row, and nothing
// behind its header can make libjpeg give up.
bool is_plain(const jpeg_decompress_struct& jpeg, const PixelTile& tile, int components) {
    bool plain = jpeg.image_width == static_cast<JDIMENSION>(tile.width) &&
                 jpeg.image_height == static_cast<JDIMENSION>(tile.height) &&
                 jpeg.num_components == components && jpeg.comps_in_scan == components &&
                 jpeg.data_precision == 8 && jpeg.progressive_mode == FALSE &&
                 jpeg.arith_code == FALSE;
    for (int i = 0; plain && i < components; ++i) {
        plain = jpeg.comp_info[i].h_samp_factor == 1 && jpeg.comp_info[i].v_samp_factor == 1;
    }
    return plain;
}

void start(jpeg_decompress_struct& jpeg, const PixelTile& tile, bool colour) {
    const auto common = reinterpret_cast<j_common_ptr>(&jpeg);
    jpeg_read_header(&jpeg, TRUE);
    if (!is_plain(jpeg, tile, colour ? 3 : 1)) JpegSession::fail(common, kInitializationError);
    jpeg.jpeg_color_space = colour ? JCS_YCbCr : JCS_GRAYSCALE;
    jpeg.out_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg.dct_method = JDCT_ISLOW;
    jpeg.do_block_smoothing = FALSE;
    jpeg_start_decompress(&jpeg);
}

// What is written into the fourth byte of each pixel of a tile.
struct AlphaSource {
    const LosslessPlane* plane = nullptr;  // null for types without one

    void apply(std::uint8_t* row, const PixelTile& tile, JDIMENSION y) const {
        if (plane == nullptr) return;
        if (plane->planes == nullptr) {
            set(row, tile.width);
            return;
        }
        const std::uint8_t* alpha =
            plane->planes->row(0, static_cast<std::size_t>(tile.y) + y) + tile.x;
        for (std::ptrdiff_t x = 0; x < tile.width; ++x) row[4 * x + 3] = alpha[x];
    }

  private:
    // Whole pixels at a time: vectors do that faster than every fourth byte.
    void set(std::uint8_t* row, std::int32_t width) const {
        const std::uint32_t alpha = std::uint32_t{plane->value} << 24;
        for (std::ptrdiff_t x = 0; x < width; ++x) {
            std::uint32_t pixel;
            std::memcpy(&pixel, row + 4 * x, sizeof(pixel));
            pixel = (pixel & 0x00FFFFFFU) | alpha;
            std::memcpy(row + 4 * x, &pixel, sizeof(pixel));
        }
    }
};

void read_tile(std::span<const std::uint8_t> bytes, const PixelTile& tile, bool colour,
               const AlphaSource& alpha) {
    JpegSource source(bytes);
    JpegDecompressor session;
    jpeg_decompress_struct& jpeg = session.jpeg();
    source.attach(jpeg);
    session.run(kInitializationError, [&] {
        start(jpeg, tile, colour);
        while (jpeg.output_scanline < jpeg.output_height) {
            const JDIMENSION y = jpeg.output_scanline;
            JSAMPROW row = tile.first + y * tile.stride;
            jpeg_read_scanlines(&jpeg, &row, 1);
            alpha.apply(row, tile, y);
        }
    });
}

void read_tiles(std::span<const std::span<const std::uint8_t>> streams, const Image& target,
                const AlphaSource& alpha) {
    const bool colour = target.type() == PixelType::kRgb;
    std::size_t next = 0;
    for_each_tile(target,
                  [&](const PixelTile& tile) { read_tile(streams[next++], tile, colour, alpha); });
}

void copy_pixels(const Image& source, const Image& target) {
    const auto line = static_cast<std::size_t>(target.record().width) *
                      static_cast<std::size_t>(bytes_per_pixel(target.type()));
    for (std::int32_t y = 0; y < target.record().height; ++y) {
        std::memcpy(target.row(y), source.row(y), line);
    }
}

}  // namespace

void put_jpeg(Bytes& out, const Image& image, int quality) {
    const bool colour = image.type() == PixelType::kRgb;
    AlphaBits alpha;
    for_each_tile(image, [&](const PixelTile& tile) {
        put_tile(out, tile, quality, colour ? &alpha : nullptr);
    });
    if (!colour) return;
    if (alpha.is_constant()) {
        put_constant(out, alpha.value());
    } else {
        put_alpha(out, image);
    }
}

// A tile that is refused is refused before its first row. So one tile can go straight to the image,
// while several go through a picture of their own.
void read_jpeg(StreamReader& reader, Image& image) {
    const ImageRecord& record = image.record();
    std::vector<std::span<const std::uint8_t>> streams;
    for_each_tile(image, [&](const PixelTile&) { streams.push_back(reader.section()); });
    LosslessPlane plane;
    AlphaSource alpha;
    if (image.type() == PixelType::kRgb) {
        plane = read_lossless(reader, static_cast<std::size_t>(record.width),
                              static_cast<std::size_t>(record.height), 1);
        alpha.plane = &plane;
    }
    reader.expect_end();
    if (is_one_tile(image)) {
        read_tiles(streams, image, alpha);
        return;
    }
    Image scratch(Variant::kPrivate, {});
    scratch.reinitialise(
        {.type = record.type, .width = record.width, .height = record.height, .border = 0});
    read_tiles(streams, scratch, alpha);
    copy_pixels(scratch, image);
}

}  // namespace zq
