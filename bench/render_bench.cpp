// Per-particle cost of rebuilding the drawing data: sprite quads on the CPU, and point sprites
// including their copy into the vertex buffer.
#include <cstdlib>
#include <memory>

#include <benchmark/benchmark.h>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"

namespace {

float Spread() {
  return static_cast<float>(std::rand() % 2001 - 1000) * 0.01f;
}  // -10..10

// An emitter on the reference device with `count` live particles scattered around the origin,
// all facing one point, spinning, and every fourth attached.
class BenchEmitter {
 public:
  explicit BenchEmitter(int count) : device_(MemoryDevice::Create()), channel_(device_) {
    std::srand(7);
    emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
    emitter_->Particles.resize(static_cast<std::size_t>(count));
    for (int i = 0; i < count; ++i) {
      Particle& p = emitter_->Particles[static_cast<std::size_t>(i)];
      p.Active = true;
      p.Attached = i % 4 == 0;
      p.Size = 1.0f + Spread() * 0.05f;
      p.Color = 0xFF000000u | static_cast<std::uint32_t>(i);
      p.RenderPosition = {Spread(), Spread(), Spread()};
      p.LookAtPoint = {0.0f, 5.0f, -50.0f};
      p.RenderSpinAngle = Spread();
    }
    emitter_->ParticleCount = count;
    emitter_->SpinEnabled = true;
    emitter_->HasCompositeTexture = true;
  }
  ~BenchEmitter() {
    emitter_.reset();
    device_->Release();
  }

  Tev_AdvancedParticleEmitter& Emitter() { return *emitter_; }
  MemoryDevice& Device() { return *device_; }

 private:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  MemoryDevice* device_;
  Tev_DX8_DeviceChannel channel_;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter_;
};

void ReportPerParticle(benchmark::State& state, int count) {
  state.SetItemsProcessed(state.iterations() * count);
  // The inverted per-particle rate: seconds per particle, shown with its SI prefix (ns).
  state.counters["time_per_particle"] =
      benchmark::Counter(static_cast<double>(count), benchmark::Counter::kIsIterationInvariantRate |
                                                         benchmark::Counter::kInvert);
}

void BM_QuadBuild(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  BenchEmitter bench(count);
  bench.Emitter().InitializeLocalVertexBuffer();
  for (auto _ : state) {
    bench.Emitter().UpdateLocalVertexBuffer();
    benchmark::DoNotOptimize(bench.Emitter().LocalVertices[0]);
    benchmark::ClobberMemory();
  }
  ReportPerParticle(state, count);
}
BENCHMARK(BM_QuadBuild)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

void BM_PointSpriteBuild(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  BenchEmitter bench(count);
  bench.Emitter().InitializePointSpriteVertexBuffer();
  std::int64_t rounds = 0;
  for (auto _ : state) {
    bench.Emitter().UpdatePointSpriteVertexBuffer();
    benchmark::ClobberMemory();
    // The reference device logs every lock; keep its log from growing without bound.
    if (++rounds % 1024 == 0) bench.Device().ClearCalls();
  }
  ReportPerParticle(state, count);
}
BENCHMARK(BM_PointSpriteBuild)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

}  // namespace
