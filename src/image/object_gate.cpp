// A recursive lock that can be closed for good.
#include "image/object_gate.h"

#include <mutex>

#include "platform/thread.h"

namespace zq {

bool ObjectGate::lock() {
    const std::uintptr_t self = platform::current_thread();
    const std::lock_guard guard(mutex_);
    if (!really_locks_) {
        return open_;
    }
    while (open_ && held_by_other(self)) {
        ++waiting_;
        changed_.wait(mutex_);
        --waiting_;
    }
    if (!open_) {
        return false;
    }
    owner_ = self;
    ++depth_;
    return true;
}

void ObjectGate::unlock() {
    const std::lock_guard guard(mutex_);
    if (!open_ || owner_ != platform::current_thread()) {
        return;
    }
    if (--depth_ == 0) {
        owner_ = 0;
        if (waiting_ > 0) {
            changed_.notify_one();
        }
    }
}

void ObjectGate::close() {
    const std::uintptr_t self = platform::current_thread();
    const std::lock_guard guard(mutex_);
    while (open_ && held_by_other(self)) {
        ++waiting_;
        changed_.wait(mutex_);
        --waiting_;
    }
    open_ = false;
    owner_ = 0;
    depth_ = 0;
    changed_.notify_all();
}

}  // namespace zq
