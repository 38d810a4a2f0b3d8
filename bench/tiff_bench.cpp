// TIFF beside a bare loop over libtiff with the same settings, and beside OpenCV.
// Run: zqvis_bench --benchmark_filter=FileTiff
#include <tiff.h>

#include "bare_tiff.h"
#include "photo_file.h"

namespace {

using zqbench::Image;

// The third option word, the tag, and the settings of OpenCV's file.
struct Codec {
    int32_t word;
    uint16_t tag;
    const char* settings;
};

constexpr Codec kNone{0, COMPRESSION_NONE, "TIFF"}, kLzw{0x10005, COMPRESSION_LZW, "TIFF LZW"},
    kDeflate{5, COMPRESSION_DEFLATE, "TIFF deflate"},
    kPackBits{4, COMPRESSION_PACKBITS, "TIFF PackBits"}, kJpegStrips{2, COMPRESSION_JPEG, nullptr};

// As many rows as our writer takes for a strip of about 64 KiB.
uint32_t strip_rows(int32_t type, const Codec& codec) {
    const uint32_t samples = type == ZQ_TYPE_RGB ? 3 : type == ZQ_TYPE_I16 ? 2 : 1;
    const uint32_t rows = (uint32_t{64} << 10) / (samples * zqbench::kPhotoWidth);
    return codec.tag == COMPRESSION_JPEG ? (rows + 7) / 8 * 8 : rows;
}

zqbench::Job opencv_write(const std::string& path, const Image& image, const Codec& codec) {
    return codec.settings == nullptr
               ? zqbench::Job()
               : zqbench::opencv_write(path, zqbench::pixels_of(image), codec.settings);
}

void FileTiffWrite(benchmark::State& state, const Codec& codec) {
    const auto type = static_cast<int32_t>(state.range(0));
    const zqbench::Photograph image(type);
    const zqbench::FilePaths paths(".tif");
    zqbench::compare_write(
        state, paths.ours,
        [&] {
            zqbench::write_file(paths.ours, image, zqbench::kTiff, {1, {0, 0, codec.word}});
        },
        {{"libtiff", paths.bare,
          [&] { zqbench::bare_tiff_write(paths.bare, image, codec.tag, strip_rows(type, codec)); }},
         {"OpenCV", paths.opencv, opencv_write(paths.opencv, image, codec)}});
}

void FileTiffRead(benchmark::State& state, const Codec& codec, bool one_strip) {
    const auto type = static_cast<int32_t>(state.range(0));
    const zqbench::Photograph image(type);
    const Image copy(type);
    const zqbench::FilePaths paths(".tif");
    zqbench::bare_tiff_write(paths.bare, image, codec.tag,
                             one_strip ? zqbench::kPhotoHeight : strip_rows(type, codec));
    zqbench::compare_read(state, paths.bare, type,
                          {{"libtiff", [&] { zqbench::bare_tiff_read(paths.bare); }},
                           {"OpenCV", zqbench::opencv_read(paths.bare)}});
    zqbench::read_file(paths.bare, copy);
    zqbench::check_same(copy, zqbench::bare_tiff_read(paths.bare));
    if (codec.tag != COMPRESSION_JPEG) zqbench::check_same(copy, image);
}

void types(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_I16)->Arg(ZQ_TYPE_RGB)->Apply(zqbench::timed_file);
}

void types_of_jpeg(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->Apply(zqbench::timed_file);
}

BENCHMARK_CAPTURE(FileTiffWrite, none, kNone)->Apply(types);
BENCHMARK_CAPTURE(FileTiffWrite, lzw, kLzw)->Apply(types);
BENCHMARK_CAPTURE(FileTiffWrite, deflate, kDeflate)->Apply(types);
BENCHMARK_CAPTURE(FileTiffWrite, packbits, kPackBits)->Apply(types);
BENCHMARK_CAPTURE(FileTiffWrite, jpeg, kJpegStrips)->Apply(types_of_jpeg);
BENCHMARK_CAPTURE(FileTiffRead, none, kNone, false)->Apply(types);
BENCHMARK_CAPTURE(FileTiffRead, lzw, kLzw, false)->Apply(types);
BENCHMARK_CAPTURE(FileTiffRead, deflate, kDeflate, false)->Apply(types);
BENCHMARK_CAPTURE(FileTiffRead, packbits, kPackBits, false)->Apply(types);
BENCHMARK_CAPTURE(FileTiffRead, jpeg, kJpegStrips, false)->Apply(types_of_jpeg);
BENCHMARK_CAPTURE(FileTiffRead, none_in_one_strip, kNone, true)->Apply(types);
BENCHMARK_CAPTURE(FileTiffRead, lzw_in_one_strip, kLzw, true)->Apply(types);
BENCHMARK_CAPTURE(FileTiffRead, deflate_in_one_strip, kDeflate, true)->Apply(types);

}  // namespace
