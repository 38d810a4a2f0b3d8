// Helpers of the C environment.
#include "host/c_environment.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <limits>
#include <span>

#include "base/checked.h"
#include "host/host_array.h"

namespace zq::host {
namespace {

std::int32_t saturate(std::int64_t value) {
    using Limits = std::numeric_limits<std::int32_t>;
    return static_cast<std::int32_t>(std::clamp<std::int64_t>(value, Limits::min(), Limits::max()));
}

// Elements of other sizes are counted out as bytes.
ElementType element_type(std::size_t size) {
    switch (size) {
        case 2:
            return ElementType::kU16;
        case 4:
            return ElementType::kU32;
        case 8:
            return ElementType::kU64;
        default:
            return ElementType::kU8;
    }
}

void copy_to_array(const void* source, std::int32_t element_size,
                   std::span<const std::int32_t> counts, ZqHandle* array) {
    if (array == nullptr) throw kNullPointer;
    if (element_size < 1) throw kInvalidParameter;
    std::size_t elements = 1;
    for (const std::int32_t count : counts) {
        if (count < 0) throw kInvalidParameter;
        elements = checked_mul(elements, static_cast<std::size_t>(count));
    }
    if (source == nullptr && elements > 0) throw kNullPointer;
    const auto size = static_cast<std::size_t>(element_size);
    const std::size_t bytes = checked_mul(elements, size);
    const ElementType type = element_type(size);
    // Host blocks have 32-bit sizes.
    checked_narrow<std::int32_t>(checked_add(bytes, counts.size_bytes()));
    std::uint8_t* block = resize_array(type, static_cast<std::int32_t>(counts.size()), array,
                                       type == ElementType::kU8 ? bytes : elements);
    std::memcpy(block, counts.data(), counts.size_bytes());
    if (bytes > 0) std::memcpy(block + counts.size_bytes(), source, bytes);
}

}  // namespace

ZqRect to_rect(const ZqCoordinates& corners) {
    return {.left = corners.left,
            .top = corners.top,
            .width = saturate(std::int64_t{corners.right} - corners.left),
            .height = saturate(std::int64_t{corners.bottom} - corners.top)};
}

ZqCoordinates to_coordinates(const ZqRect& rect) {
    return {.left = rect.left,
            .top = rect.top,
            .right = saturate(std::int64_t{rect.left} + rect.width),
            .bottom = saturate(std::int64_t{rect.top} + rect.height)};
}

void copy_to_array_1d(const void* source, std::int32_t element_size, std::int32_t count,
                      ZqHandle* array) {
    copy_to_array(source, element_size, std::array{count}, array);
}

void copy_to_array_2d(const void* source, std::int32_t element_size, std::int32_t rows,
                      std::int32_t columns, ZqHandle* array) {
    copy_to_array(source, element_size, std::array{rows, columns}, array);
}

}  // namespace zq::host
