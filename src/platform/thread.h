// Threads as the library sees them: an identity, a short pause for spin loops, and slots that hold
// a pointer for each thread.
#pragma once

#include <cstdint>

namespace zq::platform {

// Identity of the calling thread; never 0, unique among running threads.
std::uintptr_t current_thread();

// Gives way for a moment inside a spin loop.
void pause_spin();

// The value in a thread-local slot that somebody else made (TlsAlloc, pthread_key_create); null for
// a bad index.
void* foreign_slot_value(std::int32_t index);

// A thread-local pointer whose release function runs when a thread ends and, for the values still
// there, when the slot itself is destroyed. Trap: pthread then knows the value of the destroying
// thread only; those of other running threads are never released. The release function never sees
// null.
class ThreadSlot {
  public:
    explicit ThreadSlot(void (*release)(void*));
    ~ThreadSlot();
    ThreadSlot(const ThreadSlot&) = delete;
    ThreadSlot& operator=(const ThreadSlot&) = delete;
    void* get() const;
    // False when the system is out of memory; the value then stays the caller's.
    bool set(void* value);

  private:
    void (*release_)(void*);
    std::uintptr_t key_ = 0;
    bool valid_ = false;
};

}  // namespace zq::platform
