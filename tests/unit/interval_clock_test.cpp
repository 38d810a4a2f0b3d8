// Both kinds of clock, over counters that the test moves.
#include "timers/interval_clock.h"

#include <gtest/gtest.h>

#include "base/error_codes.h"

using namespace zq;

namespace {

std::int64_t ticks = 0;
std::int32_t milliseconds = 0;
int frequency_calls = 0;

std::optional<std::int64_t> three_megahertz() {
    return 3'000'000;
}
std::optional<std::int64_t> no_counter() {
    return std::nullopt;
}
std::optional<std::int64_t> vanishing() {
    return frequency_calls++ == 0 ? std::optional<std::int64_t>(1) : std::nullopt;
}
std::int64_t read_ticks() {
    return ticks;
}
std::int32_t read_milliseconds() {
    return milliseconds;
}

}  // namespace

TEST(IntervalClock, CountsPerformanceTicksFromTheLatestStart) {
    IntervalClock clock({three_megahertz, read_ticks, read_milliseconds});
    ticks = 6;
    EXPECT_EQ(clock.elapsed_microseconds(), 2.0) << "without a start from tick 0";
    clock.start();
    ticks = 3'000'006;
    EXPECT_EQ(clock.elapsed_microseconds(), 1'000'000.0);
    EXPECT_EQ(clock.elapsed_microseconds(), 1'000'000.0) << "stopping does not move the start";
    // Beyond the 53 bits of a double: the subtraction comes first.
    ticks = (std::int64_t{1} << 62) + 1;
    clock.start();
    ticks += 3;
    EXPECT_EQ(clock.elapsed_microseconds(), 1.0);
    EXPECT_EQ(clock.seconds(3'000'000, 9'000'000), 2.0);
}

TEST(IntervalClock, CountsMillisecondsWithoutAPerformanceCounter) {
    IntervalClock clock({no_counter, read_ticks, read_milliseconds});
    milliseconds = -5;  // the 32-bit count has wrapped
    clock.start();
    milliseconds = 2;
    EXPECT_EQ(clock.elapsed_microseconds(), 7000.0);
    EXPECT_EQ(clock.seconds(0, 1), 0.001);
}

TEST(IntervalClock, IsNotMadeWhenTheCounterVanishes) {
    try {
        const IntervalClock clock({vanishing, read_ticks, read_milliseconds});
        FAIL();
    } catch (GRLIBError_enum code) {
        EXPECT_EQ(code, kInitializationError);
    }
}
