// Handles that move, and the quarantine that finds stale pointers.
#include "heap.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <memory>
#include <utility>

#if __has_include(<sanitizer/asan_interface.h>)
#include <sanitizer/asan_interface.h>
#else
#define ASAN_POISON_MEMORY_REGION(address, size) \
    (static_cast<void>(address), static_cast<void>(size))
#define ASAN_UNPOISON_MEMORY_REGION(address, size) \
    (static_cast<void>(address), static_cast<void>(size))
#endif

namespace refhost {
namespace {

struct Free {
    void operator()(void* memory) const { std::free(memory); }
};
using Memory = std::unique_ptr<void, Free>;

constexpr int kFreshByte = 0xCD;
constexpr uint8_t kStaleByte = 0xDD;
constexpr size_t kCountBytes = sizeof(int32_t);  // in front of the elements of a string or array
constexpr size_t kMaxRelicBytes = 32u << 20;

// The range of the services' 32-bit sizes.
bool is_size(int64_t size) {
    return size >= 0 && size <= std::numeric_limits<int32_t>::max();
}

std::string describe(const char* what, size_t size, uint64_t number) {
    return std::string(what) + " of " + std::to_string(size) + " bytes (allocation " +
           std::to_string(number) + ")";
}

const char* pool_name(Pool pool) {
    return pool == Pool::kApplication ? "AZ handle" : "DS handle";
}

}  // namespace

Heap& heap() {
    static auto* the_heap = new Heap;
    return *the_heap;
}

void Heap::note(size_t Report::*count, const std::string& line) {
    ++(report_.*count);
    report_.details += line + "\n";
}

void* Heap::allocate(size_t size) const {
    void* address = std::malloc(std::max<size_t>(size, 1));
    if (address != nullptr && strict_) std::memset(address, kFreshByte, size);
    return address;
}

ZqHandle Heap::make(Pool pool, int64_t size) {
    if (!is_size(size)) return nullptr;
    const auto bytes = static_cast<size_t>(size);
    Memory cell(std::malloc(sizeof(uint8_t*)));
    Memory block(allocate(bytes));
    if (cell == nullptr || block == nullptr) return nullptr;
    handles_[cell.get()] = {pool, bytes, ++allocations_};
    auto* handle = static_cast<ZqHandle>(cell.release());
    *handle = static_cast<uint8_t*>(block.release());
    return handle;
}

Heap::Entry* Heap::find(Pool pool, ZqHandle handle, const char* service) {
    const auto found = handles_.find(handle);
    if (found == handles_.end()) {
        if (is_retired(handle))
            note(&Report::stale_uses, std::string(service) + ": a disposed handle");
        else
            note(&Report::foreign_uses, std::string(service) + ": not a handle");
        return nullptr;
    }
    if (found->second.pool != pool) {
        note(&Report::foreign_uses, std::string(service) + ": a handle of the other heap");
        return nullptr;
    }
    return &found->second;
}

bool Heap::is_retired(ZqHandle handle) const {
    return retired_.any_of([handle](ZqHandle retired) { return retired == handle; });
}

int32_t Heap::resize(Pool pool, ZqHandle handle, int64_t size, const char* service) {
    Entry* entry = find(pool, handle, service);
    if (entry == nullptr || size < 0) return kBadArgument;
    if (!is_size(size)) return kOutOfMemory;
    const auto bytes = static_cast<size_t>(size);
    if (strict_) {
        Memory moved(allocate(bytes));
        if (moved == nullptr) return kOutOfMemory;
        std::memcpy(moved.get(), *handle, std::min(bytes, entry->size));
        retire(*handle, *entry);
        *handle = static_cast<uint8_t*>(moved.release());
    } else {
        auto* moved = static_cast<uint8_t*>(std::realloc(*handle, std::max<size_t>(bytes, 1)));
        if (moved == nullptr) return kOutOfMemory;
        *handle = moved;
    }
    entry->size = bytes;
    return kOk;
}

int32_t Heap::dispose(Pool pool, ZqHandle handle, const char* service) {
    if (is_retired(handle)) {
        note(&Report::double_frees, std::string(service) + ": a handle that was disposed before");
        return kBadArgument;
    }
    Entry* entry = find(pool, handle, service);
    if (entry == nullptr) return kBadArgument;
    retire(*handle, *entry);
    *handle = nullptr;
    handles_.erase(handle);
    retired_.push_back(handle);
    if (retired_.size() > kMaxRetired) {
        std::free(retired_.front());
        retired_.pop_front();
    }
    return kOk;
}

int32_t Heap::size(Pool pool, ZqHandle handle, const char* service) {
    const Entry* entry = find(pool, handle, service);
    return entry == nullptr ? 0 : static_cast<int32_t>(entry->size);
}

bool Heap::is_live(Pool pool, const void* handle) const {
    const auto found = handles_.find(handle);
    return found != handles_.end() && found->second.pool == pool;
}

void Heap::dispose_any(ZqHandle handle) {
    if (handle == nullptr) return;
    const auto found = handles_.find(handle);
    dispose(found == handles_.end() ? Pool::kData : found->second.pool, handle, "dispose");
}

std::optional<size_t> Heap::size_any(const void* handle) const {
    const auto found = handles_.find(handle);
    if (found == handles_.end()) return std::nullopt;
    return found->second.size;
}

std::optional<std::string> Heap::read_string(ZqStringHandle string, const char* service) {
    if (string == nullptr) return std::string();
    const std::optional<size_t> bytes = size_any(string);
    if (!bytes) {
        note(&Report::foreign_uses, std::string(service) + ": a string that is no live handle");
        return std::nullopt;
    }
    if (*bytes < kCountBytes) return std::nullopt;
    const int32_t length = (*string)->length;
    if (length < 0 || static_cast<size_t>(length) > *bytes - kCountBytes) return std::nullopt;
    return std::string(reinterpret_cast<const char*>((*string)->bytes),
                       static_cast<size_t>(length));
}

int32_t Heap::write_string(ZqStringHandle* string, std::string_view text, const char* service) {
    if (string == nullptr) return kBadArgument;
    const auto size = static_cast<int64_t>(kCountBytes + text.size());
    const int32_t status = reserve(reinterpret_cast<ZqHandle*>(string), size, service);
    if (status != kOk) return status;
    (**string)->length = static_cast<int32_t>(text.size());
    std::copy(text.begin(), text.end(), (**string)->bytes);
    return kOk;
}

int32_t Heap::reserve(ZqHandle* handle, int64_t size, const char* service) {
    if (*handle != nullptr) return resize(Pool::kData, *handle, size, service);
    *handle = make(Pool::kData, size);
    return *handle == nullptr ? kOutOfMemory : kOk;
}

void* Heap::make_block(int64_t size) {
    if (!is_size(size)) return nullptr;
    const auto bytes = static_cast<size_t>(size);
    Memory block(allocate(bytes));
    if (block != nullptr) blocks_[block.get()] = {Pool::kData, bytes, ++allocations_};
    return block.release();
}

int32_t Heap::dispose_block(void* block, const char* service) {
    const auto found = blocks_.find(block);
    if (found == blocks_.end()) {
        const auto is_block = [block](const Relic& relic) { return relic.address == block; };
        const bool relic = relics_.any_of(is_block);
        note(relic ? &Report::double_frees : &Report::foreign_uses,
             std::string(service) + ": not a live block");
        return kBadArgument;
    }
    const Entry entry = found->second;
    blocks_.erase(found);
    retire(block, entry);
    return kOk;
}

void Heap::retire(void* address, const Entry& entry) {
    if (!strict_) {
        std::free(address);
        return;
    }
    relics_.push_back({address, entry.size, entry.number});
    std::memset(address, kStaleByte, entry.size);
    ASAN_POISON_MEMORY_REGION(address, entry.size);
    relic_bytes_ += entry.size;
    while (relics_.size() > kMaxRelics || relic_bytes_ > kMaxRelicBytes) release_oldest_relic();
}

void Heap::release_oldest_relic() {
    const Relic relic = relics_.front();
    relics_.pop_front();
    relic_bytes_ -= relic.size;
    ASAN_UNPOISON_MEMORY_REGION(relic.address, relic.size);
    const auto* bytes = static_cast<const uint8_t*>(relic.address);
    if (!std::all_of(bytes, bytes + relic.size, [](uint8_t byte) { return byte == kStaleByte; }))
        note(&Report::stale_writes,
             describe("a write into a block left behind", relic.size, relic.number));
    std::free(relic.address);
}

Report Heap::finish() {
    while (!relics_.empty()) release_oldest_relic();
    for (auto& [handle, entry] : handles_) {
        if (!std::exchange(entry.reported, true))
            note(&Report::leaked_handles,
                 "leaked " + describe(pool_name(entry.pool), entry.size, entry.number));
    }
    for (auto& [block, entry] : blocks_) {
        if (!std::exchange(entry.reported, true))
            note(&Report::leaked_blocks, "leaked " + describe("block", entry.size, entry.number));
    }
    return std::exchange(report_, {});
}

}  // namespace refhost
