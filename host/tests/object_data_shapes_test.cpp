// The built-in shapes: sizes, outward normals, clockwise front faces seen from outside and,
// for the closed shapes, a watertight consistently wound surface.
#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>
#include <map>
#include <ostream>
#include <string>
#include <tuple>

#include "host/object_data_channel.h"
#include "host/tests/test_channels.h"

namespace {

struct ShapeCase {
  const char* name;
  std::function<void(Tev_DX8_ObjectDataChannel&)> build;
  int vertices;
  int triangles;
  bool closed;  // surrounds its centre: normals and faces point away from it
};

void PrintTo(const ShapeCase& shape, std::ostream* out) {
  *out << shape.name;
}

D3DXVECTOR3 Cross(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}
float Dot(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return a.x * b.x + a.y * b.y + a.z * b.z;
}

class BuiltInShape : public HostContextTest, public ::testing::WithParamInterface<ShapeCase> {
 protected:
  void SetUp() override {
    GetParam().build(mesh_);
    ASSERT_EQ(mesh_.GetIndexCount() % 3, 0);
  }
  D3DXVECTOR3 Position(int index_position) {
    return mesh_.GetVertexPosition(mesh_.GetIndexes(static_cast<DWORD>(index_position)));
  }
  // Where a face should point away from: the centre for closed shapes, below for flat ones.
  D3DXVECTOR3 Outward(const D3DXVECTOR3& point) const {
    return GetParam().closed ? point : D3DXVECTOR3(0, 1, 0);
  }
  Tev_DX8_ObjectDataChannel mesh_;
};

TEST_P(BuiltInShape, HasTheExpectedSize) {
  EXPECT_EQ(mesh_.GetVertexCount(), GetParam().vertices);
  EXPECT_EQ(mesh_.GetIndexCount(), GetParam().triangles * 3);
}

TEST_P(BuiltInShape, NormalsAreUnitAndOutward) {
  for (DWORD v = 0; v < static_cast<DWORD>(mesh_.GetVertexCount()); ++v) {
    const D3DXVECTOR3 normal = mesh_.GetVertexNormals(v);
    EXPECT_NEAR(std::sqrt(Dot(normal, normal)), 1.0f, 1e-5f) << v;
    EXPECT_GT(Dot(normal, Outward(mesh_.GetVertexPosition(v))), 0.0f) << v;
  }
}

// Direct3D culls counter-clockwise faces by default: seen from outside, every triangle runs
// clockwise, so that cross(b - a, c - a) points out of the shape.
TEST_P(BuiltInShape, FrontFacesAreClockwiseSeenFromOutside) {
  for (int t = 0; t < mesh_.GetIndexCount(); t += 3) {
    const D3DXVECTOR3 a = Position(t), b = Position(t + 1), c = Position(t + 2);
    const D3DXVECTOR3 face = Cross(b - a, c - a);
    const D3DXVECTOR3 centroid = (a + b + c) / 3.0f;
    EXPECT_GT(std::sqrt(Dot(face, face)), 1e-6f) << "degenerate triangle " << t / 3;
    EXPECT_GT(Dot(face, Outward(centroid)), 0.0f) << "triangle " << t / 3;
  }
}

// In a closed, consistently wound surface every edge is run once in each direction.
TEST_P(BuiltInShape, ClosedShapesAreWatertight) {
  if (!GetParam().closed) GTEST_SKIP() << "open shape";
  using Point = std::tuple<float, float, float>;
  auto key = [](const D3DXVECTOR3& p) {
    auto snap = [](float f) { return std::round(f * 1e4f) / 1e4f + 0.0f; };
    return Point{snap(p.x), snap(p.y), snap(p.z)};
  };
  std::map<std::pair<Point, Point>, int> directed;
  for (int t = 0; t < mesh_.GetIndexCount(); t += 3)
    for (int k = 0; k < 3; ++k) ++directed[{key(Position(t + k)), key(Position(t + (k + 1) % 3))}];
  for (const auto& [edge, count] : directed) {
    EXPECT_EQ(count, 1);
    const auto reverse = directed.find({edge.second, edge.first});
    ASSERT_NE(reverse, directed.end());
    EXPECT_EQ(reverse->second, 1);
  }
}

TEST_P(BuiltInShape, TextureCoordinatesLieInTheUnitSquare) {
  for (DWORD v = 0; v < static_cast<DWORD>(mesh_.GetVertexCount()); ++v) {
    const D3DXVECTOR2 uv = mesh_.GetVertexTUV(0, v);
    EXPECT_GE(uv.x, 0.0f);
    EXPECT_LE(uv.x, 1.0f);
    EXPECT_GE(uv.y, 0.0f);
    EXPECT_LE(uv.y, 1.0f);
  }
}

INSTANTIATE_TEST_SUITE_P(
    Shapes, BuiltInShape,
    ::testing::Values(ShapeCase{"quad", [](auto& m) { m.BuildQuad(2.0f, 3.0f); }, 4, 2, false},
                      ShapeCase{"box",
                                [](auto& m) {
                                  m.BuildBox({1.0f, 2.0f, 0.5f});
                                },
                                24, 12, true},
                      ShapeCase{"box_negative_extents",
                                [](auto& m) {
                                  m.BuildBox({-1.0f, 1.0f, -3.0f});
                                },
                                24, 12, true},
                      ShapeCase{"sphere", [](auto& m) { m.BuildUvSphere(1.5f, 16, 8); }, 17 * 9,
                                2 * 16 * 8 - 2 * 16, true},
                      ShapeCase{"sphere_clamped", [](auto& m) { m.BuildUvSphere(1.0f, 1, 1); },
                                4 * 3, 2 * 3, true},
                      ShapeCase{"disc", [](auto& m) { m.BuildDisc(1.0f, 12); }, 13, 12, false}),
    [](const ::testing::TestParamInfo<ShapeCase>& info) { return std::string(info.param.name); });

TEST(BuiltInShapes, BoxSpansItsHalfExtents) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_ObjectDataChannel mesh;
  mesh.BuildBox({1.0f, 2.0f, 3.0f});
  EXPECT_EQ(mesh.GetBoundingBoxMin(), D3DXVECTOR3(-1, -2, -3));
  EXPECT_EQ(mesh.GetBoundingBoxMax(), D3DXVECTOR3(1, 2, 3));
}

TEST(BuiltInShapes, UnusableSizesLeaveAnEmptyMesh) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_ObjectDataChannel mesh;
  const float nan = std::numeric_limits<float>::quiet_NaN();
  const float inf = std::numeric_limits<float>::infinity();
  mesh.BuildBox({1, 1, 1});
  mesh.BuildQuad(0.0f, 1.0f);
  EXPECT_EQ(mesh.GetVertexCount(), 0);  // the earlier box is replaced, not kept
  mesh.BuildBox({1, nan, 1});
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  mesh.BuildUvSphere(inf, 8, 8);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  mesh.BuildDisc(-0.0f, 8);
  EXPECT_EQ(mesh.GetIndexCount(), 0);
}

TEST(BuiltInShapes, BuildingKeepsTheWorldMatrix) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_ObjectDataChannel mesh;
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 0, 4, 0);
  mesh.SetWorldMatrix(world);
  mesh.BuildDisc(2.0f, 5);
  EXPECT_EQ(mesh.GetWorldMatrix(), world);
}

}  // namespace
