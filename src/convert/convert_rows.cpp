// The chains of kernels behind every pair of pixel types. What lies between two passes stays in the
// nearest cache. Values of 16 bits a channel are not scaled when they come from or go to types of
// other depths, unless a bit depth says so.
#include "convert/convert_rows.h"

#include <algorithm>

#include "kernels/colour_model.h"
#include "kernels/from_colour.h"
#include "kernels/from_float.h"
#include "kernels/from_i16.h"
#include "kernels/from_u8.h"
#include "kernels/stream_copy.h"

namespace zq {

namespace {

using Pass = RowConverter::Pass;
using Passes = RowConverter::Passes;

// Kernels that need no settings, as passes.
template <auto kKernel, class From, class To>
constexpr Pass pass_of(void (*)(const From*, To*, std::size_t)) {
    return {[](const void* from, void* to, std::size_t pixels, const ConversionSettings&, Stores) {
                kKernel(static_cast<const From*>(from), static_cast<To*>(to), pixels);
            },
            false};
}

template <auto kKernel, class From, class To>
constexpr Pass pass_of(void (*)(const From*, To*, std::size_t, Stores)) {
    return {[](const void* from, void* to, std::size_t pixels, const ConversionSettings&,
               Stores stores) {
                kKernel(static_cast<const From*>(from), static_cast<To*>(to), pixels, stores);
            },
            true};
}

template <auto kKernel>
constexpr Pass plain = pass_of<kKernel>(kKernel);

constexpr Pass kReduceI16 = {
    [](const void* from, void* to, std::size_t pixels, const ConversionSettings& settings, Stores) {
        i16_to_u8(static_cast<const std::int16_t*>(from), static_cast<std::uint8_t*>(to), pixels,
                  Reduction(settings.bit_depth));
    }};

// Alpha like the colours.
constexpr Pass kReduceRgbU64 = {
    [](const void* from, void* to, std::size_t pixels, const ConversionSettings& settings, Stores) {
        u16_to_u8(static_cast<const std::uint16_t*>(from), static_cast<std::uint8_t*>(to),
                  4 * pixels, Reduction(settings.bit_depth));
    }};

constexpr Pass kScaledMagnitude = {
    [](const void* from, void* to, std::size_t pixels, const ConversionSettings& settings, Stores) {
        magnitude_to_u8(static_cast<const float*>(from), static_cast<std::uint8_t*>(to), pixels,
                        settings.scale);
    }};

constexpr Pass kU8ToI16 = plain<u8_to_i16>;
constexpr Pass kU8ToSgl = plain<u8_to_f32>;
constexpr Pass kU8ToRgb = plain<u8_to_grey32>;
constexpr Pass kU8ToHsl = plain<u8_to_u32>;
constexpr Pass kU8ToRgbU64 = plain<u8_to_grey64>;
constexpr Pass kU16ToRgbU64 = plain<u16_to_grey64>;
constexpr Pass kSglToU8 = plain<f32_to_u8>;
constexpr Pass kSglToComplex = plain<f32_to_complex>;
constexpr Pass kRgbToU8 = plain<rgb_to_mean_u8>;
constexpr Pass kRgbToSgl = plain<rgb_to_mean_f32>;
constexpr Pass kRgbToHsl = plain<rgb_to_hsl>;
constexpr Pass kRgbToRgbU64 = plain<rgb_to_rgbu64>;
constexpr Pass kHslToU8 = plain<hsl_to_luminance>;
constexpr Pass kHslToRgb = plain<hsl_to_rgb>;

// By source, then destination, both in the order of the type codes.
constexpr std::array<std::array<Passes, 7>, 7> kChains = {{
    // U8
    {{{},
      {kU8ToI16},
      {kU8ToSgl},
      {kU8ToSgl, kSglToComplex},
      {kU8ToRgb},
      {kU8ToHsl},
      {kU8ToRgbU64}}},
    // I16
    {{{kReduceI16},
      {},
      {plain<i16_to_f32>},
      {plain<i16_to_f32>, kSglToComplex},
      {kReduceI16, kU8ToRgb},
      {kReduceI16, kU8ToHsl},
      {plain<i16_to_u16>, kU16ToRgbU64}}},
    // SGL
    {{{kSglToU8},
      {plain<f32_to_i16>},
      {},
      {kSglToComplex},
      {kSglToU8, kU8ToRgb},
      {kSglToU8, kU8ToHsl},
      {plain<f32_to_u16>, kU16ToRgbU64}}},
    // Complex
    {{{kScaledMagnitude},
      {plain<magnitude_to_i16>},
      {plain<magnitude_to_f32>},
      {},
      {kScaledMagnitude, kU8ToRgb},
      {kScaledMagnitude, kU8ToHsl},
      {plain<magnitude_to_u16>, kU16ToRgbU64}}},
    // RGB
    {{{kRgbToU8},
      {kRgbToU8, kU8ToI16},
      {kRgbToSgl},
      {kRgbToSgl, kSglToComplex},
      {},
      {kRgbToHsl},
      {kRgbToRgbU64}}},
    // HSL
    {{{kHslToU8},
      {kHslToU8, kU8ToI16},
      {kHslToU8, kU8ToSgl},
      {kHslToU8, kU8ToSgl, kSglToComplex},
      {kHslToRgb},
      {},
      {kHslToRgb, kRgbToRgbU64}}},
    // RGBU64
    {{{kReduceRgbU64, kRgbToU8},
      {plain<rgbu64_to_mean_i16>},
      {plain<rgbu64_to_mean_f32>},
      {plain<rgbu64_to_mean_f32>, kSglToComplex},
      {kReduceRgbU64},
      {kReduceRgbU64, kRgbToHsl},
      {}}},
}};

const Passes& chain(PixelType from, PixelType to) {
    return kChains[static_cast<std::size_t>(from)][static_cast<std::size_t>(to)];
}

}  // namespace

RowConverter::RowConverter(PixelType from, PixelType to, const ConversionSettings& settings,
                           Stores stores)
    : passes_(chain(from, to)),
      settings_(settings),
      stores_(stores),
      from_bytes_(static_cast<std::size_t>(bytes_per_pixel(from))),
      to_bytes_(static_cast<std::size_t>(bytes_per_pixel(to))) {}

RowConverter::~RowConverter() {
    if (stores_ == Stores::kStreamed) finish_streaming();
}

void RowConverter::convert(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
    const bool is_single = passes_[1].run == nullptr;
    if (is_single && (stores_ == Stores::kCached || passes_[0].can_stream)) {
        passes_[0].run(from, to, pixels, settings_, stores_);
        return;
    }
    while (pixels > 0) {
        const std::size_t some = std::min(pixels, kPixelsAtOnce);
        convert_some(from, to, some);
        from += some * from_bytes_;
        to += some * to_bytes_;
        pixels -= some;
    }
}

// What is narrower than its source, or has come through several passes, is written past the cache
// in whole blocks: single narrow stores do not fill the lines.
void RowConverter::convert_some(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
    const void* source = from;
    std::size_t scratch = 0;
    for (std::size_t i = 0; i < passes_.size() && passes_[i].run != nullptr; ++i) {
        const bool is_last = i + 1 == passes_.size() || passes_[i + 1].run == nullptr;
        void* target = is_last && stores_ == Stores::kCached ? to : scratch_[scratch].data();
        passes_[i].run(source, target, pixels, settings_, Stores::kCached);
        source = target;
        scratch = 1 - scratch;
    }
    if (stores_ == Stores::kStreamed) stream_copy(to, source, pixels * to_bytes_);
}

}  // namespace zq
