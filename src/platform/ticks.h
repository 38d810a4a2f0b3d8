// Counters of elapsed time.
#pragma once

#include <cstdint>
#include <optional>

namespace zq::platform {

// Ticks a second of the performance counter; nothing on a machine without one.
std::optional<std::int64_t> performance_frequency();

// Ticks of that counter from an origin of its own.
std::int64_t performance_ticks();

// Milliseconds since the process started, from the time of day; wraps after 24 days.
std::int32_t process_milliseconds();

}  // namespace zq::platform
