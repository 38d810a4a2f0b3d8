// The clock behind the interval timers.
#include "timers/interval_clock.h"

#include "base/error_codes.h"
#include "platform/ticks.h"

namespace zq {
namespace {

constexpr std::int64_t kMillisecondsPerSecond = 1000;
constexpr long double kMicrosecondsPerSecond = 1'000'000;

// Readings far apart wrap around instead of overflowing.
std::int64_t difference(std::int64_t start, std::int64_t end) {
    return static_cast<std::int64_t>(static_cast<std::uint64_t>(end) -
                                     static_cast<std::uint64_t>(start));
}

}  // namespace

IntervalClock::IntervalClock(const TickSource& source)
    : source_(source),
      counts_milliseconds_(!source.frequency().has_value()),
      frequency_(kMillisecondsPerSecond) {
    if (counts_milliseconds_) return;
    const std::optional<std::int64_t> frequency = source.frequency();
    if (!frequency) throw kInitializationError;
    frequency_ = *frequency;
}

IntervalClock* IntervalClock::of_process() noexcept {
    struct Holder {
        std::optional<IntervalClock> clock;
        Holder() {
            try {
                clock.emplace(TickSource{platform::performance_frequency,
                                         platform::performance_ticks,
                                         platform::process_milliseconds});
            } catch (GRLIBError_enum) {
                // No clock then: timing is no reason to refuse the library.
            }
        }
    };
    static Holder holder;
    return holder.clock ? &*holder.clock : nullptr;
}

namespace {
// Before any caller can come.
[[maybe_unused]] const IntervalClock* const made_with_the_library = IntervalClock::of_process();
}  // namespace

double IntervalClock::elapsed_microseconds() const {
    const std::int64_t ticks = difference(start_.load(std::memory_order_relaxed), now());
    // Extended precision keeps every tick of a long interval.
    const long double seconds =
        static_cast<long double>(ticks) / static_cast<long double>(frequency_);
    return static_cast<double>(seconds * kMicrosecondsPerSecond);
}

double IntervalClock::seconds(std::int64_t start, std::int64_t end) const {
    return static_cast<double>(difference(start, end)) / static_cast<double>(frequency_);
}

}  // namespace zq
