// Size and colour over life, the sliding size, and the attached-particle update.
#include "simulation/tests/emitter_fixture.h"

namespace {

class Envelopes : public EmitterTest {
 protected:
  void SetUp() override { LinkBasics(3.0f, 50.0f, 0.0f); }
};

TEST_F(Envelopes, SizeIsTheEnvelopeAtNormalizedAgeTimesTheMultiplier) {
  SetEnvelope(kLinkSizeEnvelope, {{0.0f, 0.0f}, {0.5f, 2.0f}, {1.0f, 0.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}, 1.0f).SizeMultiplier = 1.5f;
  RunFrame(500.0);
  EXPECT_EQ(P(0).NormalizedAge, 0.5f);
  EXPECT_EQ(P(0).Size, 3.0f);
}

TEST_F(Envelopes, ANegativeSizeIsZeroAndNoEnvelopeGivesTheMultiplier) {
  SetEnvelope(kLinkSizeEnvelope, {{0.0f, -1.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}).SizeMultiplier = 1.5f;
  StepOnce();
  EXPECT_EQ(P(0).Size, 0.0f);
  Unlink(kLinkSizeEnvelope);
  StepOnce();
  EXPECT_EQ(P(0).Size, 1.5f);
}

TEST_F(Envelopes, ColourComponentsAreTruncatedCappedAndPacked) {
  SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 300.0f}});
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 128.9f}});
  SetEnvelope(kLinkGreenColorEnvelope, {{0.0f, 0.0f}});
  SetEnvelope(kLinkBlueColorEnvelope, {{0.0f, 255.0f}});
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  StepOnce();
  EXPECT_EQ(P(0).Color, 0xFF8000FFu);
}

TEST_F(Envelopes, MissingColourEnvelopesGiveTransparentBlackAndNegativesKeepLowBits) {
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}).Color = 0x12345678u;
  StepOnce();
  EXPECT_EQ(P(0).Color, 0u);
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, -1.0f}});
  StepOnce();
  EXPECT_EQ(P(0).Color, 0x00FF0000u);
}

struct SlidingSizeCase {
  const char* Name;
  std::vector<std::pair<float, float>> Keys;  // empty: no envelope
  float Expected;
};

class SlidingSize : public Envelopes, public ::testing::WithParamInterface<SlidingSizeCase> {};

TEST_P(SlidingSize, IsTheSumOfOffsetMultiplierAndCapturedSize) {
  if (!GetParam().Keys.empty()) SetEnvelope(kLinkSlidingSizeOffsetEnvelope, GetParam().Keys);
  Start();
  Particle& p = PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f});
  p.Sliding = true;
  p.SizeMultiplier = 1.2f;
  p.AttachSize = 0.5f;
  StepOnce();
  EXPECT_FLOAT_EQ(P(0).Size, GetParam().Expected);
}

INSTANTIATE_TEST_SUITE_P(Cases, SlidingSize,
                         ::testing::Values(SlidingSizeCase{"NoEnvelope", {}, 1.7f},
                                           SlidingSizeCase{"Offset", {{0.0f, 0.3f}}, 2.0f},
                                           SlidingSizeCase{
                                               "NegativeSumIsZero", {{0.0f, -5.0f}}, 0.0f}),
                         [](const auto& info) { return std::string(info.param.Name); });

// An attached record: captured bytes 200, 100, 50, 10 and size 2 at multiplier 1.5.
class Attached : public Envelopes {
 protected:
  Particle& PlaceAttached() {
    Particle& p = PlaceParticle(0, {1.0f, 2.0f, 3.0f}, {0.0f, 0.0f, 0.0f});
    p.Attached = true;
    p.AttachAlpha = 200;
    p.AttachRed = 100;
    p.AttachGreen = 50;
    p.AttachBlue = 10;
    p.AttachSize = 2.0f;
    p.SizeMultiplier = 1.5f;
    p.LookAtPoint = {7.0f, 7.0f, 7.0f};
    return p;
  }
};

TEST_F(Attached, OffsetEnvelopesAreSampledAtTheAttachedFraction) {
  SetValue(kLinkAttachedLifespan, 4.0f);
  SetEnvelope(kLinkAttachedAlphaOffsetEnvelope, {{0.0f, 0.0f}, {1.0f, 1.0f}});
  SetEnvelope(kLinkAttachedSizeOffsetEnvelope, {{0.0f, 0.0f}, {1.0f, 4.0f}});
  Start();
  PlaceAttached();
  RunFrame(1000.0);  // age 1 s of 4: u = 0.25
  EXPECT_TRUE(P(0).Active);
  EXPECT_EQ(P(0).Color, (50u << 24) | (100u << 16) | (50u << 8) | 10u);
  EXPECT_EQ(P(0).Size, 1.5f * 2.0f * 1.0f);
  EXPECT_EQ(P(0).Position, D3DXVECTOR3(1.0f, 2.0f, 3.0f));
}

TEST_F(Attached, LivesThroughItsAttachedLifespanAndEndsAfter) {
  SetValue(kLinkAttachedLifespan, 4.0f);
  Start();
  PlaceAttached();
  RunFrames(4, 1000.0);
  EXPECT_EQ(P(0).Age, 4.0f);
  EXPECT_TRUE(P(0).Active);
  EXPECT_TRUE(P(0).Attached);
  RunFrame(20.0);
  EXPECT_FALSE(P(0).Active);
  EXPECT_FALSE(P(0).Attached);
}

TEST_F(Attached, WithoutAnAttachedLifespanItNeverEndsAndItsLookFreezes) {
  SetEnvelope(kLinkAttachedAlphaOffsetEnvelope, {{0.0f, 0.0f}});
  Start();
  Particle& p = PlaceAttached();
  p.Color = 0x01020304u;
  p.Size = 9.0f;
  RunFrames(3, 1000.0);
  EXPECT_TRUE(P(0).Active);
  EXPECT_EQ(P(0).Color, 0x01020304u);
  EXPECT_EQ(P(0).Size, 9.0f);
  EXPECT_TRUE(emitter->VerticesDirty);
  // The record stays taken: a birth goes elsewhere.
  EXPECT_EQ(emitter->GetInactiveParticle(), 1);
}

struct AttachedColourCase {
  float Factor;
  std::uint32_t Alpha;
};

class AttachedColour : public Attached, public ::testing::WithParamInterface<AttachedColourCase> {};

TEST_P(AttachedColour, ClampsTheScaledByteToZeroTo255) {
  SetValue(kLinkAttachedLifespan, 100.0f);
  SetEnvelope(kLinkAttachedAlphaOffsetEnvelope, {{0.0f, GetParam().Factor}});
  Start();
  PlaceAttached();
  StepOnce();
  EXPECT_EQ(P(0).Color >> 24, GetParam().Alpha);
}

INSTANTIATE_TEST_SUITE_P(Factors, AttachedColour,
                         ::testing::Values(AttachedColourCase{1.5f, 255u},
                                           AttachedColourCase{-0.5f, 0u},
                                           AttachedColourCase{0.5f, 100u},
                                           AttachedColourCase{1.0f, 200u}));

struct AttachedSizeCase {
  const char* Name;
  std::vector<std::pair<float, float>> Keys;  // empty: no envelope
  bool Additive;
  float Expected;  // base 1.5 * 2 = 3
};

class AttachedSize : public Attached, public ::testing::WithParamInterface<AttachedSizeCase> {};

TEST_P(AttachedSize, ScalesOrOffsetsTheCapturedSize) {
  SetValue(kLinkAttachedLifespan, 100.0f);
  if (!GetParam().Keys.empty()) SetEnvelope(kLinkAttachedSizeOffsetEnvelope, GetParam().Keys);
  SetValue(kLinkAttachedSizeOffsetAdditive, GetParam().Additive ? 1.0f : 0.0f);
  Start();
  PlaceAttached();
  StepOnce();
  EXPECT_FLOAT_EQ(P(0).Size, GetParam().Expected);
}

INSTANTIATE_TEST_SUITE_P(
    Modes, AttachedSize,
    ::testing::Values(AttachedSizeCase{"NoEnvelope", {}, false, 3.0f},
                      AttachedSizeCase{"Multiplied", {{0.0f, 0.5f}}, false, 1.5f},
                      AttachedSizeCase{"Added", {{0.0f, 0.5f}}, true, 3.5f},
                      AttachedSizeCase{"NegativeIsZero", {{0.0f, -4.0f}}, true, 0.0f}),
    [](const auto& info) { return std::string(info.param.Name); });

TEST_F(Attached, FacesLookAtUnlessAlignedToNormals) {
  SetValue(kLinkAttachedLifespan, 100.0f);
  SetVector(kLinkLookAt, {0.0f, 1.0f, 0.0f});
  SetValue(kLinkLookAtLocal, 1.0f);
  Start();
  PlaceAttached();
  StepOnce();
  EXPECT_EQ(P(0).LookAtPoint, D3DXVECTOR3(1.0f, 3.0f, 3.0f));

  SetValue(kLinkAlignToNormals, 1.0f);
  P(0).LookAtPoint = {7.0f, 7.0f, 7.0f};
  StepOnce();
  EXPECT_EQ(P(0).LookAtPoint, D3DXVECTOR3(7.0f, 7.0f, 7.0f));
}

TEST_F(Envelopes, SmokeDebugColoursLeaveTheColourToTheSmokeCollision) {
  SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 10.0f}});
  LinkSmoke();
  SetSmokeValue(Tev_AdvPE_SmokeSettings::kLinkDebugColours, 1.0f);
  Start();
  PlaceParticle(0, {0.0f, 0.0f, 0.0f}, {0.0f, 0.0f, 0.0f}).Color = 0x12345678u;
  StepOnce();
  EXPECT_EQ(P(0).Color, 0x12345678u);
}

}  // namespace
