// Physically contiguous buffers from the sibling library "zqkemomem", which is loaded on first use.
#pragma once

#include <cstddef>
#include <cstdint>

#include "platform/module.h"
#include "platform/mutex.h"

namespace zq {

// Threads: safe.
class PhysicalMemory {
  public:
    explicit PhysicalMemory(const char* library) : library_(library) {}
    static PhysicalMemory& instance();

    // Loads the library unless it is there; throws kMemoryError when it or one of its functions is
    // missing. Tried again at the next call.
    void bind();
    // Never null: throws kMemoryError when the allocator has nothing to give.
    std::uint8_t* allocate(std::size_t bytes);
    void release(std::uint8_t* buffer) noexcept;

  private:
    const char* library_;
    platform::Mutex mutex_;
    void* (*allocate_)(std::uint32_t bytes) = nullptr;
    void (*release_)(void* buffer) = nullptr;
};

}  // namespace zq
