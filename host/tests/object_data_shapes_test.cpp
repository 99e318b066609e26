// The built-in shapes: sizes, unit outward normals and front faces wound clockwise seen from
// outside, the winding Direct3D draws and the collision manager hits.
#include "host/object_data_channel.h"
#include "host/tests/test_channels.h"

namespace {

using BuiltInShapes = HostContextTest;
using Mesh = Tev_DX8_ObjectDataChannel;

TEST_F(BuiltInShapes, HaveOutwardNormalsAndClockwiseFrontFaces) {
  struct Case {
    const char* name;
    void (*build)(Mesh&);
    int vertices, triangles;
    bool closed;  // surrounds its centre; flat shapes face +Y
  };
  const Case cases[] = {
      {"quad", [](Mesh& m) { m.BuildQuad(2.0f, 3.0f); }, 4, 2, false},
      {"box",
       [](Mesh& m) {
         m.BuildBox({1.0f, 2.0f, 0.5f});
       },
       24, 12, true},
      {"box, negative extents",
       [](Mesh& m) {
         m.BuildBox({-1.0f, 1.0f, -3.0f});
       },
       24, 12, true},
      {"sphere", [](Mesh& m) { m.BuildUvSphere(1.5f, 16, 8); }, 17 * 9, 2 * 16 * 8 - 2 * 16, true},
      {"sphere, clamped", [](Mesh& m) { m.BuildUvSphere(1.0f, 1, 1); }, 4 * 3, 2 * 3, true},
      {"disc", [](Mesh& m) { m.BuildDisc(1.0f, 12); }, 13, 12, false}};
  for (const Case& c : cases) {
    SCOPED_TRACE(c.name);
    Mesh mesh;
    c.build(mesh);
    ASSERT_EQ(mesh.GetVertexCount(), c.vertices);
    ASSERT_EQ(mesh.GetIndexCount(), c.triangles * 3);
    auto outward = [&](const D3DXVECTOR3& p) { return c.closed ? p : D3DXVECTOR3(0, 1, 0); };
    for (DWORD v = 0; v < static_cast<DWORD>(c.vertices); ++v) {
      const D3DXVECTOR3 normal = mesh.GetVertexNormals(v), out = outward(mesh.GetVertexPosition(v));
      EXPECT_NEAR(D3DXVec3Length(&normal), 1.0f, 1e-5f) << v;
      EXPECT_GT(D3DXVec3Dot(&normal, &out), 0.0f) << v;
    }
    // Direct3D culls counter-clockwise faces: cross(b - a, c - a) must point out of the shape.
    for (DWORD t = 0; t < static_cast<DWORD>(c.triangles * 3); t += 3) {
      D3DXVECTOR3 p[3], face;
      for (DWORD k = 0; k < 3; ++k) p[k] = mesh.GetVertexPosition(mesh.GetIndexes(t + k));
      const D3DXVECTOR3 ab = p[1] - p[0], ac = p[2] - p[0], out = outward((p[0] + p[1] + p[2]) / 3);
      D3DXVec3Cross(&face, &ab, &ac);
      EXPECT_GT(D3DXVec3Dot(&face, &out), 1e-6f * D3DXVec3Length(&out)) << "triangle " << t / 3;
    }
  }
}

TEST_F(BuiltInShapes, SpanTheirSizeOrNothingForUnusableSizes) {
  Mesh mesh;
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 0, 4, 0);
  mesh.SetWorldMatrix(world);
  mesh.BuildBox({1.0f, 2.0f, 3.0f});
  EXPECT_TRUE(mesh.GetBoundingBoxMin() == D3DXVECTOR3(-1, -2, -3) &&
              mesh.GetBoundingBoxMax() == D3DXVECTOR3(1, 2, 3));
  EXPECT_EQ(mesh.GetWorldMatrix(), world);  // the shapes leave it alone
  mesh.BuildQuad(0.0f, 1.0f);
  EXPECT_EQ(mesh.GetVertexCount(), 0);  // the box is replaced, not kept
  mesh.BuildBox({1, kNaN, 1});
  mesh.BuildUvSphere(kInf, 8, 8);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  mesh.BuildDisc(-0.0f, 8);
  EXPECT_EQ(mesh.GetIndexCount(), 0);
}

}  // namespace
