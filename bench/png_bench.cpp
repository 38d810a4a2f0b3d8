// PNG beside a bare loop over libpng with the same settings, in time and size, and the memory that
// both take beside the picture. Pictures are raw samples of 4000 x 3000 pixels from the files that
// the environment names (ZQBENCH_PNG_U8, _I16, _RGB, _RGBU64: as images hold them), or painted.
// Run: zqvis_bench --benchmark_filter=Png
#include <benchmark/benchmark.h>
#include <png.h>
#include <zqvissvc/files.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include "file.h"
#include "image.h"
#include "paired.h"
#include "peak_memory.h"
#include "photograph.h"

namespace {

using zqbench::check;
using zqbench::File;
using zqbench::Image;
using zqbench::open;

constexpr int32_t kWidth = 4000, kHeight = 3000;

struct Kind {
    int32_t type;
    int colour_type, depth;
    const char* samples;  // names a file
};

constexpr Kind kKinds[] = {{ZQ_TYPE_U8, PNG_COLOR_TYPE_GRAY, 8, "ZQBENCH_PNG_U8"},
                           {ZQ_TYPE_I16, PNG_COLOR_TYPE_GRAY, 16, "ZQBENCH_PNG_I16"},
                           {ZQ_TYPE_RGB, PNG_COLOR_TYPE_RGB, 8, "ZQBENCH_PNG_RGB"},
                           {ZQ_TYPE_RGBU64, PNG_COLOR_TYPE_RGB, 16, "ZQBENCH_PNG_RGBU64"}};

const Kind& kind_of(const benchmark::State& state) {
    return kKinds[state.range(0)];
}

void paint(const Image& image, const Kind& kind) {
    if (const char* path = std::getenv(kind.samples)) {
        const File file = open(path, "rb");
        for (int32_t y = 0; y < kHeight; ++y) {
            const size_t bytes = image.row_bytes();
            check(std::fread(image.row(y), 1, bytes, file.get()) == bytes, "samples");
        }
        return;
    }
    uint32_t random = 1;
    const int channels = kind.colour_type == PNG_COLOR_TYPE_GRAY ? 1 : 4;
    for (int32_t y = 0; y < kHeight; ++y) {
        if (kind.depth == 8) {
            zqbench::paint_row(image.row(y), kWidth, y, channels, 1, random);
        } else {
            zqbench::paint_row(reinterpret_cast<uint16_t*>(image.row(y)), kWidth, y, channels, 13,
                               random);
        }
    }
}

struct Paths {
    std::string ours = name("ours.png"), bare = name("bare.png");
    ~Paths() {
        std::filesystem::remove(ours);
        std::filesystem::remove(bare);
    }
    static std::string name(const char* which) {
        return (std::filesystem::temp_directory_path() / "zqbench-").string() + which;
    }
};

void write_file(const std::string& path, const Image& image, int32_t setting) {
    const ZqWriteOptions options = {1, {setting, 0, 0}};
    check(ZqWriteFileByCode(path.c_str(), image.handle(), &options, 4, nullptr) == 0, "write");
}

void read_file(const std::string& path, const Image& image) {
    check(ZqReadFile(image.handle(), path.c_str(), nullptr, nullptr, nullptr, nullptr) == 0,
          "read");
}

void bare_write(const std::string& path, const Image& image, const Kind& kind, int level,
                int filters) {
    const File file = open(path, "wb");
    png_structp png = png_create_write_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_set_IHDR(png, info, kWidth, kHeight, kind.depth, kind.colour_type, PNG_INTERLACE_NONE,
                 PNG_COMPRESSION_TYPE_DEFAULT, PNG_FILTER_TYPE_DEFAULT);
    png_set_compression_level(png, level);
    png_set_filter(png, PNG_FILTER_TYPE_BASE, filters);
    png_write_info(png, info);
    if (kind.depth == 16) png_set_swap(png);
    if (kind.colour_type == PNG_COLOR_TYPE_RGB) {
        png_set_bgr(png);
        png_set_filler(png, 0, PNG_FILLER_AFTER);
    }
    for (int32_t y = 0; y < kHeight; ++y) png_write_row(png, image.row(y));
    png_write_end(png, info);
    png_destroy_write_struct(&png, &info);
}

// Into rows of the same layout, which are made anew as an image's are.
void bare_read(const std::string& path) {
    const File file = open(path, "rb");
    png_structp png = png_create_read_struct(PNG_LIBPNG_VER_STRING, nullptr, nullptr, nullptr);
    png_infop info = png_create_info_struct(png);
    png_init_io(png, file.get());
    png_read_info(png, info);
    if (png_get_bit_depth(png, info) == 16) png_set_swap(png);
    if (png_get_color_type(png, info) == PNG_COLOR_TYPE_RGB) {
        png_set_filler(png, 0, PNG_FILLER_AFTER);
        png_set_bgr(png);
    }
    png_read_update_info(png, info);
    const size_t stride = png_get_rowbytes(png, info);
    const std::unique_ptr<uint8_t[]> pixels(new uint8_t[stride * kHeight]);
    for (int32_t y = 0; y < kHeight; ++y) {
        png_read_row(png, pixels.get() + stride * static_cast<size_t>(y), nullptr);
    }
    png_read_end(png, nullptr);
    png_destroy_read_struct(&png, &info, nullptr);
}

// Strengths as in the compression setting 100 - s: level s / 10, and one filter or all.
int filters_of(int strength) {
    constexpr int kFilters[] = {PNG_FILTER_NONE, PNG_FILTER_SUB, PNG_FILTER_UP, PNG_FILTER_AVG,
                                PNG_FILTER_PAETH};
    return strength % 10 < 5 ? kFilters[strength % 10] : PNG_ALL_FILTERS;
}

double megabytes(size_t bytes) {
    return static_cast<double>(bytes) / (1 << 20);
}

void PngWrite(benchmark::State& state) {
    const Kind& kind = kind_of(state);
    const auto strength = static_cast<int>(state.range(1));
    const Image image(kind.type, kWidth, kHeight);
    paint(image, kind);
    const Paths paths;
    const auto ours = [&] { write_file(paths.ours, image, 100 - strength); };
    const size_t growth = zqbench::peak_growth(ours);
    zqbench::run_paired(state, ours, [&] {
        bare_write(paths.bare, image, kind, strength / 10, filters_of(strength));
    });
    const auto bytes = static_cast<double>(std::filesystem::file_size(paths.ours));
    state.counters["size_ratio"] =
        bytes / static_cast<double>(std::filesystem::file_size(paths.bare));
    state.counters["MiB_beside"] = megabytes(growth);
}

void PngRead(benchmark::State& state) {
    const Kind& kind = kind_of(state);
    const Image image(kind.type, kWidth, kHeight), target(kind.type, kWidth, kHeight);
    paint(image, kind);
    const Paths paths;
    bare_write(paths.bare, image, kind, 6, PNG_ALL_FILTERS);
    const size_t growth = zqbench::peak_growth([&] { read_file(paths.bare, Image(kind.type)); });
    zqbench::run_paired(
        state, [&] { read_file(paths.bare, Image(kind.type)); }, [&] { bare_read(paths.bare); });
    // The image made by the read is not beside the picture.
    state.counters["MiB_beside"] =
        megabytes(growth) - megabytes(image.row_bytes() * size_t{kHeight});
    read_file(paths.bare, target);
    for (int32_t y = 0; y < kHeight; ++y) {
        check(std::memcmp(image.row(y), target.row(y), image.row_bytes()) == 0, "same pixels");
    }
}

BENCHMARK(PngWrite)
    ->ArgNames({"kind", "strength"})
    ->ArgsProduct({{0, 1, 2, 3}, {0, 11, 24, 30, 46, 60, 66, 96}})
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(1);
BENCHMARK(PngRead)
    ->ArgName("kind")
    ->DenseRange(0, 3)
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(5);

}  // namespace
