// The live update: death, forces scaled by the time scale, the speed limit, attractors, spin, and
// the smoke forces (pairs, strength, drag, fades).
#include "simulation/tests/emitter_fixture.h"

namespace {

// Particles placed by hand, no births, 50 logic steps per second.
class Motion : public EmitterTest {
 protected:
  void SetUp() override { LinkBasics(4.0f, 50.0f, 0.0f); }
};

TEST_F(Motion, AParticleLivesWhileItsAgeEqualsItsLifespanAndDiesAfter) {
  Start();
  PlaceParticle(0, kZero, kZero, 0.25f);
  RunFrame(250.0);
  EXPECT_TRUE(P(0).Active);
  EXPECT_EQ(P(0).NormalizedAge, 1.0f);
  RunFrame(20.0);
  EXPECT_FALSE(P(0).Active);
}

// Each step adds the force times the scale twice; the limit (times the scale) cuts only a
// strictly faster velocity, keeping its direction.
TEST_F(Motion, ForcesAndTheSpeedLimitFollowTheTimeScale) {
  const struct {
    float Limit;  // negative: no "Maximum Speed" link
    float Scaler;
    D3DXVECTOR3 Velocity, Expected;
  } cases[] = {{-1.0f, 2.0f, {0, 0, 0}, {0, -4, 0}}, {-1.0f, 1.0f, {0, 600, 0}, {0, 599, 0}},
               {5.0f, 1.0f, {3, 5, 0}, {3, 4, 0}},   {5.0f, 1.0f, {0, 7, 0}, {0, 5, 0}},
               {5.0f, 1.0f, {6, 9, 0}, {3, 4, 0}},   {5.0f, 2.0f, {0, 14, 0}, {0, 10, 0}}};
  SetVector(kLinkGlobalForce, {0.0f, -1.0f, 0.0f});
  Start();
  for (const auto& c : cases) {
    c.Limit < 0.0f ? Unlink(kLinkMaximumSpeed) : (void)SetValue(kLinkMaximumSpeed, c.Limit);
    SetValue(kLinkSimulationScaler, c.Scaler);
    PlaceParticle(0, kZero, c.Velocity);
    StepOnce();
    ExpectNear(P(0).Velocity, c.Expected);
    EXPECT_EQ(P(0).Position, P(0).Velocity);
  }
}

// Summed at the new position, skipping a channel that went away, applied in the next step;
// sliding particles are immune only with "Sliding Particles Attractor Immunity?".
TEST_F(Motion, AttractorsAreSummedAtTheNewPositionAndActInTheNextStep) {
  auto* attractor = Make<Tev_AdvPE_Attractor>();
  attractor->Position = {5.0f, 0.0f, 0.0f};
  ASSERT_TRUE(emitter->AddChild(kLinkAttractors, attractor));
  {
    Tev_AdvPE_Attractor gone;
    ASSERT_TRUE(emitter->AddChild(kLinkAttractors, &gone));
  }
  ASSERT_TRUE(emitter->AddChild(kLinkAttractors, attractor));
  SetValue(kLinkSimulationScaler, 0.5f);
  Start();
  PlaceParticle(0, {1.0f, 1.0f, 1.0f}, {0.0f, 0.0f, 0.5f});
  PlaceParticle(1, kZero, kZero).Sliding = true;
  StepOnce();
  const D3DXVECTOR3 sum = attractor->GetForceAtPosition({1.0f, 1.0f, 1.5f}) * 2.0f;
  EXPECT_EQ(P(0).AttractorForce, sum);
  EXPECT_NE(P(1).AttractorForce, kZero);
  SetValue(kLinkSlidingAttractorImmunity, 1.0f);
  StepOnce();
  ExpectNear(P(0).Velocity, D3DXVECTOR3(0.0f, 0.0f, 0.5f) + sum * 0.25f);
  EXPECT_EQ(P(1).AttractorForce, kZero);
}

// The angle is reset (not wrapped) strictly beyond +-360; the speed is scaled. "SpinStart" alone
// switches spin on.
TEST_F(Motion, SpinAddsTheScaledSpeedAndResetsBeyond360) {
  const float cases[][4] = {// angle, speed, scale, expected
                            {359, 2, 1, 0},
                            {-359, -2, 1, 0},
                            {358, 2, 1, 360},
                            {10, 1.5f, 2, 13}};
  SetValue(kLinkSpinStart, 0.0f);
  Start();
  for (const auto& c : cases) {
    SetValue(kLinkSimulationScaler, c[2]);
    Particle& p = PlaceParticle(0, kZero, kZero);
    p.SpinAngle = c[0];
    p.SpinSpeed = c[1];
    StepOnce();
    EXPECT_EQ(P(0).SpinAngle, c[3]) << c[0];
  }
}

class SmokeForces : public Motion {
 protected:
  void SetUp() override {
    Motion::SetUp();
    LinkSmoke();
  }
};

// Strength 2 (its envelope at the lower index's age 0.5), a pair at distance d along x. The lower
// index gathers its share for its next step; the higher one uses its share in the same step.
TEST_F(SmokeForces, PairsActOnceEquallyAndOppositelyStrictlyInsideTheEnvelopesRange) {
  const struct {
    int Envelope;
    float Distance;
    bool PartnerActive;
    float Force;  // on the lower index, along x
  } cases[] = {{Smoke::kLinkRepulsionEnvelope, 1.0f, true, -6.0f},
               {Smoke::kLinkRepulsionEnvelope, 0.5f, true, 0.0f},  // range start
               {Smoke::kLinkRepulsionEnvelope, 2.0f, true, 0.0f},  // range end
               {Smoke::kLinkRepulsionEnvelope, 0.0f, true, 0.0f},  // coincident
               {Smoke::kLinkRepulsionEnvelope, 1.0f, false, 0.0f},
               {Smoke::kLinkAttractionEnvelope, 1.0f, true, 6.0f}};
  Start();
  for (const auto& c : cases) {
    LinkSmoke();
    SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 0.0f}, {1.0f, 4.0f}});
    SetSmokeEnvelope(c.Envelope, {{0.5f, 3.0f}, {2.0f, 3.0f}});
    PlaceParticle(0, kZero, kZero, 2.0f).Age = 1.0f - StepSeconds();
    PlaceParticle(1, {c.Distance, 0.0f, 0.0f}, kZero).Active = c.PartnerActive;
    StepOnce();
    ExpectNear(P(0).SmokeForce, {c.Force, 0.0f, 0.0f}, 1e-4f);
    ExpectNear(P(1).Velocity, {c.PartnerActive ? -c.Force : 0.0f, 0.0f, 0.0f}, 1e-4f);
  }
}

// Drag applies below 1 (faded by age when asked), even without a strength envelope, which leaves
// every pair force out; the global force and the limit fade with age when asked.
TEST_F(SmokeForces, DragAndFadesScaleWithAge) {
  const struct {
    float Drag, DragFades, ForceFades, SpeedFades;
    D3DXVECTOR3 Velocity, Expected;  // at normalized age 0.75
  } cases[] = {{0.5f, 0, 0, 0, {0, 0, 4}, {0, 0, 2}},
               {0.5f, 1, 0, 0, {0, 0, 4}, {0, 0, 0.5f}},
               {1.0f, 0, 1, 0, {0, 0, 0}, {0, -2, 0}},
               {1.0f, 0, 0, 1, {0, 0, 9}, {0, 0, 2.5f}}};
  SetValue(kLinkMaximumSpeed, 10.0f);
  SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.0f, 1.0f}, {2.0f, 1.0f}});
  Start();
  for (const auto& c : cases) {
    SetSmokeValue(Smoke::kLinkDrag, c.Drag);
    SetSmokeValue(Smoke::kLinkDragFadesWithAge, c.DragFades);
    SetSmokeValue(Smoke::kLinkGlobalForceFadesWithAge, c.ForceFades);
    SetSmokeValue(Smoke::kLinkMaxSpeedFadesWithAge, c.SpeedFades);
    SetVector(kLinkGlobalForce, {0.0f, c.ForceFades ? -8.0f : 0.0f, 0.0f});
    PlaceParticle(0, kZero, c.Velocity, 1.0f).Age = 0.75f - StepSeconds();
    PlaceParticle(1, {1.0f, 0.0f, 0.0f}, kZero);
    StepOnce();
    ExpectNear(P(0).Velocity, c.Expected, 1e-4f);
    EXPECT_EQ(P(0).SmokeForce, kZero);
  }
}

// Switching smoke off leaves no smoke force behind: the particle moves by the global force alone
// from the next step on, whether the settings go away or "Smoke?" turns off.
TEST_F(SmokeForces, NoSmokeForceOutlivesSmoke) {
  const bool unlinkSettings[] = {false, true};
  Start();
  for (bool unlink : unlinkSettings) {
    LinkSmoke();
    SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}, {1.0f, 1.0f}});
    SetSmokeEnvelope(Smoke::kLinkRepulsionEnvelope, {{0.0f, 2.0f}, {4.0f, 2.0f}});
    SetVector(kLinkGlobalForce, {0.0f, -1.0f, 0.0f});
    PlaceParticle(0, kZero, kZero);
    PlaceParticle(1, {1.0f, 0.0f, 0.0f}, kZero);
    StepOnce();
    ASSERT_NE(P(0).SmokeForce, kZero) << unlink;
    unlink ? Unlink(kLinkSmokeSettings) : (void)SetValue(kLinkSmoke, 0.0f);
    const D3DXVECTOR3 before = P(0).Velocity;
    StepOnce();
    EXPECT_EQ(P(0).SmokeForce, kZero) << unlink;
    EXPECT_EQ(P(0).Velocity, before + D3DXVECTOR3(0.0f, -1.0f, 0.0f)) << unlink;
  }
}

}  // namespace
