// Flattened images of 4096 x 3000 pixels: plain and packed beside memcpy, the quality codec beside
// a bare loop over libjpeg with the same settings; and what a small image costs, alone and among
// 10,000. The host string keeps its block. Run: zqvis_bench --benchmark_filter=Flatten
#include <benchmark/benchmark.h>
#include <zqvissvc/flatten.h>
#include <zqvissvc/image.h>

#include <cstring>
#include <memory>
#include <span>
#include <vector>

#include "bare_jpeg.h"
#include "image.h"
#include "paired.h"
#include "photograph.h"
#include "refhost/refhost.h"
#include "throughput.h"

namespace {

using zqbench::check;
using zqbench::Image;
using zqbench::kHeight;
using zqbench::kWidth;

enum Codec : int32_t { kPlain, kQuality, kPacked };
constexpr int32_t kUsualQuality = 750;
constexpr size_t kRecordHeader = 76;

// An image and its record.
class Flattening {
  public:
    Flattening(int32_t type, Codec codec, int32_t width = kWidth, int32_t height = kHeight)
        : codec_(codec), image_(type, width, height) {
        uint32_t random = 1;
        const int channels = type == ZQ_TYPE_RGB ? 4 : 1;
        for (int32_t y = 0; y < height; ++y) {
            zqbench::paint_row(image_.row(y), width, y, channels, 1, random);
            if (codec == kPacked) blacken_every_third(image_.row(y), width);
        }
        flatten();
    }

    void flatten() {
        if (record_.get() != nullptr) (*record_.get())->length = 0;
        check(FlattenImageToArray1D2(image_.handle(), record_.out(), 2, codec_, 0, kUsualQuality, 0,
                                     -1) == 0,
              "flatten");
    }

    void unflatten_into(const Image& target) const {
        ZqImageHandle handle = target.handle();
        check(UnflattenImageFromArray1D(&handle, record_.get()) == 0, "unflatten");
        check(handle == target.handle(), "destination");
    }

    void unflatten_anew() const {
        ZqImageHandle image = nullptr;
        check(UnflattenImageFromArray1D(&image, record_.get()) == 0, "unflatten");
        check(ZqDisposeImage(image) == 0, "dispose");
    }

    const Image& image() const { return image_; }
    zqbench::JpegRows rows() const {
        return {image_.row(0), image_.row(1) - image_.row(0), static_cast<uint32_t>(kWidth),
                static_cast<uint32_t>(kHeight), image_.handle()->type == ZQ_TYPE_RGB};
    }
    std::span<const uint8_t> jpeg() const {
        const ZqString& record = **record_.get();
        const auto block =
            std::span(record.bytes, static_cast<size_t>(record.length)).subspan(kRecordHeader);
        return block.subspan(zqbench::jpeg_start(block));
    }

  private:
    static void blacken_every_third(uint8_t* row, int32_t width) {
        for (int32_t x = 0; x < width; x += 3) row[x] = 0;
    }

    Codec codec_;
    Image image_;
    refhost::String record_;
};

// What a codec without losses gives back.
void check_rebuilt(const Image& from, const Image& rebuilt, Codec codec) {
    for (int32_t y = 0; y < kHeight; ++y) {
        const uint8_t *source = from.row(y), *got = rebuilt.row(y);
        if (codec == kPlain) check(std::memcmp(source, got, from.row_bytes()) == 0, "comparison");
        for (size_t x = 0; codec == kPacked && x < from.row_bytes(); ++x)
            check(got[x] == (source[x] != 0 ? 255 : 0), "comparison");
    }
}

// Packed reads the pixels and writes an eighth of that, or the other way round.
std::vector<zqbench::Baseline> copies(const Flattening& flattening, Codec codec) {
    const size_t bytes = flattening.image().row_bytes() * kHeight;
    std::vector<zqbench::Baseline> all = {zqbench::memcpy_named("memcpy of the image", bytes)};
    if (codec == kPacked)
        all.push_back(zqbench::memcpy_named("memcpy of pixels and bits", bytes * 9 / 16));
    return all;
}

void Flatten(benchmark::State& state, int32_t type, Codec codec) {
    Flattening flattening(type, codec);
    zqbench::run_compared(
        state, [&] { flattening.flatten(); }, copies(flattening, codec));
    const Image rebuilt(type);
    flattening.unflatten_into(rebuilt);
    check_rebuilt(flattening.image(), rebuilt, codec);
}

void FlattenBack(benchmark::State& state, int32_t type, Codec codec) {
    const Flattening flattening(type, codec);
    const Image rebuilt(type, kWidth, kHeight);
    zqbench::run_compared(
        state, [&] { flattening.unflatten_into(rebuilt); }, copies(flattening, codec));
    check_rebuilt(flattening.image(), rebuilt, codec);
}

void FlattenQuality(benchmark::State& state) {
    Flattening flattening(static_cast<int32_t>(state.range(0)), kQuality);
    // The tables, out of the way of the string that is written.
    const std::vector<uint8_t> stream(flattening.jpeg().begin(), flattening.jpeg().end());
    zqbench::run_paired(
        state, [&] { flattening.flatten(); },
        [&] { benchmark::DoNotOptimize(zqbench::bare_encode(flattening.rows(), stream)); });
    state.counters["x libjpeg"] = 1 / state.counters["ratio"];
}

// Into a new image, beside new memory; or into one that already has the shape.
void FlattenQualityBack(benchmark::State& state) {
    const auto type = static_cast<int32_t>(state.range(0));
    const bool fresh = state.range(1) == 0;
    const Flattening flattening(type, kQuality);
    const Image rebuilt(type, kWidth, kHeight);
    zqbench::JpegRows rows = flattening.rows();
    const auto memory = [&] {
        return std::make_unique_for_overwrite<uint8_t[]>(static_cast<size_t>(rows.stride) *
                                                         kHeight);
    };
    const std::unique_ptr<uint8_t[]> kept = memory();
    zqbench::run_paired(
        state, [&] { fresh ? flattening.unflatten_anew() : flattening.unflatten_into(rebuilt); },
        [&] {
            const std::unique_ptr<uint8_t[]> anew = fresh ? memory() : nullptr;
            rows.first = fresh ? anew.get() : kept.get();
            zqbench::bare_decode(rows, flattening.jpeg());
        });
    state.counters["x libjpeg"] = 1 / state.counters["ratio"];
}

// A 32 x 32 image, plain; nanoseconds each way. The argument is the number of live images.
void FlattenSmall(benchmark::State& state, bool back) {
    constexpr int32_t kSide = 32;
    constexpr int kBatch = 2000;
    Flattening flattening(ZQ_TYPE_U8, kPlain, kSide, kSide);
    const Image rebuilt(ZQ_TYPE_U8, kSide, kSide);
    std::vector<std::unique_ptr<Image>> others;
    std::vector<std::unique_ptr<refhost::String>> records;
    while (std::ssize(others) + 1 < state.range(0)) {
        others.push_back(std::make_unique<Image>(ZQ_TYPE_U8, kSide, kSide));
        // They have been flattened too, so that tables of what was flattened are full.
        records.push_back(std::make_unique<refhost::String>());
        check(FlattenImageToArray1D(others.back()->handle(), records.back()->out()) == 0, "others");
    }
    zqbench::Times times;
    for (auto step : state) {
        times.add([&] {
            for (int n = 0; n < kBatch; ++n) {
                if (back) {
                    flattening.unflatten_into(rebuilt);
                } else {
                    flattening.flatten();
                }
            }
        });
        state.SetIterationTime(times.wall.back());
    }
    state.counters["ns"] = zqbench::median(times.wall) / kBatch * 1e9;
    state.counters["cpu_ns"] = zqbench::median(times.processor) / kBatch * 1e9;
}

void timed(benchmark::internal::Benchmark* benchmark) {
    benchmark->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(21);
}
void grey_and_colour(benchmark::internal::Benchmark* benchmark) {
    timed(benchmark->Arg(ZQ_TYPE_U8)->Arg(ZQ_TYPE_RGB));
}
void new_and_kept(benchmark::internal::Benchmark* benchmark) {
    timed(benchmark->ArgsProduct({{ZQ_TYPE_U8, ZQ_TYPE_RGB}, {0, 1}}));
}
void alone_and_among_many(benchmark::internal::Benchmark* benchmark) {
    timed(benchmark->Arg(1)->Arg(10000));
}

BENCHMARK_CAPTURE(Flatten, plain_u8, ZQ_TYPE_U8, kPlain)->Apply(timed);
BENCHMARK_CAPTURE(Flatten, plain_rgb, ZQ_TYPE_RGB, kPlain)->Apply(timed);
BENCHMARK_CAPTURE(Flatten, packed_u8, ZQ_TYPE_U8, kPacked)->Apply(timed);
BENCHMARK_CAPTURE(FlattenBack, plain_u8, ZQ_TYPE_U8, kPlain)->Apply(timed);
BENCHMARK_CAPTURE(FlattenBack, plain_rgb, ZQ_TYPE_RGB, kPlain)->Apply(timed);
BENCHMARK_CAPTURE(FlattenBack, packed_u8, ZQ_TYPE_U8, kPacked)->Apply(timed);
BENCHMARK(FlattenQuality)->Apply(grey_and_colour);
BENCHMARK(FlattenQualityBack)->Apply(new_and_kept);
BENCHMARK_CAPTURE(FlattenSmall, out, false)->Apply(alone_and_among_many);
BENCHMARK_CAPTURE(FlattenSmall, back, true)->Apply(alone_and_among_many);

}  // namespace
