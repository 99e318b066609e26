// Triangle meshes in the collision manager: winding of the host's built-in shapes, reading the
// index list, Embree against the plain triangle test, meshes from the "Collision Objects" link,
// and rebuilding after the mesh moved.
#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include "host/collision_mesh.h"
#include "host/host_context.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"

namespace {

constexpr float kTolerance = 1e-5f;

int Query(Tev_MultiCollisionManager& manager, D3DXVECTOR3 origin, D3DXVECTOR3 ray,
          D3DXVECTOR3* point = nullptr, D3DXVECTOR3* normal = nullptr) {
  D3DXVECTOR3 p;
  D3DXVECTOR3 n;
  float cosine;
  const int id = manager.GetClosestFrontFaceCollision(&origin, &ray, &p, &n, &cosine);
  if (point) *point = p;
  if (normal) *normal = n;
  return id;
}

void SetMesh(Tev_DX8_ObjectDataChannel& mesh, const std::vector<D3DXVECTOR3>& positions,
             const std::vector<DWORD>& indices) {
  mesh.SetVertexCount(static_cast<int>(positions.size()));
  for (std::size_t v = 0; v < positions.size(); ++v)
    mesh.SetVertexPosition(positions[v], static_cast<int>(v));
  mesh.SetIndexCount(static_cast<int>(indices.size()));
  for (std::size_t i = 0; i < indices.size(); ++i) mesh.SetIndex(indices[i], static_cast<int>(i));
}

D3DXMATRIX Translation(float x, float y, float z) {
  D3DXMATRIX m;
  D3DXMatrixTranslation(&m, x, y, z);
  return m;
}

float RandomBetween(float low, float high) {
  return low + (high - low) * static_cast<float>(std::rand()) / static_cast<float>(RAND_MAX);
}

D3DXVECTOR3 RandomPoint(float low, float high) {
  return {RandomBetween(low, high), RandomBetween(low, high), RandomBetween(low, high)};
}

class CollisionMeshTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_MultiCollisionManager manager_;
};

// The object-data channel's quad faces +Y: it must collide from above and not from below.
TEST_F(CollisionMeshTest, BuiltInQuadCollidesFromAboveOnly) {
  Tev_DX8_ObjectDataChannel quad;
  quad.BuildQuad(2.0f, 2.0f);
  ASSERT_EQ(manager_.AddMesh(&quad), 0);
  D3DXVECTOR3 point;
  D3DXVECTOR3 normal;
  ASSERT_EQ(Query(manager_, {0.25f, 1, -0.5f}, {0, -2, 0}, &point, &normal), 0);
  EXPECT_NEAR(point.x, 0.25f, kTolerance);
  EXPECT_NEAR(point.y, 0.0f, kTolerance);
  EXPECT_NEAR(point.z, -0.5f, kTolerance);
  EXPECT_NEAR(normal.y, 1.0f, kTolerance);
  EXPECT_EQ(Query(manager_, {0.25f, -1, -0.5f}, {0, 2, 0}), -1);
  EXPECT_EQ(Query(manager_, {3.0f, 1, 0}, {0, -2, 0}), -1);  // beside the quad
}

// The built-in box is closed and wound outward: every ray from outside towards its centre hits
// with an outward normal, and no ray from its centre hits at all.
TEST_F(CollisionMeshTest, BuiltInBoxIsHitFromOutsideOnly) {
  Tev_DX8_ObjectDataChannel box;
  box.BuildBox({1, 1, 1});
  ASSERT_EQ(manager_.AddMesh(&box), 0);
  std::srand(7);
  for (int i = 0; i < 200; ++i) {
    D3DXVECTOR3 direction = RandomPoint(-1, 1);
    D3DXVec3Normalize(&direction, &direction);
    if (D3DXVec3Length(&direction) == 0.0f) continue;
    const D3DXVECTOR3 outside = direction * 5.0f;
    D3DXVECTOR3 point;
    D3DXVECTOR3 normal;
    ASSERT_EQ(Query(manager_, outside, -outside, &point, &normal), 0) << i;
    EXPECT_GT(D3DXVec3Dot(&normal, &outside), 0.0f);
    EXPECT_NEAR(std::max({std::fabs(point.x), std::fabs(point.y), std::fabs(point.z)}), 1.0f,
                kTolerance);
    EXPECT_EQ(Query(manager_, {0, 0, 0}, outside), -1) << i;
  }
}

TEST_F(CollisionMeshTest, PartialTrianglesAndBadIndicesAreLeftOut) {
  Tev_DX8_ObjectDataChannel mesh;
  // Triangle 0 faces +Y; triangle 1 names vertex 9 of 4; then a partial triangle.
  SetMesh(mesh, {{0, 0, 0}, {0, 0, 1}, {1, 0, 0}, {1, 0, 1}}, {0, 1, 2, 2, 1, 9, 1, 3});
  const std::vector<CollisionTriangle> triangles = CollisionMesh::ReadTriangles(mesh);
  ASSERT_EQ(triangles.size(), 1u);
  EXPECT_NEAR(triangles[0].Normal.y, 1.0, 1e-12);

  // A flat triangle is left out too.
  SetMesh(mesh, {{0, 0, 0}, {1, 0, 0}, {2, 0, 0}}, {0, 1, 2});
  EXPECT_TRUE(CollisionMesh::ReadTriangles(mesh).empty());
}

TEST_F(CollisionMeshTest, TrianglesAreReadThroughTheWorldMatrix) {
  Tev_DX8_ObjectDataChannel mesh;
  SetMesh(mesh, {{0, 0, 0}, {0, 0, 1}, {1, 0, 0}}, {0, 1, 2});
  mesh.SetWorldMatrix(Translation(10, 20, 30));
  const std::vector<CollisionTriangle> triangles = CollisionMesh::ReadTriangles(mesh);
  ASSERT_EQ(triangles.size(), 1u);
  EXPECT_DOUBLE_EQ(triangles[0].B.x, 10.0);
  EXPECT_DOUBLE_EQ(triangles[0].B.y, 20.0);
  EXPECT_DOUBLE_EQ(triangles[0].B.z, 31.0);
}

// Embree's search must give what testing every triangle gives, on a tangle of triangles where
// many front and back faces overlap.
TEST(CollisionMeshSearch, EmbreeAgreesWithThePlainTest) {
  std::srand(12345);
  std::vector<CollisionTriangle> triangles;
  while (triangles.size() < 400) {
    const Vec3d centre = ToVec3d(RandomPoint(-1, 1));
    CollisionTriangle triangle;
    if (MakeCollisionTriangle(centre + ToVec3d(RandomPoint(-0.3f, 0.3f)),
                              centre + ToVec3d(RandomPoint(-0.3f, 0.3f)),
                              centre + ToVec3d(RandomPoint(-0.3f, 0.3f)), &triangle))
      triangles.push_back(triangle);
  }
  RTCDevice device = rtcNewDevice("threads=1");
  ASSERT_NE(device, nullptr);
  {
    CollisionMesh mesh(device, triangles);
    ASSERT_TRUE(mesh.UsesEmbree());
    int hits = 0;
    int disagreements = 0;
    constexpr int kRays = 20000;
    for (int i = 0; i < kRays; ++i) {
      const CollisionSegment segment{ToVec3d(RandomPoint(-2, 2)), ToVec3d(RandomPoint(-3, 3))};
      CollisionHit embree;
      CollisionHit plain;
      const bool embree_hit = mesh.Intersect(segment, 1.0, &embree);
      const bool plain_hit = mesh.IntersectEachTriangle(segment, 1.0, &plain);
      if (embree_hit != plain_hit) {
        ++disagreements;  // only a ray through an edge, to float precision, may do this
        continue;
      }
      if (!plain_hit) continue;
      ++hits;
      ASSERT_NEAR(embree.T, plain.T, 1e-5) << i;
      EXPECT_LT(Dot(segment.Ray, embree.Normal), 0.0);
    }
    EXPECT_GT(hits, kRays / 10);
    EXPECT_LE(disagreements, kRays / 2000);
  }
  rtcReleaseDevice(device);
}

TEST(CollisionMeshSearch, WithoutADeviceEveryTriangleIsTested) {
  CollisionTriangle triangle;
  ASSERT_TRUE(MakeCollisionTriangle({0, 0, 0}, {0, 0, 1}, {1, 0, 0}, &triangle));
  CollisionMesh mesh(nullptr, {triangle});
  EXPECT_FALSE(mesh.UsesEmbree());
  CollisionHit hit;
  ASSERT_TRUE(mesh.Intersect({{0.2, 1, 0.2}, {0, -2, 0}}, 1.0, &hit));
  EXPECT_DOUBLE_EQ(hit.T, 0.5);
  EXPECT_FALSE(mesh.Intersect({{0.2, -1, 0.2}, {0, 2, 0}}, 1.0, &hit));
}

TEST_F(CollisionMeshTest, LinkedMeshesFollowTheCodeObjectsAfterARebuild) {
  Tev_DX8_ObjectDataChannel quad;
  quad.BuildQuad(2.0f, 2.0f);
  ASSERT_EQ(manager_.AddPlane({0, -5, 0}, {0, 1, 0}), 0);
  ASSERT_TRUE(manager_.AddChild(Tev_MultiCollisionManager::kLinkCollisionObjects, &quad));
  ASSERT_TRUE(manager_.AddChild(Tev_MultiCollisionManager::kLinkCollisionObjects, nullptr));
  EXPECT_EQ(Query(manager_, {0, 1, 0}, {0, -10, 0}), 0);  // not taken until the rebuild

  manager_.RebuildAllCollisionObjects();
  EXPECT_EQ(manager_.GetObjectCount(), 2);
  D3DXVECTOR3 point;
  EXPECT_EQ(Query(manager_, {0, 1, 0}, {0, -10, 0}, &point), 1);
  EXPECT_NEAR(point.y, 0.0f, kTolerance);

  // A code object added later takes the next code id; the linked mesh moves up behind it.
  ASSERT_EQ(manager_.AddSphere({10, 0, 0}, 1.0f), 1);
  EXPECT_EQ(Query(manager_, {0, 1, 0}, {0, -10, 0}), 2);
  EXPECT_EQ(Query(manager_, {10, 5, 0}, {0, -10, 0}), 1);

  manager_.ClearChild(Tev_MultiCollisionManager::kLinkCollisionObjects);
  manager_.RebuildAllCollisionObjects();
  EXPECT_EQ(manager_.GetObjectCount(), 2);
  EXPECT_EQ(Query(manager_, {0, 1, 0}, {0, -10, 0}), 0);
}

TEST_F(CollisionMeshTest, MovingTheMeshAndRebuildingMovesTheHits) {
  Tev_DX8_ObjectDataChannel added;
  added.BuildQuad(2.0f, 2.0f);
  Tev_DX8_ObjectDataChannel linked;
  linked.BuildQuad(2.0f, 2.0f);
  linked.SetWorldMatrix(Translation(10, 0, 0));
  ASSERT_EQ(manager_.AddMesh(&added), 0);
  ASSERT_TRUE(manager_.AddChild(Tev_MultiCollisionManager::kLinkCollisionObjects, &linked));
  manager_.RebuildAllCollisionObjects();

  added.SetWorldMatrix(Translation(0, 2, 0));
  linked.SetWorldMatrix(Translation(10, 3, 0));
  D3DXVECTOR3 point;
  ASSERT_EQ(Query(manager_, {0, 5, 0}, {0, -10, 0}, &point), 0);
  EXPECT_NEAR(point.y, 0.0f, kTolerance);  // the old place until the rebuild
  manager_.RebuildAllCollisionObjects();
  ASSERT_EQ(Query(manager_, {0, 5, 0}, {0, -10, 0}, &point), 0);
  EXPECT_NEAR(point.y, 2.0f, kTolerance);
  ASSERT_EQ(Query(manager_, {10, 5, 0}, {0, -10, 0}, &point), 1);
  EXPECT_NEAR(point.y, 3.0f, kTolerance);
  EXPECT_EQ(Query(manager_, {0, 1, 0}, {0, -2, 0}), -1);  // nothing left at the old height
}

// A mesh channel whose vertices cannot be read.
class BrokenMesh : public Tev_DX8_ObjectDataChannel {
 public:
  D3DXVECTOR3 GetVertexPosition(DWORD) override { throw std::runtime_error("unreadable"); }
};

// A failed rebuild leaves the objects as they were and says so; nothing reaches the caller.
TEST_F(CollisionMeshTest, FailedRebuildKeepsTheObjectsAndReports) {
  std::vector<std::string> messages;
  context_.DebugMessages.SetSink([&](const char* text) { messages.emplace_back(text); });
  Tev_DX8_ObjectDataChannel quad;
  quad.BuildQuad(2.0f, 2.0f);
  ASSERT_TRUE(manager_.AddChild(Tev_MultiCollisionManager::kLinkCollisionObjects, &quad));
  manager_.RebuildAllCollisionObjects();
  ASSERT_EQ(manager_.GetObjectCount(), 1);
  EXPECT_TRUE(messages.empty());

  BrokenMesh broken;
  broken.BuildQuad(2.0f, 2.0f);
  ASSERT_TRUE(manager_.AddChild(Tev_MultiCollisionManager::kLinkCollisionObjects, &broken));
  EXPECT_NO_THROW(manager_.RebuildAllCollisionObjects());
  EXPECT_EQ(manager_.GetObjectCount(), 1);
  EXPECT_EQ(Query(manager_, {0, 1, 0}, {0, -2, 0}), 0);
  ASSERT_EQ(messages.size(), 1u);
  EXPECT_NE(messages[0].find("not rebuilt"), std::string::npos);
  EXPECT_EQ(manager_.AddMesh(&broken), -1);  // refused, not thrown
}

// A large mesh: the closest of many stacked layers, with ids of the objects around it intact.
TEST_F(CollisionMeshTest, ClosestLayerOfALargeMesh) {
  Tev_DX8_ObjectDataChannel grid;
  std::vector<D3DXVECTOR3> positions;
  std::vector<DWORD> indices;
  constexpr int kCells = 50;
  for (int layer = 0; layer < 3; ++layer)
    for (int i = 0; i <= kCells; ++i)
      for (int j = 0; j <= kCells; ++j)
        positions.push_back(
            {static_cast<float>(i), static_cast<float>(layer), static_cast<float>(j)});
  const auto vertex = [](int layer, int i, int j) {
    return static_cast<DWORD>(layer * (kCells + 1) * (kCells + 1) + i * (kCells + 1) + j);
  };
  for (int layer = 0; layer < 3; ++layer)
    for (int i = 0; i < kCells; ++i)
      for (int j = 0; j < kCells; ++j) {
        // (i,j), (i,j+1), (i+1,j) faces +Y.
        indices.insert(indices.end(),
                       {vertex(layer, i, j), vertex(layer, i, j + 1), vertex(layer, i + 1, j)});
        indices.insert(indices.end(), {vertex(layer, i + 1, j), vertex(layer, i, j + 1),
                                       vertex(layer, i + 1, j + 1)});
      }
  SetMesh(grid, positions, indices);
  ASSERT_EQ(manager_.AddPlane({0, -1, 0}, {0, 1, 0}), 0);
  ASSERT_EQ(manager_.AddMesh(&grid), 1);
  D3DXVECTOR3 point;
  EXPECT_EQ(Query(manager_, {20.3f, 10, 30.6f}, {0, -20, 0}, &point), 1);
  EXPECT_NEAR(point.y, 2.0f, kTolerance);
  EXPECT_EQ(Query(manager_, {20.3f, 1.5f, 30.6f}, {0, -20, 0}, &point), 1);
  EXPECT_NEAR(point.y, 1.0f, kTolerance);
  EXPECT_EQ(Query(manager_, {20.3f, -0.5f, 30.6f}, {0, -20, 0}, &point), 0);
  EXPECT_EQ(Query(manager_, {20.3f, -0.5f, 30.6f}, {0, 20, 0}), -1);  // all back faces
}

}  // namespace
