// How the benchmarks report: CPU nanoseconds per particle, and, after the table, the goals the
// files registered (ratios against reference loops of the same run, speed-ups, time budgets).
#pragma once

#include <benchmark/benchmark.h>

#include <string>

namespace bench {

// Adds the "per_particle" column: CPU time per iteration divided by `particles`.
void ReportPerParticle(benchmark::State& state, double particles);

// Each registers a goal checked at the end of the run and returns true, so that a file can
// register at namespace scope. Names are full benchmark names, e.g. "BM_QuadBuild/10000".
// `measured` should take at most `most` times the CPU time of `reference`.
bool AddRatio(std::string label, std::string measured, std::string reference, double most);
// `fast` should take at most 1/`least` of the CPU time of `slow`.
bool AddSpeedUp(std::string label, std::string fast, std::string slow, double least);
// `measured` should take at most `seconds` of CPU time per iteration.
bool AddBudget(std::string label, std::string measured, double seconds);

}  // namespace bench
