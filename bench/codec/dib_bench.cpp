// Bitmaps of 1920 x 1080 pixels that cannot be shown in place, one thread, into memory that is
// kept; beside memcpy of the bitmap's bytes and of half the bytes that are read once and written.
// Run: zqvis_codec_bench --benchmark_filter=Bitmaps
#include <benchmark/benchmark.h>

#include <bit>
#include <cstdint>
#include <vector>

#include "display/dib_rows.h"
#include "throughput.h"

namespace {

using zq::PixelType;

constexpr std::int32_t kWide = 1920;
constexpr std::int32_t kHigh = 1080;
constexpr std::size_t kArea = std::size_t{kWide} * kHigh;

// Random bytes, samples of 12 bits or floats from 0 to 256; the same for every run.
std::vector<std::uint32_t> noise(const zq::ShownPixels& view) {
    std::vector<std::uint32_t> words(kArea * view.pixel_bytes() / 4);
    std::uint32_t random = 1;
    for (std::uint32_t& word : words) {
        random = random * 1664525U + 1013904223U;
        word = random;
        if (view.type == PixelType::kI16) word = random >> 4U & 0x0FFF0FFFU;
        if (view.type == PixelType::kSgl || view.type == PixelType::kComplex) {
            word = std::bit_cast<std::uint32_t>(static_cast<float>(random >> 8U) / 65536.0F);
        }
    }
    return words;
}

void Bitmaps(benchmark::State& state, zq::ShownPixels view) {
    const std::vector<std::uint32_t> pixels = noise(view);
    view.pixels = reinterpret_cast<const std::uint8_t*>(pixels.data());
    view.width = view.line_width = kWide;
    view.height = kHigh;
    std::vector<std::uint8_t> scratch;
    const auto make = [&] {
        benchmark::DoNotOptimize(zq::make_dib(view, scratch, {view.bounds(), {}}));
        benchmark::ClobberMemory();
    };
    make();
    const std::size_t read = kArea * view.pixel_bytes();
    zqbench::run_compared(state, make,
                          {zqbench::memcpy_named("memcpy", scratch.size()),
                           zqbench::memcpy_named("memcpy_of_all", (read + scratch.size()) / 2)},
                          kArea);
}

#define ZQ_BITMAP_BENCHMARK(name, ...)            \
    BENCHMARK_CAPTURE(Bitmaps, name, __VA_ARGS__) \
        ->Name("Display/Bitmaps/" #name)          \
        ->UseManualTime()                         \
        ->Unit(benchmark::kMillisecond)           \
        ->Iterations(101)

ZQ_BITMAP_BENCHMARK(i16_range, {.type = PixelType::kI16});
ZQ_BITMAP_BENCHMARK(i16_depth, {.type = PixelType::kI16, .bit_depth = 12});
ZQ_BITMAP_BENCHMARK(i16_shift, {.type = PixelType::kI16, .right_shift = 4});
ZQ_BITMAP_BENCHMARK(sgl, {.type = PixelType::kSgl});
ZQ_BITMAP_BENCHMARK(complex, {.type = PixelType::kComplex});
ZQ_BITMAP_BENCHMARK(hsl, {.type = PixelType::kHsl});
ZQ_BITMAP_BENCHMARK(rgbu64, {.type = PixelType::kRgbU64});

}  // namespace
