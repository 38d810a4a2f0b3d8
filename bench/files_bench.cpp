// AIPD and BMP, which need no library, beside the least that can be done: one fwrite or fread of
// as many bytes in one block, and plain loops over rows and their pixels. BMP beside OpenCV, too.
// Run: zqvis_bench --benchmark_filter=File
#include <algorithm>
#include <cstdio>
#include <vector>

#include "file.h"
#include "photo_file.h"

namespace {

using zqbench::check;
using zqbench::File;
using zqbench::FilePaths;
using zqbench::Image;
using zqbench::kPhotoHeight;
using zqbench::kPhotoWidth;
using zqbench::open;

zqbench::Photograph photograph(const benchmark::State& state) {
    return zqbench::Photograph(static_cast<int32_t>(state.range(0)));
}

constexpr size_t kAipdHeader = 512;

// The pixels of an AIPD file, row by row, with fread or fwrite.
template <class Transfer>
void each_aipd_row(const std::string& path, const char* mode, const Image& image,
                   Transfer transfer) {
    const File file = open(path, mode);
    check(std::fseek(file.get(), kAipdHeader, SEEK_SET) == 0, "fseek");
    for (int32_t y = 0; y < kPhotoHeight; ++y)
        check(transfer(image.row(y), 1, image.row_bytes(), file.get()) == image.row_bytes(), "row");
}

std::vector<uint8_t> bytes_of_aipd(const Image& image) {
    return std::vector<uint8_t>(kAipdHeader + image.row_bytes() * size_t{kPhotoHeight}, 1);
}

void FileAipdWrite(benchmark::State& state) {
    const zqbench::Photograph image = photograph(state);
    const FilePaths paths(".aipd");
    const std::vector<uint8_t> bytes = bytes_of_aipd(image);
    zqbench::compare_write(
        state, paths.ours, [&] { zqbench::write_file(paths.ours, image, zqbench::kAipd); },
        {{"fwrite", paths.bare,
          [&] {
              const File file = open(paths.bare, "wb");
              check(std::fwrite(bytes.data(), 1, bytes.size(), file.get()) == bytes.size(),
                    "fwrite");
          }},
         {"fwrite of rows", paths.opencv,
          [&] { each_aipd_row(paths.opencv, "wb", image, std::fwrite); }}});
    check(state.counters["size_ratio"] == 1.0, "same size");
}

// Into an image that has the shape already, as that of a host that reads one file after another.
void FileAipdRead(benchmark::State& state) {
    const zqbench::Photograph image = photograph(state);
    const Image target(image.type(), kPhotoWidth, kPhotoHeight),
        plain(image.type(), kPhotoWidth, kPhotoHeight);
    const FilePaths paths(".aipd");
    std::vector<uint8_t> bytes = bytes_of_aipd(image);
    zqbench::write_file(paths.ours, image, zqbench::kAipd);
    zqbench::compare_read_into(
        state, target, paths.ours,
        {{"fread",
          [&] {
              const File file = open(paths.ours, "rb");
              check(std::fread(bytes.data(), 1, bytes.size(), file.get()) == bytes.size(), "fread");
          }},
         {"fread of rows", [&] { each_aipd_row(paths.ours, "rb", plain, std::fread); }}});
    zqbench::check_same(image, plain);
    zqbench::check_same(image, target);
}

// One line of a file at a time.
class BmpLines {
  public:
    BmpLines(const std::string& path, const char* mode, const Image& image)
        : image_(image),
          is_grey_(image.handle()->type == ZQ_TYPE_U8),
          file_(open(path, mode)),
          line_((is_grey_ ? 1 : 3) * size_t{kPhotoWidth}) {
        constexpr long kColours = 54, kGreys = 54 + 1024;  // where the pixels begin
        check(std::fseek(file_.get(), is_grey_ ? kGreys : kColours, SEEK_SET) == 0, "fseek");
    }

    void write() {
        for (int32_t y = kPhotoHeight; y-- > 0;) {
            const uint8_t* row = image_.row(y);
            for (size_t x = 0; !is_grey_ && x < kPhotoWidth; ++x)
                std::copy_n(row + 4 * x, 3, &line_[3 * x]);
            const void* bytes = is_grey_ ? row : line_.data();
            check(std::fwrite(bytes, 1, line_.size(), file_.get()) == line_.size(), "fwrite");
        }
    }

    void read() {
        for (int32_t y = kPhotoHeight; y-- > 0;) {
            uint8_t* row = image_.row(y);
            void* bytes = is_grey_ ? row : line_.data();
            check(std::fread(bytes, 1, line_.size(), file_.get()) == line_.size(), "fread");
            for (size_t x = 0; !is_grey_ && x < kPhotoWidth; ++x) {
                std::copy_n(&line_[3 * x], 3, row + 4 * x);
                row[4 * x + 3] = 0;
            }
        }
    }

  private:
    const Image& image_;
    bool is_grey_;
    File file_;
    std::vector<uint8_t> line_;
};

void FileBmpWrite(benchmark::State& state) {
    const zqbench::Photograph image = photograph(state);
    const FilePaths paths(".bmp");
    zqbench::compare_write(
        state, paths.ours, [&] { zqbench::write_file(paths.ours, image, zqbench::kBmp); },
        {{"loop", paths.bare, [&] { BmpLines(paths.bare, "wb", image).write(); }},
         {"OpenCV", paths.opencv,
          zqbench::opencv_write(paths.opencv, zqbench::pixels_of(image), "BMP")}});
    check(state.counters["size_ratio"] == 1.0, "same size");
}

void FileBmpRead(benchmark::State& state) {
    const zqbench::Photograph image = photograph(state);
    const Image target(image.type(), kPhotoWidth, kPhotoHeight),
        plain(image.type(), kPhotoWidth, kPhotoHeight);
    const FilePaths paths(".bmp");
    zqbench::write_file(paths.ours, image, zqbench::kBmp);
    zqbench::compare_read_into(state, target, paths.ours,
                               {{"loop", [&] { BmpLines(paths.ours, "rb", plain).read(); }},
                                {"OpenCV", zqbench::opencv_read(paths.ours)}});
    zqbench::check_same(image, target);
    zqbench::check_same(image, plain);
}

void types(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB)->Apply(zqbench::timed_file)->Iterations(31);
}

BENCHMARK(FileAipdWrite)->Apply(types);
BENCHMARK(FileAipdRead)->Apply(types);
BENCHMARK(FileBmpWrite)->Apply(types);
BENCHMARK(FileBmpRead)->Apply(types);

}  // namespace
