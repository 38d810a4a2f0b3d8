// The services by name, and the frame that every one of them runs in: the host's lock, a counter
// and a refusal.
#ifndef REFHOST_SERVICE_H
#define REFHOST_SERVICE_H

#include <zqvissvc/types.h>

#include <cstdint>
#include <mutex>
#include <new>
#include <type_traits>

// The library looks the services up in the export table of the running program.
#if defined(_WIN32)
#define REFHOST_EXPORT extern "C" __declspec(dllexport)
#else
#define REFHOST_EXPORT extern "C" __attribute__((visibility("default")))
#endif

#define REFHOST_SERVICES(X)   \
    X(AZNewHandle)            \
    X(AZSetHandleSize)        \
    X(AZGetHandleSize)        \
    X(AZDisposeHandle)        \
    X(DSNewHandle)            \
    X(DSSetHandleSize)        \
    X(DSGetHandleSize)        \
    X(DSCheckHandle)          \
    X(DSDisposeHandle)        \
    X(DSNewPtr)               \
    X(DSDisposePtr)           \
    X(NumericArrayResize)     \
    X(MoveBlock)              \
    X(StrLen)                 \
    X(CToPStr)                \
    X(FTextToPath)            \
    X(FEmptyPath)             \
    X(FAddPath)               \
    X(DrawSBar)               \
    X(TrackSBarEvent)         \
    X(UDCookieToName)         \
    X(UDRemoveSesn)           \
    X(UDUnregisterSesn)       \
    X(UDRegisterSesn)         \
    X(UDRegisterSesnFlatten)  \
    X(UDRegisterSesnFlatten2) \
    X(TSCookieToSesn)         \
    X(RTSetCleanupProc)       \
    X(WNativeDialogSetup)     \
    X(WNativeDialogRestore)

namespace refhost {

enum class Service {
#define REFHOST_ENUMERATOR(name) k##name,
    REFHOST_SERVICES(REFHOST_ENUMERATOR)
#undef REFHOST_ENUMERATOR
        kCount
};

const char* service_name(Service service);

// Whether a service has the signature under which the library calls it.
template <typename Expected, typename Function>
constexpr bool has_signature(Function* /*service*/) {
    return std::is_same_v<Expected, Function*>;
}

// Host error numbers.
constexpr int32_t kOk = 0;
constexpr int32_t kBadArgument = 1;
constexpr int32_t kOutOfMemory = 2;

// Guards all tables of the host. Never held while a procedure of the client runs.
std::mutex& host_mutex();

// Counts one call; true when it is to be refused. The caller holds the lock.
bool count_call(Service service);

// The body of every service: counts the call and runs `body` under the lock, or returns `failure`
// when the call is refused or the host itself has run out of memory.
template <typename Result, typename Body>
Result serve(Service service, Result failure, const Body& body) noexcept {
    try {
        const std::lock_guard lock(host_mutex());
        if (count_call(service)) return failure;
        return body();
    } catch (const std::bad_alloc&) {
        return failure;
    }
}

}  // namespace refhost

#endif
