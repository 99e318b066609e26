// Sprite quads: corners, basis branches, spin, collapsed slots and texture rows.
#include <cmath>
#include <vector>

#include "render/tests/render_test_support.h"

namespace {

constexpr std::uint32_t kColor = 0xFF336699;

class QuadBuildingTest : public RenderTest {
 protected:
  // Builds the quads of `particles`; returns slot `slot`'s four corners.
  std::vector<LocalVertex> BuildQuads(std::vector<Particle> particles, std::size_t slot = 0) {
    SetPool(std::move(particles));
    Emitter().InitializeLocalVertexBuffer();
    Emitter().UpdateLocalVertexBuffer();
    return {Emitter().LocalVertices + 4 * slot, Emitter().LocalVertices + 4 * slot + 4};
  }
  void ExpectCorners(const std::vector<LocalVertex>& corners, const std::vector<D3DXVECTOR3>& at) {
    for (std::size_t k = 0; k < 4; ++k) {
      EXPECT_NEAR(corners[k].Position.x, at[k].x, 1e-6f) << "corner " << k;
      EXPECT_NEAR(corners[k].Position.y, at[k].y, 1e-6f) << "corner " << k;
      EXPECT_NEAR(corners[k].Position.z, at[k].z, 1e-6f) << "corner " << k;
    }
  }
};

// Slot 1 owns vertices 4 to 7: size 2 at (10, 0, 0) facing +z.
TEST_F(QuadBuildingTest, EachSlotIsAQuadOfFourCornersFacingItsPoint) {
  const auto corners = BuildQuads({LiveParticle({0, 0, 0}, {0, 0, 1}, 1.0f, 0),
                                   LiveParticle({10, 0, 0}, {10, 0, 10}, 2.0f, kColor)},
                                  1);
  ExpectCorners(corners, {{11, 1, 0}, {9, 1, 0}, {9, -1, 0}, {11, -1, 0}});
  const float tu[] = {0, 1, 1, 0}, tv[] = {0, 0, 1, 1};
  for (int k = 0; k < 4; ++k) {
    EXPECT_EQ(corners[k].Normal, D3DXVECTOR3(0, 0, 1));
    EXPECT_EQ(corners[k].Color, kColor);
    EXPECT_EQ(corners[k].Tu, tu[k]);
    EXPECT_EQ(corners[k].Tv, tv[k]);
  }
}

// Mostly vertical facing (ax + az < ay, strictly) builds the basis from Right, else from Up.
TEST_F(QuadBuildingTest, TheBasisBranchFollowsTheStrictComparison) {
  ExpectCorners(BuildQuads({LiveParticle({0, 0, 0}, {0, 1, 0}, 2.0f, kColor)}),
                {{1, 0, -1}, {-1, 0, -1}, {-1, 0, 1}, {1, 0, 1}});
  ExpectCorners(BuildQuads({LiveParticle({0, 0, 0}, {1, 0, 0}, 2.0f, kColor)}),
                {{0, 1, -1}, {0, 1, 1}, {0, -1, 1}, {0, -1, -1}});
  // The Right branch gives B no x (corners 0 and 3 share x), the Up branch A no y (corners 0
  // and 1 share y); (1, 2, 1) is exactly the tie.
  for (const auto& [facing, right] :
       {std::pair{D3DXVECTOR3(1, 2, 1), false}, std::pair{D3DXVECTOR3(-1, -2, 1), false},
        std::pair{D3DXVECTOR3(1, 2.001f, 1), true}}) {
    const auto corners = BuildQuads({LiveParticle({0, 0, 0}, facing, 2.0f, kColor)});
    EXPECT_EQ(corners[0].Position.x == corners[3].Position.x, right) << facing.y;
    EXPECT_EQ(corners[0].Position.y == corners[1].Position.y, !right) << facing.y;
  }
}

// The angle is in radians: pi/2 is a quarter turn, 90 is not.
TEST_F(QuadBuildingTest, SpinTurnsTheCornersByTheAngleInRadians) {
  Emitter().SpinEnabled = true;
  Particle particle = LiveParticle({0, 0, 0}, {0, 0, 10}, 2.0f, kColor);
  ExpectCorners(BuildQuads({particle}), {{1, 1, 0}, {-1, 1, 0}, {-1, -1, 0}, {1, -1, 0}});
  particle.RenderSpinAngle = 1.57079632679489661923f;
  ExpectCorners(BuildQuads({particle}), {{-1, 1, 0}, {-1, -1, 0}, {1, -1, 0}, {1, 1, 0}});
  particle.RenderSpinAngle = 90.0f;
  const float c = static_cast<float>(std::cos(90.0)), s = static_cast<float>(std::sin(90.0));
  ExpectCorners(BuildQuads({particle}),
                {{c - s, s + c, 0}, {-c - s, c - s, 0}, {s - c, -s - c, 0}, {c + s, s - c, 0}});
}

// A dead slot, and a particle looking at itself (zero normal), collapse onto their position.
TEST_F(QuadBuildingTest, DeadOrDirectionlessSlotsCollapseToTheirRenderPosition) {
  Particle dead = LiveParticle({1, 2, 3}, {1, 2, 4}, 5.0f, kColor);
  dead.Active = false;
  for (const LocalVertex& corner : BuildQuads({dead})) {
    EXPECT_EQ(corner.Position, D3DXVECTOR3(1, 2, 3));
    EXPECT_EQ(corner.Normal, D3DXVECTOR3(0, 0, 1));
    EXPECT_EQ(corner.Color, kColor);
  }
  for (const LocalVertex& corner : BuildQuads({LiveParticle({4, 5, 6}, {4, 5, 6}, 2.0f, 0)})) {
    EXPECT_EQ(corner.Position, D3DXVECTOR3(4, 5, 6));
    EXPECT_EQ(corner.Normal, D3DXVECTOR3(0, 0, 0));
  }
}

// With a composite texture free (and merely sliding) particles show its upper half, attached
// ones its lower half; without one every particle shows the whole texture.
TEST_F(QuadBuildingTest, TextureRowsFollowTheCompositeHalves) {
  const struct {
    bool Composite, Attached, Sliding;
    float Top, Bottom;
  } cases[] = {{false, true, false, 0.0f, 1.0f},
               {true, false, true, 0.0f, 0.5f},
               {true, true, false, 0.5f, 1.0f}};
  for (const auto& c : cases) {
    Emitter().HasCompositeTexture = c.Composite;
    Particle particle = LiveParticle({0, 0, 0}, {0, 0, 1}, 1.0f, kColor);
    particle.Attached = c.Attached;
    particle.Sliding = c.Sliding;
    const auto corners = BuildQuads({particle});
    const float tv[] = {c.Top, c.Top, c.Bottom, c.Bottom};
    for (int k = 0; k < 4; ++k) EXPECT_EQ(corners[k].Tv, tv[k]) << c.Composite << c.Attached;
  }
}

}  // namespace
