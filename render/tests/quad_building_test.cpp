// Sprite quads: corners, basis branches, spin, collapsed slots and texture rows.
#include <cmath>
#include <vector>

#include <gtest/gtest.h>

#include "render/tests/render_test_support.h"

namespace {

constexpr float kHalfPi = 1.57079632679489661923f;
constexpr std::uint32_t kColor = 0xFF336699;

class QuadBuildingTest : public RenderTest {
 protected:
  // Builds the quads of `particles`; returns slot `slot`'s four corners.
  std::vector<LocalVertex> BuildQuads(std::vector<Particle> particles, std::size_t slot = 0) {
    SetPool(std::move(particles));
    Emitter().InitializeLocalVertexBuffer();
    Emitter().UpdateLocalVertexBuffer();
    const LocalVertex* first = Emitter().LocalVertices + 4 * slot;
    return {first, first + 4};
  }
};

void ExpectPositionsNear(const std::vector<LocalVertex>& corners,
                         const std::vector<D3DXVECTOR3>& expected, float tolerance) {
  ASSERT_EQ(corners.size(), expected.size());
  for (std::size_t k = 0; k < corners.size(); ++k) {
    SCOPED_TRACE(testing::Message() << "corner " << k);
    EXPECT_NEAR(corners[k].Position.x, expected[k].x, tolerance);
    EXPECT_NEAR(corners[k].Position.y, expected[k].y, tolerance);
    EXPECT_NEAR(corners[k].Position.z, expected[k].z, tolerance);
  }
}

TEST_F(QuadBuildingTest, ParticleAtOriginFacingPlusZIsTheUnitSquare) {
  const auto corners = BuildQuads({LiveParticle({0, 0, 0}, {0, 0, 10}, 2.0f, kColor)});
  const D3DXVECTOR3 positions[] = {{1, 1, 0}, {-1, 1, 0}, {-1, -1, 0}, {1, -1, 0}};
  const float tu[] = {0, 1, 1, 0};
  const float tv[] = {0, 0, 1, 1};
  for (int k = 0; k < 4; ++k) {
    SCOPED_TRACE(testing::Message() << "corner " << k);
    EXPECT_EQ(corners[k].Position, positions[k]);
    EXPECT_EQ(corners[k].Normal, D3DXVECTOR3(0, 0, 1));
    EXPECT_EQ(corners[k].Color, kColor);
    EXPECT_EQ(corners[k].Tu, tu[k]);
    EXPECT_EQ(corners[k].Tv, tv[k]);
  }
}

TEST_F(QuadBuildingTest, EachSlotOwnsFourConsecutiveVertices) {
  std::vector<Particle> pool;
  for (int i = 0; i < 3; ++i) {
    pool.push_back(LiveParticle({10.0f * i, 0, 0}, {10.0f * i, 0, 10}, 2.0f, 0xFF000000u + i));
  }
  const auto corners = BuildQuads(pool, 2);
  ExpectPositionsNear(corners, {{21, 1, 0}, {19, 1, 0}, {19, -1, 0}, {21, -1, 0}}, 0.0f);
  for (const LocalVertex& corner : corners) EXPECT_EQ(corner.Color, 0xFF000002u);
}

struct BasisCase {
  const char* Name;
  D3DXVECTOR3 Facing;  // unit direction from the particle to its look-at point
  D3DXVECTOR3 Corners[4];
};
void PrintTo(const BasisCase& c, std::ostream* os) {
  *os << c.Name;
}

class QuadBasisTest : public QuadBuildingTest, public testing::WithParamInterface<BasisCase> {};

// Size 2, so the half extents are the basis vectors themselves.
TEST_P(QuadBasisTest, CornersFollowTheBasis) {
  const BasisCase& c = GetParam();
  const auto corners = BuildQuads({LiveParticle({0, 0, 0}, c.Facing, 2.0f, kColor)});
  ExpectPositionsNear(corners, {c.Corners, c.Corners + 4}, 0.0f);
  for (const LocalVertex& corner : corners) EXPECT_EQ(corner.Normal, c.Facing);
}

INSTANTIATE_TEST_SUITE_P(
    Branches, QuadBasisTest,
    testing::Values(
        // Straight up: R = (1, 0, 0), U = (0, 0, -1); the quad lies in the horizontal plane.
        BasisCase{"Up", {0, 1, 0}, {{1, 0, -1}, {-1, 0, -1}, {-1, 0, 1}, {1, 0, 1}}},
        // Straight down: R = (1, 0, 0), U = (0, 0, 1).
        BasisCase{"Down", {0, -1, 0}, {{1, 0, 1}, {-1, 0, 1}, {-1, 0, -1}, {1, 0, -1}}},
        // Along +X: R = (0, 0, -1), U = (0, 1, 0).
        BasisCase{"AlongX", {1, 0, 0}, {{0, 1, -1}, {0, 1, 1}, {0, -1, 1}, {0, -1, -1}}}),
    [](const testing::TestParamInfo<BasisCase>& info) { return info.param.Name; });

struct BranchCase {
  const char* Name;
  D3DXVECTOR3 Direction;
  bool RightBranch;  // ax + az < ay
};
void PrintTo(const BranchCase& c, std::ostream* os) {
  *os << c.Name;
}

class QuadBranchTest : public QuadBuildingTest, public testing::WithParamInterface<BranchCase> {};

// The Right branch builds U from N x Right, so U (and with size 2, B) has no x; the Up branch
// builds R from Up x N, so R (and A) has no y. With P at the origin: B.x = 0 makes corners 0 and
// 3 share x, A.y = 0 makes corners 0 and 1 share y.
TEST_P(QuadBranchTest, MostlyVerticalDirectionsAloneTakeTheRightAxis) {
  const BranchCase& c = GetParam();
  const auto corners = BuildQuads({LiveParticle({0, 0, 0}, c.Direction, 2.0f, kColor)});
  const bool b_has_no_x = corners[0].Position.x == corners[3].Position.x;
  const bool a_has_no_y = corners[0].Position.y == corners[1].Position.y;
  EXPECT_EQ(b_has_no_x, c.RightBranch);
  EXPECT_EQ(a_has_no_y, !c.RightBranch);
}

INSTANTIATE_TEST_SUITE_P(Ties, QuadBranchTest,
                         testing::Values(
                             // (1, 2, 1) normalized: ax + az equals ay exactly, and ties go to Up.
                             BranchCase{"TieGoesUp", {1, 2, 1}, false},
                             BranchCase{"TieGoesUpDownward", {-1, -2, 1}, false},
                             BranchCase{"JustAboveTieGoesRight", {1, 2.001f, 1}, true},
                             BranchCase{"JustBelowTieGoesUp", {1, 1.999f, 1}, false}),
                         [](const testing::TestParamInfo<BranchCase>& info) {
                           return info.param.Name;
                         });

TEST_F(QuadBuildingTest, SpinAtZeroEqualsNoSpin) {
  const Particle particle = LiveParticle({1, 2, 3}, {4, -2, 7}, 3.0f, kColor);
  const auto still = BuildQuads({particle});
  Emitter().SpinEnabled = true;
  Emitter().Particles[0].RenderSpinAngle = 0.0f;
  Emitter().UpdateLocalVertexBuffer();
  for (int k = 0; k < 4; ++k) {
    EXPECT_EQ(Emitter().LocalVertices[k].Position, still[k].Position) << "corner " << k;
  }
}

TEST_F(QuadBuildingTest, SpinTakesTheAngleInRadians) {
  Emitter().SpinEnabled = true;
  Particle particle = LiveParticle({0, 0, 0}, {0, 0, 10}, 2.0f, kColor);
  particle.RenderSpinAngle = kHalfPi;
  // A quarter turn: A = h U = (0, 1, 0), B = -h R = (-1, 0, 0).
  ExpectPositionsNear(BuildQuads({particle}), {{-1, 1, 0}, {-1, -1, 0}, {1, -1, 0}, {1, 1, 0}},
                      1e-6f);

  // 90 is 90 radians, not a quarter turn: A = (cos 90, sin 90, 0), B = (-sin 90, cos 90, 0).
  particle.RenderSpinAngle = 90.0f;
  const float c = static_cast<float>(std::cos(90.0));
  const float s = static_cast<float>(std::sin(90.0));
  ExpectPositionsNear(
      BuildQuads({particle}),
      {{c - s, s + c, 0}, {-c - s, c - s, 0}, {s - c, -s - c, 0}, {c + s, s - c, 0}}, 1e-6f);
}

TEST_F(QuadBuildingTest, InactiveSlotCollapsesToItsRenderPosition) {
  Emitter().SpinEnabled = true;
  Particle dead = LiveParticle({1, 2, 3}, {1, 2, 4}, 5.0f, kColor);
  dead.Active = false;
  dead.RenderSpinAngle = 0.7f;
  for (const LocalVertex& corner : BuildQuads({dead})) {
    EXPECT_EQ(corner.Position, D3DXVECTOR3(1, 2, 3));
    EXPECT_EQ(corner.Normal, D3DXVECTOR3(0, 0, 1));
    EXPECT_EQ(corner.Color, kColor);
  }
}

TEST_F(QuadBuildingTest, LookingAtItselfCollapsesWithAZeroNormal) {
  for (const LocalVertex& corner : BuildQuads({LiveParticle({4, 5, 6}, {4, 5, 6}, 2.0f, kColor)})) {
    EXPECT_EQ(corner.Position, D3DXVECTOR3(4, 5, 6));
    EXPECT_EQ(corner.Normal, D3DXVECTOR3(0, 0, 0));
  }
}

struct RowsCase {
  const char* Name;
  bool Composite;
  bool Attached;
  bool Sliding;
  float Top;
  float Bottom;
};
void PrintTo(const RowsCase& c, std::ostream* os) {
  *os << c.Name;
}

class TextureRowsTest : public QuadBuildingTest, public testing::WithParamInterface<RowsCase> {};

TEST_P(TextureRowsTest, AttachedParticlesShowTheLowerHalfOfTheComposite) {
  const RowsCase& c = GetParam();
  Emitter().HasCompositeTexture = c.Composite;
  Particle particle = LiveParticle({0, 0, 0}, {0, 0, 1}, 1.0f, kColor);
  particle.Attached = c.Attached;
  particle.Sliding = c.Sliding;
  const auto corners = BuildQuads({particle});
  const float tv[] = {c.Top, c.Top, c.Bottom, c.Bottom};
  for (int k = 0; k < 4; ++k) EXPECT_EQ(corners[k].Tv, tv[k]) << "corner " << k;
}

INSTANTIATE_TEST_SUITE_P(
    Rows, TextureRowsTest,
    testing::Values(RowsCase{"FreeWithoutComposite", false, false, false, 0.0f, 1.0f},
                    RowsCase{"AttachedWithoutComposite", false, true, false, 0.0f, 1.0f},
                    RowsCase{"FreeWithComposite", true, false, false, 0.0f, 0.5f},
                    RowsCase{"AttachedWithComposite", true, true, false, 0.5f, 1.0f},
                    RowsCase{"SlidingButNotAttached", true, false, true, 0.0f, 0.5f}),
    [](const testing::TestParamInfo<RowsCase>& info) { return info.param.Name; });

}  // namespace
