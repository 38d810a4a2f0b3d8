// JPEG 2000 files against the least that can be done: OpenJPEG with the same settings and its own
// file streams, and a plain loop between its samples and pixels. 12 million pixels.
// Run: zqvis_bench --benchmark_filter=FileJpeg2000
#include <benchmark/benchmark.h>
#include <openjpeg.h>
#include <zqvissvc/files.h>

#include <array>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>

#include "image.h"
#include "paired.h"
#include "photograph.h"

namespace {

using zqbench::check;
using zqbench::Image;

constexpr int32_t kWidth = 4000, kHeight = 3000;
constexpr int32_t kLossless = 1000;

struct Paths {
    std::string ours = name("ours.j2k"), bare = name("bare.j2k");
    ~Paths() {
        std::filesystem::remove(ours);
        std::filesystem::remove(bare);
    }
    static std::string name(const char* which) {
        return (std::filesystem::temp_directory_path() / "zqbench-jpeg2000-").string() + which;
    }
};

void paint(const Image& image) {
    uint32_t random = 1;
    for (int32_t y = 0; y < kHeight; ++y) {
        const int channels = image.handle()->type == ZQ_TYPE_U8 ? 1 : 4;
        zqbench::paint_row(image.row(y), kWidth, y, channels, 1, random);
    }
}

void write_file(const std::string& path, const Image& image, int32_t quality) {
    const ZqWriteOptions options = {1, {quality, 0, 0}};
    check(ZqWriteFileByCode(path.c_str(), image.handle(), &options, 7, nullptr) == 0, "write");
}

void bare_write(const std::string& path, const Image& image, int32_t quality) {
    const uint32_t channels = image.handle()->type == ZQ_TYPE_U8 ? 1 : 3;
    std::array<opj_image_cmptparm_t, 3> shapes{};
    for (opj_image_cmptparm_t& shape : shapes) {
        shape.dx = shape.dy = 1;
        shape.w = kWidth;
        shape.h = kHeight;
        shape.prec = 8;
    }
    opj_image_t* samples = opj_image_create(channels, shapes.data(), OPJ_CLRSPC_UNSPECIFIED);
    check(samples != nullptr, "samples");
    samples->x1 = kWidth;
    samples->y1 = kHeight;
    for (int32_t y = 0; y < kHeight; ++y) {
        const uint8_t* row = image.row(y);
        for (uint32_t c = 0; c < channels; ++c) {
            OPJ_INT32* to = samples->comps[c].data + size_t{kWidth} * static_cast<size_t>(y);
            for (size_t x = 0; x < kWidth; ++x) to[x] = channels == 1 ? row[x] : row[4 * x + 2 - c];
        }
    }
    opj_cparameters_t parameters;
    opj_set_default_encoder_parameters(&parameters);
    parameters.tcp_numlayers = 1;
    parameters.tcp_mct = channels == 3 ? 1 : 0;
    parameters.irreversible = quality == kLossless ? 0 : 1;
    parameters.cp_disto_alloc = quality == kLossless ? 1 : 0;
    parameters.cp_fixed_quality = quality == kLossless ? 0 : 1;
    parameters.tcp_distoratio[0] = 25.0F + static_cast<float>(quality) / 50.0F;
    if (quality == kLossless) parameters.tcp_distoratio[0] = 0;
    static char comment[] = "Zorvane Kemo";
    parameters.cp_comment = comment;
    opj_stream_t* stream = opj_stream_create_default_file_stream(path.c_str(), OPJ_FALSE);
    opj_codec_t* codec = opj_create_compress(OPJ_CODEC_J2K);
    check(opj_setup_encoder(codec, &parameters, samples) == OPJ_TRUE &&
              opj_start_compress(codec, samples, stream) == OPJ_TRUE &&
              opj_encode(codec, stream) == OPJ_TRUE && opj_end_compress(codec, stream) == OPJ_TRUE,
          "encode");
    opj_stream_destroy(stream);
    opj_destroy_codec(codec);
    opj_image_destroy(samples);
}

// Into rows of the same layout, which are made anew as an image's are.
void bare_read(const std::string& path) {
    opj_stream_t* stream = opj_stream_create_default_file_stream(path.c_str(), OPJ_TRUE);
    opj_codec_t* codec = opj_create_decompress(OPJ_CODEC_J2K);
    opj_dparameters_t parameters;
    opj_set_default_decoder_parameters(&parameters);
    opj_image_t* samples = nullptr;
    check(opj_setup_decoder(codec, &parameters) == OPJ_TRUE &&
              opj_read_header(stream, codec, &samples) == OPJ_TRUE &&
              opj_decode(codec, stream, samples) == OPJ_TRUE &&
              opj_end_decompress(codec, stream) == OPJ_TRUE,
          "decode");
    opj_stream_destroy(stream);
    opj_destroy_codec(codec);
    const size_t channels = samples->numcomps == 1 ? 1 : 4, count = size_t{kWidth} * kHeight;
    const std::unique_ptr<uint8_t[]> pixels(new uint8_t[count * channels]);
    if (channels == 1) {
        for (size_t i = 0; i < count; ++i)
            pixels[i] = static_cast<uint8_t>(samples->comps[0].data[i]);
    } else {
        for (size_t i = 0; i < count; ++i) {
            for (size_t c = 0; c < 3; ++c)
                pixels[4 * i + 2 - c] = static_cast<uint8_t>(samples->comps[c].data[i]);
            pixels[4 * i + 3] = 0;
        }
    }
    benchmark::DoNotOptimize(pixels.get());
    opj_image_destroy(samples);
}

void FileJpeg2000Write(benchmark::State& state) {
    const Image image(static_cast<int32_t>(state.range(0)), kWidth, kHeight);
    const auto quality = static_cast<int32_t>(state.range(1));
    paint(image);
    const Paths paths;
    zqbench::run_paired(
        state, [&] { write_file(paths.ours, image, quality); },
        [&] { bare_write(paths.bare, image, quality); });
    check(std::filesystem::file_size(paths.ours) == std::filesystem::file_size(paths.bare), "same");
}

void FileJpeg2000Read(benchmark::State& state) {
    const auto type = static_cast<int32_t>(state.range(0));
    const Image image(type, kWidth, kHeight);
    paint(image);
    const Paths paths;
    write_file(paths.ours, image, static_cast<int32_t>(state.range(1)));
    zqbench::run_paired(
        state,
        [&] {
            const Image target(type);
            check(ZqReadFile(target.handle(), paths.ours.c_str(), nullptr, nullptr, nullptr,
                             nullptr) == 0,
                  "read");
        },
        [&] { bare_read(paths.ours); });
}

void cases(benchmark::internal::Benchmark* benchmark) {
    for (const int32_t type : {ZQ_TYPE_U8, ZQ_TYPE_RGB}) {
        for (const int32_t quality : {750, kLossless}) benchmark->Args({type, quality});
    }
    benchmark->UseManualTime()->Iterations(3);
}

BENCHMARK(FileJpeg2000Write)->Apply(cases);
BENCHMARK(FileJpeg2000Read)->Apply(cases);

}  // namespace
