// The benchmark programs' main: Google Benchmark's flags, the console table and, after it, the
// goals the files registered. Unless told otherwise each benchmark runs three times and the
// quickest run stands for it: on a shared machine other work only ever adds time.
#include <benchmark/benchmark.h>

#include <unistd.h>
#include <cstring>
#include <vector>

#include "bench/ratio_reporter.h"

int main(int argc, char** argv) {
  bool tabular = false;
  bool repetitions = false;
  std::vector<char*> args(argv, argv + argc);
  for (int i = 1; i < argc; ++i) {
    if (std::strcmp(argv[i], "--benchmark_counters_tabular=true") == 0) tabular = true;
    if (std::strncmp(argv[i], "--benchmark_repetitions", 23) == 0) repetitions = true;
  }
  static char kThreeRuns[] = "--benchmark_repetitions=3";
  if (!repetitions) args.push_back(kThreeRuns);
  int count = static_cast<int>(args.size());
  args.push_back(nullptr);
  benchmark::Initialize(&count, args.data());
  if (benchmark::ReportUnrecognizedArguments(count, args.data())) return 1;
  int options = isatty(STDOUT_FILENO) ? benchmark::ConsoleReporter::OO_Color : 0;
  if (tabular) options |= benchmark::ConsoleReporter::OO_Tabular;
  bench::RatioReporter reporter(static_cast<benchmark::ConsoleReporter::OutputOptions>(options));
  benchmark::RunSpecifiedBenchmarks(&reporter);
  benchmark::Shutdown();
  return 0;
}
