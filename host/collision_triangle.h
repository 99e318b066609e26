// One triangle of a collision mesh and the plain front-face segment test against it.
//
// Winding: Direct3D draws the clockwise side of a triangle (seen from the viewer, left-handed
// coordinates) as its front, which makes the front normal of (A, B, C) the direction of
// cross(B - A, C - A) as computed component-wise. The object-data channel's built-in shapes wind
// their outside faces that way.
#pragma once

#include "host/collision_shapes.h"

struct CollisionTriangle {
  Vec3d A, B, C;
  Vec3d Normal;  // unit front normal
};

// The triangle with its front normal; false when it has no area or a non-finite corner.
bool MakeCollisionTriangle(const Vec3d& a, const Vec3d& b, const Vec3d& c,
                           CollisionTriangle* triangle);

// As the shape tests of collision_shapes.h; the edges belong to the triangle.
bool IntersectFrontFace(const CollisionTriangle& triangle, const CollisionSegment& segment,
                        double max_t, CollisionHit* hit);

// Where the segment crosses the triangle's plane (unbounded t), for refining a hit another test
// found; NaN when the segment runs parallel to the plane.
double PlaneCrossing(const CollisionTriangle& triangle, const CollisionSegment& segment);
