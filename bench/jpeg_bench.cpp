// JPEG files beside a bare loop over libjpeg with the same settings, and beside OpenCV.
// Run: zqvis_bench --benchmark_filter=FileJpeg/
#include "bare_jpeg.h"
#include "photo_file.h"

namespace {

zqbench::JpegRows rows_of(const zqbench::Image& image) {
    const zqbench::Pixels pixels = zqbench::pixels_of(image);
    return {image.row(0), static_cast<std::ptrdiff_t>(pixels.stride),
            static_cast<uint32_t>(pixels.width), static_cast<uint32_t>(pixels.height),
            pixels.colour};
}

// What libjpeg leaves in the fourth byte of a pixel.
void clear_fillers(const zqbench::Rows& rows) {
    for (size_t y = 0; y < size_t{zqbench::kPhotoHeight}; ++y) {
        for (size_t i = 3; i < rows.row_bytes; i += 4) rows.row(y)[i] = 0;
    }
}

void FileJpegWrite(benchmark::State& state) {
    const zqbench::Photograph image(static_cast<int32_t>(state.range(0)));
    const zqbench::FilePaths paths(".jpg");
    zqbench::compare_write(
        state, paths.ours, [&] { zqbench::write_file(paths.ours, image, zqbench::kJpeg); },
        {{"libjpeg", paths.bare, [&] { zqbench::bare_jpeg_write(paths.bare, rows_of(image)); }},
         {"OpenCV", paths.opencv,
          zqbench::opencv_write(paths.opencv, zqbench::pixels_of(image), "JPEG")}});
    zqbench::check(state.counters["size_ratio"] == 1.0, "same size");
}

void FileJpegRead(benchmark::State& state) {
    const zqbench::Photograph image(static_cast<int32_t>(state.range(0)));
    const zqbench::Image copy(image.type());
    const zqbench::FilePaths paths(".jpg");
    zqbench::write_file(paths.ours, image, zqbench::kJpeg);
    zqbench::compare_read(state, paths.ours, image.type(),
                          {{"libjpeg", [&] { zqbench::bare_jpeg_read(paths.ours); }},
                           {"OpenCV", zqbench::opencv_read(paths.ours)}});
    zqbench::read_file(paths.ours, copy);
    const zqbench::Rows bare = zqbench::bare_jpeg_read(paths.ours);
    if (image.type() == ZQ_TYPE_RGB) clear_fillers(bare);
    zqbench::check_same(copy, bare);
}

void types(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->Apply(zqbench::timed_file);
}

BENCHMARK(FileJpegWrite)->Apply(types);
BENCHMARK(FileJpegRead)->Apply(types);

}  // namespace
