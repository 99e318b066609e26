// Whole working frames through CallChannel on the reference device, at 60 logic steps per second
// and 60 frames per second, once the emitter has run long enough for births and deaths to
// balance: 10,000 quads (still and spinning) and 100,000 point sprites.
#include <benchmark/benchmark.h>

#include "bench/bench_report.h"
#include "bench/bench_scene.h"
#include "plugin/link_table.h"

namespace {

constexpr double kFrameMs = 1000.0 / 60.0;
constexpr int kWarmUpFrames = 300;  // five seconds: the first particles have lived their life

// A fountain of `count` records: births at the rate that keeps about nine in ten alive.
void RunFrames(benchmark::State& state, bool pointSprites, bool spin) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count, pointSprites);
  scene.LinkBasicEffect();
  scene.LinkEmitterSquare(10.0f, 1.0f);
  scene.Value(kLinkLifespanMin, 2.0f);
  scene.Value(kLinkLifespanMax, 4.0f);
  scene.Value(kLinkBirthsPerSecond, 0.3f * static_cast<float>(count));
  scene.Value(kLinkInitialForceStrength, 0.1f);
  scene.Value(kLinkSizeOffsetMax, 1.5f);
  scene.Vector(kLinkLookAt, {0.0f, 5.0f, -50.0f});
  if (spin) {
    scene.Value(kLinkSpinSpeedMin, -0.1f);
    scene.Value(kLinkSpinSpeedMax, 0.1f);
  }
  scene.Start();
  for (int f = 0; f < kWarmUpFrames; ++f) scene.RunFrame(kFrameMs);
  for (auto _ : state) scene.RunFrame(kFrameMs);
  bench::ReportPerParticle(state, count);
}

void BM_Frame_Quads(benchmark::State& state) {
  RunFrames(state, false, false);
}
void BM_Frame_QuadsSpinning(benchmark::State& state) {
  RunFrames(state, false, true);
}
void BM_Frame_PointSprites(benchmark::State& state) {
  RunFrames(state, true, false);
}
BENCHMARK(BM_Frame_Quads)->Arg(10'000)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_Frame_QuadsSpinning)->Arg(10'000)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_Frame_PointSprites)->Arg(100'000)->Unit(benchmark::kMicrosecond);

const bool kFrameGoals =
    bench::AddBudget("working frame, 10,000 quads, 60 steps/s at 60 Hz", "BM_Frame_Quads/10000",
                     0.5e-3) &&
    bench::AddBudget("working frame, 10,000 spinning quads", "BM_Frame_QuadsSpinning/10000",
                     1e-3) &&
    bench::AddBudget("working frame, 100,000 point sprites", "BM_Frame_PointSprites/100000", 4e-3);

}  // namespace
