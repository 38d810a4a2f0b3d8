// Thread identity, spin pause and thread-local slots over pthread.
#include "platform/thread.h"

#include <limits.h>
#include <pthread.h>
#include <sched.h>

namespace zq::platform {

std::uintptr_t current_thread() {
    return static_cast<std::uintptr_t>(pthread_self());
}

void pause_spin() {
    sched_yield();
}

void* foreign_slot_value(std::int32_t index) {
    if (index < 0 || index >= PTHREAD_KEYS_MAX) return nullptr;
    return pthread_getspecific(static_cast<pthread_key_t>(index));
}

ThreadSlot::ThreadSlot(void (*release)(void*)) : release_(release) {
    pthread_key_t key = 0;
    valid_ = pthread_key_create(&key, release) == 0;
    key_ = key;
}

ThreadSlot::~ThreadSlot() {
    if (!valid_) return;
    void* own = get();
    pthread_key_delete(static_cast<pthread_key_t>(key_));
    if (own != nullptr) release_(own);
}

void* ThreadSlot::get() const {
    return valid_ ? pthread_getspecific(static_cast<pthread_key_t>(key_)) : nullptr;
}

bool ThreadSlot::set(void* value) {
    return valid_ && pthread_setspecific(static_cast<pthread_key_t>(key_), value) == 0;
}

}  // namespace zq::platform
