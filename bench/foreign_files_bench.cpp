// JPEG and BMP files against the least that can be done: a bare loop over libjpeg with the same
// settings, and a plain loop over lines and their pixels. 12 million pixels.
// Run: zqvis_bench --benchmark_filter=File
#include <benchmark/benchmark.h>
#include <zqvissvc/files.h>

#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

// After <cstdio>, which it needs.
#include <jpeglib.h>

#include "file.h"
#include "image.h"
#include "paired.h"
#include "photograph.h"

namespace {

using zqbench::check;
using zqbench::File;
using zqbench::Image;
using zqbench::open;

constexpr int32_t kWidth = 4000, kHeight = 3000;

struct Paths {
    std::string ours = name("ours"), bare = name("bare");
    ~Paths() {
        std::filesystem::remove(ours);
        std::filesystem::remove(bare);
    }
    static std::string name(const char* which) {
        return (std::filesystem::temp_directory_path() / "zqbench-foreign-").string() + which;
    }
};

void paint(const Image& image) {
    uint32_t random = 1;
    for (int32_t y = 0; y < kHeight; ++y) {
        const int channels = image.handle()->type == ZQ_TYPE_U8 ? 1 : 4;
        zqbench::paint_row(image.row(y), kWidth, y, channels, 1, random);
    }
}

void write_file(const std::string& path, const Image& image, int32_t type) {
    check(ZqWriteFileByCode(path.c_str(), image.handle(), nullptr, type, nullptr) == 0, "write");
}

void read_file(const std::string& path, const Image& image) {
    check(ZqReadFile(image.handle(), path.c_str(), nullptr, nullptr, nullptr, nullptr) == 0,
          "read");
}

void bare_jpeg_write(const std::string& path, const Image& image) {
    const File file = open(path, "wb");
    jpeg_compress_struct jpeg{};
    jpeg_error_mgr errors;
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_compress(&jpeg);
    jpeg_stdio_dest(&jpeg, file.get());
    const bool grey = image.handle()->type == ZQ_TYPE_U8;
    jpeg.image_width = kWidth;
    jpeg.image_height = kHeight;
    jpeg.input_components = grey ? 1 : 4;
    jpeg.in_color_space = grey ? JCS_GRAYSCALE : JCS_EXT_BGRX;
    jpeg_set_defaults(&jpeg);
    jpeg_start_compress(&jpeg, TRUE);
    while (jpeg.next_scanline < jpeg.image_height) {
        JSAMPROW row = image.row(static_cast<int32_t>(jpeg.next_scanline));
        jpeg_write_scanlines(&jpeg, &row, 1);
    }
    jpeg_finish_compress(&jpeg);
    jpeg_destroy_compress(&jpeg);
}

// Into rows of the same layout, which are made anew as an image's are.
void bare_jpeg_read(const std::string& path) {
    const File file = open(path, "rb");
    jpeg_decompress_struct jpeg{};
    jpeg_error_mgr errors;
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_decompress(&jpeg);
    jpeg_stdio_src(&jpeg, file.get());
    jpeg_read_header(&jpeg, TRUE);
    if (jpeg.num_components == 3) jpeg.out_color_space = JCS_EXT_BGRX;
    jpeg_start_decompress(&jpeg);
    const size_t stride = size_t{kWidth} * static_cast<size_t>(jpeg.output_components);
    const std::unique_ptr<uint8_t[]> pixels(new uint8_t[stride * kHeight]);
    while (jpeg.output_scanline < jpeg.output_height) {
        JSAMPROW row = pixels.get() + jpeg.output_scanline * stride;
        jpeg_read_scanlines(&jpeg, &row, 1);
    }
    jpeg_finish_decompress(&jpeg);
    jpeg_destroy_decompress(&jpeg);
}

constexpr long kBmpColours = 54, kBmpGreys = 54 + 1024;  // where the pixels begin

void bare_bmp_write(const std::string& path, const Image& image) {
    const File file = open(path, "wb");
    const bool grey = image.handle()->type == ZQ_TYPE_U8;
    std::vector<uint8_t> line((grey ? 1 : 3) * size_t{kWidth});
    check(std::fseek(file.get(), grey ? kBmpGreys : kBmpColours, SEEK_SET) == 0, "fseek");
    for (int32_t y = kHeight; y-- > 0;) {
        const uint8_t* row = image.row(y);
        for (size_t x = 0; !grey && x < kWidth; ++x) {
            for (size_t i = 0; i < 3; ++i) line[3 * x + i] = row[4 * x + i];
        }
        const void* bytes = grey ? row : line.data();
        check(std::fwrite(bytes, 1, line.size(), file.get()) == line.size(), "fwrite");
    }
}

void bare_bmp_read(const std::string& path, const Image& image) {
    const File file = open(path, "rb");
    const bool grey = image.handle()->type == ZQ_TYPE_U8;
    std::vector<uint8_t> line((grey ? 1 : 3) * size_t{kWidth});
    check(std::fseek(file.get(), grey ? kBmpGreys : kBmpColours, SEEK_SET) == 0, "fseek");
    for (int32_t y = kHeight; y-- > 0;) {
        uint8_t* row = image.row(y);
        void* bytes = grey ? row : line.data();
        check(std::fread(bytes, 1, line.size(), file.get()) == line.size(), "fread");
        for (size_t x = 0; !grey && x < kWidth; ++x) {
            for (size_t i = 0; i < 3; ++i) row[4 * x + i] = line[3 * x + i];
            row[4 * x + 3] = 0;
        }
    }
}

void FileJpegWrite(benchmark::State& state) {
    const Image image(static_cast<int32_t>(state.range(0)), kWidth, kHeight);
    paint(image);
    const Paths paths;
    zqbench::run_paired(
        state, [&] { write_file(paths.ours, image, 3); },
        [&] { bare_jpeg_write(paths.bare, image); });
    check(std::filesystem::file_size(paths.ours) == std::filesystem::file_size(paths.bare), "same");
}

void FileJpegRead(benchmark::State& state) {
    const auto type = static_cast<int32_t>(state.range(0));
    const Image image(type, kWidth, kHeight);
    paint(image);
    const Paths paths;
    write_file(paths.ours, image, 3);
    zqbench::run_paired(
        state, [&] { read_file(paths.ours, Image(type)); }, [&] { bare_jpeg_read(paths.ours); });
}

void FileBmpWrite(benchmark::State& state) {
    const Image image(static_cast<int32_t>(state.range(0)), kWidth, kHeight);
    paint(image);
    const Paths paths;
    zqbench::run_paired(
        state, [&] { write_file(paths.ours, image, 0); },
        [&] { bare_bmp_write(paths.bare, image); });
    check(std::filesystem::file_size(paths.ours) == std::filesystem::file_size(paths.bare), "same");
}

void FileBmpRead(benchmark::State& state) {
    const auto type = static_cast<int32_t>(state.range(0));
    const Image image(type, kWidth, kHeight), target(type, kWidth, kHeight),
        plain(type, kWidth, kHeight);
    paint(image);
    const Paths paths;
    write_file(paths.ours, image, 0);
    zqbench::run_paired(
        state, [&] { read_file(paths.ours, target); }, [&] { bare_bmp_read(paths.ours, plain); });
    for (int32_t y = 0; y < kHeight; ++y) {
        check(std::memcmp(image.row(y), target.row(y), image.row_bytes()) == 0, "same pixels");
    }
}

BENCHMARK(FileJpegWrite)->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->UseManualTime()->Iterations(9);
BENCHMARK(FileJpegRead)->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->UseManualTime()->Iterations(9);
BENCHMARK(FileBmpWrite)->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->UseManualTime()->Iterations(15);
BENCHMARK(FileBmpRead)->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->UseManualTime()->Iterations(15);

}  // namespace
