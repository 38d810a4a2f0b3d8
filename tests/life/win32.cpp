// Windows: handles, thread-storage slots of both kinds, every heap block, private memory.
#include <windows.h>
// Needs the types of the one above.
#include <psapi.h>

#include <array>
#include <stdexcept>

#include "process.h"

namespace zqtest {
namespace {

constexpr const char* kLibrary = "ZqVisSvc.dll";

std::size_t busy_heap_bytes() {
    std::array<HANDLE, 64> heaps;
    const DWORD count = GetProcessHeaps(heaps.size(), heaps.data());
    std::size_t bytes = 0;
    for (DWORD i = 0; i < count && i < heaps.size(); ++i) {
        PROCESS_HEAP_ENTRY entry{};
        HeapLock(heaps[i]);
        while (HeapWalk(heaps[i], &entry) != 0) {
            if ((entry.wFlags & PROCESS_HEAP_ENTRY_BUSY) != 0) bytes += entry.cbData;
        }
        HeapUnlock(heaps[i]);
    }
    return bytes;
}

std::size_t private_bytes() {
    PROCESS_MEMORY_COUNTERS_EX counters{};
    counters.cb = sizeof(counters);
    GetProcessMemoryInfo(GetCurrentProcess(), reinterpret_cast<PROCESS_MEMORY_COUNTERS*>(&counters),
                         sizeof(counters));
    return counters.PrivateUsage;
}

// The system gives the lowest free index, so a lost slot moves it up.
std::size_t lowest_thread_slot() {
    const DWORD index = TlsAlloc();
    TlsFree(index);
    return index;
}

std::size_t lowest_fiber_slot() {
    const DWORD index = FlsAlloc(nullptr);
    FlsFree(index);
    return index;
}

}  // namespace

const bool kReachesOtherThreads = true;

std::vector<Holding> holdings() {
    DWORD handles = 0;
    GetProcessHandleCount(GetCurrentProcess(), &handles);
    const std::size_t heap = busy_heap_bytes();
    return {{"handles", handles, 0},
            {"thread-local slots", lowest_thread_slot(), 0},
            {"fiber-local slots", lowest_fiber_slot(), 0},
            {"bytes in heap blocks", heap, 4096},
            {"private bytes", private_bytes(), 2 << 20}};
}

LoadedLibrary::LoadedLibrary() : module_(LoadLibraryA(kLibrary)) {
    if (module_ == nullptr) throw std::runtime_error("the library does not load");
}

LoadedLibrary::~LoadedLibrary() {
    FreeLibrary(static_cast<HMODULE>(module_));
}

void* LoadedLibrary::address(const char* name, int ordinal) const {
    const char* which = ordinal != 0 ? MAKEINTRESOURCEA(ordinal) : name;
    return reinterpret_cast<void*>(GetProcAddress(static_cast<HMODULE>(module_), which));
}

bool library_is_loaded() {
    return GetModuleHandleA(kLibrary) != nullptr;
}

}  // namespace zqtest
