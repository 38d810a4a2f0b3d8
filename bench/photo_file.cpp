// The picture, its files, and the reports.
#include "photo_file.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "file.h"
#include "peak_memory.h"
#include "photograph.h"

namespace zqbench {

namespace {

constexpr std::size_t kPhotoPixels = std::size_t{kPhotoWidth} * kPhotoHeight;
constexpr double kMebibyte = 1 << 20;

struct Kind {
    std::int32_t type;
    int channels, bits;
    const char* samples;  // names a file
};

constexpr Kind kKinds[] = {{ZQ_TYPE_U8, 1, 8, "ZQBENCH_PHOTO_U8"},
                           {ZQ_TYPE_I16, 1, 16, "ZQBENCH_PHOTO_I16"},
                           {ZQ_TYPE_RGB, 4, 8, "ZQBENCH_PHOTO_RGB"},
                           {ZQ_TYPE_RGBU64, 4, 16, "ZQBENCH_PHOTO_RGBU64"}};

const Kind& kind_of(const Image& image) {
    for (const Kind& kind : kKinds) {
        if (kind.type == image.handle()->type) return kind;
    }
    std::abort();
}

std::string temporary(const char* name, const char* extension) {
    return (std::filesystem::temp_directory_path() / "zqbench-").string() + name + extension;
}

void check_rows(const Image& image, const auto& row_of) {
    for (std::int32_t y = 0; y < image.handle()->height; ++y)
        check(std::memcmp(image.row(y), row_of(y), image.row_bytes()) == 0, "same pixels");
}

// Nothing where the system does not tell.
void report_memory(benchmark::State& state, const Job& job, double picture_bytes = 0) {
    const auto growth = static_cast<double>(peak_growth(job));
    if (growth > 0) state.counters["MiB_beside"] = (growth - picture_bytes) / kMebibyte;
}

}  // namespace

Photograph::Photograph(std::int32_t type) : Image(type, kPhotoWidth, kPhotoHeight) {
    const Kind& kind = kind_of(*this);
    const char* const path = std::getenv(kind.samples);
    const File file = path == nullptr ? File(nullptr, std::fclose) : open(path, "rb");
    std::uint32_t random = 1;
    for (std::int32_t y = 0; y < kPhotoHeight; ++y) {
        std::uint8_t* const at = row(y);
        if (file != nullptr) {
            check(std::fread(at, 1, row_bytes(), file.get()) == row_bytes(), "samples");
        } else if (kind.bits == 8) {
            paint_row(at, kPhotoWidth, y, kind.channels, 1, random);
        } else {
            paint_row(reinterpret_cast<std::uint16_t*>(at), kPhotoWidth, y, kind.channels, 13,
                      random);
        }
    }
}

FilePaths::FilePaths(const char* extension)
    : ours(temporary("ours", extension)),
      bare(temporary("bare", extension)),
      opencv(temporary("opencv", extension)) {}

FilePaths::~FilePaths() {
    for (const std::string& path : {ours, bare, opencv}) std::filesystem::remove(path);
}

void write_file(const std::string& path, const Image& image, FileType type,
                const ZqWriteOptions& options) {
    check(ZqWriteFileByCode(path.c_str(), image.handle(), &options, type, nullptr) == 0, "write");
}

void read_file(const std::string& path, const Image& image) {
    check(ZqReadFile(image.handle(), path.c_str(), nullptr, nullptr, nullptr, nullptr) == 0,
          "read");
}

void check_same(const Image& a, const Image& b) {
    check(a.handle()->type == b.handle()->type, "same type");
    check_rows(a, [&](std::int32_t y) { return b.row(y); });
}

void check_same(const Image& a, const Rows& b) {
    check(a.row_bytes() == b.row_bytes, "same row");
    check_rows(a, [&](std::int32_t y) { return b.row(static_cast<std::size_t>(y)); });
}

Pixels pixels_of(const Image& image) {
    const Kind& kind = kind_of(image);
    return {image.row(0),       static_cast<std::size_t>(image.row(1) - image.row(0)),
            kPhotoWidth,        kPhotoHeight,
            kind.channels == 4, kind.bits};
}

void compare_write(benchmark::State& state, const std::string& path, const Job& ours,
                   const std::vector<WriteJob>& baselines) {
    report_memory(state, ours);
    const auto remover = [](const std::string& file) -> Job {
        return [file] { std::filesystem::remove(file); };
    };
    std::vector<Baseline> others;
    others.reserve(baselines.size());
    for (const WriteJob& baseline : baselines)
        others.push_back({baseline.name, baseline.job, remover(baseline.path)});
    run_compared(state, ours, others, kPhotoPixels, remover(path));
    state.counters["size_ratio"] =
        static_cast<double>(std::filesystem::file_size(path)) /
        static_cast<double>(std::filesystem::file_size(baselines.front().path));
}

void compare_read(benchmark::State& state, std::int32_t type,
                  const std::function<void(const Image&)>& ours,
                  const std::vector<Baseline>& baselines) {
    const Job read = [&] { ours(Image(type)); };
    const std::size_t picture_bytes = Image(type, kPhotoWidth, 1).row_bytes() * kPhotoHeight;
    report_memory(state, read, static_cast<double>(picture_bytes));
    run_compared(state, read, baselines, kPhotoPixels);
}

void compare_read(benchmark::State& state, const std::string& path, std::int32_t type,
                  const std::vector<Baseline>& baselines) {
    compare_read(
        state, type, [&](const Image& image) { read_file(path, image); }, baselines);
}

void compare_read_into(benchmark::State& state, const Image& target, const std::string& path,
                       const std::vector<Baseline>& baselines) {
    const Job ours = [&] { read_file(path, target); };
    ours();
    report_memory(state, ours);
    run_compared(state, ours, baselines, kPhotoPixels);
}

void timed_file(benchmark::internal::Benchmark* benchmark) {
    benchmark->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(9);
}

}  // namespace zqbench
