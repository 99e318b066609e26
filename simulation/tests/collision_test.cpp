// Collision response against a ground plane (report, attach, slide, bounce, die, with the exact
// rand() draws each outcome takes) and smoke against it (SmokeCollisionResponse, the smoke
// collision stage, the surface look-ahead).
#include <cmath>

#include "simulation/tests/emitter_fixture.h"

namespace {

constexpr D3DXVECTOR3 kUp{0.0f, 1.0f, 0.0f};
constexpr D3DXVECTOR3 kDown{0.0f, -1.0f, 0.0f};

// Particles placed by hand over the ground, 50 logic steps per second.
class Collision : public EmitterTest {
 protected:
  void SetUp() override {
    LinkBasics(100.0f, 50.0f, 0.0f);
    Link(*emitter, kLinkMultiCollisionManager, Make<Tev_MultiCollisionManager>())
        ->AddPlane(kZero, kUp);
  }
  // One unit above the ground, falling one unit per step: it hits in its next step.
  Particle& Falling(int index, float x = 0.0f) {
    return PlaceParticle(index, {x, 1.0f, 0.0f}, kDown);
  }
};

TEST_F(Collision, AnAttachingHitSticksJustAboveTheSurfaceWithItsAgeRestarted) {
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedSlideRate, 0.0f);
  SetValue(kLinkAlignToNormals, 1.0f);
  SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 200.0f}});
  Start();
  Particle& p = Falling(0);
  p.Age = 5.0f;
  p.SpinSpeed = 0.3f;
  const std::vector<int> s = RandSequence(17u, 8);
  StepOnce();
  EXPECT_EQ(DrawsTaken(s), 2);  // attach, then slide
  EXPECT_TRUE(P(0).Attached && !P(0).Sliding);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.01f, 0.0f));
  EXPECT_EQ(P(0).Velocity, kZero);
  EXPECT_EQ(P(0).Age, 0.0f);
  EXPECT_EQ(P(0).SpinSpeed, 0.0f);
  EXPECT_EQ(P(0).AttachAlpha, 200);
  EXPECT_EQ(P(0).LookAtPoint, D3DXVECTOR3(0.0f, 1.01f, 0.0f));
}

// The mirror image of the direction at half speed; it moves by it in the same update.
TEST_F(Collision, ABouncingHitMirrorsTheDirectionAtHalfSpeed) {
  const D3DXVECTOR3 cases[][2] = {
      {{0, -1, 0}, {0, 0.5f, 0}}, {{3, -4, 0}, {1.5f, 2, 0}}, {{0, -4, 3}, {0, 2, 1.5f}}};
  SetValue(kLinkBounceRate, 1.0f);
  Start();
  for (const auto& c : cases) {
    Falling(0).Velocity = c[0];
    P(0).Bouncing = false;
    const std::vector<int> s = RandSequence(23u, 8);
    StepOnce();
    EXPECT_EQ(DrawsTaken(s), 2);  // attach (fails at rate 0), then bounce
    EXPECT_TRUE(P(0).Active && P(0).Bouncing);
    ExpectNear(P(0).Velocity, c[1]);
    ExpectNear(P(0).Position, D3DXVECTOR3(0.0f, 1.0f, 0.0f) + c[1]);
  }
}

// With "Attach Rate" 0.3 alone, each hit attaches by its own draw and dies otherwise; the
// stages after the collision still run for a particle that died.
TEST_F(Collision, EachHitIsDecidedByItsOwnDraws) {
  SetValue(kLinkAttachRate, 0.3f);
  Start();
  for (int i = 0; i < 100; ++i) Falling(i, static_cast<float>(i)).Color = 0x12345678u;
  const std::vector<int> s = RandSequence(31u, 204);
  StepOnce();
  int attached = 0;
  for (int i = 0; i < 100; ++i) {
    const bool attaches = static_cast<float>(s[2 * i] % 100) * 0.01f < 0.3f;
    EXPECT_EQ(P(i).Attached, attaches) << i;
    EXPECT_EQ(P(i).Active, attaches) << i;
    EXPECT_EQ(P(i).Position.y, attaches ? 0.01f : 0.0f) << i;  // the later stages ran
    EXPECT_EQ(P(i).Color, 0u) << i;
    attached += attaches;
  }
  EXPECT_EQ(DrawsTaken(s), 200);  // the slide draw, or the bounce draw at rate 0
  EXPECT_GT(attached, 15);
  EXPECT_LT(attached, 45);
}

// Reports follow their rate, the last of a frame stands, the particles fly on; a frame without a
// report sets the ID back to 0 and keeps the vectors.
TEST_F(Collision, ReportsAloneLetParticlesThrough) {
  SetValue(kLinkCollisionReportRate, 0.5f);
  auto* id = SetValue(kLinkOutCollisionId, 7.0f);
  auto* position = SetVector(kLinkOutCollisionPosition, {-1.0f, -1.0f, -1.0f});
  auto* normal = SetVector(kLinkOutCollisionNormal, {9.0f, 9.0f, 9.0f});
  Start();
  for (int i = 0; i < 40; ++i) Falling(i, static_cast<float>(i));
  const std::vector<int> s = RandSequence(41u, 44);
  StepOnce();
  int last = -1;
  for (int i = 0; i < 40; ++i)
    if (static_cast<float>(s[i] % 100) * 0.01f < 0.5f) last = i;
  EXPECT_EQ(DrawsTaken(s), 40);
  EXPECT_EQ(id->GetValue(), 1.0f);  // object 0
  EXPECT_EQ(position->GetVector(), D3DXVECTOR3(static_cast<float>(last), 0.0f, 0.0f));
  EXPECT_EQ(normal->GetVector(), kUp);
  EXPECT_EQ(ActiveCount(), 40);
  StepOnce();  // on the plane: hit again
  const D3DXVECTOR3 kept = position->GetVector();
  StepOnce();  // below it: no report
  EXPECT_EQ(id->GetValue(), 0.0f);
  EXPECT_EQ(position->GetVector(), kept);
  EXPECT_LT(P(0).Position.y, 0.0f);
}

// Starting to slide captures the look at the hit; a sliding particle then stays at its height
// along the surface, with no draw and no report.
TEST_F(Collision, ASlidingParticleStaysAtItsHeightAndIsNeverReported) {
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedSlideRate, 1.0f);
  SetValue(kLinkAttachedSlidingHeight, 0.2f);
  SetValue(kLinkCollisionReportRate, 1.0f);
  SetEnvelope(kLinkSizeEnvelope, {{0.0f, 1.25f}});
  auto* id = SetValue(kLinkOutCollisionId, 0.0f);
  SetVector(kLinkGlobalForce, {0.25f, -1.0f, 0.0f});
  Start();
  Falling(0).Velocity = {-0.25f, 0.0f, 0.0f};  // with the force: one unit down this step
  StepOnce();
  ASSERT_TRUE(P(0).Sliding && !P(0).Attached);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.2f, 0.0f));
  EXPECT_EQ(P(0).SurfaceNormal, kUp);
  EXPECT_EQ(P(0).AttachSize, 1.25f);
  EXPECT_EQ(id->GetValue(), 1.0f);  // reported as it arrived
  const std::vector<int> s = RandSequence(3u, 4);
  for (int step = 0; step < 3; ++step) {
    const float x = P(0).Position.x;
    StepOnce();
    EXPECT_EQ(P(0).Position.y, 0.2f);
    EXPECT_GT(P(0).Position.x, x);
    EXPECT_EQ(id->GetValue(), 0.0f);
  }
  EXPECT_EQ(DrawsTaken(s), 0);
}

// In contact the motion continues along the surface, never faster than speed x contact factor.
TEST_F(Collision, SmokeCollisionResponseInContactSlidesAlongTheSurface) {
  const struct {
    D3DXVECTOR3 Direction;
    float Speed, Radius, Contact;
  } cases[] = {{{1, -2, 0}, std::sqrt(5.0f), 0.5f, 0.5f},
               {{3, -0.2f, 1}, 2.0f, 8.0f, 0.7f},
               {{0.1f, -1, 0}, 0.5f, 0.1f, 2.0f}};
  for (const auto& c : cases) {
    D3DXVECTOR3 at{0.0f, 0.3f, 0.0f}, direction, position, velocity, normal;
    D3DXVec3Normalize(&direction, &c.Direction);
    ASSERT_TRUE(emitter->SmokeCollisionResponse(0.0f, 1.0f, c.Radius, c.Contact, &at, c.Speed,
                                                &direction, &position, &velocity, &normal));
    // The step's end projected onto the plane, from the hit, capped at the speed.
    const D3DXVECTOR3 hit = at + direction * (at.y / -direction.y);
    D3DXVECTOR3 along = at + direction * (c.Speed + c.Radius) - hit;
    along.y = 0.0f;
    if (D3DXVec3Length(&along) > c.Speed) along *= c.Speed / D3DXVec3Length(&along);
    ExpectNear(velocity, along * c.Contact, 1e-4f);
    ExpectNear(position, at + velocity, 1e-4f);
  }
}

// A smoke particle of size 1 falling one unit per step from (0, 5, 0), with debug colours.
TEST_F(Collision, TheSmokeCollisionStageSteersRechecksAndColours) {
  const struct {
    float ProbeMinimum, Approach, Recheck, Enabled, Debug;
    std::uint32_t Color;
    float Y, VelocityY;
  } cases[] = {
      {0.0f, 0.25f, 0, 1, 1, 0x00FFFFFF, 4.0f, -1.0f},     // nothing in reach: white, moves on
      {10.0f, 0.25f, 0, 1, 1, 0x00FF0000, 4.5f, -0.25f},   // slowed; the move adds it again
      {10.0f, 0.25f, 1, 1, 1, 0x00FF0000, 4.75f, -0.25f},  // rechecked: placed, not moved again
      {10.0f, 5.0f, 1, 1, 1, 0x0000FF00, 5.0f, 0.0f},      // would still hit: held back
      {10.0f, 0.25f, 0, 1, 0, 7u << 16, 4.5f, -0.25f},     // colour envelopes stay in charge
      {10.0f, 0.25f, 0, 0, 1, 0x01010101, 4.0f, -1.0f}};   // off: colour left alone
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 7.0f}});
  LinkSmoke();
  Start();
  for (const auto& c : cases) {
    SetSmokeValue(Smoke::kLinkCollisionProbeMinimum, c.ProbeMinimum);
    SetSmokeValue(Smoke::kLinkApproachSpeedFactor, c.Approach);
    SetSmokeValue(Smoke::kLinkRecheckCollision, c.Recheck);
    SetSmokeValue(Smoke::kLinkCollisionEnabled, c.Enabled);
    SetSmokeValue(Smoke::kLinkDebugColours, c.Debug);
    Particle& p = PlaceParticle(0, {0.0f, 5.0f, 0.0f}, kDown);
    p.Size = 1.0f;
    p.Color = 0x01010101u;
    StepOnce();
    EXPECT_EQ(P(0).Color, c.Color);
    EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, c.Y, 0.0f));
    EXPECT_EQ(P(0).Velocity.y, c.VelocityY);
    EXPECT_FALSE(emitter->PlacedBySmokeCollision);
  }
}

// Strength 1, envelope 5 at 0 down to 1 at 4: from 2 above the ground the push is 3; none for a
// hit at the particle itself or for a particle that does not move.
TEST_F(Collision, TheSurfaceLookAheadPushesAwayFromTheSurfaceAhead) {
  const D3DXVECTOR3 cases[][3] = {
      {{0, 2, 0}, kDown, {0, 3, 0}}, {kZero, kDown, kZero}, {{0, 1, 0}, kZero, kZero}};
  LinkSmoke();
  SetSmokeEnvelope(Smoke::kLinkForceStrengthEnvelope, {{0.0f, 1.0f}});
  SetSmokeEnvelope(Smoke::kLinkSurfaceRepulsionEnvelope, {{0.0f, 5.0f}, {4.0f, 1.0f}});
  Start();
  for (const auto& c : cases) {
    PlaceParticle(0, c[0], c[1]);
    StepOnce();
    EXPECT_EQ(P(0).SmokeForce, c[2]);
  }
}

}  // namespace
