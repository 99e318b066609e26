// Cost of one logic step per particle: motion with a global force and the five main envelopes,
// attractors, and collisions against a plane and a triangle mesh with every outcome enabled.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <memory>
#include <vector>

#include "host/attractor.h"
#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

// An emitter whose links are read and whose pool is full of live particles, ready for steps.
class Scene {
 public:
  explicit Scene(int count) : device_(MemoryDevice::Create()), deviceChannel_(device_) {
    emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
    Value(kLinkParticleCount, static_cast<float>(count));
    Value(kLinkHardwareParticles, 1.0f);
    Value(kLinkLogicUpdatesPerSecond, 50.0f);
    Value(kLinkBirthsPerSecond, 0.0f);
    Value(kLinkEmitterActive, 1.0f);
    std::srand(1u);
  }
  ~Scene() {
    emitter_.reset();
    owned_.clear();
    device_->Release();
  }

  Tev_AdvancedParticleEmitter& Emitter() { return *emitter_; }

  template <typename T>
  T* Own(std::unique_ptr<T> channel) {
    T* raw = channel.get();
    owned_.push_back(std::move(channel));
    return raw;
  }
  void Value(int link, float value) {
    emitter_->SetChild(link, Own(std::make_unique<Qen_ValueChannel>(value)));
  }
  void Vector(int link, D3DXVECTOR3 value) {
    emitter_->SetChild(link, Own(std::make_unique<Qen_ValueVectorChannel>(value)));
  }
  void Envelope(int link, float start, float end) {
    auto* envelope = Own(std::make_unique<Tev_EnvelopeStorage>());
    envelope->AddKey(0.0f, start);
    envelope->AddKey(0.5f, (start + end) * 0.5f);
    envelope->AddKey(1.0f, end);
    emitter_->SetChild(link, envelope);
  }

  // Initializes, reads the links once, and fills the pool.
  void Start() {
    emitter_->CallChannel();
    context_.AdvanceFrame();
    emitter_->CallChannel();
  }

  // Every record alive, spread over a 100 x 100 square `height` above the ground, falling.
  void Rain(float height, float speed) {
    for (int i = 0; i < emitter_->ParticleCount; ++i) {
      Particle& p = emitter_->Particles[static_cast<std::size_t>(i)];
      p = Particle{};
      p.Active = true;
      p.Lifespan = 100.0f;
      p.Age = 1.0f;
      p.SizeMultiplier = 1.0f;
      const float x = static_cast<float>(std::rand() % 10000) * 0.01f;
      const float z = static_cast<float>(std::rand() % 10000) * 0.01f;
      const float y = height * static_cast<float>(1 + std::rand() % 100) * 0.01f;
      p.Position = {x, y, z};
      p.RenderPosition = p.Position;
      p.Velocity = {0.1f, -speed, 0.0f};
    }
  }

 private:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  TestClock clock_;
  MemoryDevice* device_;
  Tev_DX8_DeviceChannel deviceChannel_;
  std::vector<std::unique_ptr<Qen_Channel>> owned_;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter_;
};

void ReportPerParticle(benchmark::State& state, int count) {
  state.counters["per_particle"] =
      benchmark::Counter(static_cast<double>(count), benchmark::Counter::kIsIterationInvariantRate |
                                                         benchmark::Counter::kInvert);
}

void BM_StepWithGlobalForceAndEnvelopes(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  Scene scene(count);
  scene.Vector(kLinkGlobalForce, {0.0f, -0.01f, 0.0f});
  scene.Envelope(kLinkSizeEnvelope, 1.0f, 3.0f);
  scene.Envelope(kLinkVertexAlphaEnvelope, 255.0f, 0.0f);
  scene.Envelope(kLinkRedColorEnvelope, 255.0f, 64.0f);
  scene.Envelope(kLinkGreenColorEnvelope, 128.0f, 32.0f);
  scene.Envelope(kLinkBlueColorEnvelope, 0.0f, 200.0f);
  scene.Start();
  scene.Rain(50.0f, 0.0f);
  for (auto _ : state) scene.Emitter().RunLogicStep();
  ReportPerParticle(state, count);
}
BENCHMARK(BM_StepWithGlobalForceAndEnvelopes)->Arg(100'000)->Unit(benchmark::kMillisecond);

void BM_StepWithThreeAttractors(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  Scene scene(count);
  for (int a = 0; a < 3; ++a) {
    auto* attractor = scene.Own(std::make_unique<Tev_AdvPE_Attractor>());
    attractor->Position = {25.0f * static_cast<float>(a + 1), 10.0f, 50.0f};
    attractor->Strength = 0.5f;
    scene.Emitter().AddChild(kLinkAttractors, attractor);
  }
  scene.Start();
  scene.Rain(50.0f, 0.0f);
  for (auto _ : state) scene.Emitter().RunLogicStep();
  ReportPerParticle(state, count);
}
BENCHMARK(BM_StepWithThreeAttractors)->Arg(10'000)->Unit(benchmark::kMillisecond);

// Every particle reaches the ground within the measured step and reports, attaches, slides,
// bounces or dies by the rates; the rain is laid out afresh, untimed, before each step.
void RunRain(benchmark::State& state, Scene& scene, int count) {
  scene.Value(kLinkCollisionReportRate, 0.5f);
  scene.Value(kLinkAttachRate, 0.4f);
  scene.Value(kLinkBounceRate, 0.5f);
  scene.Value(kLinkAttachedSlideRate, 0.5f);
  scene.Value(kLinkAttachedSlidingHeight, 0.05f);
  scene.Value(kLinkAttachedLifespan, 5.0f);
  scene.Value(kLinkOutCollisionId, 0.0f);
  scene.Vector(kLinkOutCollisionPosition, {0.0f, 0.0f, 0.0f});
  scene.Vector(kLinkOutCollisionNormal, {0.0f, 0.0f, 0.0f});
  scene.Vector(kLinkGlobalForce, {0.0f, -0.01f, 0.0f});
  scene.Start();
  for (auto _ : state) {
    state.PauseTiming();
    scene.Rain(1.0f, 1.0f);
    state.ResumeTiming();
    scene.Emitter().RunLogicStep();
  }
  ReportPerParticle(state, count);
}

void BM_RainOntoPlane(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  Scene scene(count);
  auto* manager = scene.Own(std::make_unique<Tev_MultiCollisionManager>());
  manager->AddPlane({0.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f});
  scene.Emitter().SetChild(kLinkMultiCollisionManager, manager);
  RunRain(state, scene, count);
}
BENCHMARK(BM_RainOntoPlane)->Arg(10'000)->Unit(benchmark::kMillisecond);

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

void BM_RainOntoMesh(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  Scene scene(count);
  Tev_DX8_ObjectDataChannel* mesh = scene.Own(GroundMesh());
  auto* manager = scene.Own(std::make_unique<Tev_MultiCollisionManager>());
  manager->AddMesh(mesh);
  scene.Emitter().SetChild(kLinkMultiCollisionManager, manager);
  RunRain(state, scene, count);
}
BENCHMARK(BM_RainOntoMesh)->Arg(10'000)->Unit(benchmark::kMillisecond);

}  // namespace
