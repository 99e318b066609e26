#include "host/collision_shapes.h"

#include <algorithm>
#include <cmath>

namespace {

// Inverts the 3x3 `a`; false when it is singular (or nearly: the determinant is tiny against the
// rows' lengths, so the inverse would be mostly rounding).
bool Invert3x3(const double a[3][3], double inverse[3][3]) {
  const double c00 = a[1][1] * a[2][2] - a[1][2] * a[2][1];
  const double c01 = a[1][2] * a[2][0] - a[1][0] * a[2][2];
  const double c02 = a[1][0] * a[2][1] - a[1][1] * a[2][0];
  const double det = a[0][0] * c00 + a[0][1] * c01 + a[0][2] * c02;
  double scale = 1.0;
  for (int i = 0; i < 3; ++i) scale *= Length({a[i][0], a[i][1], a[i][2]});
  if (!std::isfinite(det) || !(std::fabs(det) > 1e-9 * scale)) return false;
  const double r = 1.0 / det;
  inverse[0][0] = c00 * r;
  inverse[1][0] = c01 * r;
  inverse[2][0] = c02 * r;
  inverse[0][1] = (a[0][2] * a[2][1] - a[0][1] * a[2][2]) * r;
  inverse[1][1] = (a[0][0] * a[2][2] - a[0][2] * a[2][0]) * r;
  inverse[2][1] = (a[0][1] * a[2][0] - a[0][0] * a[2][1]) * r;
  inverse[0][2] = (a[0][1] * a[1][2] - a[0][2] * a[1][1]) * r;
  inverse[1][2] = (a[0][2] * a[1][0] - a[0][0] * a[1][2]) * r;
  inverse[2][2] = (a[0][0] * a[1][1] - a[0][1] * a[1][0]) * r;
  return true;
}

// The row vector v times the 3x3 m.
Vec3d RowTimes(const Vec3d& v, const double m[3][3]) {
  return {v.x * m[0][0] + v.y * m[1][0] + v.z * m[2][0],
          v.x * m[0][1] + v.y * m[1][1] + v.z * m[2][1],
          v.x * m[0][2] + v.y * m[1][2] + v.z * m[2][2]};
}

double Component(const Vec3d& v, int axis) {
  return axis == 0 ? v.x : axis == 1 ? v.y : v.z;
}

}  // namespace

bool MakeCollisionPlane(const D3DXVECTOR3& point, const D3DXVECTOR3& normal,
                        CollisionPlane* plane) {
  const Vec3d unit = Normalized(ToVec3d(normal));
  if (!IsFinite(point) || !IsFinite(normal) || Length(unit) == 0.0) return false;
  *plane = {ToVec3d(point), unit};
  return true;
}

bool MakeCollisionSphere(const D3DXVECTOR3& centre, float radius, CollisionSphere* sphere) {
  if (!IsFinite(centre) || !std::isfinite(radius) || !(radius > 0.0f)) return false;
  *sphere = {ToVec3d(centre), radius};
  return true;
}

bool MakeCollisionBox(const D3DXMATRIX& world, const D3DXVECTOR3& half_extents, CollisionBox* box) {
  if (!IsFinite(half_extents) || !(half_extents.x > 0.0f) || !(half_extents.y > 0.0f) ||
      !(half_extents.z > 0.0f))
    return false;
  double upper[3][3];
  for (int i = 0; i < 3; ++i)
    for (int j = 0; j < 3; ++j) upper[i][j] = world.m[i][j];
  CollisionBox made;
  made.World = world;
  made.Translation = {world._41, world._42, world._43};
  made.HalfExtents = ToVec3d(half_extents);
  if (!IsFinite(made.Translation) || !Invert3x3(upper, made.Inverse)) return false;
  *box = made;
  return true;
}

bool IntersectFrontFace(const CollisionPlane& plane, const CollisionSegment& segment, double max_t,
                        CollisionHit* hit) {
  const double approach = Dot(segment.Ray, plane.Normal);
  if (!(approach < 0.0)) return false;
  const double t = Dot(plane.Point - segment.Origin, plane.Normal) / approach;
  if (!OnSegment(t, max_t)) return false;
  *hit = {t, plane.Normal};
  return true;
}

bool IntersectFrontFace(const CollisionSphere& sphere, const CollisionSegment& segment,
                        double max_t, CollisionHit* hit) {
  // |m + t d|^2 = r^2 with m = origin - centre: a t^2 + 2 b t + c = 0.
  const Vec3d m = segment.Origin - sphere.Centre;
  const double a = Dot(segment.Ray, segment.Ray);
  const double b = Dot(m, segment.Ray);
  const double c = Dot(m, m) - sphere.Radius * sphere.Radius;
  if (c < 0.0) return false;  // starts inside: only the back face lies ahead
  const double discriminant = b * b - a * c;
  if (!(discriminant > 0.0)) return false;  // misses or only grazes
  const double t = (-b - std::sqrt(discriminant)) / a;
  if (!OnSegment(t, max_t)) return false;
  *hit = {t, Normalized(m + segment.Ray * t)};
  return true;
}

bool IntersectFrontFace(const CollisionBox& box, const CollisionSegment& segment, double max_t,
                        CollisionHit* hit) {
  // Slab test in the box's own frame, where its faces are axis-aligned. The parameter t is the
  // same in both frames, as the map between them is affine.
  const Vec3d origin = RowTimes(segment.Origin - box.Translation, box.Inverse);
  const Vec3d ray = RowTimes(segment.Ray, box.Inverse);
  double enter = -INFINITY;
  double leave = INFINITY;
  int enter_axis = -1;
  double enter_sign = 0.0;
  for (int axis = 0; axis < 3; ++axis) {
    const double o = Component(origin, axis);
    const double d = Component(ray, axis);
    const double h = Component(box.HalfExtents, axis);
    if (d == 0.0) {
      if (o < -h || o > h) return false;  // parallel to this slab and outside it
      continue;
    }
    const double t_low = (-h - o) / d;
    const double t_high = (h - o) / d;
    const double near = std::min(t_low, t_high);
    leave = std::min(leave, std::max(t_low, t_high));
    if (near > enter) {
      enter = near;
      enter_axis = axis;
      enter_sign = d > 0.0 ? -1.0 : 1.0;  // the face the segment crosses faces against it
    }
  }
  if (enter_axis < 0 || enter > leave || !OnSegment(enter, max_t)) return false;
  // The outward normal of local face +-e_k is +-(column k of the inverse), as normals transform
  // by the inverse transpose.
  const Vec3d normal{box.Inverse[0][enter_axis], box.Inverse[1][enter_axis],
                     box.Inverse[2][enter_axis]};
  *hit = {enter, Normalized(normal * enter_sign)};
  return true;
}
