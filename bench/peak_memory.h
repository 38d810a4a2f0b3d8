// How much memory a job takes at its peak, as the system counts pages.
#pragma once

#include <cstddef>
#include <cstdio>
#include <functional>
#ifdef __GLIBC__
#include <malloc.h>
#endif

namespace zqbench {

// Of VmHWM and its like in /proc/self/status, in bytes; 0 where there is no such file.
inline std::size_t status_bytes(const char* format) {
    std::FILE* file = std::fopen("/proc/self/status", "r");
    if (file == nullptr) return 0;
    char line[128];
    unsigned long kibibytes = 0;
    while (std::fgets(line, sizeof line, file) != nullptr) {
        if (std::sscanf(line, format, &kibibytes) == 1) break;
    }
    std::fclose(file);
    return std::size_t{kibibytes} << 10;
}

// By how much the pages in use grow at most; 0 where that cannot be known.
inline std::size_t peak_growth(const std::function<void()>& job) {
#ifdef __GLIBC__
    malloc_trim(0);  // what earlier jobs left would hide what this one takes
#endif
    std::FILE* file = std::fopen("/proc/self/clear_refs", "w");
    if (file == nullptr) return 0;
    std::fputs("5", file);  // forgets the peak
    std::fclose(file);
    const std::size_t before = status_bytes("VmRSS: %lu");
    job();
    const std::size_t peak = status_bytes("VmHWM: %lu");
    return peak > before ? peak - before : 0;
}

}  // namespace zqbench
