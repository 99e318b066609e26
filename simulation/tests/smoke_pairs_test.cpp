// The smoke pair grid against the all-pairs loop. Randomized scenes (births several per frame,
// deaths, rebirths, particles moved by the collision stage and the smoke collision before their
// pair stage, coincident and far-flung particles) run once each way must leave every particle's
// SmokeForce, Position and Velocity the same bit for bit.
#include <bit>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <memory>
#include <random>
#include <sstream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "host/smoke_settings.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

using Smoke = Tev_AdvPE_SmokeSettings;
using Key = Tev_EnvelopeStorage::Key;

// Everything random about a scene, drawn from its seed before it runs.
struct SceneRecipe {
  unsigned Seed = 0;
  int Count = 0;
  float BirthsPerSecond = 0.0f;
  float LogicPerSecond = 0.0f;
  float LifespanMin = 0.0f;  // seconds
  float LifespanMax = 0.0f;  // seconds
  bool VertexEmissions = false;
  bool ReplaceOld = false;
  float CloudSize = 0.0f;
  float InitialStrength = 0.0f;
  D3DXVECTOR3 GlobalForce{0.0f, 0.0f, 0.0f};
  bool HasMaximumSpeed = false;
  float MaximumSpeed = 0.0f;
  std::vector<Key> Strength;
  std::vector<Key> Repulsion;   // empty: not linked
  std::vector<Key> Attraction;  // empty: not linked
  float Drag = 1.0f;
  bool DragFades = false;
  bool Plane = false;
  float AttachRate = 0.0f;
  float BounceRate = 0.0f;
  float SlideRate = 0.0f;
  float SlidingHeight = 0.0f;
  bool SmokeCollision = false;
  bool Recheck = false;
  float ProbeMinimum = 0.0f;
  bool Oddities = false;     // hand-placed: coincident, exactly at the reach, non-finite
  bool FarOutliers = false;  // hand-placed near the float range's end
  int MinimumGridParticles = 16;
  int HitCapacity = 4096;
  std::vector<double> FrameMs;
};

class SceneRandom {
 public:
  explicit SceneRandom(unsigned seed) : engine_(seed) {}
  float Uniform(float low, float high) {
    return std::uniform_real_distribution<float>(low, high)(engine_);
  }
  int Between(int low, int high) { return std::uniform_int_distribution<int>(low, high)(engine_); }
  bool Chance(double p) { return std::bernoulli_distribution(p)(engine_); }

  // Two to four keys from `low` to `high`, values in [minimum, maximum].
  std::vector<Key> Envelope(float low, float high, float minimum, float maximum) {
    std::vector<Key> keys;
    const int count = Between(2, 4);
    for (int k = 0; k < count; ++k) {
      const float x = k == 0 ? low : k == count - 1 ? high : Uniform(low, high);
      keys.push_back({x, Uniform(minimum, maximum)});
    }
    return keys;
  }

 private:
  std::mt19937 engine_;
};

SceneRecipe DrawScene(unsigned seed) {
  SceneRandom random(seed);
  SceneRecipe s;
  s.Seed = seed;
  s.Count = random.Between(24, 240);
  s.BirthsPerSecond = random.Uniform(200.0f, 4000.0f);
  s.LogicPerSecond = random.Uniform(30.0f, 120.0f);
  s.LifespanMin = random.Uniform(0.2f, 1.0f);
  s.LifespanMax = s.LifespanMin + random.Uniform(0.0f, 1.5f);
  s.VertexEmissions = random.Chance(0.25);  // several particles born on one vertex coincide
  s.ReplaceOld = random.Chance(0.5);
  s.CloudSize = random.Uniform(2.0f, 20.0f);
  s.GlobalForce = {random.Uniform(-0.01f, 0.01f), random.Uniform(-0.03f, 0.0f), 0.0f};
  s.HasMaximumSpeed = random.Chance(0.3);
  s.MaximumSpeed = random.Uniform(0.05f, 0.5f);

  s.Strength = random.Envelope(0.0f, 1.0f, -0.5f, 2.0f);
  // Reaches from a twentieth to a half of the cloud; now and then one no pair can use (a window
  // below 0) or one wider than the whole cloud, where the grid steps aside.
  const float reach = s.CloudSize * random.Uniform(0.05f, 0.5f);
  // Fast enough that a particle's own updates of a step (several for a late birth of a frame)
  // and its collisions carry it across cells before its pair stage.
  s.InitialStrength = random.Uniform(0.0f, 1.0f) * reach;
  const int shape = random.Between(0, 9);
  if (shape != 0) s.Repulsion = random.Envelope(-0.2f * reach, reach, -0.01f, 0.05f);
  if (shape == 0 || random.Chance(0.5))
    s.Attraction = random.Envelope(random.Uniform(0.0f, reach), 1.5f * reach, -0.01f, 0.03f);
  if (shape == 1) s.Attraction = random.Envelope(-2.0f, -1.0f, 0.0f, 1.0f);
  if (shape == 2) s.Repulsion = random.Envelope(0.0f, 10.0f * s.CloudSize, 0.0f, 0.01f);
  s.Drag = random.Chance(0.5) ? random.Uniform(0.8f, 1.0f) : 1.0f;
  s.DragFades = random.Chance(0.3);

  s.Plane = random.Chance(0.6);
  s.AttachRate = random.Uniform(0.0f, 0.6f);
  s.BounceRate = random.Uniform(0.0f, 1.0f);
  s.SlideRate = random.Uniform(0.0f, 1.0f);
  s.SlidingHeight = random.Uniform(0.0f, 0.2f);
  s.SmokeCollision = random.Chance(0.4);
  s.Recheck = random.Chance(0.5);
  s.ProbeMinimum = random.Uniform(0.0f, 1.0f);

  s.Oddities = random.Chance(0.3);
  s.FarOutliers = random.Chance(0.1);
  s.MinimumGridParticles = random.Chance(0.8) ? 16 : 128;
  if (random.Chance(0.1)) s.HitCapacity = random.Between(1, 4);
  const int frames = random.Between(20, 40);
  for (int f = 0; f < frames; ++f) s.FrameMs.push_back(random.Uniform(5.0f, 45.0f));
  return s;
}

struct Outcome {
  std::vector<Particle> Particles;
  std::int64_t GridSteps = 0;
  std::int64_t FallbackUpdates = 0;
};

// One scene on a host of its own: an emitter above a ground plane, born on the faces (or the
// corners) of a tetrahedron, with the scene's smoke and collision settings.
class SceneRun {
 public:
  SceneRun() : device_(MemoryDevice::Create()) {
    deviceChannel_ = std::make_unique<Tev_DX8_DeviceChannel>(device_);
    emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
  }
  ~SceneRun() {
    emitter_.reset();
    owned_.clear();
    deviceChannel_.reset();
    device_->Release();
  }
  SceneRun(const SceneRun&) = delete;
  SceneRun& operator=(const SceneRun&) = delete;

  Outcome Run(const SceneRecipe& s, sim::PairSearch search) {
    Link(s);
    sim::SmokePairGrid& grid = emitter_->Step.SmokePairs;
    grid.Search = search;
    grid.MinimumGridParticles = s.MinimumGridParticles;
    grid.HitCapacity = s.HitCapacity;
    std::srand(s.Seed);
    emitter_->CallChannel();  // initializes
    if (s.Oddities) PlaceOddities(s);
    for (double ms : s.FrameMs) {
      clock_.AdvanceMs(ms);
      context_.AdvanceFrame();
      emitter_->CallChannel();
    }
    return {emitter_->Particles, grid.GridSteps, grid.FallbackUpdates};
  }

 private:
  template <typename T, typename... Args>
  T* Make(Args&&... args) {
    auto channel = std::make_unique<T>(std::forward<Args>(args)...);
    T* raw = channel.get();
    owned_.push_back(std::move(channel));
    return raw;
  }
  void Value(Qen_Channel& owner, int link, float value) {
    ASSERT_TRUE(owner.SetChild(link, Make<Qen_ValueChannel>(value))) << link;
  }
  Tev_EnvelopeStorage* Envelope(const std::vector<Key>& keys) {
    auto* envelope = Make<Tev_EnvelopeStorage>();
    envelope->SetKeys(keys);
    return envelope;
  }

  void Link(const SceneRecipe& s) {
    Tev_AdvancedParticleEmitter& e = *emitter_;
    Value(e, kLinkParticleCount, static_cast<float>(s.Count));
    Value(e, kLinkHardwareParticles, 1.0f);
    Value(e, kLinkLogicUpdatesPerSecond, s.LogicPerSecond);
    Value(e, kLinkBirthsPerSecond, s.BirthsPerSecond);
    Value(e, kLinkEmitterActive, 1.0f);
    Value(e, kLinkVertexEmissions, s.VertexEmissions ? 1.0f : 0.0f);
    Value(e, kLinkReplaceOldParticles, s.ReplaceOld ? 1.0f : 0.0f);
    Value(e, kLinkLifespanMin, s.LifespanMin);
    Value(e, kLinkLifespanMax, s.LifespanMax);
    Value(e, kLinkInitialForceStrength, s.InitialStrength);
    ASSERT_TRUE(e.SetChild(kLinkGlobalForce, Make<Qen_ValueVectorChannel>(s.GlobalForce)));
    if (s.HasMaximumSpeed) Value(e, kLinkMaximumSpeed, s.MaximumSpeed);
    D3DXMATRIX identity;
    D3DXMatrixIdentity(&identity);
    ASSERT_TRUE(e.SetChild(kLinkEmitterMotion, Make<Qen_MatrixChannel>(identity)));
    ASSERT_TRUE(e.SetChild(kLinkEmitter, Tetrahedron(s.CloudSize)));

    auto* smoke = Make<Smoke>();
    ASSERT_TRUE(e.SetChild(kLinkSmokeSettings, smoke));
    Value(e, kLinkSmoke, 1.0f);
    ASSERT_TRUE(smoke->SetChild(Smoke::kLinkForceStrengthEnvelope, Envelope(s.Strength)));
    if (!s.Repulsion.empty()) {
      ASSERT_TRUE(smoke->SetChild(Smoke::kLinkRepulsionEnvelope, Envelope(s.Repulsion)));
    }
    if (!s.Attraction.empty()) {
      ASSERT_TRUE(smoke->SetChild(Smoke::kLinkAttractionEnvelope, Envelope(s.Attraction)));
    }
    Value(*smoke, Smoke::kLinkDrag, s.Drag);
    Value(*smoke, Smoke::kLinkDragFadesWithAge, s.DragFades ? 1.0f : 0.0f);
    Value(*smoke, Smoke::kLinkCollisionEnabled, s.SmokeCollision ? 1.0f : 0.0f);
    Value(*smoke, Smoke::kLinkRecheckCollision, s.Recheck ? 1.0f : 0.0f);
    Value(*smoke, Smoke::kLinkCollisionProbeMinimum, s.ProbeMinimum);

    if (!s.Plane) return;
    auto* manager = Make<Tev_MultiCollisionManager>();
    manager->AddPlane({0.0f, 0.0f, 0.0f}, {0.0f, 1.0f, 0.0f});
    ASSERT_TRUE(e.SetChild(kLinkMultiCollisionManager, manager));
    Value(e, kLinkAttachRate, s.AttachRate);
    Value(e, kLinkBounceRate, s.BounceRate);
    Value(e, kLinkAttachedSlideRate, s.SlideRate);
    Value(e, kLinkAttachedSlidingHeight, s.SlidingHeight);
    Value(e, kLinkAttachedLifespan, 0.5f);
  }

  // Four faces just above the ground, `size` across.
  Tev_DX8_ObjectDataChannel* Tetrahedron(float size) {
    auto* mesh = Make<Tev_DX8_ObjectDataChannel>();
    const D3DXVECTOR3 corners[4] = {{0.0f, 0.1f * size, 0.0f},
                                    {size, 0.1f * size, 0.0f},
                                    {0.5f * size, 0.1f * size, size},
                                    {0.5f * size, size, 0.4f * size}};
    mesh->SetVertexCount(4);
    for (int v = 0; v < 4; ++v) {
      mesh->SetVertexPosition(corners[v], v);
      mesh->SetVertexNormal({0.0f, 1.0f, 0.0f}, v);
    }
    const DWORD faces[12] = {0, 1, 2, 0, 3, 1, 1, 3, 2, 2, 3, 0};
    mesh->SetIndexCount(12);
    for (int i = 0; i < 12; ++i) mesh->SetIndex(faces[i], i);
    D3DXMATRIX identity;
    D3DXMatrixIdentity(&identity);
    mesh->SetWorldMatrix(identity);
    return mesh;
  }

  // Records the grid must treat exactly as the loop does, at the lowest indexes (births take
  // the lowest free record, so these are not overwritten unless old particles are replaced).
  void PlaceOddities(const SceneRecipe& s) {
    const float reach = s.Repulsion.empty() ? 1.0f : s.Repulsion.back().X;
    constexpr float kInf = std::numeric_limits<float>::infinity();
    const float nan = std::numeric_limits<float>::quiet_NaN();
    std::vector<D3DXVECTOR3> places = {
        {1.0f, 2.0f, 1.0f}, {1.0f, 2.0f, 1.0f},          // coincident
        {2.0f, 3.0f, 2.0f}, {2.0f + reach, 3.0f, 2.0f},  // exactly at the reach
        {nan, 1.0f, 1.0f},  {kInf, 1.0f, 1.0f},         {1.0f, -kInf, 1.0f}};
    if (s.FarOutliers) {
      places.push_back({3e38f, 1.0f, 1.0f});
      places.push_back({-3e38f, 1.0f, 1.0f});
      places.push_back({1e30f, 1e30f, 1e30f});
    }
    for (std::size_t i = 0; i < places.size() && i < emitter_->Particles.size(); ++i) {
      Particle& p = emitter_->Particles[i];
      p = Particle{};
      p.Active = true;
      p.Lifespan = 100.0f;
      p.SizeMultiplier = 1.0f;
      p.Position = places[i];
      p.RenderPosition = places[i];
    }
  }

  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  TestClock clock_;
  MemoryDevice* device_;
  std::unique_ptr<Tev_DX8_DeviceChannel> deviceChannel_;
  std::vector<std::unique_ptr<Qen_Channel>> owned_;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter_;
};

Outcome RunScene(const SceneRecipe& recipe, sim::PairSearch search) {
  SceneRun run;
  return run.Run(recipe, search);
}

bool SameBits(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return std::bit_cast<std::uint32_t>(a.x) == std::bit_cast<std::uint32_t>(b.x) &&
         std::bit_cast<std::uint32_t>(a.y) == std::bit_cast<std::uint32_t>(b.y) &&
         std::bit_cast<std::uint32_t>(a.z) == std::bit_cast<std::uint32_t>(b.z);
}

std::string Describe(const D3DXVECTOR3& v) {
  std::ostringstream text;
  text.precision(9);
  text << "(" << v.x << ", " << v.y << ", " << v.z << ")";
  return text.str();
}

// The first particle that differs, described; empty when none does.
std::string FirstDifference(const Outcome& grid, const Outcome& loop) {
  if (grid.Particles.size() != loop.Particles.size()) return "pool sizes differ";
  for (std::size_t i = 0; i < grid.Particles.size(); ++i) {
    const Particle& a = grid.Particles[i];
    const Particle& b = loop.Particles[i];
    const auto field = [&](const char* name, const D3DXVECTOR3& x, const D3DXVECTOR3& y) {
      return "particle " + std::to_string(i) + " " + name + ": grid " + Describe(x) +
             ", all-pairs " + Describe(y);
    };
    if (a.Active != b.Active) return "particle " + std::to_string(i) + " Active differs";
    if (!SameBits(a.SmokeForce, b.SmokeForce))
      return field("SmokeForce", a.SmokeForce, b.SmokeForce);
    if (!SameBits(a.Position, b.Position)) return field("Position", a.Position, b.Position);
    if (!SameBits(a.Velocity, b.Velocity)) return field("Velocity", a.Velocity, b.Velocity);
  }
  return "";
}

int CountPushed(const Outcome& outcome) {
  int pushed = 0;
  for (const Particle& p : outcome.Particles)
    if (p.Active && !(p.SmokeForce == D3DXVECTOR3(0.0f, 0.0f, 0.0f))) ++pushed;
  return pushed;
}

// Each block of seeds is one test, so that the blocks run in parallel.
class GridMatchesAllPairs : public ::testing::TestWithParam<unsigned> {};

constexpr unsigned kScenesPerBlock = 25;

TEST_P(GridMatchesAllPairs, BitForBitInRandomScenes) {
  int gridScenes = 0;
  int pushed = 0;
  for (unsigned k = 0; k < kScenesPerBlock; ++k) {
    const SceneRecipe recipe = DrawScene(GetParam() * kScenesPerBlock + k + 1);
    const Outcome grid = RunScene(recipe, sim::PairSearch::Automatic);
    const Outcome loop = RunScene(recipe, sim::PairSearch::AllPairs);
    EXPECT_EQ(loop.GridSteps, 0);
    EXPECT_EQ(FirstDifference(grid, loop), "") << "scene seed " << recipe.Seed;
    if (grid.GridSteps > 0) ++gridScenes;
    pushed += CountPushed(grid);
  }
  // The comparison means something only if the grid ran and forces acted.
  EXPECT_GE(gridScenes, static_cast<int>(kScenesPerBlock) / 2);
  EXPECT_GT(pushed, 0);
}

INSTANTIATE_TEST_SUITE_P(SeedBlocks, GridMatchesAllPairs, ::testing::Range(0u, 8u));

}  // namespace
