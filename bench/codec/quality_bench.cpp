// The quality codec against the least that can be done: libjpeg driven by a bare loop over the same
// pixels, with the tables of the codec's own stream. A picture of 12 million pixels at quality 75.
// Run: zqvis_codec_bench --benchmark_filter=Quality
#include <benchmark/benchmark.h>

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <vector>

// After <cstdio>, which it needs.
#include <jpeglib.h>

#include "paired.h"
#include "serialize/quality_codec.h"

namespace {

constexpr std::int32_t kWidth = 4096;
constexpr std::int32_t kHeight = 3000;
constexpr int kQuality = 75;
constexpr std::size_t kHeader = 28;  // of the block, and the length of its first JPEG stream

template <class Sample>
void paint_row(std::uint8_t* row, std::int32_t y, int channels, double scale,
               std::uint32_t& random) {
    auto* at = reinterpret_cast<Sample*>(row);
    for (std::int32_t x = 0; x < kWidth; ++x) {
        const double shade = 110 + 50 * std::sin(x * 0.02) + 40 * std::cos(y * 0.03 + x * 0.01);
        const int edge = (x / 37 + y / 53) % 7 == 0 ? 30 : 0;
        for (int i = 0; i < channels; ++i) {
            random = random * 1664525U + 1013904223U;
            const double sample = shade + edge + i * 5 + (random >> 28);
            *at++ = static_cast<Sample>(i == 3 ? 0 : scale * sample);
        }
    }
}

// Like a photograph: soft shapes, edges and the noise of a sensor.
void paint(const zq::Image& image) {
    std::uint32_t random = 1;
    for (std::int32_t y = 0; y < kHeight; ++y) {
        std::uint8_t* row = image.row(y);
        switch (image.type()) {
            case zq::PixelType::kI16:
                paint_row<std::int16_t>(row, y, 1, 100, random);
                break;
            case zq::PixelType::kSgl:
                paint_row<float>(row, y, 1, 1e-3, random);
                break;
            case zq::PixelType::kComplex:
                paint_row<float>(row, y, 2, 1e-3, random);
                break;
            case zq::PixelType::kRgbU64:
                paint_row<std::uint16_t>(row, y, 4, 200, random);
                break;
            default:
                paint_row<std::uint8_t>(row, y, zq::bytes_per_pixel(image.type()), 1, random);
        }
    }
}

// The stream's own tables and sampling; any stream of the codec has those of its quality.
void copy_tables(const std::vector<std::uint8_t>& block, jpeg_compress_struct& to) {
    jpeg_decompress_struct from{};
    jpeg_error_mgr errors;
    from.err = jpeg_std_error(&errors);
    jpeg_create_decompress(&from);
    jpeg_mem_src(&from, block.data() + kHeader, block.size() - kHeader);
    jpeg_read_header(&from, TRUE);
    for (int i = 0; i < 2; ++i) {
        if (from.quant_tbl_ptrs[i] == nullptr) continue;
        unsigned steps[64];
        for (int k = 0; k < 64; ++k) steps[k] = from.quant_tbl_ptrs[i]->quantval[k];
        jpeg_add_quant_table(&to, i, steps, 100, TRUE);
    }
    jpeg_destroy_decompress(&from);
}

std::size_t bare_encode(const zq::Image& image, const std::vector<std::uint8_t>& block) {
    jpeg_compress_struct jpeg{};
    jpeg_error_mgr errors;
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_compress(&jpeg);
    unsigned char* out = nullptr;
    unsigned long size = 0;
    jpeg_mem_dest(&jpeg, &out, &size);
    const bool colour = image.type() == zq::PixelType::kRgb;
    jpeg.image_width = kWidth;
    jpeg.image_height = kHeight;
    jpeg.input_components = colour ? 4 : 1;
    jpeg.in_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg_set_defaults(&jpeg);
    jpeg.comp_info[0].h_samp_factor = jpeg.comp_info[0].v_samp_factor = 1;
    copy_tables(block, jpeg);
    jpeg_start_compress(&jpeg, TRUE);
    while (jpeg.next_scanline < jpeg.image_height) {
        JSAMPROW rows[8];
        const JDIMENSION count = std::min<JDIMENSION>(8, jpeg.image_height - jpeg.next_scanline);
        for (JDIMENSION i = 0; i < count; ++i) {
            rows[i] = image.row(static_cast<std::int32_t>(jpeg.next_scanline + i));
        }
        jpeg_write_scanlines(&jpeg, rows, count);
    }
    jpeg_finish_compress(&jpeg);
    jpeg_destroy_compress(&jpeg);
    std::free(out);
    return size;
}

void bare_decode(const zq::Image& image, const std::vector<std::uint8_t>& block) {
    jpeg_decompress_struct jpeg{};
    jpeg_error_mgr errors;
    jpeg.err = jpeg_std_error(&errors);
    jpeg_create_decompress(&jpeg);
    jpeg_mem_src(&jpeg, block.data() + kHeader, block.size() - kHeader);
    jpeg_read_header(&jpeg, TRUE);
    const bool colour = image.type() == zq::PixelType::kRgb;
    jpeg.jpeg_color_space = colour ? JCS_YCbCr : JCS_GRAYSCALE;
    jpeg.out_color_space = colour ? JCS_EXT_BGRX : JCS_GRAYSCALE;
    jpeg_start_decompress(&jpeg);
    while (jpeg.output_scanline < jpeg.output_height) {
        JSAMPROW row = image.row(static_cast<std::int32_t>(jpeg.output_scanline));
        jpeg_read_scanlines(&jpeg, &row, 1);
    }
    jpeg_finish_decompress(&jpeg);
    jpeg_destroy_decompress(&jpeg);
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
        [&] { benchmark::DoNotOptimize(bare_encode(image, block)); });
    state.counters["bits_per_pixel"] = 8.0 * static_cast<double>(block.size()) / kWidth / kHeight;
}

void QualityDecode(benchmark::State& state) {
    zq::Image& image = picture(static_cast<std::int32_t>(state.range(0)));
    const auto block = zq::compress_pixels(image, kQuality);
    zqbench::run_paired(
        state, [&] { zq::decompress_pixels(image, block); }, [&] { bare_decode(image, block); });
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
