// Drawing on a canvas of 1920 x 1080 pixels, one thread: whole redraws beside memcpy of the
// canvas's bytes, and pictures taken in place beside a tiny one. Run: zqvis_bench
// --benchmark_filter=Display
#include <benchmark/benchmark.h>
#include <zqvissvc/display.h>

#include <vector>

#include "image.h"
#include "throughput.h"

namespace {

using zqbench::check;
using zqbench::Image;

constexpr int32_t kClientWidth = 1920;
constexpr int32_t kClientHeight = 1080;
constexpr size_t kClientPixels = size_t{kClientWidth} * kClientHeight;

class Canvas {
  public:
    explicit Canvas(int32_t width = kClientWidth, int32_t height = kClientHeight) {
        check(ZqNewCanvas(width, height, &handle_) == 0, "ZqNewCanvas");
    }
    ~Canvas() { ZqDisposeCanvas(handle_); }
    Canvas(const Canvas&) = delete;
    Canvas& operator=(const Canvas&) = delete;

    void draw(const Image& image, int32_t zoom) const {
        check(ZqDrawImage(handle_, image.handle(), zoom, 0, 0, 0, handle_) == 0, "ZqDrawImage");
    }
    void draw(const std::vector<uint8_t>& buffer, int32_t zoom, int32_t width, int32_t height,
              uint32_t flags) const {
        check(Gen_PlotZoomedImage(handle_, buffer.data(), zoom, width, height, 0, 0, flags,
                                  handle_) == 0,
              "Gen_PlotZoomedImage");
    }

  private:
    ZqDeviceContext handle_ = nullptr;
};

// The time that is wanted does not depend on the picture's size: "x tiny" near 1. Both cover the
// canvas.
void InPlace(benchmark::State& state, int32_t type) {
    constexpr int kTimes = 200;
    constexpr int32_t kSide = 8192;
    const Canvas canvas(1, 1);
    const Image large(type, kSide, kSide), tiny(type, 64, 64);
    const auto often = [&](const Image& image) {
        return [&] {
            for (int i = 0; i < kTimes; ++i) canvas.draw(image, 1);
        };
    };
    zqbench::run_compared(state, often(large), {{"tiny", often(tiny)}},
                          kTimes * size_t{kSide} * kSide);
}

int32_t covering_size(int32_t client, int32_t zoom) {
    return zoom > 0 ? client / zoom : client * -zoom;
}

// The picture covers the canvas exactly.
void Redraw(benchmark::State& state, uint32_t flags, size_t bytes) {
    const auto zoom = static_cast<int32_t>(state.range(0));
    const int32_t width = covering_size(kClientWidth, zoom);
    const int32_t height = covering_size(kClientHeight, zoom);
    const Canvas canvas;
    const std::vector<uint8_t> buffer(
        static_cast<size_t>(width) * static_cast<size_t>(height) * bytes, 99);
    zqbench::run_compared(
        state, [&] { canvas.draw(buffer, zoom, width, height, flags); },
        {zqbench::memcpy_named("memcpy", 4 * kClientPixels)}, kClientPixels);
}

// Pictures of types that are mapped. They cover the canvas so many times in each direction.
void Mapped(benchmark::State& state, int32_t type, int32_t times) {
    const auto zoom = static_cast<int32_t>(state.range(0));
    const Canvas canvas;
    const Image image(type, times * covering_size(kClientWidth, zoom),
                      times * covering_size(kClientHeight, zoom));
    fill_with_noise(image);
    zqbench::run_compared(
        state, [&] { canvas.draw(image, zoom); },
        {zqbench::memcpy_named("memcpy", 4 * kClientPixels)}, kClientPixels);
}

#define ZQ_DISPLAY_BENCHMARK(job, name, ...)  \
    BENCHMARK_CAPTURE(job, name, __VA_ARGS__) \
        ->Name("Display/" #job "/" #name)     \
        ->UseManualTime()                     \
        ->Unit(benchmark::kMillisecond)       \
        ->Iterations(101)

ZQ_DISPLAY_BENCHMARK(InPlace, u8, ZQ_TYPE_U8);
ZQ_DISPLAY_BENCHMARK(InPlace, rgb, ZQ_TYPE_RGB);
ZQ_DISPLAY_BENCHMARK(Redraw, grey_8, ZQ_DRAW_GREY_8, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Redraw, colour_24, ZQ_DRAW_COLOUR_24, 3)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Redraw, colour_32, ZQ_DRAW_COLOUR_32, 4)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Mapped, i16, ZQ_TYPE_I16, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Mapped, sgl, ZQ_TYPE_SGL, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Mapped, complex, ZQ_TYPE_COMPLEX, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Mapped, hsl, ZQ_TYPE_HSL, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Mapped, rgbu64, ZQ_TYPE_RGBU64, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Mapped, part_of_sgl, ZQ_TYPE_SGL, 2)->Arg(1);
ZQ_DISPLAY_BENCHMARK(Mapped, part_of_hsl, ZQ_TYPE_HSL, 2)->Arg(1);

}  // namespace
