// Smoke against surfaces: SmokeCollisionResponse, the smoke collision stage with its recheck and
// debug colours, and the surface look-ahead force.
#include <cmath>

#include "host/multi_collision_manager.h"
#include "simulation/tests/emitter_fixture.h"

namespace {

using Smoke = Tev_AdvPE_SmokeSettings;
constexpr D3DXVECTOR3 kUp{0.0f, 1.0f, 0.0f};
constexpr D3DXVECTOR3 kDown{0.0f, -1.0f, 0.0f};
constexpr D3DXVECTOR3 kOrigin{0.0f, 0.0f, 0.0f};

class SmokeSurface : public EmitterTest {
 protected:
  void SetUp() override {
    LinkBasics(4.0f, 50.0f, 0.0f);
    manager = Make<Tev_MultiCollisionManager>();
    ASSERT_EQ(manager->AddPlane(kOrigin, kUp), 0);
    ASSERT_TRUE(emitter->SetChild(kLinkMultiCollisionManager, manager));
  }

  struct Response {
    bool Hit;
    D3DXVECTOR3 Position;
    D3DXVECTOR3 Velocity;
    D3DXVECTOR3 Normal;
  };
  Response Respond(float probeMinimum, float approach, float radius, float contact,
                   D3DXVECTOR3 position, float speed, D3DXVECTOR3 direction) {
    Response r{false, {}, {}, {}};
    r.Hit = emitter->SmokeCollisionResponse(probeMinimum, approach, radius, contact, &position,
                                            speed, &direction, &r.Position, &r.Velocity, &r.Normal);
    return r;
  }

  Tev_MultiCollisionManager* manager = nullptr;
};

TEST_F(SmokeSurface, ASurfaceAheadWithinTheProbeSlowsTheApproach) {
  const Response r = Respond(10.0f, 0.3f, 0.5f, 1.0f, {0.0f, 5.0f, 0.0f}, 1.0f, kDown);
  ASSERT_TRUE(r.Hit);
  EXPECT_EQ(r.Velocity, D3DXVECTOR3(0.0f, -0.3f, 0.0f));
  EXPECT_EQ(r.Position, D3DXVECTOR3(0.0f, 4.7f, 0.0f));
  EXPECT_EQ(r.Normal, kUp);
}

TEST_F(SmokeSurface, ASurfaceBeyondTheProbeIsNotSeen) {
  EXPECT_FALSE(Respond(2.0f, 0.3f, 0.5f, 1.0f, {0.0f, 5.0f, 0.0f}, 1.0f, kDown).Hit);
  EXPECT_FALSE(Respond(0.0f, 0.3f, 0.5f, 1.0f, {0.0f, 5.0f, 0.0f}, 1.0f, kUp).Hit);
}

TEST_F(SmokeSurface, WithoutTheManagerNothingIsSeen) {
  Unlink(kLinkMultiCollisionManager);
  EXPECT_FALSE(Respond(10.0f, 0.3f, 0.5f, 1.0f, {0.0f, 5.0f, 0.0f}, 1.0f, kDown).Hit);
}

TEST_F(SmokeSurface, ContactContinuesTheMotionAlongTheSurface) {
  // From (0, 1, 0) along (1, -2, 0) at its length: the probe meets the plane at (0.5, 0, 0).
  const float speed = std::sqrt(5.0f);
  D3DXVECTOR3 direction{1.0f, -2.0f, 0.0f};
  direction = direction / speed;
  const Response r = Respond(0.0f, 0.3f, 0.5f, 0.5f, {0.0f, 1.0f, 0.0f}, speed, direction);
  ASSERT_TRUE(r.Hit);
  const float reach = speed + 0.5f;
  const float alongX = direction.x * reach - 0.5f;  // the projected end of the step, from the hit
  EXPECT_NEAR(r.Velocity.x, alongX * 0.5f, 1e-5f);
  EXPECT_NEAR(r.Velocity.y, 0.0f, 1e-6f);
  EXPECT_NEAR(r.Position.x, alongX * 0.5f, 1e-5f);
  EXPECT_NEAR(r.Position.y, 1.0f, 1e-6f);
}

struct ContactCase {
  D3DXVECTOR3 Direction;
  float Speed;
  float Radius;
  float Contact;
};

class ContactSpeed : public SmokeSurface, public ::testing::WithParamInterface<ContactCase> {};

TEST_P(ContactSpeed, NeverExceedsSpeedTimesTheContactFactor) {
  const ContactCase& c = GetParam();
  D3DXVECTOR3 direction = c.Direction;
  D3DXVec3Normalize(&direction, &direction);
  const Response r =
      Respond(0.0f, 1.0f, c.Radius, c.Contact, {0.0f, 0.3f, 0.0f}, c.Speed, direction);
  ASSERT_TRUE(r.Hit);
  const float length = std::sqrt(r.Velocity.x * r.Velocity.x + r.Velocity.y * r.Velocity.y +
                                 r.Velocity.z * r.Velocity.z);
  EXPECT_LE(length, c.Speed * c.Contact * (1.0f + 1e-6f));
  EXPECT_NEAR(r.Velocity.y, 0.0f, 1e-5f);
}

INSTANTIATE_TEST_SUITE_P(Cases, ContactSpeed,
                         ::testing::Values(ContactCase{{1.0f, -1.0f, 0.0f}, 1.0f, 5.0f, 1.0f},
                                           ContactCase{{3.0f, -0.2f, 1.0f}, 2.0f, 8.0f, 0.7f},
                                           ContactCase{{0.1f, -1.0f, 0.0f}, 0.5f, 0.1f, 2.0f},
                                           ContactCase{{0.0f, -1.0f, 0.0f}, 4.0f, 1.0f, 1.0f}));

// A smoke particle of size 1 falling one unit per step from (0, 5, 0).
class SmokeCollisionStage : public SmokeSurface {
 protected:
  void SetUp() override {
    SmokeSurface::SetUp();
    LinkSmoke();
    SetSmokeValue(Smoke::kLinkCollisionEnabled, 1.0f);
    SetSmokeValue(Smoke::kLinkDebugColours, 1.0f);
  }
  Particle& Smoker() {
    Particle& p = PlaceParticle(0, {0.0f, 5.0f, 0.0f}, kDown);
    p.Size = 1.0f;
    p.SizeMultiplier = 1.0f;
    return p;
  }
};

TEST_F(SmokeCollisionStage, NoSurfaceInReachShowsWhiteAndMovesOn) {
  Start();
  Smoker();
  StepOnce();
  EXPECT_EQ(P(0).Color, 0x00FFFFFFu);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 4.0f, 0.0f));
}

TEST_F(SmokeCollisionStage, ASurfaceAheadSlowsItAndTheMoveStageAddsTheVelocityAgain) {
  SetSmokeValue(Smoke::kLinkCollisionProbeMinimum, 10.0f);
  SetSmokeValue(Smoke::kLinkApproachSpeedFactor, 0.25f);
  Start();
  Smoker();
  StepOnce();
  EXPECT_EQ(P(0).Color, 0x00FF0000u);
  EXPECT_EQ(P(0).Velocity, D3DXVECTOR3(0.0f, -0.25f, 0.0f));
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 4.5f, 0.0f));
}

TEST_F(SmokeCollisionStage, WithRecheckThePlacedPositionIsNotMovedAgain) {
  SetSmokeValue(Smoke::kLinkCollisionProbeMinimum, 10.0f);
  SetSmokeValue(Smoke::kLinkApproachSpeedFactor, 0.25f);
  SetSmokeValue(Smoke::kLinkRecheckCollision, 1.0f);
  Start();
  Smoker();
  StepOnce();
  EXPECT_EQ(P(0).Color, 0x00FF0000u);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 4.75f, 0.0f));
  EXPECT_FALSE(emitter->PlacedBySmokeCollision);  // cleared by the move stage
}

TEST_F(SmokeCollisionStage, RecheckHoldsBackAParticleThatWouldStillHit) {
  // Approaching five times faster reaches the surface within the new step: held where it was.
  SetSmokeValue(Smoke::kLinkCollisionProbeMinimum, 10.0f);
  SetSmokeValue(Smoke::kLinkApproachSpeedFactor, 5.0f);
  SetSmokeValue(Smoke::kLinkRecheckCollision, 1.0f);
  Start();
  Smoker();
  StepOnce();
  EXPECT_EQ(P(0).Color, 0x0000FF00u);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 5.0f, 0.0f));
  EXPECT_EQ(P(0).Velocity, kOrigin);
}

TEST_F(SmokeCollisionStage, WithoutDebugColoursTheColourEnvelopesStayInCharge) {
  SetSmokeValue(Smoke::kLinkDebugColours, 0.0f);
  SetSmokeValue(Smoke::kLinkCollisionProbeMinimum, 10.0f);
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 7.0f}});
  Start();
  Smoker();
  StepOnce();
  EXPECT_EQ(P(0).Color, 7u << 16);
}

TEST_F(SmokeCollisionStage, IsOffWithoutCollisionEnabled) {
  SetSmokeValue(Smoke::kLinkCollisionEnabled, 0.0f);
  SetSmokeValue(Smoke::kLinkCollisionProbeMinimum, 10.0f);
  SetSmokeValue(Smoke::kLinkApproachSpeedFactor, 0.25f);
  Start();
  Smoker().Color = 0x01010101u;
  StepOnce();
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 4.0f, 0.0f));
  EXPECT_EQ(P(0).Color, 0x01010101u);  // debug colours leave it alone
}

class SurfaceLookAhead : public SmokeSurface {
 protected:
  void SetUp() override {
    SmokeSurface::SetUp();
    LinkSmoke();
    SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}});
    SetSmokeEnvelope(Smoke::kLinkSurfaceRepulsionEnvelope, {{0.0f, 5.0f}, {4.0f, 1.0f}});
  }
};

TEST_F(SurfaceLookAhead, PushesAwayFromTheSurfaceAheadByDistance) {
  Start();
  PlaceParticle(0, {0.0f, 2.0f, 0.0f}, kDown);
  StepOnce();
  // From (0, 2, 0) the probe of length 4 meets the plane 2 below: value 3 at distance 2.
  EXPECT_EQ(P(0).SmokeForce, D3DXVECTOR3(0.0f, 3.0f, 0.0f));
  StepOnce();
  EXPECT_EQ(P(0).Velocity, D3DXVECTOR3(0.0f, 2.0f, 0.0f));
}

// On the plane, the probe meets the surface at the particle itself: no direction, no force.
TEST_F(SurfaceLookAhead, AHitAtTheParticleItselfGivesNoForce) {
  Start();
  PlaceParticle(0, kOrigin, kDown);
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce, kOrigin);
}

TEST_F(SurfaceLookAhead, AStillParticleLooksNowhere) {
  Start();
  PlaceParticle(0, {0.0f, 1.0f, 0.0f}, kOrigin);
  StepOnce();
  EXPECT_EQ(P(0).SmokeForce, kOrigin);
}

}  // namespace
