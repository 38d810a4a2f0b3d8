// Bayer decoding with tables, beside a copy of the same bytes and OpenCV's decoder followed by its
// way to the same range of values.
// Run: zqvis_bench --benchmark_filter=Bayer
#include <benchmark/benchmark.h>
#include <zqvissvc/bayer.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "image.h"
#include "opencv/jobs.h"
#include "throughput.h"

namespace {

using zqbench::check;
using zqbench::Image;
using zqbench::kHeight;
using zqbench::kWidth;

struct Tables {
    explicit Tables(uint32_t bit_depth) {
        for (auto& table : colours) table.resize(bit_depth > 8 ? 65536 : 256);
        fill(bit_depth);
    }
    void fill(uint32_t bit_depth) {
        check(Gen_CalculateBayerColorLUT(1.8, 1.0, 1.5, colours[0].data(), colours[1].data(),
                                         colours[2].data(), bit_depth) == 0,
              "Gen_CalculateBayerColorLUT");
    }
    std::array<std::vector<uint32_t>, 3> colours;
};

void decode(const Image& source, const Image& target, const Tables& tables, uint32_t bit_depth) {
    const auto line_width = [](const Image& image) {
        return static_cast<uint32_t>(image.handle()->rowPixels);
    };
    check(Gen_BayerColorDecode(reinterpret_cast<uint32_t*>(target.row(0)), source.row(0), kHeight,
                               kWidth, line_width(target), line_width(source),
                               tables.colours[0].data(), tables.colours[1].data(),
                               tables.colours[2].data(), 2, bit_depth) == 0,
          "Gen_BayerColorDecode");
}

void fill_with_samples(const Image& image, uint32_t bit_depth) {
    zqbench::fill_with_noise(image);
    if (bit_depth <= 8) return;
    for (int32_t y = 0; y < kHeight; ++y) {
        auto* sample = reinterpret_cast<uint16_t*>(image.row(y));
        for (int32_t x = 0; x < kWidth; ++x)
            sample[x] &= static_cast<uint16_t>((1U << bit_depth) - 1);
    }
}

// `linear`: the library's own tables. Otherwise one entry is off, so that all are looked up.
void BayerDecode(benchmark::State& state, uint32_t bit_depth, bool linear) {
    const bool is_wide = bit_depth > 8;
    const Image source(is_wide ? ZQ_TYPE_I16 : ZQ_TYPE_U8, kWidth, kHeight);
    const Image target(ZQ_TYPE_RGB, kWidth, kHeight);
    fill_with_samples(source, bit_depth);
    Tables tables(bit_depth);
    if (!linear) tables.colours[0].back() ^= 0x10000;
    zqbench::run_compared(state, [&] { decode(source, target, tables, bit_depth); },
                          {zqbench::memcpy_of(is_wide ? 6 : 5),
                           {"OpenCV", zqbench::opencv_bayer(is_wide ? "16 bits" : "8 bits")}});
}

void timed(benchmark::internal::Benchmark* one) {
    one->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(31);
}
BENCHMARK_CAPTURE(BayerDecode, 8_bits, 8, true)->Apply(timed);
BENCHMARK_CAPTURE(BayerDecode, 12_bits, 12, true)->Apply(timed);
BENCHMARK_CAPTURE(BayerDecode, 16_bits, 16, true)->Apply(timed);
BENCHMARK_CAPTURE(BayerDecode, 8_bits_any_tables, 8, false)->Apply(timed);
BENCHMARK_CAPTURE(BayerDecode, 12_bits_any_tables, 12, false)->Apply(timed);
BENCHMARK_CAPTURE(BayerDecode, 16_bits_any_tables, 16, false)->Apply(timed);

void BayerTables(benchmark::State& state) {
    Tables tables(16);
    for (auto step : state) tables.fill(16);
}
BENCHMARK(BayerTables)->Unit(benchmark::kMicrosecond);

}  // namespace
