// PNG files by plain loops over libpng, independent of the library's own reader and writer, and
// their chunks without libpng.
#pragma once

#include <png.h>
#include <zlib.h>

#include <cstdint>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

namespace zqtest {

// Rows as they stand in the file: packed samples, big-endian.
struct BarePng {
    uint32_t width = 0, height = 0;
    int depth = 8, colour_type = PNG_COLOR_TYPE_GRAY;
    bool interlaced = false;
    std::vector<std::vector<uint8_t>> rows;
    std::vector<png_color> palette;
    std::vector<uint8_t> palette_alpha;
    bool has_key = false;  // one colour of grey or RGB counts as transparent
    png_color_16 key{};
};

using BareFile = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;

// Errors abort the program: the test's own pictures are good.
inline void write_bare_png(const std::string& path, BarePng& picture) {
    const BareFile file(std::fopen(path.c_str(), "wb"), std::fclose);
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_set_IHDR(png, info, picture.width, picture.height, picture.depth, picture.colour_type,
                 picture.interlaced ? PNG_INTERLACE_ADAM7 : PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    if (!picture.palette.empty()) {
        png_set_PLTE(png, info, picture.palette.data(), static_cast<int>(picture.palette.size()));
    }
    if (!picture.palette_alpha.empty() || picture.has_key) {
        png_set_tRNS(png, info, picture.palette_alpha.data(),
                     static_cast<int>(picture.palette_alpha.size()), &picture.key);
    }
    png_write_info(png, info);
    std::vector<png_bytep> rows;
    for (auto& row : picture.rows) rows.push_back(row.data());
    png_write_image(png, rows.data());
    png_write_end(png, nullptr);
    png_destroy_write_struct(&png, &info);
}

inline BarePng read_bare_png(const std::string& path) {
    BarePng picture;
    const BareFile file(std::fopen(path.c_str(), "rb"), std::fclose);
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_read_png(png, info, PNG_TRANSFORM_IDENTITY, nullptr);
    int interlace = 0;
    png_get_IHDR(png, info, &picture.width, &picture.height, &picture.depth, &picture.colour_type,
                 &interlace, nullptr, nullptr);
    png_bytepp rows = png_get_rows(png, info);
    for (uint32_t y = 0; y < picture.height; ++y) {
        picture.rows.emplace_back(rows[y], rows[y] + png_get_rowbytes(png, info));
    }
    png_colorp palette = nullptr;
    png_bytep alpha = nullptr;
    int count = 0;
    if (png_get_PLTE(png, info, &palette, &count) != 0) {
        picture.palette.assign(palette, palette + count);
    }
    count = 0;
    if (png_get_tRNS(png, info, &alpha, &count, nullptr) != 0 && alpha != nullptr) {
        picture.palette_alpha.assign(alpha, alpha + count);
    }
    png_destroy_read_struct(&png, &info, nullptr);
    return picture;
}

// A chunk with its length and check sum.
inline std::string png_chunk(const std::string& name, const std::string& bytes) {
    const auto big_endian = [](uLong value) {
        std::string text;
        for (int shift = 24; shift >= 0; shift -= 8) text += static_cast<char>(value >> shift);
        return text;
    };
    const std::string body = name + bytes;
    const uLong sum =
        crc32(0, reinterpret_cast<const Bytef*>(body.data()), static_cast<uInt>(body.size()));
    return big_endian(static_cast<uLong>(bytes.size())) + body + big_endian(sum);
}

struct Chunk {
    std::string name, bytes;
};

inline std::vector<Chunk> chunks_of(const std::string& file) {
    std::vector<Chunk> chunks;
    for (size_t at = 8; at + 12 <= file.size();) {
        size_t length = 0;
        for (size_t i = 0; i < 4; ++i) length = length << 8 | static_cast<uint8_t>(file[at + i]);
        chunks.push_back({file.substr(at + 4, 4), file.substr(at + 8, length)});
        at += length + 12;
    }
    return chunks;
}

// Names of all chunks, separated by blanks.
inline std::string chunk_names(const std::string& file) {
    std::string names;
    for (const Chunk& chunk : chunks_of(file)) names += (names.empty() ? "" : " ") + chunk.name;
    return names;
}

// Contents of all chunks of a name, joined; empty when there is none.
inline std::string chunk_bytes(const std::string& file, const std::string& name) {
    std::string all;
    for (const Chunk& chunk : chunks_of(file)) all += chunk.name == name ? chunk.bytes : "";
    return all;
}

// The file with more chunks in front of the first one of a name.
inline std::string with_chunks(std::string file, const std::string& before,
                               const std::string& chunks) {
    return file.insert(file.find(before) - 4, chunks);
}

}  // namespace zqtest
