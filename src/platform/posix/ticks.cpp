// Counters of elapsed time: the monotonic clock in nanoseconds, and the time of day.
#include "platform/ticks.h"

#include <ctime>

namespace zq::platform {
namespace {

std::int64_t nanoseconds(clockid_t clock) {
    std::timespec time{};
    clock_gettime(clock, &time);
    return std::int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

}  // namespace

std::optional<std::int64_t> performance_frequency() {
    return 1'000'000'000;
}

std::int64_t performance_ticks() {
    return nanoseconds(CLOCK_MONOTONIC);
}

std::int32_t process_milliseconds() {
    // The first call stands for the start of the process; intervals do not see the difference.
    static const std::int64_t origin = nanoseconds(CLOCK_REALTIME);
    return static_cast<std::int32_t>((nanoseconds(CLOCK_REALTIME) - origin) / 1'000'000);
}

}  // namespace zq::platform
