// Per-particle cost of a frame's births and of the blend between logic steps.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <vector>

#include "bench/bench_report.h"
#include "bench/bench_scene.h"
#include "plugin/link_table.h"

namespace {

constexpr int kBirthsPerFrame = 100;

// A frame's births into a pool of state.range(0) records of which nine in ten are alive, the free
// ones scattered; the pool is set back, untimed, after each frame.
void BM_Births(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.LinkBasicEffect();
  scene.LinkEmitterSquare(10.0f, 1.0f);
  scene.Value(kLinkLifespanMin, 2.0f);
  scene.Value(kLinkLifespanMax, 4.0f);
  scene.Value(kLinkInitialForceStrength, 0.1f);
  scene.Value(kLinkSizeOffsetMax, 1.5f);
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, 100.0f, {0.0f, 0.0f, 0.0f});
  std::vector<Particle>& pool = scene.Emitter().Particles;
  for (Particle& p : pool) p.Active = std::rand() % 10 != 0;
  const std::vector<Particle> start = pool;
  for (auto _ : state) {
    for (int k = 0; k < kBirthsPerFrame; ++k) scene.Emitter().BirthParticle(k);
    state.PauseTiming();
    pool = start;
    state.ResumeTiming();
  }
  bench::ReportPerParticle(state, kBirthsPerFrame);
}
BENCHMARK(BM_Births)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

void BM_Interpolation(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.Value(kLinkSpinSpeedMin, 0.1f);
  scene.Value(kLinkSpinSpeedMax, 0.2f);
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, 100.0f, {0.1f, -0.2f, 0.3f});
  for (auto _ : state) {
    scene.Emitter().InterpolateParticles(0.5f);
    benchmark::ClobberMemory();
  }
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_Interpolation)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

}  // namespace
