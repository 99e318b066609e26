// Direct3D 9's documented starting values of the render states and texture stage states, the
// one table every device of this system starts from.
#pragma once

#include "platform/d3d9_types.h"

// 0 for states Direct3D starts at zero and for numbers past the table.
DWORD D3D9DefaultRenderState(D3DRENDERSTATETYPE state);
// Stage 0 modulates the texture with the diffuse colour, later stages are disabled, and each
// stage reads the texture coordinates of its own number. 0 past the table.
DWORD D3D9DefaultTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type);
