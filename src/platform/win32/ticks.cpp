// Counters of elapsed time: the performance counter, and the time of day against the process's
// start.
#include "platform/ticks.h"

#include <windows.h>

namespace zq::platform {
namespace {

constexpr std::int64_t kFileTimePerMillisecond = 10'000;

std::int64_t count_of(const FILETIME& time) {
    return static_cast<std::int64_t>(std::uint64_t{time.dwHighDateTime} << 32U |
                                     time.dwLowDateTime);
}

}  // namespace

std::optional<std::int64_t> performance_frequency() {
    LARGE_INTEGER frequency{};
    if (QueryPerformanceFrequency(&frequency) == 0 || frequency.QuadPart <= 0) return std::nullopt;
    return frequency.QuadPart;
}

std::int64_t performance_ticks() {
    LARGE_INTEGER ticks{};
    QueryPerformanceCounter(&ticks);
    return ticks.QuadPart;
}

std::int32_t process_milliseconds() {
    FILETIME now{};
    FILETIME start{};
    FILETIME unused{};
    GetSystemTimeAsFileTime(&now);
    GetProcessTimes(GetCurrentProcess(), &start, &unused, &unused, &unused);
    return static_cast<std::int32_t>((count_of(now) - count_of(start)) / kFileTimePerMillisecond);
}

}  // namespace zq::platform
