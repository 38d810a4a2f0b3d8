// The lock of one registered object. It is shared by the object and by every thread that waits for
// it, so a wait for an object that somebody disposes ends with "gone" instead of touching freed
// memory.
#pragma once

#include <cstdint>

#include "platform/mutex.h"

namespace zq {

class ObjectGate {
  public:
    // A gate that does not really lock lets everybody in; its object must be used by one thread at
    // a time.
    explicit ObjectGate(bool really_locks) : really_locks_(really_locks) {}

    // Recursive. False when the object is gone.
    bool lock();
    // Undoes one lock of the calling thread; nothing happens when the object is gone or the caller
    // holds no lock.
    void unlock();
    // Waits until no other thread holds the lock, then closes the gate for good: waiting and later
    // locks fail, also the locks that the caller itself still holds are void.
    void close();

  private:
    bool held_by_other(std::uintptr_t self) const { return owner_ != 0 && owner_ != self; }

    const bool really_locks_;
    platform::Mutex mutex_;
    platform::Condition changed_;
    std::uintptr_t owner_ = 0;  // thread; 0: free
    std::uint32_t depth_ = 0;
    std::uint32_t waiting_ = 0;
    bool open_ = true;
};

}  // namespace zq
