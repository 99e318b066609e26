// Where each part of a vertex lies for a flexible vertex format (FVF), in Direct3D's order:
// position, normal, point size, diffuse, specular, texture coordinate sets.
#pragma once

#include "platform/d3d9_types.h"

struct FvfLayout {
  UINT size = 0;    // bytes per vertex the format describes
  int normal = -1;  // byte offsets; -1 when the part is absent
  int point_size = -1;
  int diffuse = -1;
  int specular = -1;
  int texcoords = -1;  // first set; each set is two floats, 8 bytes after the last
  UINT texcoord_sets = 0;
};

// False for formats this device cannot draw: a position other than plain D3DFVF_XYZ (pre-
// transformed or blended vertices), texture coordinate sets of other than two floats, more than
// eight sets, or bits it does not know.
bool DescribeFvf(DWORD fvf, FvfLayout* layout);
