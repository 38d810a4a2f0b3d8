// The memory layer: where pixel buffers come from. Every block carries an 8-byte header in front of
// the caller's bytes that remembers its source, so a block goes back to where it came from whatever
// the mode is by then.
#pragma once

#include <cstddef>
#include <cstdint>

namespace zq::memory {

// The process-wide choice. While the memory pool is enabled every allocation comes from the pool.
enum class Mode : std::int32_t { kHostRoutine = 1, kPool = 2, kHeap = 3 };

// A host's own allocator. allocate returns null when it has no memory; blocks are aligned to 8
// bytes at least.
struct HostRoutine {
    void* (*allocate)(std::size_t bytes);
    void (*release)(void* block);
};

// kHostRoutine needs a routine, which must stay callable while blocks of it live. Throws
// kInvalidParameter. Threads: safe against running allocations.
void set_mode(Mode mode, const HostRoutine* routine);

// Makes the process-wide state. Whoever releases blocks while the process ends calls this when it
// is made itself, so that the state is still there.
void prepare();

// Both throw kNotEnoughMemory, or kPoolExhausted while the pool serves. Blocks are aligned to 8
// bytes.
void* allocate(std::size_t bytes);
// Resizes in place where the source can; contents up to the smaller size are kept. On failure the
// old block stays.
void* resize(void* block, std::size_t bytes);

// Null is accepted.
void release(void* block) noexcept;

}  // namespace zq::memory
