// Memory control, the account, and the helpers for clients.
#include "refhost.h"

#include <algorithm>
#include <new>

#include "account.h"
#include "heap.h"
#include "service.h"

namespace refhost {

void set_strict(bool on) {
    const std::lock_guard lock(host_mutex());
    heap().set_strict(on);
}

size_t live_handles() {
    const std::lock_guard lock(host_mutex());
    return heap().handles();
}

size_t live_blocks() {
    const std::lock_guard lock(host_mutex());
    return heap().blocks();
}

std::optional<size_t> handle_size(const void* handle) {
    const std::lock_guard lock(host_mutex());
    return heap().size_any(handle);
}

Report finish() {
    const std::lock_guard lock(host_mutex());
    Report report = heap().finish();
    report.leaked_paths = take_unreported_paths();
    if (report.leaked_paths > 0)
        report.details += "leaked " + std::to_string(report.leaked_paths) + " paths\n";
    return report;
}

ZqStringHandle new_string(std::string_view text) {
    const std::lock_guard lock(host_mutex());
    ZqStringHandle string = nullptr;
    if (heap().write_string(&string, text, "new_string") != kOk) throw std::bad_alloc();
    return string;
}

std::string text(ZqStringHandle string) {
    const std::lock_guard lock(host_mutex());
    return heap().read_string(string, "text").value_or("");
}

ZqArrayU32Handle new_array(std::span<const uint32_t> elements) {
    const std::lock_guard lock(host_mutex());
    ZqHandle array = nullptr;
    const int64_t size = static_cast<int64_t>(sizeof(int32_t) + elements.size_bytes());
    if (heap().reserve(&array, size, "new_array") != kOk) throw std::bad_alloc();
    auto* typed = reinterpret_cast<ZqArrayU32Handle>(array);
    (*typed)->count = static_cast<int32_t>(elements.size());
    std::copy(elements.begin(), elements.end(), (*typed)->elements);
    return typed;
}

std::vector<uint32_t> elements(ZqArrayU32Handle array) {
    const std::lock_guard lock(host_mutex());
    const std::optional<size_t> bytes = heap().size_any(array);
    if (!bytes || *bytes < sizeof(int32_t) || (*array)->count < 0) return {};
    const size_t room = (*bytes - sizeof(int32_t)) / sizeof(uint32_t);
    const auto count = static_cast<size_t>((*array)->count);
    if (count > room) return {};
    return {(*array)->elements, (*array)->elements + count};
}

void dispose(void* handle) {
    const std::lock_guard lock(host_mutex());
    heap().dispose_any(static_cast<ZqHandle>(handle));
}

}  // namespace refhost
