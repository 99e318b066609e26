// The attractor's force field: direction, the two falloffs, the capped centre, the swirl, finite
// answers for extreme settings, and links overriding the fields.
#include <gtest/gtest.h>

#include <cfloat>
#include <cmath>
#include <limits>
#include <ostream>
#include <string>

#include "host/attractor.h"
#include "host/host_context.h"
#include "host/link_channels.h"

namespace {

constexpr float kTolerance = 1e-5f;
constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInf = std::numeric_limits<float>::infinity();

using Falloff = Tev_AdvPE_Attractor::Falloff;

void ExpectVectorNear(const D3DXVECTOR3& actual, const D3DXVECTOR3& expected) {
  EXPECT_NEAR(actual.x, expected.x, kTolerance);
  EXPECT_NEAR(actual.y, expected.y, kTolerance);
  EXPECT_NEAR(actual.z, expected.z, kTolerance);
}

bool IsFiniteVector(const D3DXVECTOR3& v) {
  return std::isfinite(v.x) && std::isfinite(v.y) && std::isfinite(v.z);
}

struct ForceCase {
  const char* Name;
  Falloff Mode;
  float Strength;
  float MinimumRadius;
  float Radius;
  float VortexStrength;
  D3DXVECTOR3 At;  // relative to the attractor at (1, 2, 3)
  D3DXVECTOR3 Expected;
};

void PrintTo(const ForceCase& c, std::ostream* os) {
  *os << c.Name;
}

class AttractorForceTest : public ::testing::TestWithParam<ForceCase> {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_AdvPE_Attractor attractor_;
};

TEST_P(AttractorForceTest, GivesTheExpectedForce) {
  const ForceCase& c = GetParam();
  attractor_.Position = {1, 2, 3};
  attractor_.FalloffMode = c.Mode;
  attractor_.Strength = c.Strength;
  attractor_.MinimumRadius = c.MinimumRadius;
  attractor_.Radius = c.Radius;
  attractor_.VortexStrength = c.VortexStrength;
  attractor_.VortexAxis = {0, 1, 0};
  ExpectVectorNear(attractor_.GetForceAtPosition(attractor_.Position + c.At), c.Expected);
}

INSTANTIATE_TEST_SUITE_P(
    Falloffs, AttractorForceTest,
    ::testing::Values(
        // Inverse square: Strength / r^2 towards the centre.
        ForceCase{"PullsTowardsTheCentre",
                  Falloff::InverseSquare,
                  2,
                  0.1f,
                  1,
                  0,
                  {0, 0, 2},
                  {0, 0, -0.5f}},
        ForceCase{"FallsWithTheSquare",
                  Falloff::InverseSquare,
                  2,
                  0.1f,
                  1,
                  0,
                  {0, 0, 4},
                  {0, 0, -0.125f}},
        ForceCase{"NegativeStrengthRepels",
                  Falloff::InverseSquare,
                  -2,
                  0.1f,
                  1,
                  0,
                  {2, 0, 0},
                  {0.5f, 0, 0}},
        // Inside the minimum radius the force stays at its value there: 1 / 0.5^2.
        ForceCase{"CappedInsideTheMinimumRadius",
                  Falloff::InverseSquare,
                  1,
                  0.5f,
                  1,
                  0,
                  {0, -0.1f, 0},
                  {0, 4, 0}},
        ForceCase{"CappedAtTheMinimumRadius",
                  Falloff::InverseSquare,
                  1,
                  0.5f,
                  1,
                  0,
                  {0, -0.5f, 0},
                  {0, 4, 0}},
        ForceCase{"ZeroAtTheCentre", Falloff::InverseSquare, 1, 0.5f, 1, 5, {0, 0, 0}, {0, 0, 0}},
        // Linear: Strength * (1 - r / Radius), nothing beyond Radius.
        ForceCase{"LinearHalfway", Falloff::Linear, 4, 0.1f, 2, 0, {-1, 0, 0}, {2, 0, 0}},
        ForceCase{"LinearAtTheRadius", Falloff::Linear, 4, 0.1f, 2, 0, {0, 2, 0}, {0, 0, 0}},
        ForceCase{"LinearBeyondTheRadius", Falloff::Linear, 4, 0.1f, 2, 0, {0, 3, 0}, {0, 0, 0}},
        ForceCase{"LinearWithoutRadius", Falloff::Linear, 4, 0.1f, 0, 0, {0, 1, 0}, {0, 0, 0}},
        // Swirl along VortexAxis x (point - centre): (0,1,0) x (1,0,0) = (0,0,-1).
        ForceCase{"SwirlAroundTheAxis", Falloff::Linear, 0, 0.1f, 10, 1, {1, 0, 0}, {0, 0, -0.9f}},
        ForceCase{"SwirlAndPull", Falloff::Linear, 1, 0.1f, 10, 1, {1, 0, 0}, {-0.9f, 0, -0.9f}},
        ForceCase{"NoSwirlOnTheAxis", Falloff::Linear, 0, 0.1f, 10, 1, {0, 3, 0}, {0, 0, 0}}),
    [](const auto& info) { return std::string(info.param.Name); });

class AttractorTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_AdvPE_Attractor attractor_;
};

TEST_F(AttractorTest, StaysFiniteForExtremeSettingsAndPositions) {
  attractor_.Strength = FLT_MAX;
  attractor_.MinimumRadius = 0.0f;  // uncapped
  attractor_.VortexStrength = FLT_MAX;
  for (const D3DXVECTOR3& at : {D3DXVECTOR3(1e-30f, 0, 0), D3DXVECTOR3(0, 1e-20f, 1e-20f),
                                D3DXVECTOR3(FLT_MAX, -FLT_MAX, FLT_MAX), D3DXVECTOR3(0, 0, 0)})
    EXPECT_TRUE(IsFiniteVector(attractor_.GetForceAtPosition(at)));
  attractor_.Position = {-FLT_MAX, FLT_MAX, 0};
  EXPECT_TRUE(IsFiniteVector(attractor_.GetForceAtPosition({FLT_MAX, -FLT_MAX, 0})));
  // Settings that are not numbers give no force rather than NaN.
  attractor_.Position = {0, 0, 0};
  attractor_.Strength = kNaN;
  attractor_.VortexStrength = 0.0f;
  EXPECT_TRUE(IsFiniteVector(attractor_.GetForceAtPosition({1, 0, 0})));
}

TEST_F(AttractorTest, NonFinitePositionsGiveNoForce) {
  for (const D3DXVECTOR3& at : {D3DXVECTOR3(kNaN, 0, 0), D3DXVECTOR3(0, kInf, 0)})
    EXPECT_EQ(attractor_.GetForceAtPosition(at), D3DXVECTOR3(0, 0, 0));
}

TEST_F(AttractorTest, DeclaresItsLinks) {
  ASSERT_EQ(attractor_.GetChildCreationCount(), Tev_AdvPE_Attractor::kLinkCount);
  EXPECT_EQ(attractor_.FindChildLinkByName("Position"), Tev_AdvPE_Attractor::kLinkPosition);
  EXPECT_EQ(attractor_.FindChildLinkByName("Strength"), Tev_AdvPE_Attractor::kLinkStrength);
  EXPECT_EQ(attractor_.FindChildLinkByName("Linear Falloff?"),
            Tev_AdvPE_Attractor::kLinkLinearFalloff);
  EXPECT_EQ(
      std::string(attractor_.GetChildCreation(Tev_AdvPE_Attractor::kLinkVortexAxis)->Type.TypeName),
      "Value Vector");
}

// Linked values replace the fields while linked, and are read at every call.
TEST_F(AttractorTest, LinkedValuesOverrideTheFields) {
  attractor_.Position = {100, 100, 100};
  attractor_.Strength = 1000;
  Qen_ValueVectorChannel position({0, 0, 0});
  Qen_ValueChannel strength(2.0f);
  Qen_ValueChannel linear(1.0f);
  Qen_ValueChannel radius(4.0f);
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkPosition, &position));
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkStrength, &strength));
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkLinearFalloff, &linear));
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkRadius, &radius));
  ExpectVectorNear(attractor_.GetForceAtPosition({0, 0, 1}), {0, 0, -1.5f});

  position.SetVector({0, 0, 2});
  ExpectVectorNear(attractor_.GetForceAtPosition({0, 0, 1}), {0, 0, 1.5f});

  linear.SetValue(0.0f);  // "no": inverse square, 2 / 1^2
  ExpectVectorNear(attractor_.GetForceAtPosition({0, 0, 1}), {0, 0, 2.0f});

  Qen_ValueChannel vortex(1.0f);
  Qen_ValueVectorChannel axis({1, 0, 0});
  Qen_ValueChannel minimum(2.0f);
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkVortexStrength, &vortex));
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkVortexAxis, &axis));
  ASSERT_TRUE(attractor_.SetChild(Tev_AdvPE_Attractor::kLinkMinimumRadius, &minimum));
  // Capped at 1 / 2^2; swirl (1,0,0) x (0,0,-1) = (0,1,0).
  ExpectVectorNear(attractor_.GetForceAtPosition({0, 0, 1}), {0, 0.25f, 0.5f});

  for (int link = 0; link < Tev_AdvPE_Attractor::kLinkCount; ++link) attractor_.ClearChild(link);
  ExpectVectorNear(attractor_.GetForceAtPosition({100, 100, 101}), {0, 0, -1000});
}

}  // namespace
