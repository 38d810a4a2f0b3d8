// One JPEG stream for each tile of an image.
#include "serialize/quality_jpeg.h"

#include <algorithm>
#include <cstring>
#include <memory>

#include "codecs/jpeg_memory.h"
#include "codecs/jpeg_session.h"
#include "convert/copy_rows.h"
#include "kernels/stream_copy.h"
#include "serialize/quality_bands.h"
#include "serialize/quality_lossless.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

// JPEG ends at 65500; whole blocks of 8.
constexpr std::int32_t kJpegSide = 65280;

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

bool is_alpha_constant(const CommonBits& bits) {
    return bits.all >> 24 == bits.any >> 24;
}

void configure(jpeg_compress_struct& jpeg, bool colour, const JpegSteps& luma,
               const JpegSteps& chroma) {
    jpeg.input_components = colour ? 3 : 1;
    jpeg.in_color_space = colour ? JCS_YCbCr : JCS_GRAYSCALE;
    jpeg_set_defaults(&jpeg);
    jpeg.raw_data_in = TRUE;
    jpeg.dct_method = JDCT_ISLOW;
    jpeg.write_JFIF_header = FALSE;
    for (int i = 0; i < jpeg.num_components; ++i) {
        jpeg.comp_info[i].h_samp_factor = 1;
        jpeg.comp_info[i].v_samp_factor = 1;
    }
    jpeg_add_quant_table(&jpeg, 0, luma.data(), 100, TRUE);
    if (colour) jpeg_add_quant_table(&jpeg, 1, chroma.data(), 100, TRUE);
}

void put_tile(Bytes& out, const PixelTile& tile, int quality, bool colour, EncoderBand& band) {
    const JpegSteps luma = colour ? luma_steps(quality) : grey_steps(quality);
    const JpegSteps chroma = chroma_steps(quality);
    JpegSink sink(static_cast<std::size_t>(tile.width) * static_cast<std::size_t>(tile.height) / 4);
    JpegCompressor session;
    jpeg_compress_struct& jpeg = session.jpeg();
    sink.attach(jpeg);
    session.run(kSystemError, [&] {
        jpeg.image_width = static_cast<JDIMENSION>(tile.width);
        jpeg.image_height = static_cast<JDIMENSION>(tile.height);
        configure(jpeg, colour, luma, chroma);
        jpeg_start_compress(&jpeg, TRUE);
        while (jpeg.next_scanline < jpeg.image_height) band.write(jpeg, tile.pixels());
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
    jpeg.out_color_space = jpeg.jpeg_color_space;
    jpeg.raw_data_out = colour ? TRUE : FALSE;
    jpeg.dct_method = JDCT_ISLOW;
    jpeg.do_block_smoothing = FALSE;
    jpeg_start_decompress(&jpeg);
}

// `band` is null for U8, whose rows go straight to the tile.
void read_tile(std::span<const std::uint8_t> bytes, const PixelTile& tile, DecoderBand* band) {
    JpegSource source(bytes);
    JpegDecompressor session;
    jpeg_decompress_struct& jpeg = session.jpeg();
    source.attach(jpeg);
    session.run(kInitializationError, [&] {
        start(jpeg, tile, band != nullptr);
        while (jpeg.output_scanline < jpeg.output_height) {
            if (band != nullptr) {
                band->read(jpeg, tile);
            } else {
                JSAMPROW row = tile.row(jpeg.output_scanline);
                jpeg_read_scanlines(&jpeg, &row, 1);
            }
        }
    });
}

void read_tiles(std::span<const std::span<const std::uint8_t>> streams, const Image& target,
                DecoderBand* band) {
    std::size_t next = 0;
    for_each_tile(target, [&](const PixelTile& tile) { read_tile(streams[next++], tile, band); });
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
    EncoderBand band(colour, std::min(image.record().width, kJpegSide));
    for_each_tile(image,
                  [&](const PixelTile& tile) { put_tile(out, tile, quality, colour, band); });
    if (!colour) return;
    if (is_alpha_constant(band.bits())) {
        put_constant(out, static_cast<std::uint16_t>(band.bits().any >> 24));
    } else {
        put_alpha(out, image);
    }
}

// A tile that is refused is refused before its first row. So one tile can go straight to the image,
// while several go through a picture of their own.
void read_jpeg(StreamReader& reader, Image& image, PixelMemory memory) {
    const ImageRecord& record = image.record();
    std::vector<std::span<const std::uint8_t>> streams;
    for_each_tile(image, [&](const PixelTile&) { streams.push_back(reader.section()); });
    LosslessPlane plane;
    std::unique_ptr<DecoderBand> band;
    if (image.type() == PixelType::kRgb) {
        const auto width = static_cast<std::size_t>(record.width);
        const auto height = static_cast<std::size_t>(record.height);
        plane = read_lossless(reader, width, height, 1);
        const Stores stores =
            memory == PixelMemory::kFresh ? Stores::kCached : stores_for(4 * width * height);
        band =
            std::make_unique<DecoderBand>(true, plane, std::min(record.width, kJpegSide), stores);
    }
    reader.expect_end();
    if (is_one_tile(image)) {
        read_tiles(streams, image, band.get());
        finish_streaming();
        return;
    }
    Image scratch(Variant::kPrivate, {});
    scratch.reinitialise(
        {.type = record.type, .width = record.width, .height = record.height, .border = 0});
    read_tiles(streams, scratch, band.get());
    finish_streaming();
    copy_pixels(scratch, image);
}

}  // namespace zq
