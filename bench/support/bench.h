#pragma once

#include <benchmark/benchmark.h>

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

/// What the benchmark programs share. Each program defines addBenchmarks(); the main() is here.
namespace bench {

/// Loops over the state and does the work once an iteration.
using Job = std::function<void(benchmark::State&)>;

/// Registers one contestant of a work under the name "<work>/<size>/<contestant>".
///
/// The contestants of one work and size are added one after the other, the library ("pells") first:
/// a run of the program is one round, in which they take turns in the order they were added. The
/// report compares the times within each round.
///
/// \param work       such as "tokens/table/string stream"; "/" separates its parts.
/// \param contestant one word or name: "pells", "expat", "limit" …
void add(const std::string& work, std::int64_t size, const std::string& contestant, Job job);

/// All the sizes or, when every work is to run just once (--once), the first of them.
std::vector<std::int64_t> sizes(const std::vector<std::int64_t>& all);

/// Sets a preference of the process, such as "log"; the library reads them when it makes its log.
void setPreference(const std::string& key, const std::string& value);

/// The folder that the program runs in, for its files: empty at the start, removed at the end.
std::string scratch();

}  // namespace bench

/// Registers the benchmarks of a program with bench::add().
void addBenchmarks();
