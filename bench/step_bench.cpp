// One logic step per particle: the basic effect (gravity and the five main envelopes) beside the
// plain reference loop doing the same arithmetic and the floor loop doing it as cheaply as this
// machine can, then three attractors, and rain onto a plane
// and onto a triangle mesh with every collision outcome enabled.
#include <benchmark/benchmark.h>

#include <memory>

#include "bench/bench_report.h"
#include "bench/bench_scene.h"
#include "bench/floor_step.h"
#include "bench/reference_step.h"
#include "host/attractor.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "plugin/link_table.h"

namespace {

void BM_Step_GravityAndEnvelopes(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.LinkBasicEffect();
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, 100.0f, {0.0f, 0.0f, 0.0f});
  for (auto _ : state) scene.Emitter().RunLogicStep();
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_Step_GravityAndEnvelopes)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

// The same records and envelopes as above, stepped by the plain loop.
void BM_ReferenceStep(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.LinkBasicEffect();
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, 100.0f, {0.0f, 0.0f, 0.0f});
  Tev_AdvancedParticleEmitter& e = scene.Emitter();
  const bench::ReferenceEffect effect{e.GlobalForce,
                                      e.SimulationScaler,
                                      e.LookAt,
                                      bench::InlineEnvelope(*e.SizeEnvelope),
                                      bench::InlineEnvelope(*e.AlphaEnvelope),
                                      bench::InlineEnvelope(*e.RedEnvelope),
                                      bench::InlineEnvelope(*e.GreenEnvelope),
                                      bench::InlineEnvelope(*e.BlueEnvelope)};
  std::vector<Particle> pool = e.Particles;
  for (auto _ : state) {
    bench::ReferenceStep(pool, effect);
    benchmark::ClobberMemory();
  }
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_ReferenceStep)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

// The same records and stages again, with the curves' slopes prepared once and sampled without
// branches: what this machine needs at least.
void BM_FloorStep(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  scene.LinkBasicEffect();
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, 100.0f, {0.0f, 0.0f, 0.0f});
  Tev_AdvancedParticleEmitter& e = scene.Emitter();
  const bench::FloorEffect effect{e.GlobalForce,
                                  e.SimulationScaler,
                                  e.LookAt,
                                  bench::FloorEnvelope(*e.SizeEnvelope),
                                  bench::FloorEnvelope(*e.AlphaEnvelope),
                                  bench::FloorEnvelope(*e.RedEnvelope),
                                  bench::FloorEnvelope(*e.GreenEnvelope),
                                  bench::FloorEnvelope(*e.BlueEnvelope)};
  std::vector<Particle> pool = e.Particles;
  for (auto _ : state) {
    bench::FloorStep(pool, effect);
    benchmark::ClobberMemory();
  }
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_FloorStep)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

const bool kStepRatio =
    bench::AddRatio("basic logic step / plain reference loop (10,000)",
                    "BM_Step_GravityAndEnvelopes/10000", "BM_ReferenceStep/10000", 0.8) &&
    bench::AddRatio("basic logic step / plain reference loop (100,000)",
                    "BM_Step_GravityAndEnvelopes/100000", "BM_ReferenceStep/100000", 0.8) &&
    bench::AddRatio("basic logic step / floor loop (10,000)", "BM_Step_GravityAndEnvelopes/10000",
                    "BM_FloorStep/10000", 1.3) &&
    bench::AddRatio("basic logic step / floor loop (100,000)", "BM_Step_GravityAndEnvelopes/100000",
                    "BM_FloorStep/100000", 1.3);

void BM_Step_ThreeAttractors(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  for (int a = 0; a < 3; ++a) {
    auto* attractor = scene.Own(std::make_unique<Tev_AdvPE_Attractor>());
    attractor->Position = {25.0f * static_cast<float>(a + 1), 10.0f, 50.0f};
    attractor->Strength = 0.5f;
    scene.Emitter().AddChild(kLinkAttractors, attractor);
  }
  scene.LinkBasicEffect();
  scene.Start();
  scene.FillCloud({0.0f, 0.0f, 0.0f}, 100.0f, {0.0f, 0.0f, 0.0f});
  for (auto _ : state) scene.Emitter().RunLogicStep();
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_Step_ThreeAttractors)->Arg(10'000)->Unit(benchmark::kMicrosecond);

const bool kAttractorRatio =
    bench::AddRatio("three attractors / basic logic step (10,000)", "BM_Step_ThreeAttractors/10000",
                    "BM_Step_GravityAndEnvelopes/10000", 2.0);

// Every record falling onto the ground within the measured step, from at most a step above it,
// so that every particle reports, attaches, slides, bounces or dies by the rates; the rain is
// laid out afresh, untimed, before each step.
void RunRain(benchmark::State& state, bench::Scene& scene, int count) {
  scene.Value(kLinkCollisionReportRate, 0.5f);
  scene.Value(kLinkAttachRate, 0.4f);
  scene.Value(kLinkBounceRate, 0.5f);
  scene.Value(kLinkAttachedSlideRate, 0.5f);
  scene.Value(kLinkAttachedSlidingHeight, 0.05f);
  scene.Value(kLinkAttachedLifespan, 5.0f);
  scene.Value(kLinkOutCollisionId, 0.0f);
  scene.Vector(kLinkOutCollisionPosition, {0.0f, 0.0f, 0.0f});
  scene.Vector(kLinkOutCollisionNormal, {0.0f, 0.0f, 0.0f});
  scene.LinkBasicEffect();
  scene.Start();
  for (auto _ : state) {
    state.PauseTiming();
    scene.FillCloud({0.0f, 0.01f, 0.0f}, 0.98f, {0.1f, -1.0f, 0.0f});
    for (Particle& p : scene.Emitter().Particles) {
      p.Position.x *= 100.0f;
      p.Position.z *= 100.0f;
    }
    state.ResumeTiming();
    scene.Emitter().RunLogicStep();
  }
  bench::ReportPerParticle(state, count);
}

void BM_Step_RainOntoPlane(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  auto* manager = scene.Own(std::make_unique<Tev_MultiCollisionManager>());
  manager->AddPlane({0.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f});
  scene.Emitter().SetChild(kLinkMultiCollisionManager, manager);
  RunRain(state, scene, count);
}
BENCHMARK(BM_Step_RainOntoPlane)->Arg(10'000)->Unit(benchmark::kMicrosecond);

// A 50 x 100 grid of quads, two triangles each, over the 100 x 100 square at y = 0, facing up.
std::unique_ptr<Tev_DX8_ObjectDataChannel> GroundMesh() {
  constexpr int kColumns = 50;
  constexpr int kRows = 100;
  auto mesh = std::make_unique<Tev_DX8_ObjectDataChannel>();
  mesh->SetVertexCount((kColumns + 1) * (kRows + 1));
  for (int r = 0; r <= kRows; ++r)
    for (int c = 0; c <= kColumns; ++c) {
      const int v = r * (kColumns + 1) + c;
      mesh->SetVertexPosition({static_cast<float>(c) * 2.0f, 0.0f, static_cast<float>(r)}, v);
      mesh->SetVertexNormal({0.0f, 1.0f, 0.0f}, v);
    }
  mesh->SetIndexCount(kColumns * kRows * 6);
  int at = 0;
  for (int r = 0; r < kRows; ++r)
    for (int c = 0; c < kColumns; ++c) {
      const DWORD a = static_cast<DWORD>(r * (kColumns + 1) + c);
      const DWORD b = a + 1;
      const DWORD d = a + static_cast<DWORD>(kColumns + 1);
      const DWORD e = d + 1;
      for (DWORD v : {a, d, b, b, d, e}) mesh->SetIndex(v, at++);
    }
  D3DXMATRIX identity;
  D3DXMatrixIdentity(&identity);
  mesh->SetWorldMatrix(identity);
  return mesh;
}

void BM_Step_RainOntoMesh(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  bench::Scene scene(count);
  Tev_DX8_ObjectDataChannel* mesh = scene.Own(GroundMesh());
  auto* manager = scene.Own(std::make_unique<Tev_MultiCollisionManager>());
  manager->AddMesh(mesh);
  scene.Emitter().SetChild(kLinkMultiCollisionManager, manager);
  RunRain(state, scene, count);
}
BENCHMARK(BM_Step_RainOntoMesh)->Arg(10'000)->Unit(benchmark::kMicrosecond);

}  // namespace
