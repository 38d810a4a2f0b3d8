// Carving, resets and the refusals of the memory pool.
#include "image/memory_pool.h"

#include <algorithm>
#include <functional>
#include <mutex>
#include <new>

#include "base/checked.h"
#include "base/error_codes.h"

namespace zq {

namespace {

constexpr std::size_t kTrailer = 12;  // bytes reserved behind the pool's end

// Keeps the header of every following block aligned.
constexpr std::size_t kGrain = 8;

}  // namespace

MemoryPool& MemoryPool::instance() {
    static MemoryPool the_pool;
    return the_pool;
}

void MemoryPool::create(std::int32_t kilobytes) {
    const std::lock_guard lock(mutex_);
    if (pool_ != nullptr) {
        throw kPoolExists;
    }
    const auto size = checked_mul<std::size_t>(static_cast<std::size_t>(kilobytes), 1024);
    auto storage = std::make_unique<Storage>();
    storage->bytes.reset(new (std::nothrow) std::uint8_t[checked_add(size, kTrailer)]);
    if (storage->bytes == nullptr) {
        throw kNotEnoughMemory;
    }
    storage->size = size;
    storages_.push_back(std::move(storage));
    pool_ = storages_.back().get();
    any_storage_ = true;
    used_ = 0;
    count_ = 0;
}

void MemoryPool::destroy() {
    const std::lock_guard lock(mutex_);
    if (pool_ == nullptr) {
        return;
    }
    if (count_ > 0) {
        throw kPoolInUse;
    }
    if (enabled_) {
        throw kPoolEnabled;
    }
    retire_pool();
}

void MemoryPool::abandon() noexcept {
    const std::lock_guard lock(mutex_);
    enabled_ = false;
    if (pool_ != nullptr) {
        retire_pool();
    }
}

// Memory that still holds blocks stays until the last of them is given back.
void MemoryPool::retire_pool() noexcept {
    if (pool_->live_blocks == 0) {
        storages_.pop_back();
        any_storage_ = !storages_.empty();
    }
    pool_ = nullptr;
    count_ = -1;
}

void MemoryPool::enable(bool enabled) {
    const std::lock_guard lock(mutex_);
    if (pool_ == nullptr) {
        throw kPoolMissing;
    }
    enabled_ = enabled;
}

void MemoryPool::reset() {
    const std::lock_guard lock(mutex_);
    if (enabled_) {
        throw kPoolEnabled;
    }
    if (pool_ != nullptr) {
        used_ = 0;
        count_ = 0;
    }
}

void* MemoryPool::carve(std::size_t bytes) {
    const std::lock_guard lock(mutex_);
    if (pool_ == nullptr || bytes > pool_->size) {
        throw kPoolExhausted;
    }
    const std::size_t grains = (bytes + kGrain - 1) / kGrain * kGrain;
    if (grains > pool_->size - used_) {
        throw kPoolExhausted;
    }
    std::uint8_t* block = pool_->bytes.get() + used_;
    used_ += grains;
    ++pool_->live_blocks;
    ++count_;
    return block;
}

MemoryPool::Storage* MemoryPool::storage_of(const void* block) const {
    const auto* address = static_cast<const std::uint8_t*>(block);
    const auto found =
        std::find_if(storages_.begin(), storages_.end(), [address](const auto& storage) {
            const std::uint8_t* base = storage->bytes.get();
            return std::greater_equal<>()(address, base) &&
                   std::less<>()(address, base + storage->size);
        });
    return found == storages_.end() ? nullptr : found->get();
}

std::size_t MemoryPool::bytes_behind(const void* block) {
    if (!any_storage_) {
        return 0;
    }
    const std::lock_guard lock(mutex_);
    const Storage* storage = storage_of(block);
    return storage == nullptr ? 0
                              : static_cast<std::size_t>(storage->bytes.get() + storage->size -
                                                         static_cast<const std::uint8_t*>(block));
}

void MemoryPool::give_back(void* block) noexcept {
    const std::lock_guard lock(mutex_);
    Storage* storage = storage_of(block);
    if (storage == nullptr) {
        return;
    }
    --storage->live_blocks;
    if (storage == pool_) {
        // A block from before a reset is no reservation any more; they cannot be told apart, so the
        // count stops at 0.
        if (count_ > 0) {
            --count_;
        }
    } else if (storage->live_blocks == 0) {
        std::erase_if(storages_, [storage](const auto& each) { return each.get() == storage; });
        any_storage_ = !storages_.empty();
    }
}

}  // namespace zq
