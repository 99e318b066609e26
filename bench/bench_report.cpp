#include "bench/bench_report.h"

#include <utility>
#include <vector>

#include "bench/ratio_reporter.h"

namespace bench {

namespace {

std::vector<Goal>& Goals() {
  static std::vector<Goal> goals;
  return goals;
}

}  // namespace

void ReportPerParticle(benchmark::State& state, double particles) {
  // The inverted rate: seconds per particle, shown with an SI prefix (ns).
  state.counters["per_particle"] = benchmark::Counter(
      particles, benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

bool AddRatio(std::string label, std::string measured, std::string reference, double most) {
  Goals().push_back(
      {Goal::Kind::Ratio, std::move(label), std::move(measured), std::move(reference), most});
  return true;
}

bool AddSpeedUp(std::string label, std::string fast, std::string slow, double least) {
  Goals().push_back(
      {Goal::Kind::SpeedUp, std::move(label), std::move(fast), std::move(slow), least});
  return true;
}

bool AddBudget(std::string label, std::string measured, double seconds) {
  Goals().push_back({Goal::Kind::Budget, std::move(label), std::move(measured), "", seconds});
  return true;
}

const std::vector<Goal>& RegisteredGoals() {
  return Goals();
}

}  // namespace bench
