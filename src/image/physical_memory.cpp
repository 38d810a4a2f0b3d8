// Binding to the allocator of physically contiguous memory.
#include "image/physical_memory.h"

#include <mutex>

#include "base/error_codes.h"

namespace zq {

PhysicalMemory& PhysicalMemory::instance() {
    static PhysicalMemory the_memory("zqkemomem");
    return the_memory;
}

void PhysicalMemory::bind() {
    const std::lock_guard lock(mutex_);
    if (allocate_ != nullptr) {
        return;
    }
    platform::ModuleHandle module = platform::load_library(library_);
    if (module == nullptr) {
        throw kMemoryError;
    }
    const auto allocate =
        platform::find_function<void* (*)(std::uint32_t)>(module, "AllocPhysMem32");
    const auto release = platform::find_function<void (*)(void*)>(module, "FreePhysMem");
    if (allocate == nullptr || release == nullptr) {
        throw kMemoryError;
    }
    allocate_ = allocate;
    release_ = release;
}

std::uint8_t* PhysicalMemory::allocate(std::size_t bytes) {
    bind();
    void* buffer = allocate_(static_cast<std::uint32_t>(bytes));
    if (buffer == nullptr) {
        throw kMemoryError;
    }
    return static_cast<std::uint8_t*>(buffer);
}

void PhysicalMemory::release(std::uint8_t* buffer) noexcept {
    release_(buffer);
}

}  // namespace zq
