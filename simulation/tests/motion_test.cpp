// The live update: death, forces scaled by the time scale, the speed limit, attractors, spin and
// the dispatch between live, attached and free records.
#include <cmath>

#include "simulation/tests/emitter_fixture.h"

namespace {

// Particles placed by hand, no births, 50 logic steps per second.
class Motion : public EmitterTest {
 protected:
  void SetUp() override { LinkBasics(4.0f, 50.0f, 0.0f); }
};

TEST_F(Motion, AParticleLivesWhileItsAgeEqualsItsLifespanAndDiesAfter) {
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 0.25f);
  RunFrame(250.0);
  EXPECT_TRUE(P(0).Active);
  EXPECT_EQ(P(0).Age, 0.25f);
  EXPECT_EQ(P(0).NormalizedAge, 1.0f);
  RunFrame(20.0);
  EXPECT_FALSE(P(0).Active);
}

TEST_F(Motion, NormalizedAgeIsAgeOverLifespan) {
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 2.0f);
  RunFrame(500.0);
  EXPECT_EQ(P(0).NormalizedAge, 0.5f / 2.0f);
}

TEST_F(Motion, GlobalForceIsScaledTwiceByTheTimeScale) {
  SetVector(kLinkGlobalForce, {0.0f, -1.0f, 0.0f});
  SetValue(kLinkSimulationScaler, 2.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_EQ(P(0).Velocity, D3DXVECTOR3(0.0f, -4.0f, 0.0f));
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, -4.0f, 0.0f));
  StepOnce();
  EXPECT_EQ(P(0).Velocity, D3DXVECTOR3(0.0f, -8.0f, 0.0f));
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, -12.0f, 0.0f));
}

struct SpeedCase {
  const char* Name;
  float Limit;  // negative: no "Maximum Speed" link
  float Scaler;
  D3DXVECTOR3 Velocity;
  D3DXVECTOR3 Expected;
};

class SpeedLimit : public Motion, public ::testing::WithParamInterface<SpeedCase> {};

TEST_P(SpeedLimit, CutsOnlyFasterVelocitiesKeepingTheirDirection) {
  const SpeedCase& c = GetParam();
  if (c.Limit >= 0.0f) SetValue(kLinkMaximumSpeed, c.Limit);
  SetValue(kLinkSimulationScaler, c.Scaler);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, c.Velocity);
  StepOnce();
  EXPECT_FLOAT_EQ(P(0).Velocity.x, c.Expected.x);
  EXPECT_FLOAT_EQ(P(0).Velocity.y, c.Expected.y);
  EXPECT_FLOAT_EQ(P(0).Velocity.z, c.Expected.z);
}

INSTANTIATE_TEST_SUITE_P(
    Cases, SpeedLimit,
    ::testing::Values(
        SpeedCase{"EqualIsKept", 5.0f, 1.0f, {3.0f, 4.0f, 0.0f}, {3.0f, 4.0f, 0.0f}},
        SpeedCase{"FasterIsCut", 5.0f, 1.0f, {0.0f, 6.0f, 0.0f}, {0.0f, 5.0f, 0.0f}},
        SpeedCase{"DiagonalIsCut", 5.0f, 1.0f, {6.0f, 8.0f, 0.0f}, {3.0f, 4.0f, 0.0f}},
        SpeedCase{"LimitScales", 5.0f, 2.0f, {0.0f, 0.0f, 12.0f}, {0.0f, 0.0f, 10.0f}},
        SpeedCase{"NoLinkNoLimit", -1.0f, 1.0f, {0.0f, 600.0f, 0.0f}, {0.0f, 600.0f, 0.0f}}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Motion, AttractorsAreSummedAtTheNewPositionAndActInTheNextStep) {
  Tev_AdvPE_Attractor* attractors[3];
  const D3DXVECTOR3 centres[3] = {{5.0f, 0.0f, 0.0f}, {0.0f, 7.0f, 0.0f}, {-3.0f, 0.0f, 4.0f}};
  for (int a = 0; a < 3; ++a) {
    attractors[a] = Make<Tev_AdvPE_Attractor>();
    attractors[a]->Position = centres[a];
    attractors[a]->Strength = 2.0f + static_cast<float>(a);
    ASSERT_TRUE(emitter->AddChild(kLinkAttractors, attractors[a]));
  }
  {
    // A channel that went away leaves a null entry, which is skipped.
    Tev_AdvPE_Attractor gone;
    ASSERT_TRUE(emitter->AddChild(kLinkAttractors, &gone));
  }
  SetValue(kLinkSimulationScaler, 0.5f);
  Start();
  PlaceParticle(0, {1.0f, 1.0f, 1.0f}, {0.0f, 0.0f, 0.5f});
  StepOnce();
  const D3DXVECTOR3 at = P(0).Position;
  ASSERT_EQ(at, D3DXVECTOR3(1.0f, 1.0f, 1.5f));
  D3DXVECTOR3 sum{0.0f, 0.0f, 0.0f};
  for (Tev_AdvPE_Attractor* attractor : attractors) sum += attractor->GetForceAtPosition(at);
  EXPECT_EQ(P(0).AttractorForce, sum);

  StepOnce();
  const D3DXVECTOR3 expected = D3DXVECTOR3(0.0f, 0.0f, 0.5f) + sum * 0.5f * 0.5f;
  EXPECT_FLOAT_EQ(P(0).Velocity.x, expected.x);
  EXPECT_FLOAT_EQ(P(0).Velocity.y, expected.y);
  EXPECT_FLOAT_EQ(P(0).Velocity.z, expected.z);
}

TEST_F(Motion, SlidingParticlesIgnoreAttractorsOnlyWhenImmune) {
  auto* attractor = Make<Tev_AdvPE_Attractor>();
  attractor->Position = {0.0f, 5.0f, 0.0f};
  ASSERT_TRUE(emitter->AddChild(kLinkAttractors, attractor));
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}).Sliding = true;
  PlaceParticle(1, {1.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_NE(P(0).AttractorForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));

  SetValue(kLinkSlidingAttractorImmunity, 1.0f);
  StepOnce();
  StepOnce();
  EXPECT_EQ(P(0).AttractorForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_NE(P(1).AttractorForce, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
}

struct SpinCase {
  float Angle;
  float Speed;
  float Scaler;
  float Expected;
};

class SpinStep : public Motion, public ::testing::WithParamInterface<SpinCase> {};

TEST_P(SpinStep, AddsScaledSpeedAndResetsBeyondThreeHundredSixty) {
  SetValue(kLinkSpinStart, 0.0f);
  SetValue(kLinkSimulationScaler, GetParam().Scaler);
  Start();
  Particle& p = PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  p.SpinAngle = GetParam().Angle;
  p.SpinSpeed = GetParam().Speed;
  StepOnce();
  EXPECT_EQ(P(0).SpinAngle, GetParam().Expected);
}

INSTANTIATE_TEST_SUITE_P(Cases, SpinStep,
                         ::testing::Values(SpinCase{359.0f, 2.0f, 1.0f, 0.0f},
                                           SpinCase{-359.0f, -2.0f, 1.0f, 0.0f},
                                           SpinCase{358.0f, 2.0f, 1.0f, 360.0f},
                                           SpinCase{10.0f, 1.5f, 2.0f, 13.0f}));

TEST_F(Motion, WithoutSpinTheAngleStays) {
  Start();
  Particle& p = PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  p.SpinAngle = 5.0f;
  p.SpinSpeed = 1.0f;
  p.RenderSpinAngle = 5.5f;
  StepOnce();
  EXPECT_EQ(P(0).SpinAngle, 5.0f);
  EXPECT_EQ(P(0).RenderSpinAngle, 5.5f);
}

TEST_F(Motion, FreeRecordsAreNotUpdated) {
  Start();
  Particle& p = PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 1.0f});
  p.Active = false;
  StepOnce();
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.0f, 0.0f));
  EXPECT_FALSE(emitter->VerticesDirty);
}

TEST_F(Motion, ColourIsRecomputedEveryStepFromTheEnvelopes) {
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 0.0f}, {1.0f, 200.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 1.0f).Color = 0xFFFFFFFFu;
  RunFrame(500.0);  // NormalizedAge 0.5 in the last step
  EXPECT_EQ(P(0).Color, 100u << 16);
}

}  // namespace
