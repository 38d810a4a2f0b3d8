// Host arrays.
#include "host/host_array.h"

#include <cstring>
#include <limits>

#include "base/checked.h"

namespace zq::host {

std::uint8_t* resize_array(ElementType type, std::int32_t dimensions, ZqHandle* array,
                           std::size_t elements) {
    if (numeric_array_resize(type, dimensions, array, elements) != 0 || *array == nullptr ||
        **array == nullptr) {
        throw kNotEnoughMemory;
    }
    return **array;
}

std::span<const std::uint32_t> view(ZqArrayU32Handle array) {
    if (array == nullptr || *array == nullptr) return {};
    const std::int32_t count = (*array)->count;
    constexpr auto kMost = std::numeric_limits<std::ptrdiff_t>::max() / sizeof(std::uint32_t);
    if (count < 0 || static_cast<std::size_t>(count) > kMost) return {};
    return {(*array)->elements, static_cast<std::size_t>(count)};
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

}  // namespace zq::host
