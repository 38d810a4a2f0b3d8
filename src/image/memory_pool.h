// The reserved pool for time-bounded work: one block of memory that allocations are carved from and
// that is only given back as a whole.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "platform/mutex.h"

namespace zq {

// Threads: safe. A reset makes the pool forget its reservations although images may still lie in
// it; what they hold is then overwritten by later allocations, but the memory itself stays until
// the last of them is gone.
class MemoryPool {
  public:
    static MemoryPool& instance();

    // Throws kPoolExists, kNotEnoughMemory.
    void create(std::int32_t kilobytes);
    // Does nothing without a pool; throws kPoolInUse with live reservations, kPoolEnabled while
    // enabled.
    void destroy();
    // Releases the pool whatever its state, at the end of the host's run.
    void abandon() noexcept;
    // Throws kPoolMissing.
    void enable(bool enabled);
    // Throws kPoolEnabled while enabled; does nothing without a pool.
    void reset();

    bool exists() const { return count_.load() >= 0; }
    bool is_enabled() const { return enabled_.load(std::memory_order_relaxed); }
    // Live reservations; -1 without a pool.
    std::int32_t reservations() const { return count_.load(); }

    // Throws kPoolExhausted when the pool has not that much left (or there is none); the pool is
    // then as before.
    void* carve(std::size_t bytes);
    void give_back(void* block) noexcept;
    // Bytes from `block` to the end of the pool memory it lies in; 0 when it lies in none. A block
    // from before a reset may have been overwritten, its header included, so only its address can
    // be trusted.
    std::size_t bytes_behind(const void* block);

  private:
    struct Storage {
        std::unique_ptr<std::uint8_t[]> bytes;
        std::size_t size = 0;
        std::size_t live_blocks = 0;  // not lowered by a reset
    };
    void retire_pool() noexcept;
    Storage* storage_of(const void* block) const;

    platform::Mutex mutex_;
    std::vector<std::unique_ptr<Storage>>
        storages_;  // retired ones that still hold blocks, then the pool itself
    std::atomic<bool> any_storage_ = false;  // lets the heap's blocks pass without the mutex
    Storage* pool_ = nullptr;
    std::size_t used_ = 0;
    std::atomic<std::int32_t> count_ = -1;
    std::atomic<bool> enabled_ = false;
};

}  // namespace zq
