// Host arrays.
#include "host/host_array.h"

#include <array>
#include <cstring>
#include <limits>

#include "base/checked.h"

namespace zq::host {

namespace {

template <class Element, class Array>
std::span<const Element> elements_of(Array** array) {
    if (array == nullptr || *array == nullptr) return {};
    const std::int32_t count = (*array)->count;
    constexpr auto kMost = std::numeric_limits<std::ptrdiff_t>::max() / sizeof(Element);
    if (count < 0 || static_cast<std::size_t>(count) > kMost) return {};
    return {(*array)->elements, static_cast<std::size_t>(count)};
}

using Counts = std::array<std::int32_t, 2>;

std::uint8_t* store_counts(std::uint8_t* block, const Array2dShape& shape) {
    const Counts counts = {shape.rows, shape.columns};
    std::memcpy(block, counts.data(), sizeof counts);
    return block + sizeof counts;
}

std::size_t element_count(const Array2dShape& shape) {
    return checked_mul(checked_narrow<std::size_t>(shape.rows),
                       checked_narrow<std::size_t>(shape.columns));
}

}  // namespace

std::uint8_t* resize_array(ElementType type, std::int32_t dimensions, ZqHandle* array,
                           std::size_t elements) {
    if (numeric_array_resize(type, dimensions, array, elements) != 0 || *array == nullptr ||
        **array == nullptr) {
        throw kNotEnoughMemory;
    }
    return **array;
}

std::span<const std::uint32_t> view(ZqArrayU32Handle array) {
    return elements_of<std::uint32_t>(array);
}

std::span<const std::int32_t> view(ZqArrayI32Handle array) {
    return elements_of<std::int32_t>(array);
}

void set_array(ZqArrayU32Handle* target, std::span<const std::uint32_t> elements) {
    if (target == nullptr) throw kNullPointer;
    const auto count = checked_narrow<std::int32_t>(elements.size());
    ZqHandle handle = reinterpret_cast<ZqHandle>(*target);
    std::uint8_t* block = resize_array(ElementType::kU32, 1, &handle, elements.size());
    std::memcpy(block, &count, sizeof count);
    if (count > 0) std::memcpy(block + sizeof count, elements.data(), elements.size_bytes());
    *target = reinterpret_cast<ZqArrayU32Handle>(handle);
}

std::uint8_t* resize_array2d(ZqHandle* array, const Array2dShape& shape) {
    if (array == nullptr) throw kMemoryError;
    return store_counts(resize_array(shape.type, 2, array, element_count(shape)), shape);
}

std::uint8_t* fit_array2d(ZqHandle* array, const Array2dShape& shape) {
    if (array == nullptr || *array == nullptr) throw kMemoryError;
    const std::size_t wanted =
        checked_add(checked_mul(element_count(shape), shape.element_bytes), sizeof(Counts));
    const std::int32_t size = ds_get_handle_size(*array);
    if (size < 0 || wanted > static_cast<std::size_t>(size)) throw kOutputArrayTooSmall;
    return store_counts(**array, shape);
}

}  // namespace zq::host
