#pragma once

// A benchmark of work beside the empty pass of the parser over the same bytes: its time moves with
// the machine, the units less.

#include "Orders.h"
#include "Units.h"

#include <benchmark/benchmark.h>

namespace bench {

constexpr std::size_t megabyte = 1000 * 1000;

// The document of orders of that size; the latest one is kept.
const std::string& document(std::int64_t megabytes);

// Runs work() beside the unit; it returns whether it did what it should.
template <class Work>
void besideUnit(benchmark::State& state, const std::string& xml, Work work) {
    Units units;
    for (auto _ : state) {
        if (!units.measure(xml, work))
            state.SkipWithError("nothing was parsed, read or written");
        state.SetIterationTime(units.latestSeconds());
    }
    state.counters["units"] = units.median();
    state.counters["ms"] = units.medianSeconds() * 1e3;
    state.counters["passMs"] = units.medianPassSeconds() * 1e3;
}

// At the table's size of 60 MB.
inline void once(benchmark::internal::Benchmark* benchmark) {
    benchmark->Arg(60)->Iterations(7)->Unit(benchmark::kMillisecond)->UseManualTime();
}
// At the sizes of the plot; 600 MB only where the machine has the memory.
void sizes(benchmark::internal::Benchmark* benchmark);

} // namespace bench
