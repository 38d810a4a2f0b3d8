// Mutex and condition variable over SRW locks, which are one word each and are never torn down.
#include "platform/mutex.h"

#include <windows.h>

#include <cassert>
#include <new>

namespace zq::platform {
namespace {

template <class Native>
Native* native(unsigned char* storage) {
    return std::launder(reinterpret_cast<Native*>(storage));
}

}  // namespace

Mutex::Mutex() {
    static_assert(sizeof(SRWLOCK) <= sizeof(storage_) && alignof(SRWLOCK) <= 8);
    InitializeSRWLock(::new (storage_) SRWLOCK);
}

Mutex::~Mutex() = default;

void Mutex::lock() {
    AcquireSRWLockExclusive(native<SRWLOCK>(storage_));
}

void Mutex::unlock() {
    ReleaseSRWLockExclusive(native<SRWLOCK>(storage_));
}

bool Mutex::try_lock() {
    return TryAcquireSRWLockExclusive(native<SRWLOCK>(storage_)) != 0;
}

Condition::Condition() {
    static_assert(sizeof(CONDITION_VARIABLE) <= sizeof(storage_));
    static_assert(alignof(CONDITION_VARIABLE) <= 8);
    InitializeConditionVariable(::new (storage_) CONDITION_VARIABLE);
}

Condition::~Condition() = default;

void Condition::wait(Mutex& mutex) {
    [[maybe_unused]] const BOOL woken = SleepConditionVariableSRW(
        native<CONDITION_VARIABLE>(storage_), native<SRWLOCK>(mutex.storage_), INFINITE, 0);
    assert(woken);
}

void Condition::notify_one() {
    WakeConditionVariable(native<CONDITION_VARIABLE>(storage_));
}

void Condition::notify_all() {
    WakeAllConditionVariable(native<CONDITION_VARIABLE>(storage_));
}

}  // namespace zq::platform
