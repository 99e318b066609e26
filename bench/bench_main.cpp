// The benchmark programs' main: Google Benchmark's flags, the console table and, after it, the
// ratios the files registered.
#include <benchmark/benchmark.h>

#include <unistd.h>
#include <cstring>

#include "bench/ratio_reporter.h"

int main(int argc, char** argv) {
  bool tabular = false;
  for (int i = 1; i < argc; ++i)
    if (std::strcmp(argv[i], "--benchmark_counters_tabular=true") == 0) tabular = true;
  benchmark::Initialize(&argc, argv);
  if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
  int options = isatty(STDOUT_FILENO) ? benchmark::ConsoleReporter::OO_Color : 0;
  if (tabular) options |= benchmark::ConsoleReporter::OO_Tabular;
  bench::RatioReporter reporter(static_cast<benchmark::ConsoleReporter::OutputOptions>(options));
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();
  return 0;
}
