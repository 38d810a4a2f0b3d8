// The quality codec against the least that can be done: libjpeg driven by a bare loop over the same
// pixels, with the tables of the codec's own stream. A picture of 12 million pixels at quality 75.
// Run: zqvis_codec_bench --benchmark_filter=Quality
#include <benchmark/benchmark.h>

#include <cstdint>
#include <span>
#include <vector>

#include "bare_jpeg.h"
#include "paired.h"
#include "photograph.h"
#include "serialize/quality_codec.h"

namespace {

constexpr std::int32_t kWidth = 4096;
constexpr std::int32_t kHeight = 3000;
constexpr int kQuality = 75;

template <class Sample>
void paint_as(std::uint8_t* row, std::int32_t y, int channels, double scale,
              std::uint32_t& random) {
    zqbench::paint_row(reinterpret_cast<Sample*>(row), kWidth, y, channels, scale, random);
}

void paint(const zq::Image& image) {
    std::uint32_t random = 1;
    for (std::int32_t y = 0; y < kHeight; ++y) {
        std::uint8_t* row = image.row(y);
        switch (image.type()) {
            case zq::PixelType::kI16:
                paint_as<std::int16_t>(row, y, 1, 100, random);
                break;
            case zq::PixelType::kSgl:
                paint_as<float>(row, y, 1, 1e-3, random);
                break;
            case zq::PixelType::kComplex:
                paint_as<float>(row, y, 2, 1e-3, random);
                break;
            case zq::PixelType::kRgbU64:
                paint_as<std::uint16_t>(row, y, 4, 200, random);
                break;
            default:
                paint_as<std::uint8_t>(row, y, zq::bytes_per_pixel(image.type()), 1, random);
        }
    }
}

zqbench::JpegRows rows_of(const zq::Image& image) {
    return {image.row(0), image.row_stride(), kWidth, kHeight, image.type() == zq::PixelType::kRgb};
}

std::span<const std::uint8_t> stream_of(const std::vector<std::uint8_t>& block) {
    return std::span(block).subspan(zqbench::jpeg_start(block));
}

zq::Image& picture(std::int32_t type) {
    static zq::Image image(zq::Variant::kPrivate, {});
    image.reinitialise({.type = type, .width = kWidth, .height = kHeight, .border = 0});
    paint(image);
    return image;
}

void QualityEncode(benchmark::State& state) {
    const zq::Image& image = picture(static_cast<std::int32_t>(state.range(0)));
    const auto block = zq::compress_pixels(image, kQuality);
    zqbench::run_paired(
        state, [&] { benchmark::DoNotOptimize(zq::compress_pixels(image, kQuality)); },
        [&] { benchmark::DoNotOptimize(zqbench::bare_encode(rows_of(image), stream_of(block))); });
    state.counters["bits_per_pixel"] = 8.0 * static_cast<double>(block.size()) / kWidth / kHeight;
}

void QualityDecode(benchmark::State& state) {
    zq::Image& image = picture(static_cast<std::int32_t>(state.range(0)));
    const auto block = zq::compress_pixels(image, kQuality);
    zqbench::run_paired(
        state, [&] { zq::decompress_pixels(image, block); },
        [&] { zqbench::bare_decode(rows_of(image), stream_of(block)); });
}

// Types that are not coded by libjpeg have no such baseline: megapixels a second.
void QualityWavelet(benchmark::State& state) {
    zq::Image& image = picture(static_cast<std::int32_t>(state.range(0)));
    const bool decode = state.range(1) != 0;
    const auto block = zq::compress_pixels(image, kQuality);
    for (auto step : state) {
        if (decode) {
            zq::decompress_pixels(image, block);
        } else {
            benchmark::DoNotOptimize(zq::compress_pixels(image, kQuality));
        }
    }
    state.counters["megapixels"] =
        benchmark::Counter(kWidth * kHeight / 1e6, benchmark::Counter::kIsIterationInvariantRate);
}

BENCHMARK(QualityEncode)->Arg(0)->Arg(4)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(QualityDecode)->Arg(0)->Arg(4)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(QualityWavelet)->ArgsProduct({{1, 2, 3, 5, 6}, {0, 1}})->Unit(benchmark::kMillisecond);

}  // namespace
