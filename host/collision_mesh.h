// A triangle mesh in world space for front-face segment queries. An Embree scene finds the
// closest front face (back faces are rejected in its intersection filter); should Embree fail to
// build one, every triangle is tested in turn instead.
#pragma once

#include <embree3/rtcore.h>

#include <vector>

#include "host/collision_triangle.h"

class Tev_DX8_ObjectDataChannel;

class CollisionMesh {
 public:
  // The object's triangles in world space: its index list read in threes, each vertex through
  // its world matrix. A partial last triangle, triangles with an index beyond the vertex list and
  // triangles that are flat or not finite (in float) are left out.
  static std::vector<CollisionTriangle> ReadTriangles(Tev_DX8_ObjectDataChannel& object);

  // `device` may be null: the mesh then tests every triangle.
  CollisionMesh(RTCDevice device, std::vector<CollisionTriangle> triangles);
  ~CollisionMesh();
  CollisionMesh(const CollisionMesh&) = delete;
  CollisionMesh& operator=(const CollisionMesh&) = delete;

  // The closest front-face hit with t in [0, max_t], as the shape tests of collision_shapes.h.
  // Segments beyond the range Embree accepts are searched triangle by triangle.
  bool Intersect(const CollisionSegment& segment, double max_t, CollisionHit* hit) const;
  // The same answer by testing every triangle (ties: the lowest triangle index).
  bool IntersectEachTriangle(const CollisionSegment& segment, double max_t,
                             CollisionHit* hit) const;

  bool UsesEmbree() const { return scene_ != nullptr; }
  const std::vector<CollisionTriangle>& Triangles() const { return triangles_; }

 private:
  bool BuildScene(RTCDevice device);

  std::vector<CollisionTriangle> triangles_;
  RTCScene scene_ = nullptr;
  Vec3d bounds_min_, bounds_max_;  // of all triangles, for the plain search
};
