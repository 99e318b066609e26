// Smoke: pair forces between smoke particles, their strength over age, drag and the fades.
#include "simulation/tests/emitter_fixture.h"

namespace {

using Smoke = Tev_AdvPE_SmokeSettings;

class SmokeForces : public EmitterTest {
 protected:
  void SetUp() override {
    LinkBasics(4.0f, 50.0f, 0.0f);
    LinkSmoke();
  }
};

TEST_F(SmokeForces, RepulsionPushesAPairApartEquallyAndOppositely) {
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}});
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.0f, 3.0f}, {2.0f, 3.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  PlaceParticle(1, {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  // The lower index gathers its share for its next step; the higher one used its share at once.
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(-3.0f, 0.0f, 0.0f));
  EXPECT_EQ(P(1).Velocity, D3DXVECTOR3(3.0f, 0.0f, 0.0f));
  EXPECT_EQ(P(1).SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  StepOnce();
  EXPECT_EQ(P(0).Velocity, D3DXVECTOR3(-3.0f, 0.0f, 0.0f));
}

TEST_F(SmokeForces, AttractionPullsAPairTogether) {
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 2.0f}});
  SetSmokeEnvelope(Smoke::kLinkAttractionEnvelope, {{0.0f, 0.5f}, {5.0f, 0.5f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  PlaceParticle(2, {0.0f, 2.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(0.0f, 1.0f, 0.0f));
  EXPECT_EQ(P(2).Velocity, D3DXVECTOR3(0.0f, -1.0f, 0.0f));
}

struct DistanceCase {
  const char* Name;
  float Distance;
  bool Acts;
};

class PairRange : public SmokeForces, public ::testing::WithParamInterface<DistanceCase> {};

TEST_P(PairRange, ActsOnlyStrictlyInsideTheEnvelopesIndexRange) {
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}});
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.5f, 1.0f}, {2.0f, 1.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  PlaceParticle(1, {0.0f, 0.0f, GetParam().Distance}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce.z, GetParam().Acts ? -1.0f : 0.0f);
  EXPECT_EQ(P(1).Velocity.z, GetParam().Acts ? 1.0f : 0.0f);
}

INSTANTIATE_TEST_SUITE_P(Distances, PairRange,
                         ::testing::Values(DistanceCase{"AtRangeEnd", 2.0f, false},
                                           DistanceCase{"AtRangeStart", 0.5f, false},
                                           DistanceCase{"Inside", 1.0f, true},
                                           DistanceCase{"Beyond", 3.0f, false}),
                         [](const auto& info) { return std::string(info.param.Name); });

TEST_F(SmokeForces, CoincidentParticlesExertNoForce) {
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}});
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{-1.0f, 1.0f}, {2.0f, 1.0f}});
  Start();
  PlaceParticle(0, {1.0f, 1.0f, 1.0f}, {0.0f, 0.0f, 0.0f});
  PlaceParticle(1, {1.0f, 1.0f, 1.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_EQ(P(1).Position, D3DXVECTOR3(1.0f, 1.0f, 1.0f));
}

TEST_F(SmokeForces, DeadParticlesNeitherPushNorArePushed) {
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}});
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.0f, 1.0f}, {2.0f, 1.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  PlaceParticle(1, {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}).Active = false;
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_EQ(P(1).SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
}

TEST_F(SmokeForces, StrengthIsTheLowerIndexsEnvelopeValueAtItsNormalizedAge) {
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 0.0f}, {1.0f, 4.0f}});
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.0f, 1.0f}, {2.0f, 1.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 1.0f).Age = 0.479f;
  PlaceParticle(1, {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 100.0f);
  StepOnce();  // particle 0 at age 0.5
  EXPECT_FLOAT_EQ(P(0).SmokeForce.x, -4.0f * P(0).NormalizedAge);
  EXPECT_NEAR(P(0).NormalizedAge, 0.5f, 1e-6f);
}

TEST_F(SmokeForces, WithoutAStrengthEnvelopeNoForceActsButDragDoes) {
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.0f, 1.0f}, {2.0f, 1.0f}});
  SetSmokeValue(Smoke::kLinkDrag, 0.5f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 4.0f});
  PlaceParticle(1, {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_EQ(P(0).Velocity, D3DXVECTOR3(0.0f, 0.0f, 2.0f));
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.0f, 2.0f));
  EXPECT_EQ(P(1).Velocity, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
}

TEST_F(SmokeForces, DragOfOneOrMoreDoesNothingAndFadingDragScalesWithAge) {
  SetSmokeValue(Smoke::kLinkDrag, 1.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 4.0f});
  StepOnce();
  EXPECT_EQ(P(0).Velocity.z, 4.0f);

  SetSmokeValue(Smoke::kLinkDrag, 0.5f);
  SetSmokeValue(Smoke::kLinkDragFadesWithAge, 1.0f);
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 4.0f}, 1.0f).Age = 0.479f;
  StepOnce();
  EXPECT_FLOAT_EQ(P(0).Velocity.z, 4.0f * ((1.0f - P(0).NormalizedAge) * 0.5f));
}

TEST_F(SmokeForces, GlobalForceAndSpeedLimitFadeWithAge) {
  SetVector(kLinkGlobalForce, {0.0f, -8.0f, 0.0f});
  SetSmokeValue(Smoke::kLinkGlobalForceFadesWithAge, 1.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 1.0f).Age = 0.729f;
  StepOnce();  // age 0.75: a quarter of the force
  EXPECT_NEAR(P(0).NormalizedAge, 0.75f, 1e-6f);
  EXPECT_FLOAT_EQ(P(0).Velocity.y, -8.0f * (1.0f - P(0).NormalizedAge));

  SetValue(kLinkMaximumSpeed, 10.0f);
  SetSmokeValue(Smoke::kLinkMaxSpeedFadesWithAge, 1.0f);
  SetSmokeValue(Smoke::kLinkGlobalForceFadesWithAge, 0.0f);
  SetVector(kLinkGlobalForce, {0.0f, 0.0f, 0.0f});
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 9.0f}, 1.0f).Age = 0.479f;
  StepOnce();  // age 0.5: the limit is 5
  EXPECT_FLOAT_EQ(P(0).Velocity.z, (1.0f - P(0).NormalizedAge) * 10.0f);
}

TEST_F(SmokeForces, SmokeNeedsBothTheSwitchAndTheSettings) {
  SetSmokeValue(Smoke::kLinkDrag, 0.5f);
  SetValue(kLinkSmoke, 0.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 4.0f});
  StepOnce();
  EXPECT_FALSE(emitter->SmokeEnabled);
  EXPECT_EQ(P(0).Velocity.z, 4.0f);

  SetValue(kLinkSmoke, 1.0f);
  StepOnce();
  EXPECT_TRUE(emitter->SmokeEnabled);
  EXPECT_EQ(P(0).Velocity.z, 2.0f);

  Unlink(kLinkSmokeSettings);
  StepOnce();
  EXPECT_FALSE(emitter->SmokeEnabled);
  EXPECT_EQ(P(0).Velocity.z, 2.0f);
}

}  // namespace
