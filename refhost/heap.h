// The memory of the host: two heaps of relocatable handles, fixed blocks, and the account of what
// clients did wrong with them. The caller holds the host's lock.
#ifndef REFHOST_HEAP_H
#define REFHOST_HEAP_H

#include <zqvissvc/types.h>

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>

#include "refhost.h"
#include "service.h"

namespace refhost {

// A queue with room of its own, so that disposing never fails for want of memory. The caller pops
// before it is full.
template <class Item, size_t kRoom>
class Ring {
  public:
    void push_back(const Item& item) { items_[(first_ + count_++) % kRoom] = item; }
    const Item& front() const { return items_[first_]; }
    void pop_front() {
        first_ = (first_ + 1) % kRoom;
        --count_;
    }
    size_t size() const { return count_; }
    bool empty() const { return count_ == 0; }
    template <class Predicate>
    bool any_of(Predicate holds) const {
        for (size_t i = 0; i < count_; ++i) {
            if (holds(items_[(first_ + i) % kRoom])) return true;
        }
        return false;
    }

  private:
    std::array<Item, kRoom> items_{};
    size_t first_ = 0;
    size_t count_ = 0;
};

enum class Pool { kApplication, kData };  // the AZ and the DS heap

class Heap {
  public:
    // Handles. `service` names the culprit in the account. Statuses are host error numbers.
    ZqHandle make(Pool pool, int64_t size);
    int32_t resize(Pool pool, ZqHandle handle, int64_t size, const char* service);
    int32_t dispose(Pool pool, ZqHandle handle, const char* service);
    int32_t size(Pool pool, ZqHandle handle, const char* service);  // 0 for a bad handle
    bool is_live(Pool pool, const void* handle) const;

    // Whatever heap it belongs to; null is accepted.
    void dispose_any(ZqHandle handle);
    std::optional<size_t> size_any(const void* handle) const;

    // The bytes of a counted string, "" for null; nothing when the handle is bad or the count
    // exceeds the block.
    std::optional<std::string> read_string(ZqStringHandle string, const char* service);
    int32_t write_string(ZqStringHandle* string, std::string_view text, const char* service);

    // Gives *handle, of the data heap, that many bytes; makes it when it is null.
    int32_t reserve(ZqHandle* handle, int64_t size, const char* service);

    void* make_block(int64_t size);
    int32_t dispose_block(void* block, const char* service);

    void set_strict(bool on) { strict_ = on; }
    size_t handles() const { return handles_.size(); }
    size_t blocks() const { return blocks_.size(); }
    Report finish();

  private:
    struct Entry {
        Pool pool;
        size_t size;
        uint64_t number;  // counts the allocations of the program, for the account
        bool reported = false;
    };
    struct Relic {
        void* address;
        size_t size;
        uint64_t number;
    };

    void* allocate(size_t size) const;
    void retire(void* address, const Entry& entry);
    void release_oldest_relic();
    Entry* find(Pool pool, ZqHandle handle, const char* service);
    void note(size_t Report::*count, const std::string& line);

    static constexpr size_t kMaxRetired = 4096;
    static constexpr size_t kMaxRelics = 1024;

    bool is_retired(ZqHandle handle) const;

    bool strict_ = false;
    uint64_t allocations_ = 0;
    std::unordered_map<const void*, Entry> handles_;
    std::unordered_map<const void*, Entry> blocks_;
    // Disposed handles and blocks left behind: their addresses are not given out again for a while.
    Ring<ZqHandle, kMaxRetired + 1> retired_;
    Ring<Relic, kMaxRelics + 1> relics_;
    size_t relic_bytes_ = 0;
    Report report_;
};

// The one heap of the process. Never destroyed: the library may free handles while the process is
// being taken down.
Heap& heap();

}  // namespace refhost

#endif
