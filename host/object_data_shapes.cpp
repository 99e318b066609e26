// The mesh's geometry helpers: bounding boxes, texture-coordinate mappings and the built-in
// shapes. Shapes have outward normals and front faces wound clockwise seen from outside, the
// winding Direct3D draws under its default cull mode.
#include <algorithm>
#include <cmath>
#include <numbers>

#include "host/object_data_channel.h"

namespace {

constexpr D3DCOLOR kShapeColor = 0xFFFFFFFFu;
constexpr float kPi = std::numbers::pi_v<float>;
// Tessellation bounds of the round shapes, so that no request can exhaust memory.
constexpr int kMinimumSegments = 3;
constexpr int kMaximumSegments = 1024;
constexpr int kMinimumStacks = 2;

// Where `value` lies between `low` and `high`, 0 to 1; 0 when the range is empty.
float Fraction(float value, float low, float high) {
  return high > low ? (value - low) / (high - low) : 0.0f;
}

float Component(const D3DXVECTOR3& v, int axis) {
  return axis == 0 ? v.x : axis == 1 ? v.y : v.z;
}

// A size the shapes accept: finite and above zero once its sign is dropped.
bool UsableSize(float size) {
  return std::isfinite(size) && std::fabs(size) > 0.0f;
}

// Axis-aligned box of points; zero for none.
template <typename PointOf>
void BoxOf(const std::vector<ObjectVertex>& vertices, PointOf point_of, D3DXVECTOR3& minimum,
           D3DXVECTOR3& maximum) {
  if (vertices.empty()) {
    minimum = maximum = D3DXVECTOR3(0.0f, 0.0f, 0.0f);
    return;
  }
  minimum = maximum = point_of(vertices.front());
  for (const ObjectVertex& vertex : vertices) {
    const D3DXVECTOR3 p = point_of(vertex);
    minimum = {std::min(minimum.x, p.x), std::min(minimum.y, p.y), std::min(minimum.z, p.z)};
    maximum = {std::max(maximum.x, p.x), std::max(maximum.y, p.y), std::max(maximum.z, p.z)};
  }
}

// Appends vertices and triangles; every triangle is wound to face `outward`.
class MeshBuilder {
 public:
  MeshBuilder(std::vector<ObjectVertex>& vertices, std::vector<std::uint32_t>& indices)
      : vertices_(vertices), indices_(indices) {}

  std::uint32_t Vertex(D3DXVECTOR3 position, D3DXVECTOR3 normal, float tu, float tv) {
    vertices_.push_back({position, normal, kShapeColor, tu, tv});
    return static_cast<std::uint32_t>(vertices_.size() - 1);
  }

  // Clockwise seen from outside means cross(b - a, c - a) points outward in Direct3D's
  // left-handed space.
  void Triangle(std::uint32_t a, std::uint32_t b, std::uint32_t c, D3DXVECTOR3 outward) {
    const D3DXVECTOR3 ab = vertices_[b].Position - vertices_[a].Position;
    const D3DXVECTOR3 ac = vertices_[c].Position - vertices_[a].Position;
    D3DXVECTOR3 face;
    D3DXVec3Cross(&face, &ab, &ac);
    if (D3DXVec3Dot(&face, &outward) < 0.0f) std::swap(b, c);
    indices_.insert(indices_.end(), {a, b, c});
  }

  // Corners in order around the quad.
  void Quad(std::uint32_t a, std::uint32_t b, std::uint32_t c, std::uint32_t d,
            D3DXVECTOR3 outward) {
    Triangle(a, b, c, outward);
    Triangle(a, c, d, outward);
  }

 private:
  std::vector<ObjectVertex>& vertices_;
  std::vector<std::uint32_t>& indices_;
};

}  // namespace

// --- Bounds ---

void Tev_DX8_ObjectDataChannel::MakeObjectSizeBoundrys(D3DXVECTOR3& minimum, D3DXVECTOR3& maximum) {
  BoxOf(
      Vertices, [](const ObjectVertex& v) { return v.Position; }, minimum, maximum);
}

void Tev_DX8_ObjectDataChannel::CalculateBoundingBox() {
  MakeObjectSizeBoundrys(BoundingBoxMin, BoundingBoxMax);
}
D3DXVECTOR3 Tev_DX8_ObjectDataChannel::GetBoundingBoxMin() {
  return BoundingBoxMin;
}
D3DXVECTOR3 Tev_DX8_ObjectDataChannel::GetBoundingBoxMax() {
  return BoundingBoxMax;
}

// Exact: every vertex is transformed, not just the corners of the object's box.
void Tev_DX8_ObjectDataChannel::GetObjectTransformedMinMaxBox(D3DXMATRIX matrix) {
  auto transformed = [&matrix](const ObjectVertex& v) {
    D3DXVECTOR3 out;
    D3DXVec3TransformCoord(&out, &v.Position, &matrix);
    return out;
  };
  BoxOf(Vertices, transformed, TransformedBoxMin, TransformedBoxMax);
}
void Tev_DX8_ObjectDataChannel::GetObjectTransformedMinMaxBox() {
  GetObjectTransformedMinMaxBox(WorldMatrix);
}

// Without culling data of its own the mesh is visible whenever it has something to draw.
bool Tev_DX8_ObjectDataChannel::GetIfObjectIsVisible() {
  return !Vertices.empty();
}

// --- Texture mapping (set 0 is the only set) ---

void Tev_DX8_ObjectDataChannel::MapTexture(int set, int mapping, bool normalize) {
  if (set != 0) return;
  TextureMapping = mapping;
  switch (mapping) {
    case kMappingPlanar:
      PlanarTexture(set, 2);
      break;
    case kMappingSphere:
      MakeSphereTexture(set);
      break;
    case kMappingCylinder:
      MakeCylinderTexture(set);
      break;
    case kMappingCubic:
      CubicTexture(set, normalize);
      break;
    default:
      return;
  }
  if (normalize) NormalizeTexture(set);
}

int Tev_DX8_ObjectDataChannel::GetTextureMapping(int set) {
  return set == 0 ? TextureMapping : kMappingNone;
}

// u around the Y axis from the box centre, v from the latitude (0 at the top).
void Tev_DX8_ObjectDataChannel::MakeSphereTexture(int set) {
  if (set != 0) return;
  CalculateBoundingBox();
  const D3DXVECTOR3 centre = (BoundingBoxMin + BoundingBoxMax) * 0.5f;
  for (ObjectVertex& vertex : Vertices) {
    const D3DXVECTOR3 d = vertex.Position - centre;
    const float length = D3DXVec3Length(&d);
    if (!(length > 0.0f)) {
      vertex.Tu = vertex.Tv = 0.5f;
      continue;
    }
    vertex.Tu = 0.5f + std::atan2(d.z, d.x) / (2.0f * kPi);
    vertex.Tv = 0.5f - std::asin(std::clamp(d.y / length, -1.0f, 1.0f)) / kPi;
  }
}

// u around the Y axis, v down the height of the box.
void Tev_DX8_ObjectDataChannel::MakeCylinderTexture(int set) {
  if (set != 0) return;
  CalculateBoundingBox();
  const D3DXVECTOR3 centre = (BoundingBoxMin + BoundingBoxMax) * 0.5f;
  for (ObjectVertex& vertex : Vertices) {
    const D3DXVECTOR3 d = vertex.Position - centre;
    vertex.Tu = (d.x == 0.0f && d.z == 0.0f) ? 0.5f : 0.5f + std::atan2(d.z, d.x) / (2.0f * kPi);
    vertex.Tv = 1.0f - Fraction(vertex.Position.y, BoundingBoxMin.y, BoundingBoxMax.y);
  }
}

// Each vertex is projected along the axis its normal leans on most; `normalize` scales the
// coordinates to the box, otherwise they are object-space distances.
void Tev_DX8_ObjectDataChannel::CubicTexture(int set, bool normalize) {
  if (set != 0) return;
  CalculateBoundingBox();
  for (ObjectVertex& vertex : Vertices) {
    const D3DXVECTOR3 n(std::fabs(vertex.Normal.x), std::fabs(vertex.Normal.y),
                        std::fabs(vertex.Normal.z));
    const int axis = n.x >= n.y && n.x >= n.z ? 0 : n.y >= n.z ? 1 : 2;
    const int u_axis = axis == 0 ? 2 : 0;
    const int v_axis = axis == 1 ? 2 : 1;
    const float u = Component(vertex.Position, u_axis);
    const float v = Component(vertex.Position, v_axis);
    vertex.Tu = normalize ? Fraction(u, Component(BoundingBoxMin, u_axis),
                                     Component(BoundingBoxMax, u_axis))
                          : u;
    vertex.Tv = normalize ? 1.0f - Fraction(v, Component(BoundingBoxMin, v_axis),
                                            Component(BoundingBoxMax, v_axis))
                          : -v;
  }
}

// Projects along `axis` (0 X, 1 Y, 2 Z) onto the box's face: u grows with the first remaining
// axis, v shrinks with the second (texture rows run downward).
void Tev_DX8_ObjectDataChannel::PlanarTexture(int set, int axis) {
  if (set != 0 || axis < 0 || axis > 2) return;
  CalculateBoundingBox();
  const int u_axis = axis == 0 ? 2 : 0;
  const int v_axis = axis == 1 ? 2 : 1;
  for (ObjectVertex& vertex : Vertices) {
    vertex.Tu = Fraction(Component(vertex.Position, u_axis), Component(BoundingBoxMin, u_axis),
                         Component(BoundingBoxMax, u_axis));
    vertex.Tv =
        1.0f - Fraction(Component(vertex.Position, v_axis), Component(BoundingBoxMin, v_axis),
                        Component(BoundingBoxMax, v_axis));
  }
}

// Rescales the coordinates so that they span 0 to 1 on both axes.
void Tev_DX8_ObjectDataChannel::NormalizeTexture(int set) {
  if (set != 0 || Vertices.empty()) return;
  float u_min = Vertices.front().Tu, u_max = u_min;
  float v_min = Vertices.front().Tv, v_max = v_min;
  for (const ObjectVertex& vertex : Vertices) {
    u_min = std::min(u_min, vertex.Tu), u_max = std::max(u_max, vertex.Tu);
    v_min = std::min(v_min, vertex.Tv), v_max = std::max(v_max, vertex.Tv);
  }
  for (ObjectVertex& vertex : Vertices) {
    vertex.Tu = Fraction(vertex.Tu, u_min, u_max);
    vertex.Tv = Fraction(vertex.Tv, v_min, v_max);
  }
}

void Tev_DX8_ObjectDataChannel::RemapTexture() {
  CalculateTextureCoords(0);
}

// Applies the mapping chosen last again, after the vertices moved.
void Tev_DX8_ObjectDataChannel::CalculateTextureCoords(int set) {
  if (set == 0) MapTexture(set, TextureMapping, false);
}

// --- Built-in shapes ---

void Tev_DX8_ObjectDataChannel::BuildQuad(float width, float depth) {
  Release();
  if (UsableSize(width) && UsableSize(depth)) {
    const float x = std::fabs(width) * 0.5f, z = std::fabs(depth) * 0.5f;
    const D3DXVECTOR3 up(0.0f, 1.0f, 0.0f);
    MeshBuilder mesh(Vertices, Indices);
    const auto a = mesh.Vertex({-x, 0.0f, z}, up, 0.0f, 0.0f);
    const auto b = mesh.Vertex({x, 0.0f, z}, up, 1.0f, 0.0f);
    const auto c = mesh.Vertex({x, 0.0f, -z}, up, 1.0f, 1.0f);
    const auto d = mesh.Vertex({-x, 0.0f, -z}, up, 0.0f, 1.0f);
    mesh.Quad(a, b, c, d, up);
  }
  CalculateBoundingBox();
}

void Tev_DX8_ObjectDataChannel::BuildBox(D3DXVECTOR3 half_extents) {
  Release();
  if (UsableSize(half_extents.x) && UsableSize(half_extents.y) && UsableSize(half_extents.z)) {
    const float half[3] = {std::fabs(half_extents.x), std::fabs(half_extents.y),
                           std::fabs(half_extents.z)};
    MeshBuilder mesh(Vertices, Indices);
    for (int axis = 0; axis < 3; ++axis) {
      const int s = (axis + 1) % 3, t = (axis + 2) % 3;  // the face's two in-plane axes
      for (float side : {1.0f, -1.0f}) {
        float normal[3] = {0.0f, 0.0f, 0.0f};
        normal[axis] = side;
        const D3DXVECTOR3 outward(normal[0], normal[1], normal[2]);
        std::uint32_t corners[4];
        const float around[4][2] = {{-1, -1}, {1, -1}, {1, 1}, {-1, 1}};
        for (int k = 0; k < 4; ++k) {
          float p[3];
          p[axis] = side * half[axis];
          p[s] = around[k][0] * half[s];
          p[t] = around[k][1] * half[t];
          corners[k] = mesh.Vertex({p[0], p[1], p[2]}, outward, (around[k][0] + 1.0f) * 0.5f,
                                   (1.0f - around[k][1]) * 0.5f);
        }
        mesh.Quad(corners[0], corners[1], corners[2], corners[3], outward);
      }
    }
  }
  CalculateBoundingBox();
}

void Tev_DX8_ObjectDataChannel::BuildUvSphere(float radius, int slices, int stacks) {
  Release();
  if (UsableSize(radius)) {
    const float r = std::fabs(radius);
    const int columns = std::clamp(slices, kMinimumSegments, kMaximumSegments);
    const int rows = std::clamp(stacks, kMinimumStacks, kMaximumSegments);
    MeshBuilder mesh(Vertices, Indices);
    // Rows of columns + 1 vertices (the seam repeats), from the top pole down.
    for (int row = 0; row <= rows; ++row) {
      const float theta = kPi * static_cast<float>(row) / static_cast<float>(rows);
      for (int column = 0; column <= columns; ++column) {
        const float phi = 2.0f * kPi * static_cast<float>(column) / static_cast<float>(columns);
        const D3DXVECTOR3 normal(std::sin(theta) * std::cos(phi), std::cos(theta),
                                 std::sin(theta) * std::sin(phi));
        mesh.Vertex(normal * r, normal, static_cast<float>(column) / static_cast<float>(columns),
                    static_cast<float>(row) / static_cast<float>(rows));
      }
    }
    auto at = [columns](int row, int column) {
      return static_cast<std::uint32_t>(row * (columns + 1) + column);
    };
    for (int row = 0; row < rows; ++row) {
      for (int column = 0; column < columns; ++column) {
        const std::uint32_t a = at(row, column), b = at(row, column + 1);
        const std::uint32_t c = at(row + 1, column + 1), d = at(row + 1, column);
        // The triangles touching a pole would have two corners on it: skip those.
        const D3DXVECTOR3 outward = (Vertices[a].Normal + Vertices[c].Normal);
        if (row != 0) mesh.Triangle(a, b, c, outward);
        if (row != rows - 1) mesh.Triangle(a, c, d, outward);
      }
    }
  }
  CalculateBoundingBox();
}

void Tev_DX8_ObjectDataChannel::BuildDisc(float radius, int segments) {
  Release();
  if (UsableSize(radius)) {
    const float r = std::fabs(radius);
    const int count = std::clamp(segments, kMinimumSegments, kMaximumSegments);
    const D3DXVECTOR3 up(0.0f, 1.0f, 0.0f);
    MeshBuilder mesh(Vertices, Indices);
    const auto centre = mesh.Vertex({0.0f, 0.0f, 0.0f}, up, 0.5f, 0.5f);
    for (int k = 0; k < count; ++k) {
      const float angle = 2.0f * kPi * static_cast<float>(k) / static_cast<float>(count);
      const float c = std::cos(angle), s = std::sin(angle);
      mesh.Vertex({r * c, 0.0f, r * s}, up, 0.5f + 0.5f * c, 0.5f - 0.5f * s);
    }
    for (int k = 0; k < count; ++k) {
      const auto here = static_cast<std::uint32_t>(1 + k);
      const auto next = static_cast<std::uint32_t>(1 + (k + 1) % count);
      mesh.Triangle(centre, here, next, up);
    }
  }
  CalculateBoundingBox();
}
