// Mutex and condition variable over pthread objects that live inside the opaque storage.
#include "platform/mutex.h"

#include <pthread.h>

#include <cassert>
#include <new>

namespace zq::platform {
namespace {

template <class Native>
Native* native(unsigned char* storage) {
    return std::launder(reinterpret_cast<Native*>(storage));
}

void check([[maybe_unused]] int result) {
    assert(result == 0);
}

}  // namespace

Mutex::Mutex() {
    static_assert(sizeof(pthread_mutex_t) <= sizeof(storage_));
    static_assert(alignof(pthread_mutex_t) <= 8);
    check(pthread_mutex_init(::new (storage_) pthread_mutex_t, nullptr));
}

Mutex::~Mutex() {
    check(pthread_mutex_destroy(native<pthread_mutex_t>(storage_)));
}

void Mutex::lock() {
    check(pthread_mutex_lock(native<pthread_mutex_t>(storage_)));
}

void Mutex::unlock() {
    check(pthread_mutex_unlock(native<pthread_mutex_t>(storage_)));
}

bool Mutex::try_lock() {
    return pthread_mutex_trylock(native<pthread_mutex_t>(storage_)) == 0;
}

Condition::Condition() {
    static_assert(sizeof(pthread_cond_t) <= sizeof(storage_));
    static_assert(alignof(pthread_cond_t) <= 8);
    check(pthread_cond_init(::new (storage_) pthread_cond_t, nullptr));
}

Condition::~Condition() {
    check(pthread_cond_destroy(native<pthread_cond_t>(storage_)));
}

void Condition::wait(Mutex& mutex) {
    check(pthread_cond_wait(native<pthread_cond_t>(storage_),
                            native<pthread_mutex_t>(mutex.storage_)));
}

void Condition::notify_one() {
    check(pthread_cond_signal(native<pthread_cond_t>(storage_)));
}

void Condition::notify_all() {
    check(pthread_cond_broadcast(native<pthread_cond_t>(storage_)));
}

}  // namespace zq::platform
