// Sources of blocks behind one header format.
#include "image/memory.h"

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <mutex>

#include "base/error_codes.h"
#include "image/memory_pool.h"
#include "platform/mutex.h"

namespace zq::memory {

namespace {

struct Header {
    std::uint32_t source;  // Mode
    std::uint32_t bytes;   // the caller's, without header
};
static_assert(sizeof(Header) == 8);

struct Choice {
    platform::Mutex mutex;
    Mode mode = Mode::kHeap;
    HostRoutine routine = {nullptr, nullptr};
};

Choice& choice() {
    static Choice the_choice;
    return the_choice;
}

Header* header_of(void* block) {
    return static_cast<Header*>(block) - 1;
}

Mode current_mode(HostRoutine& routine) {
    if (MemoryPool::instance().is_enabled()) {
        return Mode::kPool;
    }
    const std::lock_guard lock(choice().mutex);
    routine = choice().routine;
    return choice().mode;
}

// A copy: the host's code runs without the mutex.
HostRoutine chosen_routine() {
    const std::lock_guard lock(choice().mutex);
    return choice().routine;
}

void* raw_allocate(Mode mode, const HostRoutine& routine, std::size_t bytes) {
    void* raw = nullptr;
    switch (mode) {
        case Mode::kHostRoutine:
            raw = routine.allocate(bytes);
            break;
        case Mode::kPool:
            return MemoryPool::instance().carve(bytes);
        case Mode::kHeap:
            raw = std::malloc(bytes);
            break;
    }
    if (raw == nullptr) {
        throw kNotEnoughMemory;
    }
    return raw;
}

std::size_t with_header(std::size_t bytes) {
    if (bytes > std::numeric_limits<std::uint32_t>::max() - sizeof(Header)) {
        throw kNotEnoughMemory;
    }
    return bytes + sizeof(Header);
}

void* finish(void* raw, Mode mode, std::size_t bytes) {
    auto* header = static_cast<Header*>(raw);
    *header = {static_cast<std::uint32_t>(mode), static_cast<std::uint32_t>(bytes)};
    return header + 1;
}

}  // namespace

void prepare() {
    choice();
    MemoryPool::instance();
}

void set_mode(Mode mode, const HostRoutine* routine) {
    if (mode == Mode::kHostRoutine &&
        (routine == nullptr || routine->allocate == nullptr || routine->release == nullptr)) {
        throw kInvalidParameter;
    }
    if (mode < Mode::kHostRoutine || mode > Mode::kHeap) {
        throw kInvalidParameter;
    }
    const std::lock_guard lock(choice().mutex);
    choice().mode = mode;
    if (mode == Mode::kHostRoutine) {
        // Kept in the other modes as well: blocks of the routine may still be alive.
        choice().routine = *routine;
    }
}

void* allocate(std::size_t bytes) {
    HostRoutine routine{};
    const Mode mode = current_mode(routine);
    return finish(raw_allocate(mode, routine, with_header(bytes)), mode, bytes);
}

void* resize(void* block, std::size_t bytes) {
    if (block == nullptr) {
        return allocate(bytes);
    }
    HostRoutine routine{};
    const Mode mode = current_mode(routine);
    Header* header = header_of(block);
    const std::size_t in_pool = MemoryPool::instance().bytes_behind(block);
    const bool same_source = in_pool == 0 && header->source == static_cast<std::uint32_t>(mode);
    if (same_source && header->bytes == bytes) {
        return block;
    }
    if (same_source && mode == Mode::kHeap) {
        void* raw = std::realloc(header, with_header(bytes));
        if (raw == nullptr) {
            throw kNotEnoughMemory;
        }
        return finish(raw, mode, bytes);
    }
    void* moved = finish(raw_allocate(mode, routine, with_header(bytes)), mode, bytes);
    const std::size_t old_bytes =
        in_pool == 0 ? header->bytes : std::min<std::size_t>(header->bytes, in_pool);
    std::memmove(moved, block, std::min(bytes, old_bytes));
    release(block);
    return moved;
}

void release(void* block) noexcept {
    if (block == nullptr) {
        return;
    }
    Header* header = header_of(block);
    if (MemoryPool::instance().bytes_behind(header) != 0) {
        MemoryPool::instance().give_back(header);
    } else if (header->source == static_cast<std::uint32_t>(Mode::kHostRoutine)) {
        chosen_routine().release(header);
    } else {
        std::free(header);
    }
}

}  // namespace zq::memory
