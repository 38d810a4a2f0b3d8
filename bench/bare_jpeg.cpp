// libjpeg and nothing else.
#include "bare_jpeg.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

// After <cstdio>, which it needs.
#include <jpeglib.h>

#include "file.h"

namespace zqbench {

namespace {

JSAMPROW row(const JpegRows& rows, JDIMENSION y) {
    return rows.first + static_cast<std::ptrdiff_t>(y) * rows.stride;
}

struct Encoder {
    jpeg_compress_struct jpeg{};
    jpeg_error_mgr errors;

    Encoder() {
        jpeg.err = jpeg_std_error(&errors);
        jpeg_create_compress(&jpeg);
    }
    ~Encoder() { jpeg_destroy_compress(&jpeg); }
    Encoder(const Encoder&) = delete;
    Encoder& operator=(const Encoder&) = delete;

    void set_defaults(const JpegRows& rows) {
        jpeg.image_width = rows.width;
        jpeg.image_height = rows.height;
        jpeg.input_components = rows.colour ? 4 : 1;
        jpeg.in_color_space = rows.colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
        jpeg_set_defaults(&jpeg);
    }
    void encode(const JpegRows& rows) {
        jpeg_start_compress(&jpeg, TRUE);
        while (jpeg.next_scanline < jpeg.image_height) {
            JSAMPROW at_once[8];
            const auto count = std::min<JDIMENSION>(8, jpeg.image_height - jpeg.next_scanline);
            for (JDIMENSION i = 0; i < count; ++i) at_once[i] = row(rows, jpeg.next_scanline + i);
            jpeg_write_scanlines(&jpeg, at_once, count);
        }
        jpeg_finish_compress(&jpeg);
    }
};

struct Decoder {
    jpeg_decompress_struct jpeg{};
    jpeg_error_mgr errors;

    Decoder() {
        jpeg.err = jpeg_std_error(&errors);
        jpeg_create_decompress(&jpeg);
    }
    ~Decoder() { jpeg_destroy_decompress(&jpeg); }
    Decoder(const Decoder&) = delete;
    Decoder& operator=(const Decoder&) = delete;

    void decode(const JpegRows& rows) {
        jpeg.out_color_space = rows.colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
        jpeg_start_decompress(&jpeg);
        while (jpeg.output_scanline < jpeg.output_height) {
            JSAMPROW target = row(rows, jpeg.output_scanline);
            jpeg_read_scanlines(&jpeg, &target, 1);
        }
        jpeg_finish_decompress(&jpeg);
    }
};

// The stream's own tables and sampling; any stream of the codec has those of its quality.
void copy_tables(std::span<const std::uint8_t> stream, jpeg_compress_struct& to) {
    Decoder decoder;
    jpeg_decompress_struct& from = decoder.jpeg;
    jpeg_mem_src(&from, stream.data(), static_cast<unsigned long>(stream.size()));
    jpeg_read_header(&from, TRUE);
    for (int i = 0; i < 2; ++i) {
        if (from.quant_tbl_ptrs[i] == nullptr) continue;
        unsigned steps[64];
        for (int k = 0; k < 64; ++k) steps[k] = from.quant_tbl_ptrs[i]->quantval[k];
        jpeg_add_quant_table(&to, i, steps, 100, TRUE);
    }
}

}  // namespace

std::size_t bare_encode(const JpegRows& rows, std::span<const std::uint8_t> stream_with_tables) {
    Encoder encoder;
    unsigned char* out = nullptr;
    unsigned long size = 0;
    jpeg_mem_dest(&encoder.jpeg, &out, &size);
    encoder.set_defaults(rows);
    encoder.jpeg.comp_info[0].h_samp_factor = encoder.jpeg.comp_info[0].v_samp_factor = 1;
    copy_tables(stream_with_tables, encoder.jpeg);
    encoder.encode(rows);
    std::free(out);
    return size;
}

void bare_decode(const JpegRows& rows, std::span<const std::uint8_t> stream) {
    Decoder decoder;
    jpeg_mem_src(&decoder.jpeg, stream.data(), static_cast<unsigned long>(stream.size()));
    jpeg_read_header(&decoder.jpeg, TRUE);
    decoder.jpeg.jpeg_color_space = rows.colour ? JCS_YCbCr : JCS_GRAYSCALE;
    decoder.decode(rows);
}

void bare_jpeg_write(const std::string& path, const JpegRows& rows) {
    const File file = open(path, "wb");
    Encoder encoder;
    jpeg_stdio_dest(&encoder.jpeg, file.get());
    encoder.set_defaults(rows);
    encoder.encode(rows);
}

Rows bare_jpeg_read(const std::string& path) {
    const File file = open(path, "rb");
    Decoder decoder;
    jpeg_stdio_src(&decoder.jpeg, file.get());
    jpeg_read_header(&decoder.jpeg, TRUE);
    const bool colour = decoder.jpeg.num_components == 3;
    const JDIMENSION width = decoder.jpeg.image_width, height = decoder.jpeg.image_height;
    Rows picture(std::size_t{width} * (colour ? 4 : 1), height);
    decoder.decode(
        {picture.row(0), static_cast<std::ptrdiff_t>(picture.stride), width, height, colour});
    return picture;
}

}  // namespace zqbench
