// RGB and HSL into each other: a 4096 x 3000 picture, one thread, beside memcpy of the bytes that
// are read and written and beside OpenCV, which converts three channels, not exactly this model and
// not to the last bit. Run: zqvis_bench --benchmark_filter=ColourModel
#include <benchmark/benchmark.h>
#include <zqvissvc/convert.h>
#include <zqvissvc/image.h>

#include <cstring>
#include <string>

#include "colours.h"
#include "image.h"
#include "throughput.h"

namespace {

using zqbench::check;
using zqbench::Image;
using zqbench::kHeight;
using zqbench::kWidth;

void fill(const Image& rgb, bool near_grey) {
    zqbench::Colours colours(near_grey);
    for (int32_t y = 0; y < kHeight; ++y) {
        for (size_t x = 0; x < kWidth; ++x) {
            const uint32_t colour = colours.next();
            std::memcpy(rgb.row(y) + 4 * x, &colour, sizeof colour);
        }
    }
}

void convert(const Image& source, const Image& destination) {
    const ZqImageValue from = source.value();
    ZqImageValue to = destination.value();
    check(DF_Convert(&from, &to, nullptr) == 0, "DF_Convert");
}

void run(benchmark::State& state, bool to_hsl, bool near_grey) {
    const Image rgb(ZQ_TYPE_RGB, kWidth, kHeight), hsl(ZQ_TYPE_HSL, kWidth, kHeight);
    fill(rgb, near_grey);
    convert(rgb, hsl);
    const Image& source = to_hsl ? rgb : hsl;
    const Image destination(to_hsl ? ZQ_TYPE_HSL : ZQ_TYPE_RGB, kWidth, kHeight);
    const std::string job =
        std::string(to_hsl ? "RGB to HSL" : "HSL to RGB") + (near_grey ? " near grey" : " noise");
    zqbench::run_compared(state, [&] { convert(source, destination); },
                          {zqbench::memcpy_of(8), {"OpenCV", zqbench::opencv_colour_model(job)}});
}

#define ZQ_COLOUR_MODEL_BENCHMARK(name, to_hsl, near_grey) \
    BENCHMARK_CAPTURE(run, name, to_hsl, near_grey)        \
        ->Name("ColourModel/" #name)                       \
        ->UseManualTime()                                  \
        ->Unit(benchmark::kMillisecond)                    \
        ->Iterations(11)

ZQ_COLOUR_MODEL_BENCHMARK(rgb_to_hsl_noise, true, false);
ZQ_COLOUR_MODEL_BENCHMARK(rgb_to_hsl_near_grey, true, true);
ZQ_COLOUR_MODEL_BENCHMARK(hsl_to_rgb_noise, false, false);
ZQ_COLOUR_MODEL_BENCHMARK(hsl_to_rgb_near_grey, false, true);

}  // namespace
