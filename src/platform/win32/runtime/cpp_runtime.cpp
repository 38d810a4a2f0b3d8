// Parts of the C++ run-time inside the DLL, made so that everything goes with the DLL. Linked into
// the DLL alone.
//
// The run-time's own parts use a thread library that asks the system for a thread-local slot and
// never gives it back, and keeps blocks for every thread: all lost when the DLL is unloaded. So
// what the run-time needs is defined here, over the system's own means, and neither its parts nor
// that library is linked: the state of exceptions, the guards of local static objects, and the
// mutexes and one-time calls of the unwinder. The reserve for exceptions without memory is given
// back only when asked for.
//
// A library source that needs more of that library (std::thread, std::condition_variable) does not
// link: symbols would be defined twice. platform/mutex.h has what the library needs.
#include <cxxabi.h>
#include <pthread.h>
#include <windows.h>

#include <atomic>
#include <cstdlib>
#include <exception>

namespace __gnu_cxx {
void __freeres();
}  // namespace __gnu_cxx

namespace {

// The layout that the C++ ABI gives __cxa_eh_globals.
struct ExceptionState {
    void* caught;
    unsigned uncaught;
};

constinit std::atomic<DWORD> g_slot{FLS_OUT_OF_INDEXES};

void WINAPI release_state(void* state) {
    std::free(state);
}

// No lock: exceptions may be thrown where any lock is held.
DWORD slot() {
    DWORD known = g_slot.load(std::memory_order_acquire);
    if (known != FLS_OUT_OF_INDEXES) return known;
    const DWORD made = FlsAlloc(release_state);
    if (made == FLS_OUT_OF_INDEXES) std::terminate();
    if (g_slot.compare_exchange_strong(known, made, std::memory_order_acq_rel)) return made;
    FlsFree(made);
    return known;
}

constinit SRWLOCK g_guard_lock = SRWLOCK_INIT;
constinit CONDITION_VARIABLE g_guard_changed = CONDITION_VARIABLE_INIT;

// A guard's first byte tells the compiled code that the object is there; the second is ours.
bool is_made(const unsigned char* guard) {
    return guard[0] != 0;
}

void end_making(unsigned char* guard, bool made) {
    AcquireSRWLockExclusive(&g_guard_lock);
    guard[1] = 0;
    if (made) __atomic_store_n(guard, 1, __ATOMIC_RELEASE);
    ReleaseSRWLockExclusive(&g_guard_lock);
    WakeAllConditionVariable(&g_guard_changed);
}

// Whether the caller is to make what the guard guards. The lock is not held meanwhile: making one
// object may make another.
bool begin_making(unsigned char* guard) {
    AcquireSRWLockExclusive(&g_guard_lock);
    while (!is_made(guard) && guard[1] != 0) {
        SleepConditionVariableSRW(&g_guard_changed, &g_guard_lock, INFINITE, 0);
    }
    const bool make = !is_made(guard);
    if (make) guard[1] = 1;
    ReleaseSRWLockExclusive(&g_guard_lock);
    return make;
}

// The type has room for a lock of the system. One with a static initialiser becomes a free lock at
// its first use.
SRWLOCK* native(pthread_mutex_t* mutex) {
    static_assert(sizeof(*mutex) == sizeof(SRWLOCK));
    pthread_mutex_t unused = PTHREAD_MUTEX_INITIALIZER;
    __atomic_compare_exchange_n(mutex, &unused, 0, false, __ATOMIC_ACQ_REL, __ATOMIC_ACQUIRE);
    return reinterpret_cast<SRWLOCK*>(mutex);
}

// Runs after the destructors of all static objects.
[[gnu::destructor]] void release_all() {
    __gnu_cxx::__freeres();
    const DWORD last = g_slot.exchange(FLS_OUT_OF_INDEXES, std::memory_order_acq_rel);
    if (last != FLS_OUT_OF_INDEXES) FlsFree(last);
}

}  // namespace

namespace __cxxabiv1 {
extern "C" {

__cxa_eh_globals* __cxa_get_globals() noexcept {
    void* state = FlsGetValue(slot());
    if (state == nullptr) {
        state = std::calloc(1, sizeof(ExceptionState));
        if (state == nullptr || FlsSetValue(slot(), state) == 0) std::terminate();
    }
    return static_cast<__cxa_eh_globals*>(state);
}

__cxa_eh_globals* __cxa_get_globals_fast() noexcept {
    return __cxa_get_globals();
}

// 1: the caller is to make the object.
int __cxa_guard_acquire(__guard* guard) {
    return begin_making(reinterpret_cast<unsigned char*>(guard)) ? 1 : 0;
}

void __cxa_guard_release(__guard* guard) noexcept {
    end_making(reinterpret_cast<unsigned char*>(guard), true);
}

void __cxa_guard_abort(__guard* guard) noexcept {
    end_making(reinterpret_cast<unsigned char*>(guard), false);
}

}  // extern "C"
}  // namespace __cxxabiv1

extern "C" {

int pthread_mutex_init(pthread_mutex_t* mutex, const pthread_mutexattr_t* /*plain*/) {
    *mutex = 0;
    return 0;
}
int pthread_mutex_destroy(pthread_mutex_t* /*mutex*/) {
    return 0;
}
int pthread_mutex_lock(pthread_mutex_t* mutex) {
    AcquireSRWLockExclusive(native(mutex));
    return 0;
}
int pthread_mutex_unlock(pthread_mutex_t* mutex) {
    ReleaseSRWLockExclusive(native(mutex));
    return 0;
}

int pthread_once(pthread_once_t* once, void (*initialise)()) {
    auto* guard = reinterpret_cast<unsigned char*>(once);
    if (begin_making(guard)) {
        initialise();
        end_making(guard, true);
    }
    return 0;
}

}  // extern "C"
