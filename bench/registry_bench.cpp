// What one image costs while many others are alive: the same operation beside 100 and beside
// 100,000 live images, in turn. The ratio must stay below 2. Run: zqvis_bench
// --benchmark_filter=Registry
#include <benchmark/benchmark.h>
#include <zqvissvc/image.h>

#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "paired.h"
#include "refhost/refhost.h"

namespace {

constexpr int kFew = 100;
constexpr int kMany = 100000;
constexpr int kBatch = 2000;     // operations timed together
constexpr int kBatches = 9;      // a population; the median counts
constexpr int kWorkingSet = 64;  // images that are used, spread over all live ones
constexpr int32_t kSide = 16;

void check(bool good, const char* what) {
    if (good) return;
    std::fprintf(stderr, "registry_bench: %s failed\n", what);
    std::abort();
}

// The live images of a benchmark.
class Population {
  public:
    explicit Population(bool named) : named_(named) {}
    ~Population() { resize(0); }
    Population(const Population&) = delete;
    Population& operator=(const Population&) = delete;

    void resize(int count) {
        while (size() > count) {
            check(ZqDisposeImage(images_.back()) == 0, "dispose");
            images_.pop_back();
        }
        while (size() < count) {
            ZqImageHandle image = nullptr;
            const std::string name = named_ ? name_of(size()) : std::string();
            check(NewNamedImage(ZQ_TYPE_U8, kSide, kSide, 0, name.c_str(), 0, &image) == 0, "new");
            images_.push_back(image);
        }
    }
    // Which image the n-th operation uses.
    int chosen(int n) const { return n % kWorkingSet * (size() / kWorkingSet); }
    ZqImageHandle image(int index) const { return images_[static_cast<size_t>(index)]; }
    static std::string name_of(int index) { return "live image " + std::to_string(index); }

  private:
    int size() const { return static_cast<int>(images_.size()); }

    bool named_;
    std::vector<ZqImageHandle> images_;
};

using Operation = void (*)(const Population& population, int n);

void create_unnamed(const Population& /*population*/, int /*n*/) {
    ZqImageHandle image = nullptr;
    check(NewImage(ZQ_TYPE_U8, kSide, kSide, 0, &image) == 0, "NewImage");
    check(ZqDisposeImage(image) == 0, "dispose");
}

void create_named(const Population& /*population*/, int n) {
    ZqImageHandle image = nullptr;
    const std::string name = "passing image " + std::to_string(n);
    check(NewNamedImage(ZQ_TYPE_U8, kSide, kSide, 0, name.c_str(), 0, &image) == 0, "new");
    check(ZqDisposeImage(image) == 0, "dispose");
}

void create_from_host(const Population& /*population*/, int /*n*/) {
    static const refhost::String name("host image");
    static ZqImageValue value{};
    check(DF_Create(name.get(), ZQ_TYPE_U8, 0, kSide, kSide, 0, &value, nullptr) == 0, "DF_Create");
    check(DF_Dispose(&value, 0, nullptr) == 0, "DF_Dispose");
}

void lock(const Population& population, int n) {
    const ZqImageHandle image = population.image(population.chosen(n));
    check(ZqLockImages(&image, 1) == 0 && ZqUnlockImages(&image, 1) == 0, "lock");
}

void find_or_create(const Population& population, int n) {
    const int index = population.chosen(n);
    ZqImageHandle image = nullptr;
    check(NewNamedImage(ZQ_TYPE_U8, kSide, kSide, 0, Population::name_of(index).c_str(), 0,
                        &image) == 0,
          "find or create");
    check(image == population.image(index), "find");
}

void time_batches(zqbench::Times& times, Operation operation, const Population& population) {
    for (int batch = 0; batch < kBatches; ++batch) {
        times.add([&] {
            for (int n = 0; n < kBatch; ++n) operation(population, n);
        });
    }
}

void run(benchmark::State& state, Operation operation, bool named) {
    Population population(named);
    zqbench::Times few, many;
    for (auto step : state) {
        population.resize(kFew);
        time_batches(few, operation, population);
        population.resize(kMany);
        time_batches(many, operation, population);
        state.SetIterationTime(zqbench::median(many.wall));
    }
    const auto nanoseconds = [](const zqbench::Times& times) {
        return zqbench::median(times.wall) / kBatch * 1e9;
    };
    state.counters["ns_at_100"] = nanoseconds(few);
    state.counters["ns_at_100000"] = nanoseconds(many);
    state.counters["ratio"] = nanoseconds(many) / nanoseconds(few);
}

#define ZQ_REGISTRY_BENCHMARK(name, operation, named) \
    BENCHMARK_CAPTURE(run, name, operation, named)    \
        ->Name("Registry/" #name)                     \
        ->UseManualTime()                             \
        ->Unit(benchmark::kMillisecond)               \
        ->Iterations(3)

ZQ_REGISTRY_BENCHMARK(create_dispose_unnamed_among_unnamed, create_unnamed, false);
ZQ_REGISTRY_BENCHMARK(create_dispose_unnamed_among_named, create_unnamed, true);
ZQ_REGISTRY_BENCHMARK(create_dispose_named_among_unnamed, create_named, false);
ZQ_REGISTRY_BENCHMARK(create_dispose_named_among_named, create_named, true);
ZQ_REGISTRY_BENCHMARK(host_create_dispose_among_named, create_from_host, true);
ZQ_REGISTRY_BENCHMARK(lock_unlock_among_unnamed, lock, false);
ZQ_REGISTRY_BENCHMARK(lock_unlock_among_named, lock, true);
ZQ_REGISTRY_BENCHMARK(find_or_create_among_named, find_or_create, true);

}  // namespace
