#include "platform/gl/d3d_to_gl.h"

namespace {

// Blend values past the ten named in the shared header, with their published numbers.
constexpr DWORD kBlendSrcAlphaSat = 11;
constexpr DWORD kBlendBothSrcAlpha = 12;     // source SRCALPHA, destination INVSRCALPHA
constexpr DWORD kBlendBothInvSrcAlpha = 13;  // source INVSRCALPHA, destination SRCALPHA
constexpr DWORD kBlendFactor = 14;
constexpr DWORD kBlendInvBlendFactor = 15;

constexpr DWORD kBlendOpSubtract = 2;
constexpr DWORD kBlendOpRevSubtract = 3;
constexpr DWORD kBlendOpMin = 4;
constexpr DWORD kBlendOpMax = 5;

constexpr std::uint32_t kDiffuseMaterialSource = 145;  // render state
constexpr DWORD kMaterialSourceColor1 = 1;             // the vertex's diffuse colour

GLenum BlendFactor(DWORD d3d_blend, GLenum fallback) {
  switch (d3d_blend) {
    case D3DBLEND_ZERO:
      return GL_ZERO;
    case D3DBLEND_ONE:
      return GL_ONE;
    case D3DBLEND_SRCCOLOR:
      return GL_SRC_COLOR;
    case D3DBLEND_INVSRCCOLOR:
      return GL_ONE_MINUS_SRC_COLOR;
    case D3DBLEND_SRCALPHA:
      return GL_SRC_ALPHA;
    case D3DBLEND_INVSRCALPHA:
      return GL_ONE_MINUS_SRC_ALPHA;
    case D3DBLEND_DESTALPHA:
      return GL_DST_ALPHA;
    case D3DBLEND_INVDESTALPHA:
      return GL_ONE_MINUS_DST_ALPHA;
    case D3DBLEND_DESTCOLOR:
      return GL_DST_COLOR;
    case D3DBLEND_INVDESTCOLOR:
      return GL_ONE_MINUS_DST_COLOR;
    case kBlendSrcAlphaSat:
      return GL_SRC_ALPHA_SATURATE;
    case kBlendFactor:
      return GL_CONSTANT_COLOR;
    case kBlendInvBlendFactor:
      return GL_ONE_MINUS_CONSTANT_COLOR;
    default:
      return fallback;
  }
}

}  // namespace

BlendFactors BlendFactorsFor(DWORD d3d_source, DWORD d3d_destination) {
  if (d3d_source == kBlendBothSrcAlpha) return {GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA};
  if (d3d_source == kBlendBothInvSrcAlpha) return {GL_ONE_MINUS_SRC_ALPHA, GL_SRC_ALPHA};
  return {BlendFactor(d3d_source, GL_ONE), BlendFactor(d3d_destination, GL_ZERO)};
}

GLenum BlendEquation(DWORD d3d_blend_op) {
  switch (d3d_blend_op) {
    case kBlendOpSubtract:
      return GL_FUNC_SUBTRACT;
    case kBlendOpRevSubtract:
      return GL_FUNC_REVERSE_SUBTRACT;
    case kBlendOpMin:
      return GL_MIN;
    case kBlendOpMax:
      return GL_MAX;
    default:
      return GL_FUNC_ADD;
  }
}

GLenum CompareFunction(DWORD d3d_cmp, GLenum fallback) {
  switch (d3d_cmp) {
    case D3DCMP_NEVER:
      return GL_NEVER;
    case D3DCMP_LESS:
      return GL_LESS;
    case D3DCMP_EQUAL:
      return GL_EQUAL;
    case D3DCMP_LESSEQUAL:
      return GL_LEQUAL;
    case D3DCMP_GREATER:
      return GL_GREATER;
    case D3DCMP_NOTEQUAL:
      return GL_NOTEQUAL;
    case D3DCMP_GREATEREQUAL:
      return GL_GEQUAL;
    case D3DCMP_ALWAYS:
      return GL_ALWAYS;
    default:
      return fallback;
  }
}

GLenum PolygonMode(DWORD d3d_fill) {
  switch (d3d_fill) {
    case D3DFILL_POINT:
      return GL_POINT;
    case D3DFILL_WIREFRAME:
      return GL_LINE;
    default:
      return GL_FILL;
  }
}

PrimitiveDraw PrimitiveFor(D3DPRIMITIVETYPE type, UINT primitive_count) {
  const std::uint64_t n = primitive_count;
  switch (type) {
    case D3DPT_POINTLIST:
      return {GL_POINTS, n};
    case D3DPT_LINELIST:
      return {GL_LINES, 2 * n};
    case D3DPT_LINESTRIP:
      return {GL_LINE_STRIP, n == 0 ? 0 : n + 1};
    case D3DPT_TRIANGLELIST:
      return {GL_TRIANGLES, 3 * n};
    case D3DPT_TRIANGLESTRIP:
      return {GL_TRIANGLE_STRIP, n == 0 ? 0 : n + 2};
    case D3DPT_TRIANGLEFAN:
      return {GL_TRIANGLE_FAN, n == 0 ? 0 : n + 2};
  }
  return {GL_POINTS, 0};
}

CullSetup CullFor(DWORD d3d_cull) {
  switch (d3d_cull) {
    case D3DCULL_CW:
      return {true, GL_CCW};
    case D3DCULL_CCW:
      return {true, GL_CW};
    default:
      return {false, GL_CW};
  }
}

ColourRgba ColourFromD3d(D3DCOLOR colour) {
  constexpr float kScale = 1.0f / 255.0f;
  return {static_cast<float>((colour >> 16) & 0xFFu) * kScale,
          static_cast<float>((colour >> 8) & 0xFFu) * kScale,
          static_cast<float>(colour & 0xFFu) * kScale,
          static_cast<float>((colour >> 24) & 0xFFu) * kScale};
}

bool LitAlphaFromVertex(const DWORD* render_states, bool vertex_has_diffuse) {
  return vertex_has_diffuse && render_states[D3DRS_COLORVERTEX] != FALSE &&
         render_states[kDiffuseMaterialSource] == kMaterialSourceColor1;
}
