// What the emitter pays per particle and step in the sibling channels: an envelope sample, and a
// collision query against a plane and against a 10,000-triangle mesh.
#include <benchmark/benchmark.h>

#include <cstdlib>
#include <vector>

#include "host/envelope_storage.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"

namespace {

float RandomBetween(float low, float high) {
  return low + (high - low) * static_cast<float>(std::rand()) / static_cast<float>(RAND_MAX);
}

// Sample points across the key range and a little beyond, fixed for every run.
std::vector<float> SamplePoints(float low, float high) {
  std::srand(1);
  std::vector<float> xs(1024);
  for (float& x : xs) x = RandomBetween(low - 0.1f, high + 0.1f);
  return xs;
}

// state.range(0) keys; state.range(1) 1 for even spacing (the lookup path), 0 for uneven (the
// binary search).
void BM_EnvelopeValue(benchmark::State& state) {
  const int count = static_cast<int>(state.range(0));
  const bool even = state.range(1) != 0;
  std::srand(2);
  Tev_EnvelopeStorage envelope;
  float x = 0.0f;
  for (int i = 0; i < count; ++i) {
    envelope.AddKey(x, RandomBetween(0.0f, 255.0f));
    x += even ? 1.0f / static_cast<float>(count) : RandomBetween(0.1f, 2.0f) / count;
  }
  envelope.Initialize();
  const std::vector<float> xs = SamplePoints(envelope.GetMinIndex(), envelope.GetMaxIndex());
  std::size_t next = 0;
  for (auto _ : state) {
    benchmark::DoNotOptimize(envelope.GetEnvelopeValue(xs[next]));
    next = (next + 1) % xs.size();
  }
}
BENCHMARK(BM_EnvelopeValue)->ArgsProduct({{8, 64, 1024}, {1, 0}})->ArgNames({"keys", "even"});

struct Query {
  D3DXVECTOR3 Origin;
  D3DXVECTOR3 Ray;
};

void RunQueries(benchmark::State& state, Tev_MultiCollisionManager& manager,
                std::vector<Query> queries) {
  std::size_t next = 0;
  int hits = 0;
  for (auto _ : state) {
    D3DXVECTOR3 point, normal;
    float cosine;
    Query& q = queries[next];
    const int id =
        manager.GetClosestFrontFaceCollision(&q.Origin, &q.Ray, &point, &normal, &cosine);
    hits += id >= 0;
    benchmark::DoNotOptimize(point);
    next = (next + 1) % queries.size();
  }
  state.counters["hit_fraction"] =
      benchmark::Counter(static_cast<double>(hits) / static_cast<double>(state.iterations()));
}

// Short downward segments like a particle's step, over the area [0, 50] x [0, 50], starting
// above `top` (the surface's highest point). With `hit` they run through the whole surface,
// otherwise they stop above it.
std::vector<Query> StepQueries(float top, bool hit) {
  std::srand(3);
  std::vector<Query> queries(1024);
  for (Query& q : queries) {
    const float above = RandomBetween(0.05f, 0.5f);
    q.Origin = {RandomBetween(0.5f, 49.5f), top + above, RandomBetween(0.5f, 49.5f)};
    q.Ray = {RandomBetween(-0.1f, 0.1f), hit ? -(top + 2.0f * above) : -0.5f * above,
             RandomBetween(-0.1f, 0.1f)};
  }
  return queries;
}

void BM_CollisionPlane(benchmark::State& state) {
  Tev_MultiCollisionManager manager;
  manager.AddPlane({0, 0, 0}, {0, 1, 0});
  RunQueries(state, manager, StepQueries(0.0f, state.range(0) != 0));
}
BENCHMARK(BM_CollisionPlane)->Arg(1)->Arg(0)->ArgName("hit");

// A rolling height field of 50 x 100 cells split into triangles: 10,000 triangles facing up.
void BuildTerrain(Tev_DX8_ObjectDataChannel& mesh) {
  constexpr int kColumns = 50, kRows = 100;
  mesh.SetVertexCount((kColumns + 1) * (kRows + 1));
  for (int i = 0; i <= kColumns; ++i)
    for (int j = 0; j <= kRows; ++j) {
      const float x = static_cast<float>(i);
      const float z = static_cast<float>(j) * 0.5f;
      const float y = 0.3f * static_cast<float>((i * 7 + j * 13) % 5) / 5.0f;
      mesh.SetVertexPosition({x, y, z}, i * (kRows + 1) + j);
    }
  mesh.SetIndexCount(kColumns * kRows * 6);
  int position = 0;
  const auto vertex = [](int i, int j) { return static_cast<DWORD>(i * (kRows + 1) + j); };
  for (int i = 0; i < kColumns; ++i)
    for (int j = 0; j < kRows; ++j)
      for (DWORD v : {vertex(i, j), vertex(i, j + 1), vertex(i + 1, j), vertex(i + 1, j),
                      vertex(i, j + 1), vertex(i + 1, j + 1)})
        mesh.SetIndex(v, position++);
}

void BM_CollisionMesh10k(benchmark::State& state) {
  Tev_DX8_ObjectDataChannel terrain;
  BuildTerrain(terrain);
  Tev_MultiCollisionManager manager;
  manager.AddMesh(&terrain);
  RunQueries(state, manager, StepQueries(0.24f, state.range(0) != 0));  // heights 0..0.24
}
BENCHMARK(BM_CollisionMesh10k)->Arg(1)->Arg(0)->ArgName("hit");

}  // namespace
