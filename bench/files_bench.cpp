// Image files against the least that can be done: PNG beside a bare loop over libpng with the same
// settings, AIPD beside one fwrite or fread of the same bytes. A picture of 12 million pixels.
// Run: zqvis_bench --benchmark_filter=File
#include <benchmark/benchmark.h>
#include <png.h>
#include <zqvissvc/files.h>
#include <zqvissvc/image.h>

#include <cmath>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>

#include "file.h"
#include "image.h"
#include "paired.h"

namespace {

using zqbench::check;
using zqbench::File;
using zqbench::Image;
using zqbench::open;

constexpr int32_t kWidth = 4000;
constexpr int32_t kHeight = 3000;
constexpr int kLevel = 6;

std::string temporary(const char* name) {
    return (std::filesystem::temp_directory_path() / name).string();
}

// Like a photograph: soft shapes and the noise of a sensor.
void paint(const Image& image) {
    uint32_t random = 1;
    for (int32_t y = 0; y < kHeight; ++y) {
        uint8_t* pixel = image.row(y);
        for (int32_t x = 0; x < kWidth; ++x) {
            const double shade =
                110 + 50 * std::sin(x * 0.004) + 40 * std::cos(y * 0.003 + x * 0.01);
            for (int channel = 0; channel < 3; ++channel) {
                random = random * 1664525U + 1013904223U;
                *pixel++ = static_cast<uint8_t>(shade + channel * 9 + (random >> 29));
            }
            *pixel++ = 0;
        }
    }
}

void bare_png_write(const std::string& path, const Image& image) {
    const File file = open(path, "wb");
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_set_IHDR(png, info, kWidth, kHeight, 8, PNG_COLOR_TYPE_RGB, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    png_set_compression_level(png, kLevel);
    png_set_filter(png, PNG_FILTER_TYPE_BASE, PNG_ALL_FILTERS);
    png_write_info(png, info);
    png_set_bgr(png);
    png_set_filler(png, 0, PNG_FILLER_AFTER);
    for (int32_t y = 0; y < kHeight; ++y) png_write_row(png, image.row(y));
    png_write_end(png, info);
    png_destroy_write_struct(&png, &info);
}

// Into rows of the same layout, which are made anew as an image's are.
void bare_png_read(const std::string& path) {
    const File file = open(path, "rb");
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_read_info(png, info);
    png_set_filler(png, 0, PNG_FILLER_AFTER);
    png_set_bgr(png);
    png_read_update_info(png, info);
    const size_t stride = png_get_rowbytes(png, info);
    const std::unique_ptr<uint8_t[]> pixels(new uint8_t[stride * kHeight]);
    for (int32_t y = 0; y < kHeight; ++y) {
        png_read_row(png, pixels.get() + stride * static_cast<size_t>(y), nullptr);
    }
    png_read_end(png, nullptr);
    png_destroy_read_struct(&png, &info, nullptr);
}

bool same_pixels(const Image& a, const Image& b) {
    for (int32_t y = 0; y < kHeight; ++y) {
        if (std::memcmp(a.row(y), b.row(y), size_t{4} * kWidth) != 0) return false;
    }
    return true;
}

void write_file(const std::string& path, const Image& image, const char* type) {
    check(ZqWriteFileByName(path.c_str(), image.handle(), nullptr, type, nullptr) == 0, "write");
}

void read_file(const std::string& path, const Image& image) {
    check(ZqReadFile(image.handle(), path.c_str(), nullptr, nullptr, nullptr, nullptr) == 0,
          "read");
}

void FilePngWrite(benchmark::State& state) {
    const Image image(ZQ_TYPE_RGB, kWidth, kHeight);
    paint(image);
    const std::string ours = temporary("zqbench-ours.png"), bare = temporary("zqbench-bare.png");
    zqbench::run_paired(
        state, [&] { write_file(ours, image, "PNG"); }, [&] { bare_png_write(bare, image); });
    check(std::filesystem::file_size(ours) <= std::filesystem::file_size(bare), "comparison");
    std::filesystem::remove(ours);
    std::filesystem::remove(bare);
}
BENCHMARK(FilePngWrite)->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(7);

void FilePngRead(benchmark::State& state) {
    const Image image(ZQ_TYPE_RGB, kWidth, kHeight), target(ZQ_TYPE_RGB);
    paint(image);
    const std::string path = temporary("zqbench.png");
    write_file(path, image, "PNG");
    const bool fresh = state.range(0) == 0;
    zqbench::run_paired(
        state,
        [&] {
            if (fresh) {
                read_file(path, Image(ZQ_TYPE_RGB));
            } else {
                read_file(path, target);
            }
        },
        [&] { bare_png_read(path); });
    read_file(path, target);
    check(same_pixels(image, target), "comparison");
    std::filesystem::remove(path);
}
// 0: into a new image; 1: into one that already has the shape and keeps its addresses.
BENCHMARK(FilePngRead)
    ->Arg(0)
    ->Arg(1)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(9);

void FileAipdWrite(benchmark::State& state) {
    const auto type = static_cast<int32_t>(state.range(0));
    const Image image(type, kWidth, kHeight);
    const std::string ours = temporary("zqbench-ours.aipd"), plain = temporary("zqbench.bytes");
    write_file(ours, image, "AIPD");
    const auto size = static_cast<size_t>(std::filesystem::file_size(ours));
    const std::unique_ptr<uint8_t[]> bytes(new uint8_t[size]());
    zqbench::run_paired(
        state, [&] { write_file(ours, image, "AIPD"); },
        [&] {
            const File file = open(plain, "wb");
            check(std::fwrite(bytes.get(), 1, size, file.get()) == size, "fwrite");
        });
    state.counters["bytes"] = static_cast<double>(size);
    std::filesystem::remove(ours);
    std::filesystem::remove(plain);
}
BENCHMARK(FileAipdWrite)
    ->Arg(ZQ_TYPE_U8)
    ->Arg(ZQ_TYPE_RGB)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(31);

void FileAipdRead(benchmark::State& state) {
    const auto type = static_cast<int32_t>(state.range(0));
    const Image image(type, kWidth, kHeight);
    const std::string path = temporary("zqbench.aipd");
    write_file(path, image, "AIPD");
    const auto size = static_cast<size_t>(std::filesystem::file_size(path));
    const std::unique_ptr<uint8_t[]> bytes(new uint8_t[size]());
    zqbench::run_paired(
        state, [&] { read_file(path, image); },
        [&] {
            const File file = open(path, "rb");
            check(std::fread(bytes.get(), 1, size, file.get()) == size, "fread");
        });
    state.counters["bytes"] = static_cast<double>(size);
    std::filesystem::remove(path);
}
BENCHMARK(FileAipdRead)
    ->Arg(ZQ_TYPE_U8)
    ->Arg(ZQ_TYPE_RGB)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(31);

}  // namespace
