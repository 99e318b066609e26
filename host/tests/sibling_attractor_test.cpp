// The attractor's force field: direction, the two falloffs, the capped centre, the swirl, finite
// answers for extreme settings, and links overriding the fields.
#include <cfloat>
#include <cmath>

#include "host/attractor.h"
#include "host/link_channels.h"
#include "host/tests/test_channels.h"

namespace {

using A = Tev_AdvPE_Attractor;
using Attractor = HostContextTest;

TEST_F(Attractor, GivesTheForceOfItsFalloffAndSwirl) {
  struct Case {
    A::Falloff mode;
    float strength, minimum_radius, radius, vortex;
    D3DXVECTOR3 at, expected;  // `at` from the attractor at (1, 2, 3)
  };
  constexpr A::Falloff kSquare = A::Falloff::InverseSquare, kLinear = A::Falloff::Linear;
  const Case cases[] = {
      // Inverse square: Strength / r^2 towards the centre, held at its value at MinimumRadius.
      {kSquare, 2, 0.1f, 1, 0, {0, 0, 2}, {0, 0, -0.5f}},
      {kSquare, -2, 0.1f, 1, 0, {2, 0, 0}, {0.5f, 0, 0}},
      {kSquare, 1, 0.5f, 1, 0, {0, -0.1f, 0}, {0, 4, 0}},
      {kSquare, 1, 0.5f, 1, 5, {0, 0, 0}, {0, 0, 0}},
      // Linear: Strength * (1 - r / Radius), nothing from Radius on or without one.
      {kLinear, 4, 0.1f, 2, 0, {-1, 0, 0}, {2, 0, 0}},
      {kLinear, 4, 0.1f, 2, 0, {0, 2, 0}, {0, 0, 0}},
      {kLinear, 4, 0.1f, 0, 0, {0, 1, 0}, {0, 0, 0}},
      // Swirl along VortexAxis x (point - centre): (0, 1, 0) x (1, 0, 0) = (0, 0, -1).
      {kLinear, 0, 0.1f, 10, 1, {1, 0, 0}, {0, 0, -0.9f}},
      {kLinear, 1, 0.1f, 10, 1, {1, 0, 0}, {-0.9f, 0, -0.9f}},
      {kLinear, 0, 0.1f, 10, 1, {0, 3, 0}, {0, 0, 0}}};
  for (const Case& c : cases) {
    SCOPED_TRACE(&c - cases);
    A attractor;
    attractor.Position = {1, 2, 3};
    attractor.FalloffMode = c.mode;
    attractor.Strength = c.strength;
    attractor.MinimumRadius = c.minimum_radius;
    attractor.Radius = c.radius;
    attractor.VortexStrength = c.vortex;
    ExpectNear(attractor.GetForceAtPosition(attractor.Position + c.at), c.expected);
  }
}

// Extreme settings, and positions out at the float range, still give finite forces.
TEST_F(Attractor, StaysFiniteForExtremeSettingsAndPositions) {
  A attractor;
  attractor.Strength = attractor.VortexStrength = FLT_MAX;
  attractor.MinimumRadius = 0.0f;  // uncapped
  attractor.Position = {-FLT_MAX, FLT_MAX, 0};
  for (const D3DXVECTOR3& at : {D3DXVECTOR3(-FLT_MAX, FLT_MAX, 1e-30f), D3DXVECTOR3(FLT_MAX, 0, 0),
                                D3DXVECTOR3(-FLT_MAX, FLT_MAX, 0)}) {
    const D3DXVECTOR3 f = attractor.GetForceAtPosition(at);
    EXPECT_TRUE(std::isfinite(f.x) && std::isfinite(f.y) && std::isfinite(f.z));
  }
  EXPECT_EQ(attractor.GetForceAtPosition({0, kNaN, 0}), D3DXVECTOR3(0, 0, 0));
  EXPECT_EQ(attractor.GetForceAtPosition({kInf, 0, 0}), D3DXVECTOR3(0, 0, 0));
}

// Linked values replace the fields while linked, and are read at every call.
TEST_F(Attractor, LinkedValuesOverrideTheFields) {
  A attractor;
  attractor.Strength = 1000;
  Qen_ValueVectorChannel position({0, 0, 2});
  Qen_ValueChannel linear(1), radius(4);
  ASSERT_TRUE(attractor.SetChild(A::kLinkPosition, &position) &&
              attractor.SetChild(A::kLinkLinearFalloff, &linear) &&
              attractor.SetChild(A::kLinkRadius, &radius));
  ExpectNear(attractor.GetForceAtPosition({0, 0, 1}), {0, 0, 750});  // 1000 * (1 - 1 / 4)
  linear.SetValue(0.0f);                                             // "no": inverse square
  ExpectNear(attractor.GetForceAtPosition({0, 0, 1}), {0, 0, 1000});
  attractor.ClearChild(A::kLinkPosition);
  ExpectNear(attractor.GetForceAtPosition({0, 0, 2}), {0, 0, -250});  // 1000 / 2^2
}

}  // namespace
