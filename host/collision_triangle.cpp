#include "host/collision_triangle.h"

#include <cmath>

bool MakeCollisionTriangle(const Vec3d& a, const Vec3d& b, const Vec3d& c,
                           CollisionTriangle* triangle) {
  if (!IsFinite(a) || !IsFinite(b) || !IsFinite(c)) return false;
  const Vec3d normal = Normalized(Cross(b - a, c - a));
  if (Length(normal) == 0.0) return false;
  *triangle = {a, b, c, normal};
  return true;
}

double PlaneCrossing(const CollisionTriangle& triangle, const CollisionSegment& segment) {
  const double approach = Dot(segment.Ray, triangle.Normal);
  if (approach == 0.0) return NAN;
  return Dot(triangle.A - segment.Origin, triangle.Normal) / approach;
}

bool IntersectFrontFace(const CollisionTriangle& triangle, const CollisionSegment& segment,
                        double max_t, CollisionHit* hit) {
  if (!(Dot(segment.Ray, triangle.Normal) < 0.0)) return false;
  const double t = PlaneCrossing(triangle, segment);
  if (!OnSegment(t, max_t)) return false;
  // Inside when the point lies on the inner side of all three edges (or on one).
  const Vec3d p = segment.Origin + segment.Ray * t;
  const Vec3d& n = triangle.Normal;
  if (Dot(Cross(triangle.B - triangle.A, p - triangle.A), n) < 0.0) return false;
  if (Dot(Cross(triangle.C - triangle.B, p - triangle.B), n) < 0.0) return false;
  if (Dot(Cross(triangle.A - triangle.C, p - triangle.C), n) < 0.0) return false;
  *hit = {t, n};
  return true;
}
