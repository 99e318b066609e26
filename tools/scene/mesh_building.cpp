#include "tools/scene/mesh_building.h"

#include <tiny_obj_loader.h>

#include <algorithm>
#include <cmath>
#include <vector>

#include "host/object_data_channel.h"

namespace apescene {
namespace {

struct MeshVertex {
  D3DXVECTOR3 Position;
  D3DXVECTOR3 Normal;
  D3DXVECTOR2 Uv;
  D3DCOLOR Color;
};

// Replaces the mesh with a plain triangle list.
void SetTriangles(Tev_DX8_ObjectDataChannel* mesh, const std::vector<MeshVertex>& vertices) {
  mesh->Release();
  const int count = static_cast<int>(vertices.size());
  mesh->SetVertexCount(count);
  mesh->SetIndexCount(count);
  for (int i = 0; i < count; ++i) {
    const MeshVertex& v = vertices[static_cast<std::size_t>(i)];
    mesh->SetVertexPosition(v.Position, i);
    mesh->SetVertexNormal(v.Normal, i);
    mesh->SetVertexTUCoord(0, v.Uv, i);
    mesh->SetVertexColor(v.Color, i);
    mesh->SetIndex(static_cast<DWORD>(i), i);
  }
}

D3DXVECTOR3 FaceNormal(const D3DXVECTOR3& a, const D3DXVECTOR3& b, const D3DXVECTOR3& c) {
  const D3DXVECTOR3 ab = b - a, ac = c - a;
  D3DXVECTOR3 n, unit;
  D3DXVec3Cross(&n, &ab, &ac);
  D3DXVec3Normalize(&unit, &n);
  return unit;
}

// Whether element `index` of a list of `size` numbers taken `width` at a time exists.
bool InRange(int index, std::size_t size, std::size_t width) {
  return index >= 0 && static_cast<std::size_t>(index) < size / width;
}

std::uint32_t Scale(std::uint32_t channel, float factor) {
  return static_cast<std::uint32_t>(
      std::lround(std::clamp(static_cast<float>(channel) * factor, 0.0f, 255.0f)));
}

}  // namespace

bool LoadObjMesh(const std::string& path, Tev_DX8_ObjectDataChannel* mesh, std::string* error) {
  tinyobj::ObjReaderConfig config;
  config.triangulate = true;
  config.vertex_color = false;
  tinyobj::ObjReader reader;
  if (!reader.ParseFromFile(path, config)) {
    std::string detail = reader.Error();
    while (!detail.empty() && (detail.back() == '\n' || detail.back() == '\r')) detail.pop_back();
    *error = "cannot read OBJ file \"" + path + "\"" + (detail.empty() ? "" : ": " + detail);
    return false;
  }
  const tinyobj::attrib_t& attrib = reader.GetAttrib();
  std::vector<MeshVertex> vertices;
  for (const tinyobj::shape_t& shape : reader.GetShapes()) {
    std::size_t offset = 0;
    for (const unsigned char corners : shape.mesh.num_face_vertices) {
      if (corners != 3) {  // triangulation leaves only triangles; skip anything else
        offset += corners;
        continue;
      }
      MeshVertex triangle[3];
      bool has_normals = true;
      for (int k = 0; k < 3; ++k) {
        const tinyobj::index_t index = shape.mesh.indices[offset + static_cast<std::size_t>(k)];
        if (!InRange(index.vertex_index, attrib.vertices.size(), 3) ||
            (index.normal_index >= 0 && !InRange(index.normal_index, attrib.normals.size(), 3)) ||
            (index.texcoord_index >= 0 &&
             !InRange(index.texcoord_index, attrib.texcoords.size(), 2))) {
          *error = "OBJ file \"" + path + "\" refers to a vertex, normal or texture coordinate " +
                   "it does not have";
          return false;
        }
        const std::size_t p = 3 * static_cast<std::size_t>(index.vertex_index);
        triangle[k].Position = {attrib.vertices[p], attrib.vertices[p + 1],
                                -attrib.vertices[p + 2]};
        if (index.normal_index >= 0) {
          const std::size_t n = 3 * static_cast<std::size_t>(index.normal_index);
          triangle[k].Normal = {attrib.normals[n], attrib.normals[n + 1], -attrib.normals[n + 2]};
        } else {
          has_normals = false;
        }
        triangle[k].Uv = {0.0f, 0.0f};
        if (index.texcoord_index >= 0) {
          const std::size_t t = 2 * static_cast<std::size_t>(index.texcoord_index);
          triangle[k].Uv = {attrib.texcoords[t], 1.0f - attrib.texcoords[t + 1]};
        }
        triangle[k].Color = 0xFFFFFFFFu;
      }
      if (!has_normals) {
        const D3DXVECTOR3 n =
            FaceNormal(triangle[0].Position, triangle[2].Position, triangle[1].Position);
        for (MeshVertex& v : triangle) v.Normal = n;
      }
      // Reversed winding: see the header.
      vertices.insert(vertices.end(), {triangle[0], triangle[2], triangle[1]});
      offset += 3;
    }
  }
  if (vertices.empty()) {
    *error = "OBJ file \"" + path + "\" holds no triangles";
    return false;
  }
  SetTriangles(mesh, vertices);
  return true;
}

void BuildGrid(Tev_DX8_ObjectDataChannel* mesh, float width, float depth, int cells, D3DCOLOR first,
               D3DCOLOR second) {
  std::vector<MeshVertex> vertices;
  vertices.reserve(static_cast<std::size_t>(cells) * static_cast<std::size_t>(cells) * 6);
  const float cell_w = width / static_cast<float>(cells);
  const float cell_d = depth / static_cast<float>(cells);
  const D3DXVECTOR3 up{0.0f, 1.0f, 0.0f};
  for (int row = 0; row < cells; ++row) {
    for (int col = 0; col < cells; ++col) {
      const float x0 = -width / 2 + cell_w * static_cast<float>(col), x1 = x0 + cell_w;
      const float z0 = -depth / 2 + cell_d * static_cast<float>(row), z1 = z0 + cell_d;
      const D3DCOLOR color = (row + col) % 2 == 0 ? first : second;
      // Seen from above (+Y) with z away from the viewer, (x0,z0) (x0,z1) (x1,z1) runs
      // clockwise.
      const D3DXVECTOR3 a{x0, 0, z0}, b{x0, 0, z1}, c{x1, 0, z1}, d{x1, 0, z0};
      for (const D3DXVECTOR3& p : {a, b, c, c, d, a})
        vertices.push_back({p, up, {(p.x + width / 2) / width, (p.z + depth / 2) / depth}, color});
    }
  }
  SetTriangles(mesh, vertices);
}

void PaintMesh(Tev_DX8_ObjectDataChannel* mesh, D3DCOLOR color) {
  for (int i = 0; i < mesh->GetVertexCount(); ++i) mesh->SetVertexColor(color, i);
}

void ShadeMesh(Tev_DX8_ObjectDataChannel* mesh) {
  D3DXVECTOR3 light{-0.4f, 0.8f, -0.45f};
  D3DXVec3Normalize(&light, &light);
  for (int i = 0; i < mesh->GetVertexCount(); ++i) {
    const D3DXVECTOR3 n = mesh->GetVertexNormals(static_cast<DWORD>(i));
    const float factor = 0.35f + 0.65f * std::max(0.0f, D3DXVec3Dot(&n, &light));
    const D3DCOLOR color = mesh->GetVertexColor(static_cast<DWORD>(i));
    const D3DCOLOR lit = (color & 0xFF000000u) | (Scale((color >> 16) & 0xFFu, factor) << 16) |
                         (Scale((color >> 8) & 0xFFu, factor) << 8) | Scale(color & 0xFFu, factor);
    mesh->SetVertexColor(lit, i);
  }
}

}  // namespace apescene
