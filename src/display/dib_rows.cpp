// Images as bitmaps that a device context takes.
#include "display/dib_rows.h"

#include <algorithm>
#include <cstring>
#include <limits>

#include "base/checked.h"
#include "convert/convert_rows.h"
#include "kernels/colour_model.h"
#include "kernels/from_float.h"
#include "kernels/from_i16.h"

namespace zq {
namespace {

bool is_aligned(const void* address) {
    return reinterpret_cast<std::uintptr_t>(address) % 4 == 0;
}

bool fits_in_place(const PixelView& view) {
    if (!is_aligned(view.pixels)) return false;
    if (view.type == PixelType::kU8) return view.width % 4 == 0 && view.line_width % 4 == 0;
    if (view.type != PixelType::kRgb) return false;
    return !view.packed_colour || (view.width % 4 == 0 && view.line_width % 4 == 0);
}

template <class Row>
void fill_rows(const PixelView& view, const Dib& dib, std::vector<std::uint8_t>& scratch,
               const Row& row) {
    for (std::int32_t y = 0; y < view.height; ++y) {
        row(view.row(y), scratch.data() + static_cast<std::size_t>(y) * dib.stride());
    }
}

template <class Sample>
struct Range {
    Sample least, largest;
};

Range<std::int16_t> range_of_samples(const PixelView& view) {
    Range<std::int16_t> range{std::numeric_limits<std::int16_t>::max(),
                              std::numeric_limits<std::int16_t>::min()};
    for (std::int32_t y = 0; y < view.height; ++y) {
        const auto* from = reinterpret_cast<const std::int16_t*>(view.row(y));
        for (std::int32_t x = 0; x < view.width; ++x) {
            range.least = std::min(range.least, from[x]);
            range.largest = std::max(range.largest, from[x]);
        }
    }
    return range;
}

// NaN takes no part. The largest value starts at the smallest normal number, so that of an image of
// negative values stays there.
Range<float> range_of_floats(const PixelView& view) {
    Range<float> range{std::numeric_limits<float>::max(), std::numeric_limits<float>::min()};
    for (std::int32_t y = 0; y < view.height; ++y) {
        const auto* from = reinterpret_cast<const float*>(view.row(y));
        for (std::int32_t x = 0; x < view.width; ++x) {
            range.least = from[x] < range.least ? from[x] : range.least;
            range.largest = from[x] > range.largest ? from[x] : range.largest;
        }
    }
    return range;
}

// The low byte of the quotient as a 32-bit number; 0 where it is none (an empty range, NaN, or too
// large).
std::uint8_t low_byte(float value, Range<float> range) {
    constexpr float kLimit = 2147483648.0F;
    const float quotient = (value - range.least) * 255.0F / (range.largest - range.least);
    if (!(quotient >= -kLimit && quotient < kLimit)) return 0;
    return static_cast<std::uint8_t>(static_cast<std::int32_t>(quotient));
}

void show_samples(const PixelView& view, const Dib& dib, std::vector<std::uint8_t>& scratch) {
    const auto width = static_cast<std::size_t>(view.width);
    const bool full_range = view.right_shift == 0 && view.bit_depth == 0;
    Reduction reduction(view.bit_depth);
    if (view.right_shift > 0) {
        reduction.shift = view.right_shift;
        reduction.half = 0;
    }
    const Range<std::int16_t> range = full_range ? range_of_samples(view) : Range<std::int16_t>{};
    const std::int32_t span = std::max(1, range.largest - range.least);
    fill_rows(view, dib, scratch, [&](const std::uint8_t* from, std::uint8_t* to) {
        const auto* samples = reinterpret_cast<const std::int16_t*>(from);
        if (!full_range) return i16_to_u8(samples, to, width, reduction);
        for (std::size_t x = 0; x < width; ++x) {
            to[x] = static_cast<std::uint8_t>((samples[x] - range.least) * 255 / span);
        }
    });
}

// Each row goes at once where the exchange of the quadrants takes it; an odd last row or column
// stays.
void show_spectrum(const PixelView& view, const Dib& dib, std::vector<std::uint8_t>& scratch) {
    const double pixels = static_cast<double>(view.width) * view.height;
    const double scale = static_cast<float>(128.0 / pixels);
    const auto width = static_cast<std::size_t>(view.width);
    const std::int32_t half_height = view.height / 2;
    for (std::int32_t y = 0; y < view.height; ++y) {
        const bool moves = y < 2 * half_height;
        const std::size_t half = moves ? width / 2 : 0;
        const auto target = [&](std::int32_t row) {
            return scratch.data() + static_cast<std::size_t>(row) * dib.stride();
        };
        const auto* from = reinterpret_cast<const float*>(view.row(y));
        if (moves) {
            std::uint8_t* to = target((y + half_height) % (2 * half_height));
            magnitude_to_u8(from, to + half, half, scale);
            magnitude_to_u8(from + 2 * half, to, half, scale);
        }
        magnitude_to_u8(from + 4 * half, target(y) + 2 * half, width - 2 * half, scale);
    }
}

void show(const PixelView& view, const Dib& dib, std::vector<std::uint8_t>& scratch) {
    const auto width = static_cast<std::size_t>(view.width);
    switch (view.type) {
        case PixelType::kI16:
            return show_samples(view, dib, scratch);
        case PixelType::kSgl: {
            const Range<float> range = range_of_floats(view);
            return fill_rows(view, dib, scratch, [&](const std::uint8_t* from, std::uint8_t* to) {
                const auto* values = reinterpret_cast<const float*>(from);
                for (std::size_t x = 0; x < width; ++x) to[x] = low_byte(values[x], range);
            });
        }
        case PixelType::kComplex:
            return show_spectrum(view, dib, scratch);
        case PixelType::kHsl:
            return fill_rows(view, dib, scratch, [&](const std::uint8_t* from, std::uint8_t* to) {
                hsl_to_rgb(from, to, width);
            });
        case PixelType::kRgbU64: {
            RowConverter converter(view.type, PixelType::kRgb, {.bit_depth = view.bit_depth},
                                   Stores::kCached);
            return fill_rows(view, dib, scratch, [&](const std::uint8_t* from, std::uint8_t* to) {
                converter.convert(from, to, width);
            });
        }
        case PixelType::kU8:
        case PixelType::kRgb:
            return fill_rows(view, dib, scratch, [&](const std::uint8_t* from, std::uint8_t* to) {
                std::memcpy(to, from, width * view.pixel_bytes());
            });
    }
}

}  // namespace

PixelView PixelView::of(const Image& image) {
    const ImageRecord& record = image.record();
    return {.pixels = record.firstPixel,
            .type = image.type(),
            .width = record.width,
            .height = record.height,
            .line_width = record.rowPixels,
            .bit_depth = image.bit_depth()};
}

Dib make_dib(const PixelView& view, std::vector<std::uint8_t>& scratch) {
    const bool colour = view.type >= PixelType::kRgb;
    Dib dib{.width = view.width,
            .height = view.height,
            .bits_per_pixel = !colour              ? 8
                              : view.packed_colour ? 24
                                                   : 32};
    if (fits_in_place(view)) {
        dib.width = view.line_width;
        dib.bits = view.pixels;
        return dib;
    }
    const std::uint64_t row_bytes =
        (static_cast<std::uint64_t>(view.width) * static_cast<unsigned>(dib.bits_per_pixel) / 8 +
         3) &
        ~std::uint64_t{3};
    scratch.resize(checked_narrow<std::size_t>(
        checked_mul(row_bytes, static_cast<std::uint64_t>(view.height))));
    dib.bits = scratch.data();
    show(view, dib, scratch);
    return dib;
}

}  // namespace zq
