// Every conversion of a 4096 x 3000 picture, one thread, beside memcpy of the bytes that it reads
// and writes, and beside OpenCV's nearest call. Run: zqvis_bench --benchmark_filter=Convert
#include <benchmark/benchmark.h>
#include <zqvissvc/convert.h>
#include <zqvissvc/image.h>

#include <initializer_list>
#include <memory>
#include <string>
#include <vector>

#include "image.h"
#include "refhost/refhost.h"
#include "throughput.h"

namespace {

using zqbench::Baseline;
using zqbench::check;
using zqbench::Image;
using zqbench::kHeight;
using zqbench::kWidth;

constexpr const char* kTypeNames[] = {"U8", "I16", "SGL", "Complex", "RGB", "HSL", "RGBU64"};

// `opencv` is the job's name there, null where it has nothing near.
struct Conversion {
    int32_t from, to;
    const char* opencv = nullptr;
    int32_t bit_depth = 0;
};

Baseline opencv(const char* job) {
    return {"OpenCV", job == nullptr ? zqbench::Job() : zqbench::opencv_conversion(job)};
}

void Convert(benchmark::State& state, const Conversion& conversion) {
    const auto source = std::make_shared<Image>(conversion.from, kWidth, kHeight);
    const auto destination = std::make_shared<Image>(conversion.to, kWidth, kHeight);
    fill_with_noise(*source);
    check(ZqSetBitDepth(source->handle(), conversion.bit_depth) == 0, "bit depth");
    const size_t bytes = source->row_bytes() / kWidth + destination->row_bytes() / kWidth;
    zqbench::run_compared(state,
                          [=] {
                              const ZqImageValue from = source->value();
                              ZqImageValue to = destination->value();
                              check(DF_Convert(&from, &to, nullptr) == 0, "DF_Convert");
                          },
                          {zqbench::memcpy_of(bytes), opencv(conversion.opencv)});
    state.SetLabel(std::string(kTypeNames[conversion.from]) + " to " + kTypeNames[conversion.to]);
}

// Pairs by their type codes.
void ConvertPair(benchmark::State& state) {
    Convert(state, {static_cast<int32_t>(state.range(0)), static_cast<int32_t>(state.range(1))});
}

// An array keeps its block, as that of a host that asks for every picture of a camera does.
void ToArray(benchmark::State& state, int32_t type) {
    const Image image(type, kWidth, kHeight);
    fill_with_noise(image);
    ZqArray2dU8Handle u8 = nullptr;
    ZqArray2dI16Handle i16 = nullptr;
    ZqArray2dSglHandle sgl = nullptr;
    ZqArray2dU32Handle u32 = nullptr;
    ZqArray2dU64Handle u64 = nullptr;
    const auto job = [&] {
        const ZqImageValue value = image.value();
        check((type < ZQ_TYPE_COMPLEX
                   ? DF_ImageToArray(&value, nullptr, &u8, &i16, &sgl, nullptr)
                   : DF_ColorImageToArray_v2(&value, nullptr, &u32, &u64, nullptr)) == 0,
              "array");
    };
    zqbench::run_compared(state, job, {zqbench::memcpy_of(2 * image.row_bytes() / kWidth)});
    for (void* array : std::initializer_list<void*>{u8, i16, sgl, u32, u64})
        refhost::dispose(array);
}

void timed(benchmark::internal::Benchmark* benchmark) {
    benchmark->UseManualTime()->Unit(benchmark::kMillisecond)->Iterations(11);
}

void other_pairs(benchmark::internal::Benchmark* benchmark) {
    // U8, I16, SGL, Complex, RGB, HSL, RGBU64 into those that have no line of their own below; RGB
    // and HSL into each other are the colour models' own benchmark.
    const std::vector<int64_t> targets[] = {
        {0, 3, 5},    {1, 2, 3, 4, 5, 6}, {2, 3, 4, 5, 6},      {1, 3, 5, 6},
        {1, 2, 3, 4}, {0, 1, 2, 3, 5, 6}, {0, 1, 2, 3, 4, 5, 6}};
    for (int64_t from = 0; from < 7; ++from) {
        for (const int64_t to : targets[from]) benchmark->Args({from, to});
    }
    timed(benchmark);
}

using C = Conversion;
BENCHMARK_CAPTURE(Convert, u8_to_i16, C{0, 1, "U8 to I16"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, u8_to_sgl, C{0, 2, "U8 to SGL"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, u8_to_rgb, C{0, 4, "U8 to RGB"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, u8_to_rgbu64, C{0, 6})->Apply(timed);
BENCHMARK_CAPTURE(Convert, rgb_to_rgbu64, C{4, 6, "RGB to RGBU64"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, i16_to_u8, C{1, 0, "I16 to U8"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, i16_of_12_bits_to_u8, C{1, 0, "I16 of 12 bits to U8", 12})->Apply(timed);
BENCHMARK_CAPTURE(Convert, sgl_to_u8, C{2, 0, "SGL to U8"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, sgl_to_i16, C{2, 1, "SGL to I16"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, rgb_to_u8, C{4, 0, "RGB to U8"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, complex_to_sgl, C{3, 2, "split and magnitude"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, complex_to_u8, C{3, 0, "split and magnitude"})->Apply(timed);
BENCHMARK_CAPTURE(Convert, complex_to_rgb, C{3, 4, "split and magnitude"})->Apply(timed);
BENCHMARK(ConvertPair)->Apply(other_pairs);
BENCHMARK_CAPTURE(ToArray, u8, 0)->Apply(timed);
BENCHMARK_CAPTURE(ToArray, i16, 1)->Apply(timed);
BENCHMARK_CAPTURE(ToArray, sgl, 2)->Apply(timed);
BENCHMARK_CAPTURE(ToArray, rgb, 4)->Apply(timed);
BENCHMARK_CAPTURE(ToArray, hsl, 5)->Apply(timed);
BENCHMARK_CAPTURE(ToArray, rgbu64, 6)->Apply(timed);

}  // namespace
