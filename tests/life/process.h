// The process that loads the library: what it holds, and loading and unloading.
#pragma once

#include <cstddef>
#include <vector>

namespace zqtest {

// Something that a library could leave behind, counted.
struct Holding {
    const char* name;
    std::size_t amount;
    std::size_t slack;  // how much it may grow by itself over a whole test
};
// The same holdings in the same order at each call. No other thread may be at work.
std::vector<Holding> holdings();

// The library, loaded for as long as this lives.
class LoadedLibrary {
  public:
    LoadedLibrary();  // throws std::runtime_error
    ~LoadedLibrary();
    LoadedLibrary(const LoadedLibrary&) = delete;
    LoadedLibrary& operator=(const LoadedLibrary&) = delete;

    // An exported function; the ordinal is for those that Windows does not export by name.
    template <class Function>
    Function* find(const char* name, int ordinal = 0) const {
        return reinterpret_cast<Function*>(address(name, ordinal));
    }

  private:
    void* address(const char* name, int ordinal) const;
    void* module_;
};

bool library_is_loaded();

// Whether unloading can release what the library keeps for threads that are still there. POSIX
// reaches the slots of the calling thread only.
extern const bool kReachesOtherThreads;

}  // namespace zqtest
