// Interpolation: the drawn position, facing point and spin angle a fraction into the next step.
#include "simulation/tests/emitter_fixture.h"

namespace {

class Interpolation : public EmitterTest {
 protected:
  void SetUp() override { LinkBasics(3.0f, 50.0f, 0.0f); }
};

TEST_F(Interpolation, DrawsAFractionOfTheNextStepAheadForEveryRecord) {
  Start();
  PlaceParticle(0, {1.0f, 1.0f, 1.0f}, {0.0f, 0.0f, 2.0f});
  Particle& free = PlaceParticle(1, {0.0f, 0.0f, 0.0f}, {4.0f, 0.0f, 0.0f});
  free.Active = false;
  emitter->InterpolateParticles(0.25f);
  EXPECT_EQ(P(0).RenderPosition, D3DXVECTOR3(1.0f, 1.0f, 1.5f));
  EXPECT_EQ(P(1).RenderPosition, D3DXVECTOR3(1.0f, 0.0f, 0.0f));
  emitter->InterpolateParticles(0.0f);
  EXPECT_EQ(P(0).RenderPosition, P(0).Position);
}

TEST_F(Interpolation, AFrameBlendsWithTheBankedFraction) {
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 4.0f, 0.0f});
  RunFrame(35.0);  // one step, 15 ms of 20 banked
  EXPECT_EQ(P(0).Position.y, 4.0f);
  EXPECT_FLOAT_EQ(P(0).RenderPosition.y, 4.0f + 4.0f * 0.75f);
}

struct FacingCase {
  const char* Name;
  bool Local;
  bool Align;
  bool Sliding;
  bool Attached;
  D3DXVECTOR3 Expected;
};

class Facing : public Interpolation, public ::testing::WithParamInterface<FacingCase> {};

// Position (1, 0, 0), velocity (0, 2, 0), t = 0.5: drawn at (1, 1, 0); LookAt (0, 0, 5); surface
// normal (0, 0, -1); an attached particle's facing point is left at (7, 7, 7).
TEST_P(Facing, FollowsLookAtLocalAndSlidingAlignment) {
  const FacingCase& c = GetParam();
  SetVector(kLinkLookAt, {0.0f, 0.0f, 5.0f});
  SetValue(kLinkLookAtLocal, c.Local ? 1.0f : 0.0f);
  SetValue(kLinkAlignToNormals, c.Align ? 1.0f : 0.0f);
  Start();
  RunFrame(1.0);  // reads the links; no step
  Particle& p = PlaceParticle(0, {1.0f, 0.0f, 0.0f}, {0.0f, 2.0f, 0.0f});
  p.Sliding = c.Sliding;
  p.Attached = c.Attached;
  p.SurfaceNormal = {0.0f, 0.0f, -1.0f};
  p.LookAtPoint = {7.0f, 7.0f, 7.0f};
  emitter->InterpolateParticles(0.5f);
  EXPECT_EQ(P(0).LookAtPoint, c.Expected);
}

INSTANTIATE_TEST_SUITE_P(
    Rules, Facing,
    ::testing::Values(
        FacingCase{"Absolute", false, false, false, false, {0.0f, 0.0f, 5.0f}},
        FacingCase{"LocalFromLogicPosition", true, false, false, false, {1.0f, 0.0f, 5.0f}},
        FacingCase{"SlidingAlignedFromDrawnPosition", true, true, true, false, {1.0f, 1.0f, -1.0f}},
        FacingCase{"AlignedButNotSliding", false, true, false, false, {0.0f, 0.0f, 5.0f}},
        FacingCase{"SlidingNotAligned", false, false, true, false, {0.0f, 0.0f, 5.0f}},
        FacingCase{"AttachedKeepsItsPoint", true, true, true, true, {7.0f, 7.0f, 7.0f}}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Interpolation, SpinAngleUsesTheUnscaledSpeed) {
  SetValue(kLinkSpinStart, 0.0f);
  SetValue(kLinkSimulationScaler, 3.0f);
  Start();
  RunFrame(1.0);
  Particle& p = PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  p.SpinAngle = 10.0f;
  p.SpinSpeed = 4.0f;
  emitter->InterpolateParticles(0.5f);
  EXPECT_EQ(P(0).RenderSpinAngle, 12.0f);
}

TEST_F(Interpolation, WithoutSpinTheDrawnAngleIsKept) {
  Start();
  RunFrame(1.0);
  Particle& p = PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  p.SpinAngle = 10.0f;
  p.SpinSpeed = 4.0f;
  p.RenderSpinAngle = 3.0f;
  emitter->InterpolateParticles(0.5f);
  EXPECT_EQ(P(0).RenderSpinAngle, 3.0f);
}

}  // namespace
