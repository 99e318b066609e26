// The collision manager's queries against its analytic shapes: front faces hit, back faces and
// insides ignored, the closest object winning, the segment's ends, the cosine, and the inputs
// that answer no hit.
#include <gtest/gtest.h>

#include <functional>
#include <limits>
#include <ostream>
#include <string>
#include <vector>

#include "host/host_context.h"
#include "host/multi_collision_manager.h"

namespace {

constexpr float kTolerance = 1e-5f;
constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();
constexpr float kInf = std::numeric_limits<float>::infinity();

// The values a query left behind; the sentinels show what it did not write.
struct Answer {
  int Id = -2;
  D3DXVECTOR3 Point{-7.0f, -7.0f, -7.0f};
  D3DXVECTOR3 Normal{-7.0f, -7.0f, -7.0f};
  float Cosine = -7.0f;
};

Answer Query(Tev_MultiCollisionManager& manager, D3DXVECTOR3 origin, D3DXVECTOR3 ray) {
  Answer answer;
  answer.Id = manager.GetClosestFrontFaceCollision(&origin, &ray, &answer.Point, &answer.Normal,
                                                   &answer.Cosine);
  return answer;
}

void ExpectVectorNear(const D3DXVECTOR3& actual, const D3DXVECTOR3& expected) {
  EXPECT_NEAR(actual.x, expected.x, kTolerance);
  EXPECT_NEAR(actual.y, expected.y, kTolerance);
  EXPECT_NEAR(actual.z, expected.z, kTolerance);
}

void ExpectUntouched(const Answer& answer) {
  EXPECT_EQ(answer.Id, -1);
  EXPECT_EQ(answer.Point, D3DXVECTOR3(-7.0f, -7.0f, -7.0f));
  EXPECT_EQ(answer.Normal, D3DXVECTOR3(-7.0f, -7.0f, -7.0f));
  EXPECT_EQ(answer.Cosine, -7.0f);
}

// A box turned a quarter about Y and stretched: its local X (half extent 1, scaled 2) runs along
// world -Z, local Z along world +X; centred at (0, 0, 5). So it spans x -1..1, y -1..1, z 3..7.
D3DXMATRIX TurnedBoxWorld() {
  return D3DXMATRIX(0, 0, -2, 0,  //
                    0, 1, 0, 0,   //
                    1, 0, 0, 0,   //
                    0, 0, 5, 1);
}

// The unit cube mirrored in X: the same box, with a negative determinant.
D3DXMATRIX MirroredBoxWorld() {
  return D3DXMATRIX(-1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1);
}

struct ShapeCase {
  const char* Name;
  std::function<int(Tev_MultiCollisionManager&)> Add;
  D3DXVECTOR3 Origin;
  D3DXVECTOR3 Ray;
  bool Hits;
  D3DXVECTOR3 Point;   // when Hits
  D3DXVECTOR3 Normal;  // when Hits
};

void PrintTo(const ShapeCase& c, std::ostream* os) {
  *os << c.Name;
}

class CollisionShapeTest : public ::testing::TestWithParam<ShapeCase> {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_MultiCollisionManager manager_;
};

TEST_P(CollisionShapeTest, AnswersTheFrontFaceOnly) {
  const ShapeCase& c = GetParam();
  ASSERT_EQ(c.Add(manager_), 0);
  const Answer answer = Query(manager_, c.Origin, c.Ray);
  if (!c.Hits) {
    ExpectUntouched(answer);
    return;
  }
  ASSERT_EQ(answer.Id, 0);
  ExpectVectorNear(answer.Point, c.Point);
  ExpectVectorNear(answer.Normal, c.Normal);
  EXPECT_LT(answer.Cosine, 0.0f);
}

const auto kPlane = [](Tev_MultiCollisionManager& m) {
  return m.AddPlane({0.0f, 1.0f, 0.0f}, {0.0f, 3.0f, 0.0f});  // normal need not be unit
};
const auto kSphere = [](Tev_MultiCollisionManager& m) {
  return m.AddSphere({1.0f, 0.0f, 0.0f}, 2.0f);
};
const auto kTurnedBox = [](Tev_MultiCollisionManager& m) {
  return m.AddBox(TurnedBoxWorld(), {1.0f, 1.0f, 1.0f});
};
const auto kMirroredBox = [](Tev_MultiCollisionManager& m) {
  return m.AddBox(MirroredBoxWorld(), {1.0f, 1.0f, 1.0f});
};

INSTANTIATE_TEST_SUITE_P(
    Shapes, CollisionShapeTest,
    ::testing::Values(
        ShapeCase{"PlaneFromAbove", kPlane, {2, 3, 4}, {0, -4, 0}, true, {2, 1, 4}, {0, 1, 0}},
        ShapeCase{"PlaneFromBelow", kPlane, {2, -1, 4}, {0, 4, 0}, false, {}, {}},
        ShapeCase{"PlaneParallel", kPlane, {0, 1, 0}, {5, 0, 0}, false, {}, {}},
        ShapeCase{
            "SphereFromOutside", kSphere, {1, 0, -5}, {0, 0, 4}, true, {1, 0, -2}, {0, 0, -1}},
        ShapeCase{"SphereOffCentre",
                  kSphere,
                  {2, 5, 0},
                  {0, -5, 0},
                  true,
                  {2, 1.7320508f, 0},
                  {0.5f, 0.8660254f, 0}},
        ShapeCase{"SphereFromInside", kSphere, {1, 0, 0}, {0, 0, 5}, false, {}, {}},
        ShapeCase{"SphereGoingAway", kSphere, {1, 0, 3}, {0, 0, 5}, false, {}, {}},
        ShapeCase{"SphereGrazed", kSphere, {3, 0, -5}, {0, 0, 10}, false, {}, {}},
        ShapeCase{
            "TurnedBoxNearFace", kTurnedBox, {0, 0, 0}, {0, 0, 10}, true, {0, 0, 3}, {0, 0, -1}},
        ShapeCase{"TurnedBoxSideFace",
                  kTurnedBox,
                  {3, 0.5f, 5},
                  {-4, 0, 0},
                  true,
                  {1, 0.5f, 5},
                  {1, 0, 0}},
        ShapeCase{"TurnedBoxFromInside", kTurnedBox, {0, 0, 5}, {0, 0, 10}, false, {}, {}},
        ShapeCase{"TurnedBoxMissedBeside", kTurnedBox, {1.5f, 0, 0}, {0, 0, 10}, false, {}, {}},
        ShapeCase{"MirroredBoxKeepsOutwardNormals",
                  kMirroredBox,
                  {3, 0, 0},
                  {-4, 0, 0},
                  true,
                  {1, 0, 0},
                  {1, 0, 0}},
        ShapeCase{"MirroredBoxFromBehindFace", kMirroredBox, {0, 0, 0}, {-4, 0, 0}, false, {}, {}}),
    [](const auto& info) { return std::string(info.param.Name); });

class CollisionManagerTest : public ::testing::Test {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Tev_MultiCollisionManager manager_;
};

TEST_F(CollisionManagerTest, ClosestOfSeveralObjectsWins) {
  ASSERT_EQ(manager_.AddPlane({0, 0, 0}, {0, 1, 0}), 0);
  ASSERT_EQ(manager_.AddBox(MirroredBoxWorld(), {1, 1, 1}), 1);  // top face at y 1
  ASSERT_EQ(manager_.AddSphere({0, 2, 0}, 0.5f), 2);             // top at y 2.5
  EXPECT_EQ(manager_.GetObjectCount(), 3);

  const Answer sphere = Query(manager_, {0, 5, 0}, {0, -10, 0});
  EXPECT_EQ(sphere.Id, 2);
  ExpectVectorNear(sphere.Point, {0, 2.5f, 0});
  // Beside the sphere the box is next, beside both the plane.
  EXPECT_EQ(Query(manager_, {0.8f, 5, 0}, {0, -10, 0}).Id, 1);
  const Answer plane = Query(manager_, {3, 5, 0}, {0, -10, 0});
  EXPECT_EQ(plane.Id, 0);
  ExpectVectorNear(plane.Point, {3, 0, 0});
}

TEST_F(CollisionManagerTest, EqualDistancesGoToTheLowestId) {
  ASSERT_EQ(manager_.AddSphere({0, 0, 0}, 1.0f), 0);
  ASSERT_EQ(manager_.AddPlane({0, 1, 0}, {0, 1, 0}), 1);
  ASSERT_EQ(manager_.AddPlane({0, 1, 0}, {0, 1, 0}), 2);
  EXPECT_EQ(Query(manager_, {0, 3, 0}, {0, -3, 0}).Id, 0);
  EXPECT_EQ(Query(manager_, {4, 3, 0}, {0, -3, 0}).Id, 1);
}

// The cosine is taken with the ray's unit direction, whatever the ray's length.
TEST_F(CollisionManagerTest, CosineUsesTheUnitDirectionOfALongRay) {
  ASSERT_EQ(manager_.AddPlane({0, 0, 0}, {0, 1, 0}), 0);
  const Answer answer = Query(manager_, {0, 1, 0}, {1.5f, -2.0f, 0});  // length 2.5
  ASSERT_EQ(answer.Id, 0);
  EXPECT_NEAR(answer.Cosine, -0.8f, kTolerance);
  ExpectVectorNear(answer.Point, {0.75f, 0, 0});
  ExpectVectorNear(answer.Normal, {0, 1, 0});
}

// The segment holds both of its ends: t in [0, 1].
TEST_F(CollisionManagerTest, SegmentEndsAreIncludedAndShortSegmentsMiss) {
  ASSERT_EQ(manager_.AddPlane({0, 0, 0}, {0, 1, 0}), 0);
  ExpectUntouched(Query(manager_, {0, 1, 0}, {0, -0.5f, 0}));
  const Answer at_end = Query(manager_, {0, 1, 0}, {0, -1, 0});
  EXPECT_EQ(at_end.Id, 0);
  ExpectVectorNear(at_end.Point, {0, 0, 0});
  const Answer at_start = Query(manager_, {2, 0, 0}, {0, -1, 0});
  EXPECT_EQ(at_start.Id, 0);
  ExpectVectorNear(at_start.Point, {2, 0, 0});
  ExpectUntouched(Query(manager_, {2, 0, 0}, {0, 1, 0}));  // leaving through the surface
}

TEST_F(CollisionManagerTest, UnusableQueriesAnswerNoHitAndWriteNothing) {
  ASSERT_EQ(manager_.AddPlane({0, 0, 0}, {0, 1, 0}), 0);
  ExpectUntouched(Query(manager_, {0, 1, 0}, {0, 0, 0}));
  ExpectUntouched(Query(manager_, {kNaN, 1, 0}, {0, -2, 0}));
  ExpectUntouched(Query(manager_, {0, 1, 0}, {0, -kInf, 0}));
  ExpectUntouched(Query(manager_, {0, 1, 0}, {kNaN, -2, 0}));
  D3DXVECTOR3 ray{0, -2, 0};
  D3DXVECTOR3 point;
  D3DXVECTOR3 normal;
  float cosine;
  EXPECT_EQ(manager_.GetClosestFrontFaceCollision(nullptr, &ray, &point, &normal, &cosine), -1);
}

TEST_F(CollisionManagerTest, EmptyManagerNeverHits) {
  manager_.RebuildAllCollisionObjects();
  ExpectUntouched(Query(manager_, {0, 1, 0}, {0, -2, 0}));
}

TEST_F(CollisionManagerTest, ShapesThatDescribeNothingAreRefused) {
  EXPECT_EQ(manager_.AddPlane({0, 0, 0}, {0, 0, 0}), -1);
  EXPECT_EQ(manager_.AddPlane({kNaN, 0, 0}, {0, 1, 0}), -1);
  EXPECT_EQ(manager_.AddSphere({0, 0, 0}, 0.0f), -1);
  EXPECT_EQ(manager_.AddSphere({0, 0, 0}, -1.0f), -1);
  EXPECT_EQ(manager_.AddSphere({0, 0, 0}, kNaN), -1);
  EXPECT_EQ(manager_.AddSphere({kInf, 0, 0}, 1.0f), -1);
  D3DXMATRIX flat = MirroredBoxWorld();
  flat._22 = 0.0f;
  EXPECT_EQ(manager_.AddBox(flat, {1, 1, 1}), -1);
  EXPECT_EQ(manager_.AddBox(MirroredBoxWorld(), {1, 0, 1}), -1);
  EXPECT_EQ(manager_.AddMesh(nullptr), -1);
  EXPECT_EQ(manager_.GetObjectCount(), 0);
  EXPECT_EQ(manager_.AddSphere({0, 0, 0}, 1.0f), 0);  // ids are not used up by refusals
}

TEST_F(CollisionManagerTest, ClearObjectsRemovesEverything) {
  manager_.AddPlane({0, 0, 0}, {0, 1, 0});
  manager_.ClearObjects();
  EXPECT_EQ(manager_.GetObjectCount(), 0);
  ExpectUntouched(Query(manager_, {0, 1, 0}, {0, -2, 0}));
  EXPECT_EQ(manager_.AddSphere({0, 0, 0}, 1.0f), 0);
}

}  // namespace
