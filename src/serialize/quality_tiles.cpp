// Pixels of a tile to planes and back.
#include <algorithm>
#include <bit>
#include <cmath>
#include <cstring>
#include <limits>
#include <type_traits>

#include "serialize/quality_samples.h"

namespace zq {

namespace {

// Integers and their scales are exact in single precision.
template <class Sample>
using Real = std::conditional_t<std::is_floating_point_v<Sample>, double, float>;

constexpr std::size_t kHuePlane = 2;
constexpr float kHues = 256;

constexpr float kRoot2 = 0.7071067812F;  // 1 / sqrt(2)
constexpr float kRoot3 = 0.5773502692F;  // 1 / sqrt(3)
constexpr float kRoot6 = 0.4082482905F;  // 1 / sqrt(6)

// Samples `kPixel` bytes apart.
template <class Sample, std::ptrdiff_t kPixel>
void load_row(const std::uint8_t* from, float* to, std::int32_t count, const SampleScale& scale) {
    const auto middle = static_cast<Real<Sample>>(scale.middle);
    const auto factor = static_cast<Real<Sample>>(scale.scale);
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        Sample sample;
        std::memcpy(&sample, from + x * kPixel, sizeof(sample));
        to[x] = static_cast<float>((static_cast<Real<Sample>>(sample) - middle) * factor);
    }
}

template <class Sample, std::ptrdiff_t kPixel>
void store_row(const float* from, std::uint8_t* to, std::int32_t count, const SampleScale& scale,
               const SampleRange& range) {
    using R = Real<Sample>;
    const auto middle = static_cast<R>(scale.middle);
    const auto factor = static_cast<R>(1 / scale.scale);
    const auto low = static_cast<R>(range.low);
    const auto high = static_cast<R>(range.high);
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        R value = static_cast<R>(from[x]) * factor + middle;
        value = value < low ? low : value;
        value = value > high ? high : value;
        Sample sample;
        if constexpr (std::is_floating_point_v<Sample>) {
            sample = static_cast<Sample>(value);
        } else {
            const auto above_low = static_cast<std::int32_t>(value - low + R{0.5});
            sample = static_cast<Sample>(above_low + static_cast<std::int32_t>(low));
        }
        std::memcpy(to + x * kPixel, &sample, sizeof(sample));
    }
}

void store_hues(const float* from, std::uint8_t* to, std::int32_t count, const SampleScale& scale) {
    constexpr float kFar = 1 << 23;  // more than any unwrapped hue
    const auto factor = static_cast<float>(1 / scale.scale);
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        const float value =
            std::clamp(from[x] * factor + static_cast<float>(scale.middle), -kFar, kFar);
        to[4 * x] = static_cast<std::uint8_t>(static_cast<std::int32_t>(std::floor(value + 0.5F)));
    }
}

void fill_gaps(float* row, std::int32_t count) {
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        if (!std::isfinite(row[x])) row[x] = x > 0 ? row[x - 1] : 0;
    }
}

// Moves each hue by whole turns to where it is nearest to its neighbours above and to the left, so
// that no jump from 255 to 0 is left to code. `above` is null in the first row.
void unwrap_hues(float* row, const float* above, std::int32_t count, float turn) {
    const float turns = 1 / turn;
    float left = above != nullptr ? above[0] : row[0];
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        const float near = above != nullptr ? (left + above[x]) / 2 : left;
        row[x] += turn * std::floor((near - row[x]) * turns + 0.5F);
        left = row[x];
    }
}

// Blue, green, red to three orthonormal mixtures, so that an error in one is the same error in the
// pixel: brightness, red against blue, green against both.
void mix_colours(float* a, float* b, float* c, std::int32_t count) {
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        const float blue = a[x];
        const float green = b[x];
        const float red = c[x];
        a[x] = (red + green + blue) * kRoot3;
        b[x] = (red - blue) * kRoot2;
        c[x] = (red - 2 * green + blue) * kRoot6;
    }
}

void unmix_colours(float* a, float* b, float* c, std::int32_t count) {
    for (std::ptrdiff_t x = 0; x < count; ++x) {
        const float brightness = a[x] * kRoot3;
        const float red_blue = b[x] * kRoot2;
        const float green = c[x] * kRoot6;
        a[x] = brightness - red_blue + green;
        b[x] = brightness - 2 * green;
        c[x] = brightness + red_blue + green;
    }
}

std::uint32_t bits_of_class(std::uint32_t kind) {
    using Limits = std::numeric_limits<float>;
    if (kind == 1) return std::bit_cast<std::uint32_t>(Limits::quiet_NaN());
    return std::bit_cast<std::uint32_t>(kind == 2 ? Limits::infinity() : -Limits::infinity());
}

void mark_not_finite(std::uint8_t* pixel, std::uint32_t kinds) {
    for (; kinds != 0; kinds >>= 2, pixel += 4) {
        if ((kinds & 3) == 0) continue;
        const std::uint32_t bits = bits_of_class(kinds & 3);
        std::memcpy(pixel, &bits, sizeof(bits));
    }
}

std::uint16_t exact_value(const LosslessPlane& plane, std::size_t x, std::size_t y) {
    if (plane.planes == nullptr) return plane.value;
    const std::uint8_t low = plane.planes->row(0, y)[x];
    const std::uint8_t high = plane.planes->planes > 1 ? plane.planes->row(1, y)[x] : 0;
    return static_cast<std::uint16_t>(low | high << 8);
}

void store_exact(const Image& image, const PixelRect& rect, std::int32_t y,
                 const LosslessPlane& plane) {
    const PixelType type = image.type();
    const bool is_float = plane_layout(type).is_float;
    if (type == PixelType::kI16 || (is_float && plane.planes == nullptr && plane.value == 0))
        return;
    const auto bytes = static_cast<std::ptrdiff_t>(bytes_per_pixel(type));
    const std::uint32_t kinds = type == PixelType::kSgl ? 3 : 15;
    std::uint8_t* pixel = image.row(y) + rect.x * bytes;
    for (std::int32_t x = rect.x; x < rect.x + rect.width; ++x, pixel += bytes) {
        const std::uint16_t value =
            exact_value(plane, static_cast<std::size_t>(x), static_cast<std::size_t>(y));
        if (is_float) {
            mark_not_finite(pixel, value & kinds);
        } else if (type == PixelType::kHsl) {
            pixel[3] = static_cast<std::uint8_t>(value);
        } else {
            std::memcpy(pixel + 6, &value, sizeof(value));
        }
    }
}

}  // namespace

void load_tile(const Image& image, const PixelRect& rect, std::span<const SampleScale> scales,
               const PlaneRows& planes) {
    const PixelType type = image.type();
    const float turn = kHues * static_cast<float>(scales[kHuePlane].scale);
    for (std::int32_t y = 0; y < rect.height; ++y) {
        const std::uint8_t* from =
            image.row(rect.y + y) + std::ptrdiff_t{rect.x} * bytes_per_pixel(type);
        const std::ptrdiff_t at = std::ptrdiff_t{y} * kTileSide;
        const auto row = [&](std::size_t plane) { return planes[plane] + at; };
        switch (type) {
            case PixelType::kI16:
                load_row<std::int16_t, 2>(from, row(0), rect.width, scales[0]);
                break;
            case PixelType::kHsl:
                for (std::size_t i = 0; i < 3; ++i) {
                    load_row<std::uint8_t, 4>(from + i, row(i), rect.width, scales[i]);
                }
                unwrap_hues(row(kHuePlane), y > 0 ? row(kHuePlane) - kTileSide : nullptr,
                            rect.width, turn);
                break;
            case PixelType::kRgbU64:
                for (std::size_t i = 0; i < 3; ++i) {
                    load_row<std::uint16_t, 8>(from + 2 * i, row(i), rect.width, scales[i]);
                }
                mix_colours(row(0), row(1), row(2), rect.width);
                break;
            case PixelType::kComplex:
                for (std::size_t i = 0; i < 2; ++i) {
                    load_row<float, 8>(from + 4 * i, row(i), rect.width, scales[i]);
                    fill_gaps(row(i), rect.width);
                }
                break;
            default:
                load_row<float, 4>(from, row(0), rect.width, scales[0]);
                fill_gaps(row(0), rect.width);
        }
    }
}

void store_tile(const Image& image, const PixelRect& rect, std::span<const SampleScale> scales,
                std::span<const SampleRange> ranges, const LosslessPlane& lossless,
                const PlaneRows& planes) {
    const PixelType type = image.type();
    for (std::int32_t y = 0; y < rect.height; ++y) {
        std::uint8_t* to = image.row(rect.y + y) + std::ptrdiff_t{rect.x} * bytes_per_pixel(type);
        const std::ptrdiff_t at = std::ptrdiff_t{y} * kTileSide;
        const auto row = [&](std::size_t plane) { return planes[plane] + at; };
        switch (type) {
            case PixelType::kI16:
                store_row<std::int16_t, 2>(row(0), to, rect.width, scales[0], ranges[0]);
                break;
            case PixelType::kHsl:
                for (std::size_t i = 0; i < 2; ++i) {
                    store_row<std::uint8_t, 4>(row(i), to + i, rect.width, scales[i], ranges[i]);
                }
                store_hues(row(kHuePlane), to + kHuePlane, rect.width, scales[kHuePlane]);
                break;
            case PixelType::kRgbU64:
                unmix_colours(row(0), row(1), row(2), rect.width);
                for (std::size_t i = 0; i < 3; ++i) {
                    store_row<std::uint16_t, 8>(row(i), to + 2 * i, rect.width, scales[i],
                                                ranges[i]);
                }
                break;
            case PixelType::kComplex:
                for (std::size_t i = 0; i < 2; ++i) {
                    store_row<float, 8>(row(i), to + 4 * i, rect.width, scales[i], ranges[i]);
                }
                break;
            default:
                store_row<float, 4>(row(0), to, rect.width, scales[0], ranges[0]);
        }
        store_exact(image, rect, rect.y + y, lossless);
    }
}

}  // namespace zq
