// The analytic collision shapes and their front-face segment tests.
//
// A segment runs from Origin (t = 0) to Origin + Ray (t = 1); both ends belong to it. A test
// answers the smallest t in [0, max_t] where the segment enters the shape through a front face,
// i.e. where Ray . normal < 0 with the outward unit normal; grazing hits (Ray . normal = 0) and
// hits from inside a shape do not count.
#pragma once

#include "host/collision_vector.h"
#include "platform/d3dx_math.h"

struct CollisionSegment {
  Vec3d Origin;
  Vec3d Ray;
};

// Whether t lies on the segment, up to max_t (both ends included).
inline bool OnSegment(double t, double max_t) {
  return t >= 0.0 && t <= max_t;
}

struct CollisionHit {
  double T = 0.0;  // where along the segment, 0..1
  Vec3d Normal;    // outward, unit length
};

// An infinite plane; its front side is the one Normal points to.
struct CollisionPlane {
  Vec3d Point;
  Vec3d Normal;  // unit length
};

struct CollisionSphere {
  Vec3d Centre;
  double Radius = 0.0;  // > 0
};

// The box of half extents HalfExtents about the origin of its own frame, placed in the world by
// an affine matrix (row convention; the fourth column is ignored).
struct CollisionBox {
  D3DXMATRIX World;
  double Inverse[3][3];  // of World's upper 3x3
  Vec3d Translation;     // World's fourth row
  Vec3d HalfExtents;     // each > 0
};

// Shapes from their defining values; false (and nothing made) for values that describe no
// shape: non-finite numbers, a zero normal, a radius or half extent not above 0, a singular box
// matrix.
bool MakeCollisionPlane(const D3DXVECTOR3& point, const D3DXVECTOR3& normal, CollisionPlane* plane);
bool MakeCollisionSphere(const D3DXVECTOR3& centre, float radius, CollisionSphere* sphere);
bool MakeCollisionBox(const D3DXMATRIX& world, const D3DXVECTOR3& half_extents, CollisionBox* box);

bool IntersectFrontFace(const CollisionPlane& plane, const CollisionSegment& segment, double max_t,
                        CollisionHit* hit);
bool IntersectFrontFace(const CollisionSphere& sphere, const CollisionSegment& segment,
                        double max_t, CollisionHit* hit);
bool IntersectFrontFace(const CollisionBox& box, const CollisionSegment& segment, double max_t,
                        CollisionHit* hit);
