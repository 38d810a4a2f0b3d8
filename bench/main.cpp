// Runs all benchmarks of the program.
#include <benchmark/benchmark.h>

#ifdef __GLIBC__
#include <malloc.h>
#endif

namespace {

// Pictures of all jobs come from the system and go back to it. Left to itself, the allocator keeps
// some after a while: whether a job pays for fresh pages then hangs on what ran before it.
void use_fresh_memory_for_pictures() {
#ifdef __GLIBC__
    constexpr int kPicture = 1 << 20;
    mallopt(M_MMAP_THRESHOLD, kPicture);
#endif
}

}  // namespace

int main(int count, char** arguments) {
    use_fresh_memory_for_pictures();
    benchmark::Initialize(&count, arguments);
    if (benchmark::ReportUnrecognizedArguments(count, arguments)) return 1;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
