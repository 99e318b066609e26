// Texture stage 0's colour and alpha operations (D3DTSS_COLOROP/ALPHAOP and their arguments) as
// GL_COMBINE set-ups of texture unit 0. Later stages are stored by the device and not drawn.
#pragma once

#include "platform/gl/gl_api.h"

#include "platform/d3d9_types.h"

// One GL_COMBINE function: mode over up to two sources, each with its operand.
struct CombineFunction {
  GLenum mode = GL_MODULATE;
  GLenum source[2] = {GL_TEXTURE, GL_PREVIOUS};
  GLenum operand[2] = {GL_SRC_COLOR, GL_SRC_COLOR};
  float scale = 1.0f;  // 1, 2 or 4
  friend bool operator==(const CombineFunction&, const CombineFunction&) = default;
};

struct Stage0Combine {
  // False: unit 0 is off and the diffuse colour and alpha pass through. So it is when the colour
  // operation is D3DTOP_DISABLE or no texture is bound (a missing texture reads as white).
  bool texturing = false;
  CombineFunction rgb;
  CombineFunction alpha;
};

// stage_states: stage 0's kD3DTextureStageStateCount values.
Stage0Combine DescribeStage0(const DWORD* stage_states, bool has_texture);
// Sets texture unit 0's environment; `texture_factor` is D3DRS_TEXTUREFACTOR, the colour that
// D3DTA_TFACTOR reads.
void ApplyStage0Combine(const Stage0Combine& combine, D3DCOLOR texture_factor);
