// Drawing 1920 x 1080 pixels on a canvas, one thread. Bitmaps are shown so small that it costs next
// to nothing, beside memcpy of the bitmap's bytes and of the bytes that are read and written; whole
// redraws beside memcpy of the canvas's bytes; pictures taken in place beside a tiny one. Run:
// zqvis_bench --benchmark_filter=Display
#include <benchmark/benchmark.h>
#include <zqvissvc/convert.h>
#include <zqvissvc/display.h>

#include <vector>

#include "image.h"
#include "throughput.h"

namespace {

using zqbench::Baseline;
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

    void clip(const ZqCoordinates& box) const {
        check(ZqSetCanvasClip(handle_, &box) == 0, "ZqSetCanvasClip");
    }

  private:
    ZqDeviceContext handle_ = nullptr;
};

// A picture of the client's size at this zoom is mapped in full, but a single column is painted.
constexpr int32_t kSmallest = -16;
class SmallCanvas : public Canvas {
  public:
    SmallCanvas() : Canvas(kClientWidth / 16, kHigh) { clip({5, 0, 6, kHigh}); }

  private:
    static constexpr int32_t kHigh = (kClientHeight + 15) / 16;
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

struct Bitmap {
    int32_t type;
    size_t bytes;  // a pixel of the bitmap
    int32_t bit_depth = 0;
};

// As cameras give them.
void keep_bits(const Image& samples, int bits) {
    for (int32_t y = 0; y < samples.handle()->height; ++y) {
        auto* row = reinterpret_cast<uint16_t*>(samples.row(y));
        for (int32_t x = 0; x < samples.handle()->width; ++x) {
            row[x] = static_cast<uint16_t>(row[x] >> (16 - bits));
        }
    }
}

void Bitmaps(benchmark::State& state, const Bitmap& bitmap) {
    const SmallCanvas canvas;
    const Image image(bitmap.type, kClientWidth, kClientHeight);
    const Image colours(ZQ_TYPE_RGB, kClientWidth, kClientHeight);
    fill_with_noise(image);
    if (bitmap.type == ZQ_TYPE_I16) keep_bits(image, 12);
    check(ZqSetBitDepth(image.handle(), bitmap.bit_depth) == 0, "bit depth");
    const size_t read = image.row_bytes() * kClientHeight;
    const size_t written = bitmap.bytes * kClientPixels;
    std::vector<Baseline> baselines = {
        zqbench::memcpy_named("memcpy", written),
        zqbench::memcpy_named("memcpy_of_all", (read + written) / 2)};
    if (bitmap.type == ZQ_TYPE_HSL) {
        baselines.push_back({"DF_Convert", [&] {
                                 const ZqImageValue from = image.value();
                                 ZqImageValue to = colours.value();
                                 check(DF_Convert(&from, &to, nullptr) == 0, "DF_Convert");
                             }});
    }
    zqbench::run_compared(
        state, [&] { canvas.draw(image, kSmallest); }, baselines, kClientPixels);
}

// A caller's 16-bit samples by a shift.
void Shifted(benchmark::State& state) {
    const SmallCanvas canvas;
    std::vector<uint8_t> samples(2 * kClientPixels);
    for (size_t i = 0; i < samples.size(); ++i) samples[i] = static_cast<uint8_t>(i * i >> 3);
    zqbench::run_compared(
        state,
        [&] { canvas.draw(samples, kSmallest, kClientWidth, kClientHeight, ZQ_DRAW_GREY_16_BY_4); },
        {zqbench::memcpy_named("memcpy", kClientPixels),
         zqbench::memcpy_named("memcpy_of_all", kClientPixels * 3 / 2)},
        kClientPixels);
}

// The picture covers the canvas exactly.
void Redraw(benchmark::State& state, uint32_t flags, size_t bytes) {
    const auto zoom = static_cast<int32_t>(state.range(0));
    const auto size = [&](int32_t client) { return zoom > 0 ? client / zoom : client * -zoom; };
    const int32_t width = size(kClientWidth), height = size(kClientHeight);
    const Canvas canvas;
    const std::vector<uint8_t> buffer(
        static_cast<size_t>(width) * static_cast<size_t>(height) * bytes, 99);
    zqbench::run_compared(
        state, [&] { canvas.draw(buffer, zoom, width, height, flags); },
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
ZQ_DISPLAY_BENCHMARK(Bitmaps, i16_range, Bitmap{ZQ_TYPE_I16, 1});
ZQ_DISPLAY_BENCHMARK(Bitmaps, i16_depth, Bitmap{ZQ_TYPE_I16, 1, 12});
ZQ_DISPLAY_BENCHMARK(Bitmaps, sgl, Bitmap{ZQ_TYPE_SGL, 1});
ZQ_DISPLAY_BENCHMARK(Bitmaps, complex, Bitmap{ZQ_TYPE_COMPLEX, 1});
ZQ_DISPLAY_BENCHMARK(Bitmaps, hsl, Bitmap{ZQ_TYPE_HSL, 4});
ZQ_DISPLAY_BENCHMARK(Bitmaps, rgbu64, Bitmap{ZQ_TYPE_RGBU64, 4});
ZQ_DISPLAY_BENCHMARK(Redraw, grey_8, ZQ_DRAW_GREY_8, 1)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Redraw, colour_24, ZQ_DRAW_COLOUR_24, 3)->Arg(1)->Arg(2)->Arg(-2);
ZQ_DISPLAY_BENCHMARK(Redraw, colour_32, ZQ_DRAW_COLOUR_32, 4)->Arg(1)->Arg(2)->Arg(-2);
BENCHMARK(Shifted)
    ->Name("Display/Bitmaps/i16_shift")
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond)
    ->Iterations(101);

}  // namespace
