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

template <class From, class To>
using Kernel = void (*)(const From*, To*, std::size_t);

// A kernel that needs no settings, as a pass.
template <auto kKernel>
void plain(const void* from, void* to, std::size_t pixels, const ConversionSettings& /*settings*/) {
    [&]<class From, class To>(Kernel<From, To> kernel) {
        kernel(static_cast<const From*>(from), static_cast<To*>(to), pixels);
    }(kKernel);
}

void reduce_i16(const void* from, void* to, std::size_t pixels,
                const ConversionSettings& settings) {
    i16_to_u8(static_cast<const std::int16_t*>(from), static_cast<std::uint8_t*>(to), pixels,
              Reduction(settings.bit_depth));
}

// Alpha like the colours.
void reduce_rgbu64(const void* from, void* to, std::size_t pixels,
                   const ConversionSettings& settings) {
    u16_to_u8(static_cast<const std::uint16_t*>(from), static_cast<std::uint8_t*>(to), 4 * pixels,
              Reduction(settings.bit_depth));
}

void scaled_magnitude(const void* from, void* to, std::size_t pixels,
                      const ConversionSettings& settings) {
    magnitude_to_u8(static_cast<const float*>(from), static_cast<std::uint8_t*>(to), pixels,
                    settings.scale);
}

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
    {{{reduce_i16},
      {},
      {plain<i16_to_f32>},
      {plain<i16_to_f32>, kSglToComplex},
      {reduce_i16, kU8ToRgb},
      {reduce_i16, kU8ToHsl},
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
    {{{scaled_magnitude},
      {plain<magnitude_to_i16>},
      {plain<magnitude_to_f32>},
      {},
      {scaled_magnitude, kU8ToRgb},
      {scaled_magnitude, kU8ToHsl},
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
    {{{reduce_rgbu64, kRgbToU8},
      {plain<rgbu64_to_mean_i16>},
      {plain<rgbu64_to_mean_f32>},
      {plain<rgbu64_to_mean_f32>, kSglToComplex},
      {reduce_rgbu64},
      {reduce_rgbu64, kRgbToHsl},
      {}}},
}};

const Passes& chain(PixelType from, PixelType to) {
    return kChains[static_cast<std::size_t>(from)][static_cast<std::size_t>(to)];
}

}  // namespace

RowConverter::RowConverter(PixelType from, PixelType to, const ConversionSettings& settings,
                           Destination destination)
    : passes_(chain(from, to)),
      settings_(settings),
      destination_(destination),
      from_bytes_(static_cast<std::size_t>(bytes_per_pixel(from))),
      to_bytes_(static_cast<std::size_t>(bytes_per_pixel(to))) {}

RowConverter::~RowConverter() {
    if (destination_ == Destination::kStreamed) finish_streaming();
}

void RowConverter::convert(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
    while (pixels > 0) {
        const std::size_t some = std::min(pixels, kPixelsAtOnce);
        convert_some(from, to, some);
        from += some * from_bytes_;
        to += some * to_bytes_;
        pixels -= some;
    }
}

void RowConverter::convert_some(const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
    const void* source = from;
    std::size_t scratch = 0;
    for (std::size_t i = 0; i < passes_.size() && passes_[i] != nullptr; ++i) {
        const bool is_last = i + 1 == passes_.size() || passes_[i + 1] == nullptr;
        const bool direct = is_last && destination_ == Destination::kCached;
        void* target = direct ? to : scratch_[scratch].data();
        passes_[i](source, target, pixels, settings_);
        source = target;
        scratch = 1 - scratch;
    }
    if (destination_ == Destination::kStreamed) stream_copy(to, source, pixels * to_bytes_);
}

}  // namespace zq
