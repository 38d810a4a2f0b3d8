// POSIX: descriptors, thread-storage keys, heap bytes. Under the address sanitizer its leak check
// stands in for the last.
#include <dlfcn.h>
#include <malloc.h>
#include <pthread.h>

#include <filesystem>
#include <iterator>
#include <stdexcept>
#include <string>

#include "process.h"

namespace zqtest {
namespace {

// By its path beside this program: a sanitizer's dlopen does not look where the program says.
std::string library() {
    const auto program = std::filesystem::read_symlink("/proc/self/exe");
    return program.parent_path().parent_path() / "lib" / "libZqVisSvc.so";
}

std::size_t open_descriptors() {
    const std::filesystem::directory_iterator entries("/proc/self/fd");
    return static_cast<std::size_t>(std::distance(begin(entries), end(entries)));
}

// The system gives the lowest free key, so a lost one moves it up.
std::size_t lowest_thread_slot() {
    pthread_key_t key = 0;
    pthread_key_create(&key, nullptr);
    pthread_key_delete(key);
    return key;
}

}  // namespace

const bool kReachesOtherThreads = false;

std::vector<Holding> holdings() {
    return {{"descriptors", open_descriptors(), 0},
            {"thread-local slots", lowest_thread_slot(), 0},
            {"bytes in heap blocks", mallinfo2().uordblks, 4096}};
}

LoadedLibrary::LoadedLibrary() : module_(dlopen(library().c_str(), RTLD_NOW | RTLD_LOCAL)) {
    if (module_ == nullptr) throw std::runtime_error(dlerror());
}

LoadedLibrary::~LoadedLibrary() {
    dlclose(module_);
}

void* LoadedLibrary::address(const char* name, int /*ordinal*/) const {
    return dlsym(module_, name);
}

bool library_is_loaded() {
    void* module = dlopen(library().c_str(), RTLD_NOW | RTLD_NOLOAD);
    if (module != nullptr) dlclose(module);
    return module != nullptr;
}

}  // namespace zqtest
