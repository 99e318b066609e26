// Per-particle cost of rebuilding the drawing data: sprite quads on the CPU (with and without
// spin) beside a memcpy of the bytes they fill, and point sprites including their copy into the
// vertex buffer.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <memory>
#include <vector>

#include "bench/bench_report.h"
#include "host/device_channel.h"
#include "host/host_context.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"

namespace {

float Spread() {
  return static_cast<float>(std::rand() % 2001 - 1000) * 0.01f;
}  // -10..10

// An emitter on the reference device with `count` live particles scattered around the origin,
// all facing one point, every fourth attached, spinning when asked.
class BenchEmitter {
 public:
  BenchEmitter(int count, bool spin) : device_(MemoryDevice::Create()), channel_(device_) {
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
    emitter_->SpinEnabled = spin;
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

void QuadBuild(benchmark::State& state, bool spin) {
  const int count = static_cast<int>(state.range(0));
  BenchEmitter bench(count, spin);
  bench.Emitter().InitializeLocalVertexBuffer();
  for (auto _ : state) {
    bench.Emitter().UpdateLocalVertexBuffer();
    benchmark::DoNotOptimize(bench.Emitter().LocalVertices[0]);
    benchmark::ClobberMemory();
  }
  bench::ReportPerParticle(state, count);
}

void BM_QuadBuild(benchmark::State& state) {
  QuadBuild(state, false);
}
void BM_QuadBuild_Spinning(benchmark::State& state) {
  QuadBuild(state, true);
}
BENCHMARK(BM_QuadBuild)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);
BENCHMARK(BM_QuadBuild_Spinning)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

// The yardstick: a copy of as many bytes as the quad build writes (four 36-byte corners per
// particle) into an array of the same size.
void BM_MemcpyQuadBytes(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  const std::size_t bytes = static_cast<std::size_t>(count) * 4 * sizeof(LocalVertex);
  std::vector<unsigned char> source(bytes, 0x5A);
  auto target = std::make_unique<LocalVertex[]>(static_cast<std::size_t>(count) * 4);
  for (auto _ : state) {
    std::memcpy(target.get(), source.data(), bytes);
    benchmark::DoNotOptimize(target[0]);
    benchmark::ClobberMemory();
  }
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_MemcpyQuadBytes)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

const bool kQuadGoals =
    bench::AddRatio("quad build / memcpy of its bytes (10,000)", "BM_QuadBuild/10000",
                    "BM_MemcpyQuadBytes/10000", 2.0) &&
    bench::AddRatio("quad build / memcpy of its bytes (100,000)", "BM_QuadBuild/100000",
                    "BM_MemcpyQuadBytes/100000", 2.0) &&
    bench::AddRatio("spinning quad build / memcpy of its bytes (10,000)",
                    "BM_QuadBuild_Spinning/10000", "BM_MemcpyQuadBytes/10000", 2.0);

void BM_PointSpriteBuild(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  BenchEmitter bench(count, false);
  bench.Emitter().InitializePointSpriteVertexBuffer();
  std::int64_t rounds = 0;
  for (auto _ : state) {
    bench.Emitter().UpdatePointSpriteVertexBuffer();
    benchmark::ClobberMemory();
    // The reference device logs every lock; keep its log from growing without bound.
    if (++rounds % 1024 == 0) bench.Device().ClearCalls();
  }
  bench::ReportPerParticle(state, count);
}
BENCHMARK(BM_PointSpriteBuild)->Arg(10'000)->Arg(100'000)->Unit(benchmark::kMicrosecond);

}  // namespace
