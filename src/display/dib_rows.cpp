// Images as bitmaps that a device context takes.
#include "display/dib_rows.h"

#include <algorithm>
#include <cstring>

#include "base/checked.h"
#include "convert/convert_rows.h"
#include "kernels/colour_model.h"
#include "kernels/from_float.h"
#include "kernels/from_i16.h"
#include "kernels/grey_range.h"

namespace zq {
namespace {

bool is_aligned(const void* address) {
    return reinterpret_cast<std::uintptr_t>(address) % 4 == 0;
}

// A bitmap in the making: what of a view, and where.
struct Sheet {
    const ShownPixels& view;
    const Dib& dib;
    const Part& part;
    std::uint8_t* bytes;

    std::uint8_t* row(std::int32_t y) const {
        return bytes + static_cast<std::size_t>(y - dib.first_row) * dib.stride();
    }
};

// Calls row(y) for every row that is wanted.
template <class Row>
void for_each_row(const Part& part, const Row& row) {
    if (part.rows.empty()) {
        for (std::int32_t y = part.box.top; y < part.box.bottom; ++y) row(y);
    } else {
        for (const std::int32_t y : part.rows) row(y);
    }
}

// Calls row(from, to, pixels) for what is wanted of each row.
template <class Row>
void fill_rows(const Sheet& sheet, const Row& row) {
    const Box& box = sheet.part.box;
    const auto left = static_cast<std::size_t>(box.left);
    const auto bytes = static_cast<std::size_t>(sheet.dib.bits_per_pixel / 8);
    for_each_row(sheet.part, [&](std::int32_t y) {
        row(sheet.view.row(y) + left * sheet.view.pixel_bytes(), sheet.row(y) + left * bytes,
            static_cast<std::size_t>(box.width()));
    });
}

// In bands from the last one up, so that the first one, which is mapped next, is still in the
// cache; but downwards within each, as the processor fetches ahead that way.
template <class Sample, class Range>
Range range_of(const ShownPixels& view) {
    constexpr std::size_t kBandBytes = std::size_t{256} << 10;
    const std::size_t row_bytes = static_cast<std::size_t>(view.line_width) * sizeof(Sample);
    const auto band = static_cast<std::int32_t>(std::max<std::size_t>(1, kBandBytes / row_bytes));
    Range range;
    for (std::int32_t end = view.height, rows = 0; end > 0; end -= rows) {
        rows = (end - 1) % band + 1;
        widen_range(reinterpret_cast<const Sample*>(view.row(end - rows)),
                    static_cast<std::size_t>(view.width), static_cast<std::size_t>(rows),
                    view.line_width, range);
    }
    return range;
}

void show_samples(const Sheet& sheet) {
    const ShownPixels& view = sheet.view;
    const bool full_range = view.right_shift == 0 && view.bit_depth == 0;
    Reduction reduction(view.bit_depth);
    if (view.right_shift > 0) {
        reduction.shift = view.right_shift;
        reduction.half = 0;
    }
    IntegerRange range;
    if (full_range) range = range_of<std::int16_t, IntegerRange>(view);
    fill_rows(sheet, [&](const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
        const auto* samples = reinterpret_cast<const std::int16_t*>(from);
        if (full_range) return i16_to_u8_in_range(samples, to, pixels, range);
        i16_to_u8(samples, to, pixels, reduction);
    });
}

void show_floats(const Sheet& sheet) {
    const Box& box = sheet.part.box;
    const FloatScale scale = scale_of(range_of<float, FloatRange>(sheet.view),
                                      static_cast<std::size_t>(box.width() * box.height()));
    fill_rows(sheet, [&](const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
        f32_to_u8_scaled(reinterpret_cast<const float*>(from), to, pixels, scale);
    });
}

// Each row comes from where the exchange of the quadrants takes it; an odd last row or column
// stays.
void show_spectrum(const Sheet& sheet) {
    const ShownPixels& view = sheet.view;
    const double pixels = static_cast<double>(view.width) * view.height;
    const double scale = static_cast<float>(128.0 / pixels);
    const auto width = static_cast<std::size_t>(view.width);
    const std::int32_t half_height = view.height / 2;
    for_each_row(sheet.part, [&](std::int32_t y) {
        const bool moves = y < 2 * half_height;
        const std::size_t half = moves ? width / 2 : 0;
        const std::int32_t origin = moves ? (y + half_height) % (2 * half_height) : y;
        const auto* from = reinterpret_cast<const float*>(view.row(origin));
        std::uint8_t* to = sheet.row(y);
        magnitude_to_u8(from, to + half, half, scale);
        magnitude_to_u8(from + 2 * half, to, half, scale);
        const auto* stays = reinterpret_cast<const float*>(view.row(y));
        magnitude_to_u8(stays + 4 * half, to + 2 * half, width - 2 * half, scale);
    });
}

void show(const Sheet& sheet) {
    const ShownPixels& view = sheet.view;
    switch (view.type) {
        case PixelType::kI16:
            return show_samples(sheet);
        case PixelType::kSgl:
            return show_floats(sheet);
        case PixelType::kComplex:
            return show_spectrum(sheet);
        case PixelType::kHsl:
            return fill_rows(sheet, hsl_to_rgb);
        case PixelType::kRgbU64: {
            RowConverter converter(view.type, PixelType::kRgb, {.bit_depth = view.bit_depth},
                                   Stores::kCached);
            return fill_rows(sheet,
                             [&](const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
                                 converter.convert(from, to, pixels);
                             });
        }
        case PixelType::kU8:
        case PixelType::kRgb:
            return fill_rows(sheet,
                             [&](const std::uint8_t* from, std::uint8_t* to, std::size_t pixels) {
                                 std::memcpy(to, from, pixels * view.pixel_bytes());
                             });
    }
}

}  // namespace

bool fits_in_place(const ShownPixels& view) {
    if (!is_aligned(view.pixels)) return false;
    if (view.type == PixelType::kU8) return view.width % 4 == 0 && view.line_width % 4 == 0;
    if (view.type != PixelType::kRgb) return false;
    return !view.packed_colour || (view.width % 4 == 0 && view.line_width % 4 == 0);
}

ShownPixels ShownPixels::of(const Image& image) {
    const ImageRecord& record = image.record();
    return {.pixels = record.firstPixel,
            .type = image.type(),
            .width = record.width,
            .height = record.height,
            .line_width = record.rowPixels,
            .bit_depth = image.bit_depth()};
}

Dib make_dib(const ShownPixels& view, std::vector<std::uint8_t>& scratch, const Part& part) {
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
    dib.first_row = part.box.top;
    dib.height = part.box.bottom - part.box.top;
    const std::size_t bytes = checked_mul(dib.stride(), static_cast<std::size_t>(dib.height));
    if (scratch.size() < bytes) scratch = std::vector<std::uint8_t>(bytes);
    dib.bits = scratch.data();
    show({view, dib, part, scratch.data()});
    return dib;
}

}  // namespace zq
