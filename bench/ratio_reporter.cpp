#include "bench/ratio_reporter.h"

#include <cstdio>
#include <ostream>

namespace bench {

void RatioReporter::ReportRuns(const std::vector<Run>& runs) {
  // The quickest repetition stands for the benchmark, in the table and in the goals.
  const Run* quickest = nullptr;
  for (const Run& run : runs) {
    if (run.error_occurred || run.run_type != Run::RT_Iteration) continue;
    if (quickest == nullptr || run.GetAdjustedCPUTime() < quickest->GetAdjustedCPUTime())
      quickest = &run;
  }
  if (quickest == nullptr) {
    // Mean, median and spread of the repetitions are left out; failed runs are shown.
    std::vector<Run> failed;
    for (const Run& run : runs)
      if (run.error_occurred) failed.push_back(run);
    if (!failed.empty()) benchmark::ConsoleReporter::ReportRuns(failed);
    return;
  }
  cpuSeconds_[quickest->run_name.str()] =
      quickest->GetAdjustedCPUTime() / benchmark::GetTimeUnitMultiplier(quickest->time_unit);
  benchmark::ConsoleReporter::ReportRuns({*quickest});
}

std::string RatioReporter::Evaluate(const Goal& goal) const {
  const auto measured = cpuSeconds_.find(goal.Measured);
  if (measured == cpuSeconds_.end()) return "";
  double value = measured->second;
  if (goal.GoalKind != Goal::Kind::Budget) {
    const auto reference = cpuSeconds_.find(goal.Reference);
    if (reference == cpuSeconds_.end()) return "";
    value = goal.GoalKind == Goal::Kind::Ratio ? measured->second / reference->second
                                               : reference->second / measured->second;
  }
  char line[512];
  switch (goal.GoalKind) {
    case Goal::Kind::Ratio:
      std::snprintf(line, sizeof line, "  %-56s %9.2fx   (target <= %.1fx: %s)\n",
                    goal.Label.c_str(), value, goal.Target,
                    value <= goal.Target ? "met" : "missed");
      break;
    case Goal::Kind::SpeedUp:
      std::snprintf(line, sizeof line, "  %-56s %9.1fx faster (target >= %.0fx: %s)\n",
                    goal.Label.c_str(), value, goal.Target,
                    value >= goal.Target ? "met" : "missed");
      break;
    case Goal::Kind::Budget:
      std::snprintf(line, sizeof line, "  %-56s %9.3f ms  (target < %.3f ms: %s)\n",
                    goal.Label.c_str(), value * 1e3, goal.Target * 1e3,
                    value < goal.Target ? "met" : "missed");
      break;
  }
  return line;
}

void RatioReporter::Finalize() {
  bool header = false;
  for (const Goal& goal : RegisteredGoals()) {
    const std::string line = Evaluate(goal);
    if (line.empty()) continue;
    if (!header) GetOutputStream() << "\nGoals (CPU time, this run):\n";
    header = true;
    GetOutputStream() << line;
  }
  benchmark::ConsoleReporter::Finalize();
}

}  // namespace bench
