// The collision manager: front faces hit, back faces and insides ignored, the closest object
// winning, the segment's ends, the cosine, refused inputs, triangle meshes (Embree against the
// plain test), linked meshes and rebuilding. Hostile meshes are left to the fuzz harness.
#include <cstdlib>

#include "host/collision_mesh.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "host/tests/test_channels.h"

namespace {

using Manager = Tev_MultiCollisionManager;
constexpr int kLinked = Manager::kLinkCollisionObjects;
// A box turned a quarter about Y and stretched: local X (scaled 2) runs along world -Z, local Z
// along +X, centred at (0, 0, 5); it spans x -1..1, y -1..1, z 3..7.
const D3DXMATRIX kTurnedBox(0, 0, -2, 0, 0, 1, 0, 0, 1, 0, 0, 0, 0, 0, 5, 1);
// The unit cube mirrored in X: the same box, with a negative determinant.
const D3DXMATRIX kMirroredBox(-1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1);

D3DXMATRIX Translation(float x, float y, float z) {
  return D3DXMATRIX(1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, x, y, z, 1);
}

Vec3d RandomPoint(double low, double high) {
  auto random = [&] { return low + (high - low) * std::rand() / RAND_MAX; };
  return {random(), random(), random()};
}

struct Answer {
  int Id;
  D3DXVECTOR3 Point, Normal;
  float Cosine;
};

class Collision : public HostContextTest {
 protected:
  Answer Query(D3DXVECTOR3 origin, D3DXVECTOR3 ray) {
    Answer a{};
    a.Id = manager_.GetClosestFrontFaceCollision(&origin, &ray, &a.Point, &a.Normal, &a.Cosine);
    return a;
  }
  Manager manager_;
};

TEST_F(Collision, EachShapeAnswersItsFrontFaceOnly) {
  struct Case {
    int (*add)(Manager&);
    D3DXVECTOR3 origin, ray;
    bool hits;
    D3DXVECTOR3 point{}, normal{};  // when it hits
  };
  auto plane = [](Manager& m) { return m.AddPlane({0, 1, 0}, {0, 3, 0}); };
  auto sphere = [](Manager& m) { return m.AddSphere({1, 0, 0}, 2); };
  auto turned = [](Manager& m) { return m.AddBox(kTurnedBox, {1, 1, 1}); };
  auto mirrored = [](Manager& m) { return m.AddBox(kMirroredBox, {1, 1, 1}); };
  const Case cases[] = {
      {plane, {2, 3, 4}, {0, -4, 0}, true, {2, 1, 4}, {0, 1, 0}},
      {plane, {2, -1, 4}, {0, 4, 0}, false},  // from behind
      {sphere, {2, 5, 0}, {0, -5, 0}, true, {2, 1.7320508f, 0}, {0.5f, 0.8660254f, 0}},
      {sphere, {1, 0, 0}, {0, 0, 5}, false},    // from inside
      {sphere, {3, 0, -5}, {0, 0, 10}, false},  // grazing
      {turned, {0, 0, 0}, {0, 0, 10}, true, {0, 0, 3}, {0, 0, -1}},
      {turned, {3, 0.5f, 5}, {-4, 0, 0}, true, {1, 0.5f, 5}, {1, 0, 0}},
      {turned, {0, 0, 5}, {0, 0, 10}, false},  // from inside
      {mirrored, {3, 0, 0}, {-4, 0, 0}, true, {1, 0, 0}, {1, 0, 0}},
      {mirrored, {0, 0, 0}, {-4, 0, 0}, false}};
  for (const Case& c : cases) {
    SCOPED_TRACE(&c - cases);
    manager_.ClearObjects();
    ASSERT_EQ(c.add(manager_), 0);
    const Answer a = Query(c.origin, c.ray);
    EXPECT_EQ(a.Id, c.hits ? 0 : -1);
    if (!c.hits) continue;
    ExpectNear(a.Point, c.point);
    ExpectNear(a.Normal, c.normal);
  }
}

// The closest hit wins, ties go to the lowest id; the segment holds both its ends and the
// cosine is taken with its unit direction.
TEST_F(Collision, ClosestHitOnTheSegmentWins) {
  ASSERT_EQ(manager_.AddPlane({0, 0, 0}, {0, 1, 0}), 0);
  ASSERT_EQ(manager_.AddBox(kMirroredBox, {1, 1, 1}), 1);  // top face at y 1
  ASSERT_EQ(manager_.AddSphere({0, 2, 0}, 0.5f), 2);       // top at y 2.5
  ASSERT_EQ(manager_.AddPlane({0, 1, 0}, {0, 1, 0}), 3);   // level with the box's top
  EXPECT_EQ(Query({0, 5, 0}, {0, -10, 0}).Id, 2);
  EXPECT_EQ(Query({0.8f, 5, 0}, {0, -10, 0}).Id, 1);
  const Answer a = Query({3, 2, 0}, {1.5f, -2.0f, 0});  // length 2.5
  EXPECT_EQ(a.Id, 3);
  EXPECT_NEAR(a.Cosine, -0.8f, 1e-6f);
  ExpectNear(a.Point, {3.75f, 1, 0});
  EXPECT_EQ(Query({3, 2, 0}, {0, -0.5f, 0}).Id, -1);
  EXPECT_EQ(Query({3, 2, 0}, {0, -1, 0}).Id, 3);     // ends on the plane
  EXPECT_EQ(Query({3, 0, 0}, {0, -1, 0}).Id, 0);     // starts on it
  EXPECT_EQ(Query({3, 0, 0}, {0, 0.5f, 0}).Id, -1);  // leaves through it
}

TEST_F(Collision, UnusableQueriesAndShapesAreRefused) {
  ASSERT_EQ(manager_.AddPlane({0, 0, 0}, {0, 1, 0}), 0);
  EXPECT_EQ(Query({0, 1, 0}, {0, 0, 0}).Id, -1);
  EXPECT_EQ(Query({kNaN, 1, 0}, {0, -2, 0}).Id, -1);
  EXPECT_EQ(Query({0, 1, 0}, {0, -kInf, 0}).Id, -1);
  D3DXVECTOR3 ray{0, -2, 0};
  EXPECT_EQ(manager_.GetClosestFrontFaceCollision(nullptr, &ray, nullptr, nullptr, nullptr), -1);
  manager_.ClearObjects();
  D3DXMATRIX flat = kMirroredBox;
  flat._22 = 0.0f;
  for (int id : {manager_.AddPlane({0, 0, 0}, {0, 0, 0}), manager_.AddSphere({kInf, 0, 0}, 1),
                 manager_.AddSphere({}, 0), manager_.AddBox(flat, {1, 1, 1}),
                 manager_.AddBox(kMirroredBox, {1, 0, 1}), manager_.AddMesh(nullptr)})
    EXPECT_EQ(id, -1);
  EXPECT_EQ(Query({0, 1, 0}, {0, -2, 0}).Id, -1);
  EXPECT_EQ(manager_.AddSphere({0, 0, 0}, 1.0f), 0);  // refusals use up no ids
}

// On a tangle of overlapping triangles Embree's search must give what testing every triangle
// gives; a mesh made without a device tests every triangle.
TEST(CollisionMeshSearch, EmbreeAgreesWithThePlainTest) {
  std::srand(12345);
  std::vector<CollisionTriangle> triangles;
  while (triangles.size() < 400) {
    const Vec3d centre = RandomPoint(-1, 1);
    CollisionTriangle t;
    if (MakeCollisionTriangle(centre + RandomPoint(-0.3, 0.3), centre + RandomPoint(-0.3, 0.3),
                              centre + RandomPoint(-0.3, 0.3), &t))
      triangles.push_back(t);
  }
  RTCDevice device = rtcNewDevice("threads=1");
  ASSERT_NE(device, nullptr);
  {
    CollisionMesh embree(device, triangles), plain(nullptr, triangles);
    ASSERT_TRUE(embree.UsesEmbree() && !plain.UsesEmbree());
    int hits = 0, disagreements = 0;
    for (int i = 0; i < 20000; ++i) {
      const CollisionSegment segment{RandomPoint(-2, 2), RandomPoint(-3, 3)};
      CollisionHit a, b;
      const bool hit = embree.Intersect(segment, 1.0, &a);
      if (hit != plain.Intersect(segment, 1.0, &b)) {
        ++disagreements;  // only a ray through an edge, to float precision, may do this
      } else if (hit) {
        ++hits;
        ASSERT_NEAR(a.T, b.T, 1e-5) << i;
        EXPECT_LT(Dot(segment.Ray, a.Normal), 0.0);
      }
    }
    EXPECT_GT(hits, 2000);
    EXPECT_LE(disagreements, 10);
  }
  rtcReleaseDevice(device);
}

// Linked meshes are taken at a rebuild and numbered after the objects added from code; meshes
// move only at a rebuild.
TEST_F(Collision, LinkedAndAddedMeshesFollowRebuilds) {
  Tev_DX8_ObjectDataChannel added, linked;
  added.BuildQuad(2.0f, 2.0f);
  linked.BuildQuad(2.0f, 2.0f);
  linked.SetWorldMatrix(Translation(10, 0, 0));
  ASSERT_EQ(manager_.AddMesh(&added), 0);
  ASSERT_TRUE(manager_.AddChild(kLinked, &linked) && manager_.AddChild(kLinked, nullptr));
  EXPECT_EQ(Query({10, 1, 0}, {0, -2, 0}).Id, -1);
  manager_.RebuildAllCollisionObjects();
  EXPECT_EQ(Query({10, 1, 0}, {0, -2, 0}).Id, 1);
  ASSERT_EQ(manager_.AddSphere({0, -50, 0}, 1.0f), 1);  // the linked mesh moves up behind it
  EXPECT_EQ(Query({10, 1, 0}, {0, -2, 0}).Id, 2);
  added.SetWorldMatrix(Translation(0, 2, 0));
  EXPECT_EQ(Query({0, 1, 0}, {0, -2, 0}).Id, 0);  // the old place until the rebuild
  manager_.RebuildAllCollisionObjects();
  EXPECT_EQ(Query({0, 1, 0}, {0, -2, 0}).Id, -1);
  ExpectNear(Query({0, 5, 0}, {0, -10, 0}).Point, {0, 2, 0});
}

}  // namespace
