// Size and colour over life, the sliding size, the attached-particle update, and the drawn state
// interpolated between logic steps.
#include <optional>

#include "simulation/tests/emitter_fixture.h"

namespace {

class Envelopes : public EmitterTest {
 protected:
  void SetUp() override { LinkBasics(3.0f, 50.0f, 0.0f); }
  // A record attached at (1, 2, 3): captured bytes 200, 100, 50, 10 and size 2 at multiplier 1.5.
  Particle& PlaceAttached() {
    Particle& p = PlaceParticle(0, {1.0f, 2.0f, 3.0f}, kZero);
    p.Attached = true;
    p.AttachAlpha = 200, p.AttachRed = 100, p.AttachGreen = 50, p.AttachBlue = 10;
    p.AttachSize = 2.0f;
    p.SizeMultiplier = 1.5f;
    p.LookAtPoint = {7.0f, 7.0f, 7.0f};
    return p;
  }
};

// Multiplier 1.5 at mid-life; sliding: offset + multiplier + captured size 0.5.
TEST_F(Envelopes, SizeIsTheEnvelopeTimesTheMultiplierOrTheSlidingSumAndNeverNegative) {
  const struct {
    bool Sliding;
    std::optional<Keys> Envelope;
    float Expected;
  } cases[] = {{false, Keys{{0, 0}, {0.5f, 2}, {1, 0}}, 3.0f},
               {false, Keys{{0, -1}}, 0.0f},
               {false, std::nullopt, 1.5f},
               {true, std::nullopt, 2.0f},
               {true, Keys{{0, 0.3f}}, 2.3f},
               {true, Keys{{0, -5}}, 0.0f}};
  for (const auto& c : cases) {
    const int link = c.Sliding ? kLinkSlidingSizeOffsetEnvelope : kLinkSizeEnvelope;
    c.Envelope ? (void)SetEnvelope(link, *c.Envelope) : Unlink(link);
    emitter->Initialize();
    Particle& p = PlaceParticle(0, kZero, kZero, 1.0f);
    p.Sliding = c.Sliding;
    p.SizeMultiplier = 1.5f;
    p.AttachSize = 0.5f;
    RunFrame(500.0);
    EXPECT_FLOAT_EQ(P(0).Size, c.Expected);
  }
}

// Truncated, capped at 255, only the low eight bits packed; a missing envelope gives 0.
TEST_F(Envelopes, LiveColourPacksTheEnvelopesLowBits) {
  SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 300.0f}});
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 128.9f}});
  SetEnvelope(kLinkGreenColorEnvelope, {{0.0f, -1.0f}});
  Start();
  PlaceParticle(0, kZero, kZero).Color = 0x12345678u;
  StepOnce();
  EXPECT_EQ(P(0).Color, 0xFF80FF00u);
}

TEST_F(Envelopes, AnAttachedParticleFollowsItsOffsetEnvelopesOverItsAttachedLifeThenEnds) {
  SetValue(kLinkAttachedLifespan, 4.0f);
  SetValue(kLinkLookAtLocal, 1.0f);
  SetVector(kLinkLookAt, {0.0f, 1.0f, 0.0f});
  SetEnvelope(kLinkAttachedAlphaOffsetEnvelope, {{0.0f, 0.0f}, {1.0f, 1.0f}});
  SetEnvelope(kLinkAttachedSizeOffsetEnvelope, {{0.0f, 0.0f}, {1.0f, 4.0f}});
  Start();
  PlaceAttached();
  RunFrame(1000.0);  // u = 0.25
  EXPECT_EQ(P(0).Color, (50u << 24) | (100u << 16) | (50u << 8) | 10u);
  EXPECT_EQ(P(0).Size, 1.5f * 2.0f * 1.0f);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(1.0f, 2.0f, 3.0f));
  EXPECT_EQ(P(0).LookAtPoint, D3DXVECTOR3(1.0f, 3.0f, 3.0f));
  RunFrames(3, 1000.0);
  EXPECT_TRUE(P(0).Active && P(0).Attached);  // u = 1
  RunFrame(20.0);
  EXPECT_FALSE(P(0).Active || P(0).Attached);
}

// Bytes 200, size 1.5 x 2 = 3: factors clamp to 0..255; the size envelope scales or is added.
TEST_F(Envelopes, AnAttachedLookIsClampedAndItsSizeScaledOrOffset) {
  const struct {
    float Factor, SizeOffset;
    bool Additive;
    std::uint32_t Alpha;
    float Size;
  } cases[] = {{1.5f, 0.5f, false, 255u, 1.5f},
               {-0.5f, 0.5f, true, 0u, 3.5f},
               {0.5f, -4.0f, true, 100u, 0.0f}};
  SetValue(kLinkAttachedLifespan, 100.0f);
  Start();
  for (const auto& c : cases) {
    SetEnvelope(kLinkAttachedAlphaOffsetEnvelope, {{0.0f, c.Factor}});
    SetEnvelope(kLinkAttachedSizeOffsetEnvelope, {{0.0f, c.SizeOffset}});
    SetValue(kLinkAttachedSizeOffsetAdditive, c.Additive ? 1.0f : 0.0f);
    PlaceAttached();
    StepOnce();
    EXPECT_EQ(P(0).Color >> 24, c.Alpha);
    EXPECT_EQ(P(0).Size, c.Size);
  }
}

// Position (1, 0, 0), velocity (0, 2, 0), t = 0.5: drawn at (1, 1, 0), inactive or not; LookAt
// (0, 0, 5); surface normal (0, 0, -1).
TEST_F(Envelopes, InterpolationDrawsAFractionOfTheNextStepAheadAndFacesByTheRules) {
  const struct {
    bool Local, Align, Sliding, Attached;
    D3DXVECTOR3 Expected;
  } cases[] = {{false, false, false, false, {0, 0, 5}}, {true, false, false, false, {1, 0, 5}},
               {true, true, true, false, {1, 1, -1}},   {false, true, false, false, {0, 0, 5}},
               {false, false, true, false, {0, 0, 5}},  {true, true, true, true, {7, 7, 7}}};
  SetVector(kLinkLookAt, {0.0f, 0.0f, 5.0f});
  SetValue(kLinkSpinStart, 0.0f);
  SetValue(kLinkSimulationScaler, 3.0f);
  Start();
  for (const auto& c : cases) {
    SetValue(kLinkLookAtLocal, c.Local ? 1.0f : 0.0f);
    SetValue(kLinkAlignToNormals, c.Align ? 1.0f : 0.0f);
    RunFrame(1.0);  // reads the links; no step
    Particle& p = PlaceParticle(0, {1.0f, 0.0f, 0.0f}, {0.0f, 2.0f, 0.0f});
    p.Active = !c.Attached;
    p.Sliding = c.Sliding, p.Attached = c.Attached;
    p.SurfaceNormal = {0.0f, 0.0f, -1.0f};
    p.LookAtPoint = {7.0f, 7.0f, 7.0f};
    p.SpinAngle = 10.0f, p.SpinSpeed = 4.0f;
    emitter->InterpolateParticles(0.5f);
    EXPECT_EQ(P(0).RenderPosition, D3DXVECTOR3(1.0f, 1.0f, 0.0f));
    EXPECT_EQ(P(0).LookAtPoint, c.Expected);
    EXPECT_EQ(P(0).RenderSpinAngle, 12.0f);  // the stored speed, not scaled
  }
  emitter->InterpolateParticles(0.0f);
  EXPECT_EQ(P(0).RenderPosition, P(0).Position);
}

}  // namespace
