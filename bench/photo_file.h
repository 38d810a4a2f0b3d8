// What the benchmarks of all file formats share: a picture of 12 million pixels, the files that it
// is written to, and the report of time and memory.
#pragma once

#include <benchmark/benchmark.h>
#include <zqvissvc/files.h>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "image.h"
#include "rows.h"
#include "throughput.h"

namespace zqbench {

inline constexpr std::int32_t kPhotoWidth = 4000, kPhotoHeight = 3000;

enum FileType : std::int32_t { kBmp, kAipd, kTiff, kJpeg, kPng, kJpeg2000 = 7 };

// A picture of a type with 8 or 16 bits: samples as an image holds them from the file that the
// environment names (ZQBENCH_PHOTO_U8, _I16, _RGB, _RGBU64), or painted.
class Photograph : public Image {
  public:
    explicit Photograph(std::int32_t type);
    std::int32_t type() const { return handle()->type; }
};

// Temporary files of one picture, removed at the end. OpenCV goes by the extension.
struct FilePaths {
    std::string ours, bare, opencv;

    explicit FilePaths(const char* extension);
    ~FilePaths();
    FilePaths(const FilePaths&) = delete;
    FilePaths& operator=(const FilePaths&) = delete;
};

void write_file(const std::string& path, const Image& image, FileType type,
                const ZqWriteOptions& options = {});
void read_file(const std::string& path, const Image& image);

// End the program unless all pixels are the same.
void check_same(const Image& a, const Image& b);
void check_same(const Image& a, const Rows& b);

// The picture as OpenCV sees it.
Pixels pixels_of(const Image& image);

// Report the job's throughput beside that of the baselines, and as MiB_beside its memory at the
// peak, without that of the picture.

// A job that writes a file, which is removed before: to replace one costs what the disk makes of
// it.
struct WriteJob {
    std::string name, path;
    Job job;
};
// Also reports the size of the file over that of the first baseline's.
void compare_write(benchmark::State& state, const std::string& path, const Job& ours,
                   const std::vector<WriteJob>& baselines);
// `ours` reads into images made anew, of no size yet.
void compare_read(benchmark::State& state, std::int32_t type,
                  const std::function<void(const Image&)>& ours,
                  const std::vector<Baseline>& baselines);
void compare_read(benchmark::State& state, const std::string& path, std::int32_t type,
                  const std::vector<Baseline>& baselines);
// Reads into one image, which has the picture's shape already.
void compare_read_into(benchmark::State& state, const Image& target, const std::string& path,
                       const std::vector<Baseline>& baselines);

void timed_file(benchmark::internal::Benchmark* benchmark);

}  // namespace zqbench
