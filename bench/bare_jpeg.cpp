// libjpeg and nothing else.
#include "bare_jpeg.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

// After <cstdio>, which it needs.
#include <jpeglib.h>

namespace zqbench {

namespace {

JSAMPROW row(const JpegRows& rows, JDIMENSION y) {
    return rows.first + static_cast<std::ptrdiff_t>(y) * rows.stride;
}

// The stream's own tables and sampling; any stream of the codec has those of its quality.
void copy_tables(std::span<const std::uint8_t> stream, jpeg_compress_struct& to) {
    jpeg_decompress_struct from{};
    jpeg_error_mgr errors;
    from.err = jpeg_std_error(&errors);
    jpeg_create_decompress(&from);
    jpeg_mem_src(&from, stream.data(), static_cast<unsigned long>(stream.size()));
    jpeg_read_header(&from, TRUE);
    for (int i = 0; i < 2; ++i) {
        if (from.quant_tbl_ptrs[i] == nullptr) continue;
        unsigned steps[64];
        for (int k = 0; k < 64; ++k) steps[k] = from.quant_tbl_ptrs[i]->quantval[k];
        jpeg_add_quant_table(&to, i, steps, 100, TRUE);
    }
    jpeg_destroy_decompress(&from);
}

}  // namespace

std::size_t bare_encode(const JpegRows& rows, std::span<const std::uint8_t> stream_with_tables) {
    jpeg_compress_struct jpeg{};
    jpeg_error_mgr errors;
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_compress(&jpeg);
    unsigned char* out = nullptr;
    unsigned long size = 0;
    jpeg_mem_dest(&jpeg, &out, &size);
    jpeg.image_width = rows.width;
    jpeg.image_height = rows.height;
    jpeg.input_components = rows.colour ? 4 : 1;
    jpeg.in_color_space = rows.colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg_set_defaults(&jpeg);
    jpeg.comp_info[0].h_samp_factor = jpeg.comp_info[0].v_samp_factor = 1;
    copy_tables(stream_with_tables, jpeg);
    jpeg_start_compress(&jpeg, TRUE);
    while (jpeg.next_scanline < jpeg.image_height) {
        JSAMPROW at_once[8];
        const JDIMENSION count = std::min<JDIMENSION>(8, jpeg.image_height - jpeg.next_scanline);
        for (JDIMENSION i = 0; i < count; ++i) at_once[i] = row(rows, jpeg.next_scanline + i);
        jpeg_write_scanlines(&jpeg, at_once, count);
    }
    jpeg_finish_compress(&jpeg);
    jpeg_destroy_compress(&jpeg);
    std::free(out);
    return size;
}

void bare_decode(const JpegRows& rows, std::span<const std::uint8_t> stream) {
    jpeg_decompress_struct jpeg{};
    jpeg_error_mgr errors;
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_decompress(&jpeg);
    jpeg_mem_src(&jpeg, stream.data(), static_cast<unsigned long>(stream.size()));
    jpeg_read_header(&jpeg, TRUE);
    jpeg.jpeg_color_space = rows.colour ? JCS_YCbCr : JCS_GRAYSCALE;
    jpeg.out_color_space = rows.colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg_start_decompress(&jpeg);
    while (jpeg.output_scanline < jpeg.output_height) {
        JSAMPROW target = row(rows, jpeg.output_scanline);
        jpeg_read_scanlines(&jpeg, &target, 1);
    }
    jpeg_finish_decompress(&jpeg);
    jpeg_destroy_decompress(&jpeg);
}

}  // namespace zqbench
