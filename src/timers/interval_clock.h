// The clock behind the interval timers.
#pragma once

#include <atomic>
#include <cstdint>
#include <optional>

namespace zq {

// Where ticks come from; see platform/ticks.h for what each function promises.
struct TickSource {
    std::optional<std::int64_t> (*frequency)();
    std::int64_t (*ticks)();
    std::int32_t (*milliseconds)();
};

// Counts performance ticks, or milliseconds where there is no performance counter. Threads may use
// one clock together; the latest start counts for all.
class IntervalClock {
  public:
    // Throws kInitializationError when the performance counter vanishes while the clock is made.
    explicit IntervalClock(const TickSource& source);

    // The process's one clock, made with the library; null when it could not be made.
    static IntervalClock* of_process() noexcept;

    std::int64_t now() const {
        return counts_milliseconds_ ? source_.milliseconds() : source_.ticks();
    }
    void start() { start_.store(now(), std::memory_order_relaxed); }
    // Microseconds since the latest start, or since tick 0.
    double elapsed_microseconds() const;
    // Seconds between two readings of now().
    double seconds(std::int64_t start, std::int64_t end) const;

  private:
    TickSource source_;
    bool counts_milliseconds_;
    std::int64_t frequency_;  // ticks a second
    std::atomic<std::int64_t> start_ = 0;
};

}  // namespace zq
