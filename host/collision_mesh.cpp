#include "host/collision_mesh.h"

#include <algorithm>
#include <cfloat>
#include <cmath>

#include "host/object_data_channel.h"

namespace {

// Embree works in float: a corner it cannot hold would make a different triangle there.
bool FitsFloat(const Vec3d& v) {
  return std::fabs(v.x) <= FLT_MAX && std::fabs(v.y) <= FLT_MAX && std::fabs(v.z) <= FLT_MAX;
}

// Embree's intersection filter: a candidate hit on a back face (or edge-on) is not a hit, and the
// search goes on behind it.
void RejectBackFaces(const RTCFilterFunctionNArguments* args) {
  const auto* triangles = static_cast<const CollisionTriangle*>(args->geometryUserPtr);
  for (unsigned int i = 0; i < args->N; ++i) {
    if (args->valid[i] != -1) continue;
    const CollisionTriangle& triangle = triangles[RTCHitN_primID(args->hit, args->N, i)];
    const Vec3d direction{RTCRayN_dir_x(args->ray, args->N, i),
                          RTCRayN_dir_y(args->ray, args->N, i),
                          RTCRayN_dir_z(args->ray, args->N, i)};
    if (!(Dot(direction, triangle.Normal) < 0.0)) args->valid[i] = 0;
  }
}

// Embree checks its rays (and aborts the process on a failed check): origin and direction
// components at most its FLT_LARGE in size, and t limits that are not NaN.
constexpr double kEmbreeLargest = 1.844e18;

bool EmbreeTakes(const CollisionSegment& segment, double max_t) {
  const double parts[] = {segment.Origin.x, segment.Origin.y, segment.Origin.z,
                          segment.Ray.x,    segment.Ray.y,    segment.Ray.z};
  for (double part : parts)
    if (!(std::fabs(part) <= kEmbreeLargest)) return false;
  return !std::isnan(max_t);
}

// Whether the segment, up to max_t, can touch the box at all.
bool SegmentMeetsBounds(const CollisionSegment& segment, double max_t, const Vec3d& low,
                        const Vec3d& high) {
  double enter = 0.0;
  double leave = max_t;
  const double origin[3] = {segment.Origin.x, segment.Origin.y, segment.Origin.z};
  const double ray[3] = {segment.Ray.x, segment.Ray.y, segment.Ray.z};
  const double lows[3] = {low.x, low.y, low.z};
  const double highs[3] = {high.x, high.y, high.z};
  for (int axis = 0; axis < 3; ++axis) {
    if (ray[axis] == 0.0) {
      if (origin[axis] < lows[axis] || origin[axis] > highs[axis]) return false;
      continue;
    }
    const double t_low = (lows[axis] - origin[axis]) / ray[axis];
    const double t_high = (highs[axis] - origin[axis]) / ray[axis];
    enter = std::max(enter, std::min(t_low, t_high));
    leave = std::min(leave, std::max(t_low, t_high));
  }
  return enter <= leave;
}

}  // namespace

std::vector<CollisionTriangle> CollisionMesh::ReadTriangles(Tev_DX8_ObjectDataChannel& object) {
  const int vertex_count = std::max(0, object.GetVertexCount());
  const D3DXMATRIX world = object.GetWorldMatrix();
  std::vector<Vec3d> positions(static_cast<std::size_t>(vertex_count));
  for (int v = 0; v < vertex_count; ++v)
    positions[v] = TransformCoord(world, ToVec3d(object.GetVertexPosition(static_cast<DWORD>(v))));

  const int index_count = std::max(0, object.GetIndexCount());
  std::vector<CollisionTriangle> triangles;
  triangles.reserve(static_cast<std::size_t>(index_count / 3));
  for (int first = 0; first + 3 <= index_count; first += 3) {
    DWORD corner[3];
    bool usable = true;
    for (int k = 0; k < 3; ++k) {
      corner[k] = object.GetIndexes(static_cast<DWORD>(first + k));
      usable =
          usable && corner[k] < static_cast<DWORD>(vertex_count) && FitsFloat(positions[corner[k]]);
    }
    CollisionTriangle triangle;
    if (usable && MakeCollisionTriangle(positions[corner[0]], positions[corner[1]],
                                        positions[corner[2]], &triangle))
      triangles.push_back(triangle);
  }
  return triangles;
}

CollisionMesh::CollisionMesh(RTCDevice device, std::vector<CollisionTriangle> triangles)
    : triangles_(std::move(triangles)) {
  if (triangles_.empty()) return;
  bounds_min_ = bounds_max_ = triangles_.front().A;
  for (const CollisionTriangle& triangle : triangles_) {
    for (const Vec3d& p : {triangle.A, triangle.B, triangle.C}) {
      bounds_min_ = {std::min(bounds_min_.x, p.x), std::min(bounds_min_.y, p.y),
                     std::min(bounds_min_.z, p.z)};
      bounds_max_ = {std::max(bounds_max_.x, p.x), std::max(bounds_max_.y, p.y),
                     std::max(bounds_max_.z, p.z)};
    }
  }
  // A little slack, so that rounding in the box test never turns away a hit on the mesh's rim.
  const double largest =
      std::max({1.0, std::fabs(bounds_min_.x), std::fabs(bounds_min_.y), std::fabs(bounds_min_.z),
                std::fabs(bounds_max_.x), std::fabs(bounds_max_.y), std::fabs(bounds_max_.z)});
  const Vec3d slack{largest * 1e-9, largest * 1e-9, largest * 1e-9};
  bounds_min_ = bounds_min_ - slack;
  bounds_max_ = bounds_max_ + slack;
  if (device && !BuildScene(device) && scene_) {
    rtcReleaseScene(scene_);
    scene_ = nullptr;
  }
}

CollisionMesh::~CollisionMesh() {
  if (scene_) rtcReleaseScene(scene_);
}

bool CollisionMesh::BuildScene(RTCDevice device) {
  RTCGeometry geometry = rtcNewGeometry(device, RTC_GEOMETRY_TYPE_TRIANGLE);
  if (!geometry) return false;
  const std::size_t count = triangles_.size();
  auto* vertices = static_cast<float*>(rtcSetNewGeometryBuffer(
      geometry, RTC_BUFFER_TYPE_VERTEX, 0, RTC_FORMAT_FLOAT3, 3 * sizeof(float), 3 * count));
  auto* indices = static_cast<unsigned int*>(rtcSetNewGeometryBuffer(
      geometry, RTC_BUFFER_TYPE_INDEX, 0, RTC_FORMAT_UINT3, 3 * sizeof(unsigned int), count));
  if (!vertices || !indices) {
    rtcReleaseGeometry(geometry);
    return false;
  }
  for (std::size_t i = 0; i < count; ++i) {
    const CollisionTriangle& triangle = triangles_[i];
    const Vec3d* corners[3] = {&triangle.A, &triangle.B, &triangle.C};
    for (std::size_t k = 0; k < 3; ++k) {
      float* vertex = vertices + 3 * (3 * i + k);
      vertex[0] = static_cast<float>(corners[k]->x);
      vertex[1] = static_cast<float>(corners[k]->y);
      vertex[2] = static_cast<float>(corners[k]->z);
      indices[3 * i + k] = static_cast<unsigned int>(3 * i + k);
    }
  }
  rtcSetGeometryUserData(geometry, triangles_.data());
  rtcSetGeometryIntersectFilterFunction(geometry, RejectBackFaces);
  rtcCommitGeometry(geometry);

  scene_ = rtcNewScene(device);
  if (!scene_) {
    rtcReleaseGeometry(geometry);
    return false;
  }
  // Robust traversal does not lose hits on shared edges, which would let particles through.
  rtcSetSceneFlags(scene_, RTC_SCENE_FLAG_ROBUST);
  rtcAttachGeometry(scene_, geometry);
  rtcReleaseGeometry(geometry);
  rtcCommitScene(scene_);
  return rtcGetDeviceError(device) == RTC_ERROR_NONE;
}

bool CollisionMesh::Intersect(const CollisionSegment& segment, double max_t,
                              CollisionHit* hit) const {
  if (!scene_ || !EmbreeTakes(segment, max_t)) return IntersectEachTriangle(segment, max_t, hit);
  RTCIntersectContext context;
  rtcInitIntersectContext(&context);
  RTCRayHit query{};
  query.ray.org_x = static_cast<float>(segment.Origin.x);
  query.ray.org_y = static_cast<float>(segment.Origin.y);
  query.ray.org_z = static_cast<float>(segment.Origin.z);
  query.ray.dir_x = static_cast<float>(segment.Ray.x);
  query.ray.dir_y = static_cast<float>(segment.Ray.y);
  query.ray.dir_z = static_cast<float>(segment.Ray.z);
  query.ray.tnear = 0.0f;
  query.ray.tfar = static_cast<float>(max_t);
  query.ray.mask = ~0u;
  query.hit.geomID = RTC_INVALID_GEOMETRY_ID;
  query.hit.instID[0] = RTC_INVALID_GEOMETRY_ID;
  rtcIntersect1(scene_, &context, &query);
  if (query.hit.geomID == RTC_INVALID_GEOMETRY_ID) return false;
  // Embree's t is a float; the triangle's plane gives it to double precision.
  const CollisionTriangle& triangle = triangles_[query.hit.primID];
  double t = PlaneCrossing(triangle, segment);
  if (std::isnan(t)) t = query.ray.tfar;
  *hit = {std::clamp(t, 0.0, max_t), triangle.Normal};
  return true;
}

bool CollisionMesh::IntersectEachTriangle(const CollisionSegment& segment, double max_t,
                                          CollisionHit* hit) const {
  if (triangles_.empty() || !SegmentMeetsBounds(segment, max_t, bounds_min_, bounds_max_))
    return false;
  bool found = false;
  for (const CollisionTriangle& triangle : triangles_) {
    CollisionHit candidate;
    if (IntersectFrontFace(triangle, segment, max_t, &candidate) &&
        (!found || candidate.T < hit->T)) {
      *hit = candidate;
      found = true;
    }
  }
  return found;
}
