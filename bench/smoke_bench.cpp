// Smoke pair forces per step at 1,000, 5,000 and 20,000 particles in a cube 100 across, with
// repulsion and attraction reaching a tenth of it: the pair stage alone, by the grid and by the
// all-pairs loop, and whole logic steps with smoke either way.
#include <benchmark/benchmark.h>

#include <memory>
#include <vector>

#include "bench/bench_report.h"
#include "bench/bench_scene.h"
#include "host/smoke_settings.h"
#include "plugin/link_table.h"
#include "simulation/smoke_pairs.h"

namespace {

constexpr float kCloudSize = 100.0f;
constexpr float kReach = kCloudSize / 10.0f;

// The scene's smoke settings: repulsion over the whole reach, attraction over its outer part.
Tev_AdvPE_SmokeSettings* LinkSmoke(bench::Scene& scene) {
  auto* smoke = scene.Own(std::make_unique<Tev_AdvPE_SmokeSettings>());
  smoke->SetChild(Tev_AdvPE_SmokeSettings::kLinkForceStrengthEnvelope,
                  scene.Envelope(-1, 1.0f, 0.5f));
  Tev_EnvelopeStorage* repulsion = scene.Envelope(-1, 0.0f, 0.0f);
  repulsion->SetKeys({{0.0f, 0.002f}, {kReach * 0.5f, 0.0005f}, {kReach, 0.0f}});
  Tev_EnvelopeStorage* attraction = scene.Envelope(-1, 0.0f, 0.0f);
  attraction->SetKeys({{kReach * 0.2f, 0.0f}, {kReach * 0.6f, 0.0004f}, {kReach, 0.0f}});
  smoke->SetChild(Tev_AdvPE_SmokeSettings::kLinkRepulsionEnvelope, repulsion);
  smoke->SetChild(Tev_AdvPE_SmokeSettings::kLinkAttractionEnvelope, attraction);
  scene.Emitter().SetChild(kLinkSmokeSettings, smoke);
  scene.Value(kLinkSmoke, 1.0f);
  return smoke;
}

// The pair stage of every active particle, in index order, as one logic step runs it (with the
// grid built for the step).
void PairStage(benchmark::State& state, sim::PairSearch search) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.LinkBasicEffect();
  Tev_AdvPE_SmokeSettings* smoke = LinkSmoke(scene);
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, kCloudSize, {0.0f, 0.0f, 0.0f});
  std::vector<Particle>& pool = scene.Emitter().Particles;
  const sim::PairEnvelopes envelopes(*smoke);
  sim::SmokePairGrid grid;
  grid.Search = search;
  grid.Reserve(count);
  for (auto _ : state) {
    grid.Build(pool, count, envelopes);
    for (int i = 0; i < count; ++i) grid.AddPairForces(pool, count, i, 1.0f);
    grid.Clear();
    benchmark::ClobberMemory();
  }
  bench::ReportPerParticle(state, count);
}

void BM_SmokePairs_Grid(benchmark::State& state) {
  PairStage(state, sim::PairSearch::Automatic);
}
void BM_SmokePairs_AllPairs(benchmark::State& state) {
  PairStage(state, sim::PairSearch::AllPairs);
}
BENCHMARK(BM_SmokePairs_Grid)->Arg(1'000)->Arg(5'000)->Arg(20'000)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SmokePairs_AllPairs)
    ->Arg(1'000)
    ->Arg(5'000)
    ->Arg(20'000)
    ->Unit(benchmark::kMillisecond);

const bool kPairGoals =
    bench::AddSpeedUp("smoke pair forces, grid against all-pairs (1,000)",
                      "BM_SmokePairs_Grid/1000", "BM_SmokePairs_AllPairs/1000", 1.0) &&
    bench::AddSpeedUp("smoke pair forces, grid against all-pairs (5,000)",
                      "BM_SmokePairs_Grid/5000", "BM_SmokePairs_AllPairs/5000", 1.0) &&
    bench::AddSpeedUp("smoke pair forces, grid against all-pairs (20,000)",
                      "BM_SmokePairs_Grid/20000", "BM_SmokePairs_AllPairs/20000", 50.0);

// A whole logic step with smoke (drag, the basic effect, pair forces); the cloud is laid out
// afresh, untimed, before each step so that its density stays.
void SmokeStep(benchmark::State& state, sim::PairSearch search) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.LinkBasicEffect();
  LinkSmoke(scene);
  scene.Start();
  scene.Emitter().Step.SmokePairs.Search = search;
  scene.FillCloud({0.0f, 0.0f, 0.0f}, kCloudSize, {0.0f, 0.0f, 0.0f});
  const std::vector<Particle> start = scene.Emitter().Particles;
  for (auto _ : state) {
    state.PauseTiming();
    scene.Emitter().Particles = start;
    state.ResumeTiming();
    scene.Emitter().RunLogicStep();
  }
  bench::ReportPerParticle(state, count);
}

void BM_SmokeStep_Grid(benchmark::State& state) {
  SmokeStep(state, sim::PairSearch::Automatic);
}
void BM_SmokeStep_AllPairs(benchmark::State& state) {
  SmokeStep(state, sim::PairSearch::AllPairs);
}
BENCHMARK(BM_SmokeStep_Grid)->Arg(20'000)->Unit(benchmark::kMillisecond);
BENCHMARK(BM_SmokeStep_AllPairs)->Arg(20'000)->Unit(benchmark::kMillisecond);

const bool kStepGoal =
    bench::AddSpeedUp("whole smoke step, grid against all-pairs (20,000)",
                      "BM_SmokeStep_Grid/20000", "BM_SmokeStep_AllPairs/20000", 50.0);

}  // namespace
