// The particle pool: sizing at initialization, the cap, the four pool queries and rebuilding.
#include <cmath>
#include <limits>

#include "simulation/particle_pool.h"
#include "simulation/tests/emitter_fixture.h"

namespace {

using Pool = EmitterTest;

struct PoolSizeCase {
  float Value;
  std::int32_t Count;
  bool Capped;
};

class PoolSizeFor : public ::testing::TestWithParam<PoolSizeCase> {};

TEST_P(PoolSizeFor, TruncatesRaisesToOneAndCaps) {
  const sim::PoolRequest request = sim::PoolSizeFor(GetParam().Value);
  EXPECT_EQ(request.Count, GetParam().Count);
  EXPECT_EQ(request.Capped, GetParam().Capped);
}

constexpr std::int32_t kCap = Tev_AdvancedParticleEmitter::kMaximumParticleCount;
INSTANTIATE_TEST_SUITE_P(
    Values, PoolSizeFor,
    ::testing::Values(PoolSizeCase{0.7f, 1, false}, PoolSizeCase{-3.0f, 1, false},
                      PoolSizeCase{0.0f, 1, false}, PoolSizeCase{250.9f, 250, false},
                      PoolSizeCase{1'000'000.0f, kCap, false},
                      PoolSizeCase{1'000'064.0f, kCap, true}, PoolSizeCase{3e9f, kCap, true},
                      PoolSizeCase{std::numeric_limits<float>::infinity(), kCap, true},
                      PoolSizeCase{-std::numeric_limits<float>::infinity(), 1, false},
                      PoolSizeCase{std::numeric_limits<float>::quiet_NaN(), 1, false}));

TEST_F(Pool, InitializeSizesThePoolFromTheTruncatedCount) {
  SetValue(kLinkParticleCount, 250.9f);
  Start();
  EXPECT_EQ(emitter->ParticleCount, 250);
  ASSERT_EQ(emitter->Particles.size(), 250u);
  const Particle fresh{};
  for (const Particle& p : emitter->Particles) {
    EXPECT_FALSE(p.Active);
    EXPECT_EQ(p.PendingSteps, 1);
    EXPECT_EQ(p.Position, fresh.Position);
  }
  EXPECT_TRUE(debugMessages.empty());
}

TEST_F(Pool, NoCountLinkGivesAnEmptyPool) {
  Start();
  EXPECT_EQ(emitter->ParticleCount, 0);
  EXPECT_TRUE(emitter->Particles.empty());
  RunFrames(3, 50.0);
  EXPECT_TRUE(emitter->Initialized);
}

TEST_F(Pool, ACountBelowOneKeepsItsSingleRecordFrameAfterFrame) {
  LinkBasics(0.5f, 50.0f, 10.0f);
  Start();
  ASSERT_EQ(emitter->ParticleCount, 1);
  RunFrame(150.0);
  ASSERT_TRUE(P(0).Active);
  // 0.5 gives 1 again, which equals the pool: no rebuild, the particle lives on.
  RunFrame(20.0);
  RunFrame(20.0);
  EXPECT_TRUE(emitter->Initialized);
  EXPECT_TRUE(P(0).Active);
}

TEST_F(Pool, AnOversizedCountIsCappedWithAMessageAndNotRebuiltEveryFrame) {
  SetValue(kLinkParticleCount, 5e9f);
  SetValue(kLinkHardwareParticles, 1.0f);
  Start();
  EXPECT_EQ(emitter->ParticleCount, Tev_AdvancedParticleEmitter::kMaximumParticleCount);
  EXPECT_EQ(emitter->Particles.size(),
            static_cast<std::size_t>(Tev_AdvancedParticleEmitter::kMaximumParticleCount));
  EXPECT_EQ(CountMessages(debugMessages, "APE: ParticleCount capped at 1000000"), 1);
  RunFrame(20.0);
  EXPECT_TRUE(emitter->Initialized);
}

TEST_F(Pool, InitializeDiscardsLivingParticles) {
  LinkBasics(4.0f, 50.0f, 100.0f);
  Start();
  RunFrame(35.0);
  ASSERT_GT(ActiveCount(), 0);
  emitter->Initialize();
  EXPECT_EQ(ActiveCount(), 0);
  EXPECT_EQ(emitter->Particles.size(), 4u);
  EXPECT_EQ(emitter->BirthAccumulator, 0.0f);
}

TEST_F(Pool, InactiveParticleIsTheLowestFreeIndexOrMinusOne) {
  SetValue(kLinkParticleCount, 4.0f);
  Start();
  EXPECT_EQ(emitter->GetInactiveParticle(), 0);
  P(0).Active = P(1).Active = true;
  P(3).Active = true;
  EXPECT_EQ(emitter->GetInactiveParticle(), 2);
  P(2).Active = true;
  EXPECT_EQ(emitter->GetInactiveParticle(), -1);
}

TEST_F(Pool, InactiveParticleOfAnEmptyPoolIsMinusOne) {
  Start();
  EXPECT_EQ(emitter->GetInactiveParticle(), -1);
}

struct OldestCase {
  const char* Name;
  std::vector<float> NormalizedAges;
  std::vector<bool> Attached;
  int Expected;
};

class OldestParticle : public Pool, public ::testing::WithParamInterface<OldestCase> {};

TEST_P(OldestParticle, IsTheGreatestAgeAmongFreeFlyingRecords) {
  const OldestCase& c = GetParam();
  SetValue(kLinkParticleCount, static_cast<float>(c.NormalizedAges.size()));
  Start();
  for (std::size_t i = 0; i < c.NormalizedAges.size(); ++i) {
    P(static_cast<int>(i)).NormalizedAge = c.NormalizedAges[i];
    P(static_cast<int>(i)).Attached = c.Attached[i];
  }
  EXPECT_EQ(emitter->GetOldestParticle(), c.Expected);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, OldestParticle,
    ::testing::Values(OldestCase{"TieKeepsLowestIndex",
                                 {0.1f, 0.2f, 0.7f, 0.3f, 0.0f, 0.7f},
                                 {false, false, false, false, false, false},
                                 2},
                      OldestCase{"AttachedIsSkipped", {0.9f, 0.1f}, {true, false}, 1},
                      OldestCase{"AllAttachedGivesZero", {0.5f, 0.9f}, {true, true}, 0},
                      // The flag is not looked at: a dead record's leftover age still counts.
                      OldestCase{
                          "InactiveLeftoverCounts", {0.2f, 5.0f, 0.4f}, {false, false, false}, 1}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Pool, QueriesInitializeFirstAndAnswerNothingThen) {
  SetValue(kLinkParticleCount, 3.0f);
  EXPECT_FALSE(emitter->GetIfParticleActive(0));
  EXPECT_TRUE(emitter->Initialized);
  EXPECT_EQ(emitter->ParticleCount, 3);
  P(0).Active = true;
  EXPECT_TRUE(emitter->GetIfParticleActive(0));

  emitter->Initialized = false;
  P(1).RenderPosition = {1.0f, 2.0f, 3.0f};
  EXPECT_EQ(emitter->GetParticlePosition(1), D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_TRUE(emitter->Initialized);
}

TEST_F(Pool, PositionIsTheInterpolatedRenderPosition) {
  LinkBasics(1.0f, 50.0f, 10.0f);
  SetVector(kLinkInitialForceOverride, {0.0f, 0.0f, 2.0f});
  Start();
  RunFrame(105.0);  // one birth, 5 steps, 5 ms banked: t = 0.25
  ASSERT_TRUE(P(0).Active);
  const D3DXVECTOR3 drawn = emitter->GetParticlePosition(0);
  EXPECT_NE(drawn, P(0).Position);
  EXPECT_FLOAT_EQ(drawn.z, P(0).Position.z + 2.0f * 0.25f);
}

TEST_F(Pool, QueriesOutsideThePoolAnswerFalseAndOrigin) {
  SetValue(kLinkParticleCount, 2.0f);
  Start();
  P(0).Active = P(1).Active = true;
  P(0).RenderPosition = P(1).RenderPosition = {5.0f, 5.0f, 5.0f};
  for (int index : {-1, 2, 1000, std::numeric_limits<int>::min()}) {
    EXPECT_FALSE(emitter->GetIfParticleActive(index)) << index;
    EXPECT_EQ(emitter->GetParticlePosition(index), D3DXVECTOR3(0.0f, 0.0f, 0.0f)) << index;
  }
}

}  // namespace
