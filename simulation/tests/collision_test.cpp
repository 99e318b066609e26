// Collision response against a ground plane: report, attach, slide, bounce and die, with the exact
// rand() draws each outcome takes.
#include <cmath>
#include <cstdlib>

#include "host/multi_collision_manager.h"
#include "simulation/tests/emitter_fixture.h"

namespace {

constexpr D3DXVECTOR3 kUp{0.0f, 1.0f, 0.0f};
constexpr D3DXVECTOR3 kOrigin{0.0f, 0.0f, 0.0f};

// A ground plane y = 0 facing up, particles placed by hand, 50 logic steps per second.
class Collision : public EmitterTest {
 protected:
  void SetUp() override {
    LinkBasics(100.0f, 50.0f, 0.0f);
    manager = Make<Tev_MultiCollisionManager>();
    ASSERT_EQ(manager->AddPlane(kOrigin, kUp), 0);
    ASSERT_TRUE(emitter->SetChild(kLinkMultiCollisionManager, manager));
  }
  // One step above the ground, falling one unit per step: it hits in its next step.
  Particle& Falling(int index, float x = 0.0f) {
    return PlaceParticle(index, {x, 1.0f, 0.0f}, {0.0f, -1.0f, 0.0f});
  }
  bool Draw(const std::vector<int>& s, int& next, float rate) {
    return static_cast<float>(s[static_cast<std::size_t>(next++)] % 100) * 0.01f < rate;
  }

  Tev_MultiCollisionManager* manager = nullptr;
};

TEST_F(Collision, EveryHitSticksJustAboveTheSurfaceWithItsAgeRestarted) {
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedSlideRate, 0.0f);
  SetValue(kLinkAttachedLifespan, 100.0f);
  Start();
  Particle& p = Falling(0);
  p.Age = 5.0f;
  p.SpinSpeed = 0.3f;
  const std::vector<int> s = RandSequence(17u, 8);
  StepOnce();
  EXPECT_TRUE(P(0).Attached);
  EXPECT_TRUE(P(0).Active);
  EXPECT_FALSE(P(0).Sliding);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.01f, 0.0f));
  EXPECT_EQ(P(0).Velocity, kOrigin);
  EXPECT_EQ(P(0).Age, 0.0f);
  EXPECT_EQ(P(0).SpinSpeed, 0.0f);
  EXPECT_EQ(DrawsTaken(s), 2);  // attach, then slide

  StepOnce();
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.01f, 0.0f));
  EXPECT_EQ(P(0).Age, 0.02f);
}

TEST_F(Collision, RainFromTheEmitterSettlesOnTheGround) {
  SetValue(kLinkBirthsPerSecond, 20.0f);
  SetEmitterMesh({{0.0f, 3.0f, 0.0f}}, {});
  SetVector(kLinkInitialForceOverride, {0.0f, -1.0f, 0.0f});
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedLifespan, 100.0f);
  Start();
  RunFrames(20, 50.0);
  int attached = 0;
  for (const Particle& p : emitter->Particles) {
    if (!p.Active) continue;
    if (p.Attached) {
      ++attached;
      EXPECT_EQ(p.Position, D3DXVECTOR3(0.0f, 0.01f, 0.0f));
      EXPECT_EQ(p.Velocity, kOrigin);
    } else {
      EXPECT_GT(p.Position.y, 0.0f);
    }
  }
  EXPECT_GT(attached, 10);
}

TEST_F(Collision, AttachedParticlesShowTheLowerHalfOfTheCompositeTexture) {
  auto* particleTexture = Make<Qen_TextureChannel>();
  auto* attachedTexture = Make<Qen_TextureChannel>();
  ASSERT_GE(particleTexture->CreateTexture(4, 4), 0);
  ASSERT_GE(attachedTexture->CreateTexture(4, 4), 0);
  ASSERT_TRUE(emitter->SetChild(kLinkParticleTexture, particleTexture));
  ASSERT_TRUE(emitter->SetChild(kLinkAttachedTexture, attachedTexture));
  SetValue(kLinkAttachRate, 1.0f);
  Start();
  ASSERT_TRUE(emitter->HasCompositeTexture);
  Falling(0);
  Falling(1, 5.0f).Velocity = {0.0f, 0.0f, 0.0f};
  StepOnce();
  ASSERT_TRUE(P(0).Attached);
  ASSERT_NE(emitter->LocalVertices, nullptr);
  EXPECT_EQ(emitter->LocalVertices[0].Tv, 0.5f);
  EXPECT_EQ(emitter->LocalVertices[2].Tv, 1.0f);
  EXPECT_EQ(emitter->LocalVertices[4].Tv, 0.0f);
  EXPECT_EQ(emitter->LocalVertices[6].Tv, 0.5f);
}

struct BounceCase {
  const char* Name;
  D3DXVECTOR3 Velocity;
  D3DXVECTOR3 Expected;
};

class Bounce : public Collision, public ::testing::WithParamInterface<BounceCase> {};

TEST_P(Bounce, MirrorsTheDirectionAtHalfSpeed) {
  SetValue(kLinkBounceRate, 1.0f);
  Start();
  Particle& p = Falling(0);
  p.Velocity = GetParam().Velocity;
  p.Bouncing = false;
  const std::vector<int> s = RandSequence(23u, 8);
  StepOnce();
  EXPECT_TRUE(P(0).Active);
  EXPECT_TRUE(P(0).Bouncing);
  EXPECT_NEAR(P(0).Velocity.x, GetParam().Expected.x, 1e-6f);
  EXPECT_NEAR(P(0).Velocity.y, GetParam().Expected.y, 1e-6f);
  EXPECT_NEAR(P(0).Velocity.z, GetParam().Expected.z, 1e-6f);
  // It moves by the new velocity in the same update.
  EXPECT_NEAR(P(0).Position.y, 1.0f + GetParam().Expected.y, 1e-6f);
  EXPECT_EQ(DrawsTaken(s), 2);  // attach (fails at rate 0), then bounce
}

INSTANTIATE_TEST_SUITE_P(
    Directions, Bounce,
    ::testing::Values(BounceCase{"Straight", {0.0f, -1.0f, 0.0f}, {0.0f, 0.5f, 0.0f}},
                      BounceCase{"Diagonal", {3.0f, -4.0f, 0.0f}, {1.5f, 2.0f, 0.0f}},
                      BounceCase{"Fast", {0.0f, -4.0f, 3.0f}, {0.0f, 2.0f, 1.5f}}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Collision, WithoutAnySuccessfulRateAHitKillsButTheUpdateRunsOn) {
  SetValue(kLinkBounceRate, 0.0f);
  Start();
  Falling(0).Color = 0x12345678u;
  StepOnce();
  EXPECT_FALSE(P(0).Active);
  EXPECT_EQ(P(0).Position, kOrigin);  // the move stage still ran
  EXPECT_EQ(P(0).Color, 0u);          // and so did the colour stage
}

TEST_F(Collision, AnAttachRateDecidesEachHitByItsOwnDraws) {
  SetValue(kLinkAttachRate, 0.3f);
  Start();
  constexpr int kCount = 100;
  for (int i = 0; i < kCount; ++i) Falling(i, static_cast<float>(i));
  const std::vector<int> s = RandSequence(31u, 2 * kCount + 4);
  StepOnce();
  int next = 0;
  int attached = 0;
  for (int i = 0; i < kCount; ++i) {
    const bool attaches = Draw(s, next, 0.3f);
    ++next;  // the slide draw, or the bounce draw at rate 0
    EXPECT_EQ(P(i).Attached, attaches) << i;
    EXPECT_EQ(P(i).Active, attaches) << i;
    attached += attaches;
  }
  EXPECT_EQ(DrawsTaken(s), 2 * kCount);
  EXPECT_GT(attached, 15);
  EXPECT_LT(attached, 45);
}

TEST_F(Collision, ReportsAloneLetParticlesThrough) {
  SetValue(kLinkCollisionReportRate, 1.0f);
  auto* id = SetValue(kLinkOutCollisionId, 7.0f);
  auto* position = SetVector(kLinkOutCollisionPosition, {9.0f, 9.0f, 9.0f});
  auto* normal = SetVector(kLinkOutCollisionNormal, {9.0f, 9.0f, 9.0f});
  Start();
  Falling(0, 3.0f);
  const std::vector<int> s = RandSequence(5u, 4);
  StepOnce();
  EXPECT_EQ(id->GetValue(), 1.0f);
  EXPECT_EQ(position->GetVector(), D3DXVECTOR3(3.0f, 0.0f, 0.0f));
  EXPECT_EQ(normal->GetVector(), kUp);
  EXPECT_EQ(DrawsTaken(s), 1);
  EXPECT_TRUE(P(0).Active);
  EXPECT_FALSE(P(0).Attached);

  // On the plane it is hit again; below it, no more: the ID goes back to 0, the vectors stay.
  StepOnce();
  StepOnce();
  EXPECT_LT(P(0).Position.y, 0.0f);
  EXPECT_EQ(id->GetValue(), 0.0f);
  EXPECT_EQ(position->GetVector(), D3DXVECTOR3(3.0f, 0.0f, 0.0f));
  EXPECT_EQ(normal->GetVector(), kUp);
}

TEST_F(Collision, TheLastReportOfAFrameStandsAndReportsFollowTheRate) {
  SetValue(kLinkCollisionReportRate, 0.5f);
  auto* position = SetVector(kLinkOutCollisionPosition, {-1.0f, -1.0f, -1.0f});
  Start();
  constexpr int kCount = 40;
  for (int i = 0; i < kCount; ++i) Falling(i, static_cast<float>(i));
  const std::vector<int> s = RandSequence(41u, kCount + 4);
  StepOnce();
  int next = 0;
  int last = -1;
  for (int i = 0; i < kCount; ++i)
    if (Draw(s, next, 0.5f)) last = i;
  ASSERT_GE(last, 0);
  EXPECT_EQ(position->GetVector(), D3DXVECTOR3(static_cast<float>(last), 0.0f, 0.0f));
  EXPECT_EQ(DrawsTaken(s), kCount);
}

TEST_F(Collision, TheReportedIdIsTheObjectsIdPlusOne) {
  manager->ClearObjects();
  ASSERT_EQ(manager->AddPlane({0.0f, 50.0f, 0.0f}, {0.0f, -1.0f, 0.0f}), 0);
  ASSERT_EQ(manager->AddPlane(kOrigin, kUp), 1);
  SetValue(kLinkCollisionReportRate, 1.0f);
  auto* id = SetValue(kLinkOutCollisionId, 0.0f);
  Start();
  Falling(0);
  StepOnce();
  EXPECT_EQ(id->GetValue(), 2.0f);
}

TEST_F(Collision, ASlidingParticleStaysAtItsHeightAndIsNeverReported) {
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedSlideRate, 1.0f);
  SetValue(kLinkAttachedSlidingHeight, 0.2f);
  SetValue(kLinkCollisionReportRate, 1.0f);
  auto* id = SetValue(kLinkOutCollisionId, 0.0f);
  SetVector(kLinkGlobalForce, {0.25f, -1.0f, 0.0f});
  Start();
  Falling(0).Velocity = {-0.25f, 0.0f, 0.0f};  // with the force: one unit down this step
  StepOnce();
  ASSERT_TRUE(P(0).Sliding);
  EXPECT_FALSE(P(0).Attached);
  EXPECT_EQ(P(0).SurfaceNormal, kUp);
  EXPECT_EQ(id->GetValue(), 1.0f);  // reported as it arrived

  float x = P(0).Position.x;
  const std::vector<int> s = RandSequence(3u, 4);
  for (int step = 0; step < 10; ++step) {
    StepOnce();
    EXPECT_TRUE(P(0).Active);
    EXPECT_EQ(P(0).Position.y, 0.2f) << step;
    EXPECT_GT(P(0).Position.x, x) << step;
    x = P(0).Position.x;
    EXPECT_EQ(id->GetValue(), 0.0f) << step;
  }
  EXPECT_EQ(DrawsTaken(s), 0);
}

TEST_F(Collision, SlidingStartsAtTheSlidingHeightWithItsLookCaptured) {
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedSlideRate, 1.0f);
  SetValue(kLinkAttachedSlidingHeight, 0.5f);
  // Flat around the middle of life, zero at its ends.
  SetEnvelope(kLinkSizeEnvelope, {{0.0f, 0.0f}, {0.4f, 1.25f}, {0.6f, 1.25f}, {1.0f, 0.0f}});
  SetEnvelope(kLinkVertexAlphaEnvelope,
              {{0.0f, 0.0f}, {0.4f, 300.0f}, {0.6f, 300.0f}, {1.0f, 0.0f}});
  Start();
  Particle& p = Falling(0);
  p.Position.y = 1.5f;
  p.Age = 49.979f;  // normalized age 0.5 at the step
  p.AttachRed = 77;
  StepOnce();
  ASSERT_TRUE(P(0).Sliding);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(0.0f, 0.5f, 0.0f));
  EXPECT_EQ(P(0).Velocity, kOrigin);
  EXPECT_EQ(P(0).AttachSize, 1.25f);
  EXPECT_EQ(P(0).AttachAlpha, 255);
  EXPECT_EQ(P(0).AttachRed, 77);  // no red envelope: kept
}

TEST_F(Collision, AStuckParticleLivesOutItsAttachedLifespanThenEnds) {
  SetValue(kLinkAttachRate, 1.0f);
  SetValue(kLinkAttachedLifespan, 0.5f);
  SetValue(kLinkAlignToNormals, 1.0f);
  SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 200.0f}});
  SetEnvelope(kLinkAttachedAlphaOffsetEnvelope, {{0.0f, 1.0f}, {1.0f, 0.0f}});
  Start();
  Falling(0);
  StepOnce();
  ASSERT_TRUE(P(0).Attached);
  EXPECT_EQ(P(0).AttachAlpha, 200);
  EXPECT_EQ(P(0).LookAtPoint, D3DXVECTOR3(0.0f, 1.01f, 0.0f));
  RunFrame(250.0);  // a quarter second into its attached life: alpha half way down
  EXPECT_TRUE(P(0).Active);
  EXPECT_EQ(P(0).Color >> 24, 100u);
  EXPECT_EQ(P(0).LookAtPoint, D3DXVECTOR3(0.0f, 1.01f, 0.0f));
  RunFrame(300.0);
  EXPECT_FALSE(P(0).Active);
  EXPECT_FALSE(P(0).Attached);
}

TEST_F(Collision, WithoutAnAttachedLifespanAStuckParticleNeverEnds) {
  SetValue(kLinkAttachRate, 1.0f);
  Start();
  Falling(0);
  StepOnce();
  ASSERT_TRUE(P(0).Attached);
  RunFrames(5, 1000.0);
  EXPECT_TRUE(P(0).Active);
  EXPECT_TRUE(P(0).Attached);
  EXPECT_EQ(emitter->AttachedLifespan, -1.0f);
}

TEST_F(Collision, NoCollisionWithoutTheManagerOrAnyRate) {
  Start();
  Falling(0);
  const std::vector<int> s = RandSequence(3u, 4);
  StepOnce();
  EXPECT_EQ(P(0).Position.y, 0.0f);
  StepOnce();
  EXPECT_EQ(P(0).Position.y, -1.0f);

  SetValue(kLinkAttachRate, 1.0f);
  Unlink(kLinkMultiCollisionManager);
  Falling(1);
  StepOnce();
  StepOnce();
  EXPECT_EQ(P(1).Position.y, -1.0f);
  EXPECT_EQ(DrawsTaken(s), 0);
}

TEST_F(Collision, SettingsReadTheirDefaultsWhenUnlinked) {
  SetValue(kLinkCollisionReportRate, 0.4f);
  Start();
  StepOnce();
  EXPECT_TRUE(emitter->ReportCollisions);
  EXPECT_FALSE(emitter->CollisionResponse);
  Unlink(kLinkCollisionReportRate);
  SetValue(kLinkBounceRate, 0.2f);
  StepOnce();
  EXPECT_FALSE(emitter->ReportCollisions);
  EXPECT_EQ(emitter->CollisionReportRate, 0.4f);  // kept
  EXPECT_TRUE(emitter->CollisionResponse);
  EXPECT_EQ(emitter->BounceRate, 0.2f);
  EXPECT_EQ(emitter->AttachRate, 0.0f);
  EXPECT_EQ(emitter->AttachedLifespan, -1.0f);
  EXPECT_EQ(emitter->AttachedSlidingHeight, 0.0f);
}

}  // namespace
