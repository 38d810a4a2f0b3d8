// JPEG 2000 files beside the least that can be done: OpenJPEG with the same settings and its own
// file streams, and a plain loop between its samples and pixels; and beside OpenCV.
// Run: zqvis_bench --benchmark_filter=FileJpeg2000
#include <openjpeg.h>

#include <array>
#include <string>

#include "photo_file.h"

namespace {

using zqbench::check;
using zqbench::Image;
using zqbench::kPhotoHeight;
using zqbench::kPhotoWidth;

constexpr int32_t kLossless = 1000;

void write_file(const std::string& path, const Image& image, int32_t quality) {
    zqbench::write_file(path, image, zqbench::kJpeg2000, {1, {quality, 0, 0}});
}

void bare_write(const std::string& path, const Image& image, int32_t quality) {
    const uint32_t channels = image.handle()->type == ZQ_TYPE_U8 ? 1 : 3;
    std::array<opj_image_cmptparm_t, 3> shapes{};
    for (opj_image_cmptparm_t& shape : shapes) {
        shape.dx = shape.dy = 1;
        shape.w = kPhotoWidth;
        shape.h = kPhotoHeight;
        shape.prec = 8;
    }
    opj_image_t* samples = opj_image_create(channels, shapes.data(), OPJ_CLRSPC_UNSPECIFIED);
    check(samples != nullptr, "samples");
    samples->x1 = kPhotoWidth;
    samples->y1 = kPhotoHeight;
    for (int32_t y = 0; y < kPhotoHeight; ++y) {
        const uint8_t* row = image.row(y);
        for (uint32_t c = 0; c < channels; ++c) {
            OPJ_INT32* to = samples->comps[c].data + size_t{kPhotoWidth} * static_cast<size_t>(y);
            for (size_t x = 0; x < kPhotoWidth; ++x)
                to[x] = channels == 1 ? row[x] : row[4 * x + 2 - c];
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

zqbench::Rows bare_read(const std::string& path) {
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
    const size_t channels = samples->numcomps == 1 ? 1 : 4;
    zqbench::Rows picture(channels * kPhotoWidth, kPhotoHeight);
    const OPJ_INT32* planes[3];
    for (size_t c = 0; c < 3; ++c) planes[c] = samples->comps[channels == 1 ? 0 : c].data;
    for (size_t y = 0; y < size_t{kPhotoHeight}; ++y) {
        uint8_t* const row = picture.row(y);
        const size_t start = y * kPhotoWidth;
        for (size_t x = 0; x < size_t{kPhotoWidth}; ++x) {
            if (channels == 1) {
                row[x] = static_cast<uint8_t>(planes[0][start + x]);
                continue;
            }
            for (size_t c = 0; c < 3; ++c)
                row[4 * x + 2 - c] = static_cast<uint8_t>(planes[c][start + x]);
            row[4 * x + 3] = 0;
        }
    }
    opj_image_destroy(samples);
    return picture;
}

// Lossy files of OpenCV's are asked for by another measure.
zqbench::Job opencv_write(const std::string& path, const Image& image, int32_t quality) {
    if (quality != kLossless) return {};
    return zqbench::opencv_write(path, zqbench::pixels_of(image), "JPEG 2000");
}

void FileJpeg2000Write(benchmark::State& state) {
    const zqbench::Photograph image(static_cast<int32_t>(state.range(0)));
    const auto quality = static_cast<int32_t>(state.range(1));
    const zqbench::FilePaths paths(".j2k"), boxed(".jp2");
    zqbench::compare_write(
        state, paths.ours, [&] { write_file(paths.ours, image, quality); },
        {{"OpenJPEG", paths.bare, [&] { bare_write(paths.bare, image, quality); }},
         {"OpenCV", boxed.opencv, opencv_write(boxed.opencv, image, quality)}});
    check(state.counters["size_ratio"] == 1.0, "same size");
}

void FileJpeg2000Read(benchmark::State& state) {
    const zqbench::Photograph image(static_cast<int32_t>(state.range(0)));
    const Image copy(image.type());
    const zqbench::FilePaths paths(".jp2"), bare(".j2k");
    write_file(paths.ours, image, static_cast<int32_t>(state.range(1)));
    write_file(bare.ours, image, static_cast<int32_t>(state.range(1)));
    zqbench::compare_read(state, bare.ours, image.type(),
                          {{"OpenJPEG", [&] { bare_read(bare.ours); }},
                           {"OpenCV", zqbench::opencv_read(paths.ours)}});
    zqbench::read_file(bare.ours, copy);
    zqbench::check_same(copy, bare_read(bare.ours));
}

void cases(benchmark::internal::Benchmark* benchmark) {
    for (const int32_t type : {ZQ_TYPE_U8, ZQ_TYPE_RGB}) {
        for (const int32_t quality : {750, kLossless}) benchmark->Args({type, quality});
    }
    benchmark->Apply(zqbench::timed_file)->Iterations(3);
}

BENCHMARK(FileJpeg2000Write)->Apply(cases);
BENCHMARK(FileJpeg2000Read)->Apply(cases);

}  // namespace
