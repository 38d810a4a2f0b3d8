// One job beside several baselines, as ratios of throughput.
#pragma once

#include <benchmark/benchmark.h>

#include <cstddef>
#include <cstring>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "opencv/jobs.h"
#include "paired.h"

namespace zqbench {

// The picture of all conversions.
inline constexpr int kWidth = 4096;
inline constexpr int kHeight = 3000;
inline constexpr std::size_t kPixels = std::size_t{kWidth} * kHeight;

struct Baseline {
    std::string name;
    Job job;          // empty: cannot be run here
    Job before = {};  // each time, and not timed
};

inline Baseline memcpy_named(std::string name, std::size_t bytes) {
    const auto source = std::make_shared<std::vector<char>>(bytes, 'a');
    const auto destination = std::make_shared<std::vector<char>>(bytes);
    return {std::move(name), [=] {
                std::memcpy(destination->data(), source->data(), bytes);
                benchmark::ClobberMemory();
            }};
}

// memcpy that moves as many bytes as a job reads and writes for each pixel together.
inline Baseline memcpy_of(std::size_t bytes_per_pixel) {
    return memcpy_named("memcpy", kPixels * bytes_per_pixel / 2);
}

// Reports megapixels a second, and how many times the throughput of each baseline that is: by the
// time that passed; as "cpu x" by the processor's, which other programs disturb less; and as
// "best x" by the shortest times of both, which tell most where the machine is restless.
inline void run_compared(benchmark::State& state, const Job& ours,
                         const std::vector<Baseline>& baselines, std::size_t pixels = kPixels,
                         const Job& before_ours = {}) {
    ours();
    Times our_times;
    std::vector<std::pair<const Baseline*, Times>> others;
    for (const Baseline& baseline : baselines) {
        if (!baseline.job) continue;
        baseline.job();
        others.emplace_back(&baseline, Times());
    }
    for (auto step : state) {
        if (before_ours) before_ours();
        our_times.add(ours);
        for (auto& [baseline, times] : others) {
            if (baseline->before) baseline->before();
            times.add(baseline->job);
        }
        state.SetIterationTime(our_times.wall.back());
    }
    const double seconds = median(our_times.wall);
    state.counters["Mpixel/s"] = static_cast<double>(pixels) / seconds * 1e-6;
    for (auto& [baseline, times] : others) {
        state.counters["x " + baseline->name] = median(times.wall) / seconds;
        state.counters["cpu x " + baseline->name] =
            median(times.processor) / median(our_times.processor);
        state.counters["best x " + baseline->name] =
            least(times.processor) / least(our_times.processor);
    }
}

}  // namespace zqbench
