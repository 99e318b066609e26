// The console table, one row per benchmark (its quickest repetition), followed by the registered
// goals evaluated on those CPU times.
#pragma once

#include <benchmark/benchmark.h>

#include <map>
#include <string>
#include <vector>

namespace bench {

struct Goal {
  enum class Kind { Ratio, SpeedUp, Budget };
  Kind GoalKind;
  std::string Label;
  std::string Measured;   // benchmark name
  std::string Reference;  // benchmark name (none for a budget)
  double Target;          // most times (ratio), least times (speed-up), most seconds (budget)
};

const std::vector<Goal>& RegisteredGoals();

class RatioReporter : public benchmark::ConsoleReporter {
 public:
  using benchmark::ConsoleReporter::ConsoleReporter;
  void ReportRuns(const std::vector<Run>& runs) override;
  void Finalize() override;

 private:
  // The goal's line, or empty when a benchmark it names did not run.
  std::string Evaluate(const Goal& goal) const;

  std::map<std::string, double> cpuSeconds_;  // per iteration, by benchmark name
};

}  // namespace bench
