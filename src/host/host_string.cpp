// Counted strings of the host.
#include "host/host_string.h"

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <optional>

#include "base/checked.h"
#include "host/host_array.h"
#include "host/services.h"

namespace zq::host {
namespace {

constexpr std::size_t kCountBytes = sizeof(std::int32_t);

// The count that the string's block starts with. None without a block, and in one that has no room
// for it or for so many bytes: a new block holds no count yet.
std::optional<std::int32_t> count_of(ZqStringHandle string) {
    if (string == nullptr || *string == nullptr) return std::nullopt;
    const auto size = ds_block_size(reinterpret_cast<ZqHandle>(string));
    if (size && *size < kCountBytes) return std::nullopt;
    const std::int32_t count = (*string)->length;
    if (size && count > 0 && static_cast<std::size_t>(count) > *size - kCountBytes) {
        return std::nullopt;
    }
    return count;
}

// Makes room for `length` bytes and stores the length; returns where the bytes go.
std::uint8_t* resize_string(ZqStringHandle* target, std::size_t length) {
    const auto count = checked_narrow<std::int32_t>(length);
    ZqHandle handle = reinterpret_cast<ZqHandle>(*target);
    std::uint8_t* block = resize_array(ElementType::kU8, 1, &handle, length);
    *target = reinterpret_cast<ZqStringHandle>(handle);
    std::memcpy(block, &count, kCountBytes);
    return block + kCountBytes;
}

}  // namespace

std::string_view view(ZqStringHandle string) {
    const std::int32_t count = count_of(string).value_or(0);
    if (count <= 0) return {};
    return {reinterpret_cast<const char*>((*string)->bytes), static_cast<std::size_t>(count)};
}

void set_string(ZqStringHandle* target, std::string_view text) {
    if (target == nullptr) throw kNullPointer;
    if (text.empty() && (*target == nullptr || count_of(*target) == 0)) return;
    std::uint8_t* bytes = resize_string(target, text.size());
    if (!text.empty()) std::memcpy(bytes, text.data(), text.size());
}

void copy_string(ZqStringHandle* target, ZqStringHandle source) {
    if (target == nullptr) throw kNullPointer;
    if (*target == source) return;
    const std::size_t length = view(source).size();
    if (length == 0) return set_string(target, {});
    std::uint8_t* bytes = resize_string(target, length);
    // The call may have moved the source's block too.
    std::memcpy(bytes, view(source).data(), length);
}

std::uint8_t* extend_string(ZqStringHandle* target, std::size_t bytes, Extension extension) {
    if (target == nullptr) throw kNullPointer;
    const std::size_t kept = extension == Extension::kAppend ? view(*target).size() : 0;
    return resize_string(target, checked_add(kept, bytes)) + kept;
}

}  // namespace zq::host
