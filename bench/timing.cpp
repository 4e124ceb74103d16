// Probes that write nothing, against the readings of the clock that they cannot do without.

#include <time.h>

#include "bench/support/bench.h"
#include "pells/timing/performance.h"

namespace {

/// The least that a region can be timed with.
class ClockReadings {
public:
    ClockReadings() { read(); }
    ClockReadings(const ClockReadings&) = delete;
    ClockReadings& operator=(const ClockReadings&) = delete;
    ~ClockReadings() { read(); }

private:
    static void read() {
        timespec now;
        clock_gettime(CLOCK_MONOTONIC, &now);
        benchmark::DoNotOptimize(now);
    }
};

void checkCharged(benchmark::State& state, const pells::PerformanceCategory& category) {
    if (category.total() == 0)
        state.SkipWithError("no time was charged");
}

void addAlone(std::int64_t count) {
    const std::string work = "probe/alone";
    bench::add(work, count, "pells", [count](benchmark::State& state) {
        pells::PerformanceCategory& drawing = pells::PerformanceCategory::find("drawing");
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i)
                const pells::Performance probe("one frame", &drawing);
        checkCharged(state, drawing);
    });
    bench::add(work, count, "limit", [count](benchmark::State& state) {
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i)
                const ClockReadings readings;
    });
}

void addNested(std::int64_t count) {
    const std::string work = "probe/nested";
    bench::add(work, count, "pells", [count](benchmark::State& state) {
        pells::PerformanceCategory& drawing = pells::PerformanceCategory::find("drawing");
        pells::PerformanceCategory& sorting = pells::PerformanceCategory::find("sorting");
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i) {
                const pells::Performance outer("one frame", &drawing);
                const pells::Performance inner("its triangles", &sorting);
            }
        checkCharged(state, drawing);
        checkCharged(state, sorting);
    });
    bench::add(work, count, "limit", [count](benchmark::State& state) {
        for (auto _ : state)
            for (std::int64_t i = 0; i < count; ++i) {
                const ClockReadings outer;
                const ClockReadings inner;
            }
    });
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t count : bench::sizes({1000})) {
        addAlone(count);
        addNested(count);
    }
}
