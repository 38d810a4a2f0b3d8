// Every conversion of a 4096 x 3000 picture, one thread, beside memcpy of the bytes that it reads
// and writes, and beside OpenCV's nearest call. Run: zqvis_bench --benchmark_filter=Convert
#include <benchmark/benchmark.h>
#include <zqvissvc/convert.h>
#include <zqvissvc/image.h>

#include <functional>
#include <memory>
#include <string>

#include "image.h"
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

void convert(benchmark::State& state, const Conversion& conversion) {
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
}

// An array keeps its block, as that of a host that asks for every picture of a camera does.
void to_array(benchmark::State& state, int32_t type) {
    const auto image = std::make_shared<Image>(type, kWidth, kHeight);
    fill_with_noise(*image);
    ZqArray2dU8Handle u8 = nullptr;
    ZqArray2dI16Handle i16 = nullptr;
    ZqArray2dSglHandle sgl = nullptr;
    ZqArray2dU32Handle u32 = nullptr;
    ZqArray2dU64Handle u64 = nullptr;
    const auto job = [&] {
        const ZqImageValue value = image->value();
        check((type < ZQ_TYPE_COMPLEX
                   ? DF_ImageToArray(&value, nullptr, &u8, &i16, &sgl, nullptr)
                   : DF_ColorImageToArray_v2(&value, nullptr, &u32, &u64, nullptr)) == 0,
              "array");
    };
    zqbench::run_compared(state, job, {zqbench::memcpy_of(2 * image->row_bytes() / kWidth)});
}

void add(const std::string& name, const std::function<void(benchmark::State&)>& run) {
    benchmark::RegisterBenchmark(name.c_str(), run)
        ->UseManualTime()
        ->Unit(benchmark::kMillisecond)
        ->Iterations(11);
}

const Conversion kCompared[] = {
    {ZQ_TYPE_U8, ZQ_TYPE_I16, "U8 to I16"},
    {ZQ_TYPE_U8, ZQ_TYPE_SGL, "U8 to SGL"},
    {ZQ_TYPE_U8, ZQ_TYPE_RGB, "U8 to RGB"},
    {ZQ_TYPE_U8, ZQ_TYPE_RGBU64},
    {ZQ_TYPE_RGB, ZQ_TYPE_RGBU64, "RGB to RGBU64"},
    {ZQ_TYPE_I16, ZQ_TYPE_U8, "I16 to U8"},
    {ZQ_TYPE_I16, ZQ_TYPE_U8, "I16 of 12 bits to U8", 12},
    {ZQ_TYPE_SGL, ZQ_TYPE_U8, "SGL to U8"},
    {ZQ_TYPE_SGL, ZQ_TYPE_I16, "SGL to I16"},
    {ZQ_TYPE_RGB, ZQ_TYPE_U8, "RGB to U8"},
    {ZQ_TYPE_COMPLEX, ZQ_TYPE_SGL, "split and magnitude"},
    {ZQ_TYPE_COMPLEX, ZQ_TYPE_U8, "split and magnitude"},
    {ZQ_TYPE_COMPLEX, ZQ_TYPE_RGB, "split and magnitude"},
};

bool is_compared(int32_t from, int32_t to) {
    for (const Conversion& c : kCompared) {
        if (c.from == from && c.to == to) return true;
    }
    return false;
}

void add_conversion(const Conversion& c) {
    const std::string depth = c.bit_depth == 0 ? "" : "/" + std::to_string(c.bit_depth) + " bits";
    add("Convert/" + std::string(kTypeNames[c.from]) + " to " + kTypeNames[c.to] + depth,
        [c](benchmark::State& state) { convert(state, c); });
}

[[maybe_unused]] const bool g_registered = [] {
    for (const Conversion& c : kCompared) add_conversion(c);
    for (int32_t from = 0; from < 7; ++from) {
        for (int32_t to = 0; to < 7; ++to) {
            // RGB and HSL into each other are the colour models' own benchmark.
            const bool colour_model = (from == ZQ_TYPE_RGB && to == ZQ_TYPE_HSL) ||
                                      (from == ZQ_TYPE_HSL && to == ZQ_TYPE_RGB);
            if (!is_compared(from, to) && !colour_model) add_conversion({from, to});
        }
    }
    for (int32_t type = 0; type < 7; ++type) {
        if (type == ZQ_TYPE_COMPLEX) continue;
        add("ToArray/" + std::string(kTypeNames[type]),
            [type](benchmark::State& state) { to_array(state, type); });
    }
    return true;
}();

}  // namespace
