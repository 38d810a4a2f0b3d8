// Pixels of an image as a host array.
#include "convert/image_to_array.h"

#include <algorithm>
#include <array>

#include "convert/copy_rows.h"
#include "host/host_array.h"

namespace zq {

namespace {

host::ElementType element_type(PixelType type) {
    switch (type) {
        case PixelType::kU8:
            return host::ElementType::kU8;
        case PixelType::kI16:
            return host::ElementType::kI16;
        case PixelType::kSgl:
            return host::ElementType::kSgl;
        case PixelType::kRgb:
        case PixelType::kHsl:
            return host::ElementType::kU32;
        case PixelType::kRgbU64:
            return host::ElementType::kU64;
        case PixelType::kComplex:
            break;
    }
    throw kInvalidImageType;
}

// The part of a range that lies in [0, size], its ends in order.
std::array<std::int32_t, 2> within(std::int32_t a, std::int32_t b, std::int32_t size) {
    return {std::clamp(std::min(a, b), 0, size), std::clamp(std::max(a, b), 0, size)};
}

// Emptied only where the shape cannot be had: a block that need not change its size is then not
// given up and asked for again with every picture.
std::uint8_t* set_shape(ZqHandle* array, const host::Array2dShape& shape, ArrayStart start,
                        ArraySize size) {
    const auto set = size == ArraySize::kGrowable ? host::resize_array2d : host::fit_array2d;
    try {
        return set(array, shape);
    } catch (GRLIBError_enum) {
        if (start == ArrayStart::kEmptied) set(array, {shape.type, shape.element_bytes, 0, 0});
        throw;
    }
}

}  // namespace

Rectangle to_rectangle(std::span<const std::int32_t> elements) {
    Rectangle rectangle;
    const std::array<std::int32_t*, 4> fields = {&rectangle.left, &rectangle.top, &rectangle.right,
                                                 &rectangle.bottom};
    for (std::size_t i = 0; i < std::min(fields.size(), elements.size()); ++i) {
        *fields[i] = elements[i];
    }
    return rectangle;
}

void image_to_array(const Image& image, const Rectangle& rectangle, ArrayStart start,
                    ArraySize size, ZqHandle* array) {
    const auto [left, right] = within(rectangle.left, rectangle.right, image.record().width);
    const auto [top, bottom] = within(rectangle.top, rectangle.bottom, image.record().height);
    const auto pixel_bytes = static_cast<std::size_t>(bytes_per_pixel(image.type()));
    host::Array2dShape shape = {element_type(image.type()), pixel_bytes, bottom - top,
                                right - left};
    const bool has_pixels = shape.rows > 0 && shape.columns > 0;
    if (!has_pixels && start == ArrayStart::kEmptied) shape.rows = shape.columns = 0;
    std::uint8_t* elements = set_shape(array, shape, start, size);
    if (!has_pixels) return;
    const std::size_t row_bytes = static_cast<std::size_t>(shape.columns) * pixel_bytes;
    copy_rows({image.row(top) + static_cast<std::size_t>(left) * pixel_bytes, image.row_stride()},
              {elements, static_cast<std::ptrdiff_t>(row_bytes)},
              static_cast<std::size_t>(shape.rows), row_bytes);
}

}  // namespace zq
