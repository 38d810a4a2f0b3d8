// The quality codec against the least that can be done: libjpeg driven by a bare loop over the same
// pixels, with the tables of the codec's own stream. Pictures of 12 million pixels, at quality 75
// where nothing else is told; of 640 x 480, which the codec tries at several qualities.
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

struct Size {
    std::int32_t width, height;
    double pixels() const { return static_cast<double>(width) * height; }
};
constexpr Size kLarge = {4096, 3000};
constexpr Size kSmall = {640, 480};
constexpr int kQuality = 75;

template <class Sample>
void paint_as(const zq::Image& image, std::int32_t y, int channels, double scale,
              std::uint32_t& random) {
    zqbench::paint_row(reinterpret_cast<Sample*>(image.row(y)), image.record().width, y, channels,
                       scale, random);
}

void paint(const zq::Image& image) {
    std::uint32_t random = 1;
    for (std::int32_t y = 0; y < image.record().height; ++y) {
        switch (image.type()) {
            case zq::PixelType::kI16:
                paint_as<std::int16_t>(image, y, 1, 100, random);
                break;
            case zq::PixelType::kSgl:
                paint_as<float>(image, y, 1, 1e-3, random);
                break;
            case zq::PixelType::kComplex:
                paint_as<float>(image, y, 2, 1e-3, random);
                break;
            case zq::PixelType::kRgbU64:
                paint_as<std::uint16_t>(image, y, 4, 200, random);
                break;
            default:
                paint_as<std::uint8_t>(image, y, zq::bytes_per_pixel(image.type()), 1, random);
        }
    }
}

zqbench::JpegRows rows_of(const zq::Image& image) {
    const zq::ImageRecord& record = image.record();
    return {image.row(0), image.row_stride(), static_cast<std::uint32_t>(record.width),
            static_cast<std::uint32_t>(record.height), image.type() == zq::PixelType::kRgb};
}

std::span<const std::uint8_t> stream_of(const std::vector<std::uint8_t>& block) {
    return std::span(block).subspan(zqbench::jpeg_start(block));
}

zq::Image& picture(std::int64_t type, const Size& size) {
    static zq::Image image(zq::Variant::kPrivate, {});
    image.reinitialise({.type = static_cast<std::int32_t>(type),
                        .width = size.width,
                        .height = size.height,
                        .border = 0});
    paint(image);
    return image;
}

void encode(benchmark::State& state, const zq::Image& image, int quality) {
    const auto block = zq::compress_pixels(image, quality);
    zqbench::run_paired(
        state, [&] { benchmark::DoNotOptimize(zq::compress_pixels(image, quality)); },
        [&] { benchmark::DoNotOptimize(zqbench::bare_encode(rows_of(image), stream_of(block))); });
    const double pixels = static_cast<double>(image.record().width) * image.record().height;
    state.counters["bits_per_pixel"] = 8.0 * static_cast<double>(block.size()) / pixels;
}

void QualityEncode(benchmark::State& state) {
    encode(state, picture(state.range(0), kLarge), static_cast<int>(state.range(1)));
}

void QualityEncodeSmall(benchmark::State& state) {
    encode(state, picture(state.range(0), kSmall), static_cast<int>(state.range(1)));
}

void QualityDecode(benchmark::State& state) {
    zq::Image& image = picture(state.range(0), kLarge);
    const auto block = zq::compress_pixels(image, kQuality);
    zqbench::run_paired(
        state, [&] { zq::decompress_pixels(image, block); },
        [&] { zqbench::bare_decode(rows_of(image), stream_of(block)); });
}

// Types that are not coded by libjpeg have no such baseline: megapixels a second.
void QualityWavelet(benchmark::State& state) {
    zq::Image& image = picture(state.range(0), kLarge);
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
        benchmark::Counter(kLarge.pixels() / 1e6, benchmark::Counter::kIsIterationInvariantRate);
}

BENCHMARK(QualityEncode)
    ->ArgsProduct({{0, 4}, {kQuality, 100}})
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(QualityEncodeSmall)
    ->ArgsProduct({{0, 4}, {50, kQuality, 100}})
    ->UseManualTime()
    ->Unit(benchmark::kMillisecond);
BENCHMARK(QualityDecode)->Arg(0)->Arg(4)->UseManualTime()->Unit(benchmark::kMillisecond);
BENCHMARK(QualityWavelet)->ArgsProduct({{1, 2, 3, 5, 6}, {0, 1}})->Unit(benchmark::kMillisecond);

}  // namespace
