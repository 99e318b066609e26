// Direct3D 9 enumeration values translated to their OpenGL counterparts.
#pragma once

#include "platform/gl/gl_api.h"

#include <cstdint>

#include "platform/d3d9_types.h"

// D3DRS_SRCBLEND and D3DRS_DESTBLEND as GL blend factors. D3DBLEND_BOTHSRCALPHA and
// D3DBLEND_BOTHINVSRCALPHA as the source set both; unknown values keep Direct3D's defaults
// (one for the source, zero for the destination).
struct BlendFactors {
  GLenum source = GL_ONE;
  GLenum destination = GL_ZERO;
};
BlendFactors BlendFactorsFor(DWORD d3d_source, DWORD d3d_destination);
// A D3DBLENDOP value as a GL blend equation; unknown values add.
GLenum BlendEquation(DWORD d3d_blend_op);
// A D3DCMPFUNC value as a GL comparison; `fallback` for unknown values.
GLenum CompareFunction(DWORD d3d_cmp, GLenum fallback);
// A D3DFILLMODE value as a glPolygonMode mode; unknown values fill.
GLenum PolygonMode(DWORD d3d_fill);

// How many vertices (or indices) a draw of `primitive_count` primitives reads, and the GL mode;
// vertices is 0 for a primitive type Direct3D does not define.
struct PrimitiveDraw {
  GLenum mode = GL_POINTS;
  std::uint64_t vertices = 0;
};
PrimitiveDraw PrimitiveFor(D3DPRIMITIVETYPE type, UINT primitive_count);

// Face culling for a D3DCULL value. Direct3D judges winding as seen on screen; the framebuffer
// is read back with GL's bottom row last, so GL's window-space winding is the same one.
struct CullSetup {
  bool enabled = false;
  GLenum front_face = GL_CW;  // GL culls the back faces: those of the other winding
};
CullSetup CullFor(DWORD d3d_cull);

// A D3DCOLOR as four floats in [0, 1], red, green, blue, alpha (GL's order).
struct ColourRgba {
  float r, g, b, a;
};
ColourRgba ColourFromD3d(D3DCOLOR colour);

// With D3DRS_LIGHTING on and no lights (this device has none), Direct3D lights a vertex black
// with the diffuse material's alpha: the vertex's alpha when D3DRS_COLORVERTEX takes the diffuse
// material (D3DRS_DIFFUSEMATERIALSOURCE = D3DMCS_COLOR1) from a vertex that has a diffuse
// colour, else the default material's alpha, 0.
bool LitAlphaFromVertex(const DWORD* render_states, bool vertex_has_diffuse);
