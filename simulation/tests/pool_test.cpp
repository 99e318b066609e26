// The particle pool: sizing and its cap, and the four pool queries.
#include <limits>

#include "simulation/particle_pool.h"
#include "simulation/tests/emitter_fixture.h"

namespace {

using Pool = EmitterTest;
constexpr std::int32_t kCap = Tev_AdvancedParticleEmitter::kMaximumParticleCount;
constexpr float kInf = std::numeric_limits<float>::infinity();

TEST(PoolSizeFor, TruncatesRaisesToOneAndCaps) {
  const struct {
    float Value;
    std::int32_t Count;
    bool Capped;
  } cases[] = {{0.7f, 1, false},
               {-3.0f, 1, false},
               {250.9f, 250, false},
               {1e6f, kCap, false},
               {1'000'064.0f, kCap, true},
               {3e9f, kCap, true},
               {kInf, kCap, true},
               {-kInf, 1, false},
               {std::numeric_limits<float>::quiet_NaN(), 1, false}};
  for (const auto& c : cases) {
    const sim::PoolRequest request = sim::PoolSizeFor(c.Value);
    EXPECT_EQ(request.Count, c.Count) << c.Value;
    EXPECT_EQ(request.Capped, c.Capped) << c.Value;
  }
}

TEST_F(Pool, AnOversizedCountIsCappedWithAMessageAndNotRebuiltEveryFrame) {
  SetValue(kLinkParticleCount, 5e9f);
  SetValue(kLinkHardwareParticles, 1.0f);
  Start();
  EXPECT_EQ(emitter->Particles.size(), static_cast<std::size_t>(kCap));
  EXPECT_EQ(debugMessages, std::vector<std::string>{"APE: ParticleCount capped at 1000000"});
  RunFrame(20.0);
  EXPECT_TRUE(emitter->Initialized);
}

// The free record: the lowest inactive index. The oldest: the greatest age among records not
// attached, active or not.
TEST_F(Pool, InactiveAndOldestRecords) {
  const struct {
    std::vector<float> Ages;
    std::vector<bool> Attached;
    int Expected;
  } cases[] = {{{0.1f, 0.2f, 0.7f, 0.3f, 0.0f, 0.7f}, {0, 0, 0, 0, 0, 0}, 2},  // tie: lowest
               {{0.9f, 0.1f}, {1, 0}, 1},
               {{0.5f, 0.9f}, {1, 1}, 0},
               {{0.2f, 5.0f, 0.4f}, {0, 0, 0}, 1}};  // a dead record's leftover age counts
  for (const auto& c : cases) {
    SetValue(kLinkParticleCount, static_cast<float>(c.Ages.size()));
    emitter->Initialize();
    for (int i = 0; i < static_cast<int>(c.Ages.size()); ++i) {
      P(i).NormalizedAge = c.Ages[i];
      P(i).Attached = c.Attached[i];
    }
    EXPECT_EQ(emitter->GetOldestParticle(), c.Expected);
    P(0).Active = true;
    EXPECT_EQ(emitter->GetInactiveParticle(), 1);
    for (Particle& p : emitter->Particles) p.Active = true;
    EXPECT_EQ(emitter->GetInactiveParticle(), -1);
  }
}

TEST_F(Pool, QueriesInitializeFirstThenAnswerFromTheRecord) {
  SetValue(kLinkParticleCount, 3.0f);
  EXPECT_FALSE(emitter->GetIfParticleActive(0));
  ASSERT_EQ(emitter->ParticleCount, 3);
  P(0).Active = true;
  EXPECT_TRUE(emitter->GetIfParticleActive(0));
  P(1).Position = {9.0f, 9.0f, 9.0f};
  P(1).RenderPosition = {1.0f, 2.0f, 3.0f};
  EXPECT_EQ(emitter->GetParticlePosition(1), D3DXVECTOR3(1.0f, 2.0f, 3.0f));
  for (int outside : {-1, 3, std::numeric_limits<int>::min()}) {
    EXPECT_FALSE(emitter->GetIfParticleActive(outside));
    EXPECT_EQ(emitter->GetParticlePosition(outside), kZero);
  }
  emitter->Initialized = false;
  EXPECT_EQ(emitter->GetParticlePosition(1), kZero);
  EXPECT_TRUE(emitter->Initialized);
}

}  // namespace
