// Direct3D 9 state put into GL's fixed-function pipeline. The device applies the whole table
// before each draw, so GL's state never drifts from the tables that Get* answers from.
#pragma once

#include "platform/gl/gl_api.h"

#include "platform/d3d9_interfaces.h"

// Once per context: no dithering, first-vertex flat shading, Direct3D's [0, 1] clip depth, point
// sprite coordinates from the upper left, and a black, unlit ambient (see ApplyLighting).
void SetFixedPipelineDefaults();

// render_states: the device's kD3DRenderStateCount values. Depth test and writes, blending,
// alpha test, culling, colour write mask, fill and shade modes.
void ApplyRenderStates(const DWORD* render_states);

// Fixed-function lighting with no lights, as Direct3D lights without any: black with the
// diffuse material's alpha (LitAlphaFromVertex); off when D3DRS_LIGHTING is FALSE.
void ApplyLighting(const DWORD* render_states, bool vertex_has_diffuse);

// Direct3D's row-vector matrices load into GL's column-major slots unchanged; the modelview is
// view then world, which is world * view in Direct3D's order.
void ApplyTransforms(const D3DMATRIX& world, const D3DMATRIX& view, const D3DMATRIX& projection);

// Direct3D's viewport counts rows from the top, GL's from the bottom.
void ApplyViewport(const D3DVIEWPORT9& viewport, UINT target_height);

// Texture coordinates across each point when D3DRS_POINTSPRITEENABLE is on and points are drawn.
void ApplyPointSprites(const DWORD* render_states, bool drawing_points);
