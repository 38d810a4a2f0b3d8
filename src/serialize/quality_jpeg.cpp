// Rows go straight from the image to libjpeg, and those of U8 straight back, so that nothing is
// copied.
#include "serialize/quality_jpeg.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>
#include <utility>

#include "codecs/jpeg_memory.h"
#include "codecs/jpeg_session.h"
#include "convert/copy_rows.h"
#include "kernels/alpha_rows.h"
#include "kernels/stream_copy.h"
#include "kernels/ycc_rows.h"
#include "serialize/quality_lossless.h"
#include "serialize/quality_steps.h"

namespace zq {

namespace {

// JPEG ends at 65500; whole blocks of 8.
constexpr std::int32_t kJpegSide = 65280;
constexpr JDIMENSION kRowsAtOnce = 8;

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

bool is_alpha_constant(const CommonBits& bits) {
    return bits.all >> 24 == bits.any >> 24;
}

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

// Alpha is looked at when libjpeg has brought the rows into the cache.
void feed(jpeg_compress_struct& jpeg, const PixelTile& tile, CommonBits* bits) {
    std::array<JSAMPROW, kRowsAtOnce> rows;
    while (jpeg.next_scanline < jpeg.image_height) {
        const JDIMENSION count = std::min(kRowsAtOnce, jpeg.image_height - jpeg.next_scanline);
        for (JDIMENSION i = 0; i < count; ++i) {
            rows[i] = tile.first + (jpeg.next_scanline + i) * tile.stride;
        }
        jpeg_write_scanlines(&jpeg, rows.data(), count);
        for (JDIMENSION i = 0; bits != nullptr && i < count; ++i) {
            gather_bits(reinterpret_cast<const std::uint32_t*>(rows[i]),
                        static_cast<std::size_t>(tile.width), *bits);
        }
    }
}

void put_tile(Bytes& out, const PixelTile& tile, int quality, CommonBits* bits) {
    const JpegSteps luma = bits != nullptr ? luma_steps(quality) : grey_steps(quality);
    const JpegSteps chroma = chroma_steps(quality);
    JpegSink sink(static_cast<std::size_t>(tile.width) * static_cast<std::size_t>(tile.height) / 4);
    JpegCompressor session;
    jpeg_compress_struct& jpeg = session.jpeg();
    sink.attach(jpeg);
    session.run(kSystemError, [&] {
        jpeg.image_width = static_cast<JDIMENSION>(tile.width);
        jpeg.image_height = static_cast<JDIMENSION>(tile.height);
        configure(jpeg, bits != nullptr, luma, chroma);
        jpeg_start_compress(&jpeg, TRUE);
        feed(jpeg, tile, bits);
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

// Eight rows of luminance and chrominance on their way from libjpeg to pixels with alpha. Cheaper
// than to let libjpeg make pixels, as their alpha would take another pass over them.
class YccBand {
  public:
    // For tiles of up to `width` pixels; `alpha` must outlive the band.
    YccBand(const LosslessPlane& alpha, std::int32_t width, Stores stores)
        : alpha_(alpha), stores_(stores), pitch_(pitch_for(static_cast<std::size_t>(width))) {
        memory_ = std::make_unique_for_overwrite<std::uint8_t[]>((3 * kRowsAtOnce + 1) * pitch_);
        std::uint8_t* row = memory_.get();
        for (std::size_t plane = 0; plane < rows_.size(); ++plane) {
            for (JSAMPROW& each : rows_[plane]) each = std::exchange(row, row + pitch_);
            planes_[plane] = rows_[plane].data();
        }
        constant_alpha_ = row;
        std::memset(row, alpha.value, pitch_);
    }
    YccBand(const YccBand&) = delete;
    YccBand& operator=(const YccBand&) = delete;

    // The tile's rows from the next on.
    void read(jpeg_decompress_struct& jpeg, const PixelTile& tile) {
        const JDIMENSION y = jpeg.output_scanline;
        jpeg_read_raw_data(&jpeg, planes_.data(), kRowsAtOnce);
        const JDIMENSION count = std::min(kRowsAtOnce, jpeg.output_height - y);
        for (JDIMENSION i = 0; i < count; ++i) {
            ycc_to_bgra({rows_[0][i], rows_[1][i], rows_[2][i], alpha_row(tile, y + i)},
                        reinterpret_cast<std::uint32_t*>(tile.first + (y + i) * tile.stride),
                        static_cast<std::size_t>(tile.width), stores_);
        }
    }

  private:
    // Whole blocks; an odd number of cache lines, so that rows do not drive each other out of it.
    static std::size_t pitch_for(std::size_t width) {
        constexpr std::size_t kLine = 64;
        return (((width + kLine - 1) / kLine) | 1) * kLine;
    }

    const std::uint8_t* alpha_row(const PixelTile& tile, JDIMENSION y) const {
        if (alpha_.planes == nullptr) return constant_alpha_;
        return alpha_.planes->row(0, static_cast<std::size_t>(tile.y) + y) + tile.x;
    }

    const LosslessPlane& alpha_;
    Stores stores_;
    std::size_t pitch_;
    std::unique_ptr<std::uint8_t[]> memory_;
    const std::uint8_t* constant_alpha_;
    std::array<std::array<JSAMPROW, kRowsAtOnce>, 3> rows_;
    std::array<JSAMPARRAY, 3> planes_;
};

// `band` is null for U8, whose rows go straight to the tile.
void read_tile(std::span<const std::uint8_t> bytes, const PixelTile& tile, YccBand* band) {
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
                JSAMPROW row = tile.first + jpeg.output_scanline * tile.stride;
                jpeg_read_scanlines(&jpeg, &row, 1);
            }
        }
    });
}

void read_tiles(std::span<const std::span<const std::uint8_t>> streams, const Image& target,
                YccBand* band) {
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
    CommonBits bits;
    for_each_tile(image, [&](const PixelTile& tile) {
        put_tile(out, tile, quality, colour ? &bits : nullptr);
    });
    if (!colour) return;
    if (is_alpha_constant(bits)) {
        put_constant(out, static_cast<std::uint16_t>(bits.any >> 24));
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
    std::unique_ptr<YccBand> band;
    if (image.type() == PixelType::kRgb) {
        const auto width = static_cast<std::size_t>(record.width);
        const auto height = static_cast<std::size_t>(record.height);
        plane = read_lossless(reader, width, height, 1);
        const Stores stores =
            memory == PixelMemory::kFresh ? Stores::kCached : stores_for(4 * width * height);
        band = std::make_unique<YccBand>(plane, std::min(record.width, kJpegSide), stores);
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
