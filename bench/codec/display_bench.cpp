// Drawing a 1920 x 1080 window: the rows of the bitmap alone, beside memcpy of the bitmap's bytes
// (HSL: beside the plain conversion); and all of a redraw on a canvas, beside memcpy of the
// canvas's bytes. x_baseline is how many times the baseline's throughput that is.
// Run: zqvis_codec_bench --benchmark_filter=Display
#include <benchmark/benchmark.h>

#include <cstring>
#include <memory>
#include <vector>

#include "convert/convert_image.h"
#include "display/canvas.h"
#include "display/dib_rows.h"
#include "display/draw.h"
#include "paired.h"
#include "photograph.h"

namespace {

constexpr std::int32_t kWidth = 1920;
constexpr std::int32_t kHeight = 1080;

std::unique_ptr<zq::Image> picture(std::int32_t type, std::int32_t width, std::int32_t height) {
    auto image = std::make_unique<zq::Image>(zq::Variant::kPrivate, std::string_view());
    image->reinitialise({.type = type, .width = width, .height = height, .border = 0});
    const auto bytes = static_cast<std::int32_t>(image->row_stride());
    std::uint32_t random = 1;
    for (std::int32_t y = 0; y < height; ++y) {
        if (type == 2 || type == 3) {
            zqbench::paint_row(reinterpret_cast<float*>(image->row(y)), bytes / 4, y, 1, 1e-3,
                               random);
        } else {
            zqbench::paint_row(image->row(y), bytes, y, 1, 1.0, random);
        }
    }
    return image;
}

struct Copy {
    explicit Copy(std::size_t bytes) : source(bytes, 1), destination(bytes) {}
    void operator()() {
        std::memcpy(destination.data(), source.data(), source.size());
        benchmark::ClobberMemory();
    }
    std::vector<std::uint8_t> source, destination;
};

template <class Ours, class Baseline>
void compare(benchmark::State& state, const Ours& ours, Baseline& baseline) {
    zqbench::run_paired(state, ours, baseline);
    state.counters["x_baseline"] = 1 / state.counters["ratio"];
}

void DisplayRows(benchmark::State& state) {
    const auto image = picture(static_cast<std::int32_t>(state.range(0)), kWidth, kHeight);
    zq::PixelView view = zq::PixelView::of(*image);
    view.right_shift = static_cast<std::int32_t>(state.range(1));
    std::vector<std::uint8_t> scratch;
    const zq::Dib dib = zq::make_dib(view, scratch);
    Copy copy(dib.stride() * static_cast<std::size_t>(kHeight));
    compare(
        state, [&] { benchmark::DoNotOptimize(zq::make_dib(view, scratch).bits); }, copy);
}

void DisplayHslRows(benchmark::State& state) {
    const auto image = picture(5, kWidth, kHeight), converted = picture(4, kWidth, kHeight);
    std::vector<std::uint8_t> scratch;
    const auto convert = [&] { zq::convert_image(*image, *converted); };
    compare(
        state,
        [&] { benchmark::DoNotOptimize(zq::make_dib(zq::PixelView::of(*image), scratch).bits); },
        convert);
}

void DisplayRedraw(benchmark::State& state) {
    const auto type = static_cast<std::int32_t>(state.range(0));
    const auto zoom = static_cast<std::int32_t>(state.range(1));
    const auto side = [&](std::int32_t shown) { return zoom < 0 ? shown * -zoom : shown / zoom; };
    const auto image = picture(type, side(kWidth), side(kHeight));
    zq::Canvas canvas(kWidth, kHeight);
    Copy copy(std::size_t{kWidth} * kHeight * 4);
    compare(
        state,
        [&] {
            zq::draw_zoomed(canvas, zq::PixelView::of(*image), {zoom, {0, 0}, canvas.bounds()}, {});
            benchmark::ClobberMemory();
        },
        copy);
}

BENCHMARK(DisplayRows)
    ->ArgNames({"type", "shift"})
    ->Args({0, 0})
    ->Args({1, 4})
    ->Args({1, 0})
    ->Args({2, 0})
    ->Args({3, 0})
    ->Args({4, 0})
    ->Args({6, 0})
    ->UseManualTime()
    ->Iterations(101)
    ->Unit(benchmark::kMicrosecond);
BENCHMARK(DisplayHslRows)->UseManualTime()->Iterations(101)->Unit(benchmark::kMicrosecond);
BENCHMARK(DisplayRedraw)
    ->ArgNames({"type", "zoom"})
    ->ArgsProduct({{0, 1, 2, 4, 6}, {1, 2, -2}})
    ->UseManualTime()
    ->Iterations(101)
    ->Unit(benchmark::kMicrosecond);

}  // namespace
