// Meshes for "3D ObjectData" channels beyond the channel's own built-in shapes: Wavefront OBJ
// files, a checkered ground grid, and vertex colours for drawing.
#pragma once

#include <string>

#include "platform/d3d9_types.h"

class Tev_DX8_ObjectDataChannel;

namespace apescene {

// Replaces the mesh with the triangles of an OBJ file (polygons are triangulated). OBJ files are
// right-handed (y up, z toward the viewer) with counter-clockwise front faces; this host is
// left-handed with clockwise front faces, so z is negated and each triangle's winding reversed,
// which keeps the file's front faces in front. Without normals in the file each triangle gets
// its face normal. False with a message naming the file.
bool LoadObjMesh(const std::string& path, Tev_DX8_ObjectDataChannel* mesh, std::string* error);

// A width x depth grid in the XZ plane facing +Y, centred on the origin, of cells x cells
// squares coloured alternately (each square has its own four vertices, so the colours stay
// crisp). Front faces are clockwise seen from above.
void BuildGrid(Tev_DX8_ObjectDataChannel* mesh, float width, float depth, int cells, D3DCOLOR first,
               D3DCOLOR second);

// Sets every vertex colour to `color`.
void PaintMesh(Tev_DX8_ObjectDataChannel* mesh, D3DCOLOR color);
// Darkens every vertex colour by how far its normal turns from a fixed light above and in front
// of the scene: the device draws without lighting, and flat colour hides a mesh's shape.
void ShadeMesh(Tev_DX8_ObjectDataChannel* mesh);

}  // namespace apescene
