// JPEG files by plain loops over libjpeg, independent of the library's own reader and writer, and
// their markers without libjpeg.
#pragma once

#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

// After <cstdio>, which it needs.
#include <jpeglib.h>

namespace zqtest {

struct BareJpeg {
    uint32_t width = 0, height = 0;
    int components = 3;
    J_COLOR_SPACE given = JCS_RGB, stored = JCS_YCbCr;  // of `samples`, and of the file
    bool progressive = false, arithmetic = false, adobe_marker = true;
    unsigned restart = 0;  // blocks between restart markers; 0: none
    int h_sampling = 2, v_sampling = 2;
    std::string samples{};  // interleaved, without padding
};

// Errors end the program: the test's own pictures are good.
inline void write_bare_jpeg(const std::string& path, BareJpeg& picture) {
    const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(path.c_str(), "wb"),
                                                               std::fclose);
    jpeg_compress_struct jpeg{};
    jpeg_error_mgr errors{};
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_compress(&jpeg);
    jpeg_stdio_dest(&jpeg, file.get());
    jpeg.image_width = picture.width;
    jpeg.image_height = picture.height;
    jpeg.input_components = picture.components;
    jpeg.in_color_space = picture.given;
    jpeg_set_defaults(&jpeg);
    jpeg_set_colorspace(&jpeg, picture.stored);
    if (!picture.adobe_marker) jpeg.write_Adobe_marker = FALSE;
    jpeg.comp_info[0].h_samp_factor = picture.h_sampling;
    jpeg.comp_info[0].v_samp_factor = picture.v_sampling;
    jpeg.restart_interval = picture.restart;
    jpeg.arith_code = picture.arithmetic ? TRUE : FALSE;
    if (picture.progressive) jpeg_simple_progression(&jpeg);
    jpeg_start_compress(&jpeg, TRUE);
    const size_t line = size_t{picture.width} * static_cast<size_t>(picture.components);
    while (jpeg.next_scanline < jpeg.image_height) {
        auto* row = reinterpret_cast<JSAMPROW>(&picture.samples[jpeg.next_scanline * line]);
        jpeg_write_scanlines(&jpeg, &row, 1);
    }
    jpeg_finish_compress(&jpeg);
    jpeg_destroy_compress(&jpeg);
}

inline BareJpeg read_bare_jpeg(const std::string& path, J_COLOR_SPACE wanted) {
    const std::unique_ptr<std::FILE, int (*)(std::FILE*)> file(std::fopen(path.c_str(), "rb"),
                                                               std::fclose);
    jpeg_decompress_struct jpeg{};
    jpeg_error_mgr errors{};
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_decompress(&jpeg);
    jpeg_stdio_src(&jpeg, file.get());
    jpeg_read_header(&jpeg, TRUE);
    jpeg.out_color_space = wanted;
    jpeg_start_decompress(&jpeg);
    BareJpeg picture;
    picture.width = jpeg.output_width;
    picture.height = jpeg.output_height;
    picture.components = jpeg.output_components;
    const size_t line = size_t{picture.width} * static_cast<size_t>(picture.components);
    picture.samples.resize(line * picture.height);
    while (jpeg.output_scanline < jpeg.output_height) {
        auto* row = reinterpret_cast<JSAMPROW>(&picture.samples[jpeg.output_scanline * line]);
        jpeg_read_scanlines(&jpeg, &row, 1);
    }
    jpeg_finish_decompress(&jpeg);
    jpeg_destroy_decompress(&jpeg);
    return picture;
}

// Where the bytes behind a marker's length begin; npos when there is none before the pixels.
inline size_t find_marker(const std::string& file, uint8_t marker) {
    for (size_t at = 2; at + 4 <= file.size();) {
        const auto byte = [&](size_t i) { return static_cast<uint8_t>(file[at + i]); };
        if (byte(1) == marker) return at + 4;
        if (byte(1) == 0xDA) break;
        at += size_t{2} + byte(2) * size_t{256} + byte(3);
    }
    return std::string::npos;
}

}  // namespace zqtest
