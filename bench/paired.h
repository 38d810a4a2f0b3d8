// Two ways to do one job, timed in turn, so that a drift of the machine hits both alike.
#pragma once

#include <benchmark/benchmark.h>

#include <algorithm>
#include <chrono>
#include <ctime>
#include <vector>

namespace zqbench {

struct Times {
    std::vector<double> wall, processor;  // seconds

    template <class Job>
    void add(Job&& job) {
        const std::clock_t processor_start = std::clock();
        const auto start = std::chrono::steady_clock::now();
        job();
        const std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start;
        wall.push_back(elapsed.count());
        processor.push_back(static_cast<double>(std::clock() - processor_start) / CLOCKS_PER_SEC);
    }
};

inline double median(std::vector<double> values) {
    const auto middle = values.begin() + static_cast<std::ptrdiff_t>(values.size() / 2);
    std::nth_element(values.begin(), middle, values.end());
    return *middle;
}

inline double least(const std::vector<double>& values) {
    return *std::min_element(values.begin(), values.end());
}

// Reports medians in milliseconds, and the ratio of the medians: of the time that passed, and of
// the processor's, which other programs on the machine disturb less.
template <class Ours, class Baseline>
void run_paired(benchmark::State& state, Ours&& ours, Baseline&& baseline) {
    Times our_times, baseline_times;
    ours();
    baseline();
    for (auto step : state) {
        our_times.add(ours);
        baseline_times.add(baseline);
        state.SetIterationTime(our_times.wall.back());
    }
    state.counters["ours_ms"] = median(our_times.wall) * 1e3;
    state.counters["baseline_ms"] = median(baseline_times.wall) * 1e3;
    state.counters["ratio"] = median(our_times.wall) / median(baseline_times.wall);
    state.counters["cpu_ratio"] = median(our_times.processor) / median(baseline_times.processor);
}

}  // namespace zqbench
