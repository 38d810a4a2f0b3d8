// Rows go straight from the image to libjpeg and back, so that nothing is copied.
#include "serialize/quality_jpeg.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>

#include "codecs/jpeg_memory.h"
#include "codecs/jpeg_session.h"
#include "convert/copy_rows.h"
#include "kernels/alpha_rows.h"
#include "kernels/stream_copy.h"
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
    jpeg.out_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg.dct_method = JDCT_ISLOW;
    jpeg.do_block_smoothing = FALSE;
    jpeg_start_decompress(&jpeg);
}

// One row of RGB on its way from libjpeg to the image, where it gets its alpha. Rows that lie at a
// multiple of 32 bytes are written past the cache by libjpeg and would have to be fetched again;
// this one does not.
class AlphaRow {
  public:
    AlphaRow(const LosslessPlane& plane, std::int32_t width, Stores stores)
        : plane_(plane),
          stores_(stores),
          memory_(std::make_unique_for_overwrite<std::uint32_t[]>(static_cast<std::size_t>(width) +
                                                                  kAlignment)) {
        const auto address =
            reinterpret_cast<std::uintptr_t>(memory_.get()) / sizeof(std::uint32_t);
        row_ = memory_.get() + (address % kAlignment == 0 ? 1 : 0);
    }

    JSAMPROW row() const { return reinterpret_cast<JSAMPROW>(row_); }
    // The tile's row y, as it lies in row().
    void deliver(const PixelTile& tile, JDIMENSION y) const {
        const auto width = static_cast<std::size_t>(tile.width);
        std::uint8_t* to = tile.first + y * tile.stride;
        if (plane_.planes == nullptr) {
            copy_with_alpha(row_, reinterpret_cast<std::uint32_t*>(to), width,
                            static_cast<std::uint8_t>(plane_.value), stores_);
            return;
        }
        const std::uint8_t* alpha =
            plane_.planes->row(0, static_cast<std::size_t>(tile.y) + y) + tile.x;
        for (std::size_t x = 0; x < width; ++x) row()[4 * x + 3] = alpha[x];
        std::memcpy(to, row_, 4 * width);
    }

  private:
    static constexpr std::size_t kAlignment = 8;  // pixels

    const LosslessPlane& plane_;
    Stores stores_;
    std::unique_ptr<std::uint32_t[]> memory_;
    std::uint32_t* row_;
};

// `between` is null for types without alpha, whose rows go straight to the tile.
void read_tile(std::span<const std::uint8_t> bytes, const PixelTile& tile,
               const AlphaRow* between) {
    JpegSource source(bytes);
    JpegDecompressor session;
    jpeg_decompress_struct& jpeg = session.jpeg();
    source.attach(jpeg);
    session.run(kInitializationError, [&] {
        start(jpeg, tile, between != nullptr);
        while (jpeg.output_scanline < jpeg.output_height) {
            const JDIMENSION y = jpeg.output_scanline;
            JSAMPROW row = between != nullptr ? between->row() : tile.first + y * tile.stride;
            jpeg_read_scanlines(&jpeg, &row, 1);
            if (between != nullptr) between->deliver(tile, y);
        }
    });
}

void read_tiles(std::span<const std::span<const std::uint8_t>> streams, const Image& target,
                const AlphaRow* between) {
    std::size_t next = 0;
    for_each_tile(target,
                  [&](const PixelTile& tile) { read_tile(streams[next++], tile, between); });
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
    std::unique_ptr<AlphaRow> between;
    if (image.type() == PixelType::kRgb) {
        const auto width = static_cast<std::size_t>(record.width);
        const auto height = static_cast<std::size_t>(record.height);
        plane = read_lossless(reader, width, height, 1);
        const Stores stores =
            memory == PixelMemory::kFresh ? Stores::kCached : stores_for(4 * width * height);
        between = std::make_unique<AlphaRow>(plane, record.width, stores);
    }
    reader.expect_end();
    if (is_one_tile(image)) {
        read_tiles(streams, image, between.get());
        finish_streaming();
        return;
    }
    Image scratch(Variant::kPrivate, {});
    scratch.reinitialise(
        {.type = record.type, .width = record.width, .height = record.height, .border = 0});
    read_tiles(streams, scratch, between.get());
    finish_streaming();
    copy_pixels(scratch, image);
}

}  // namespace zq
