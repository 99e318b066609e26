#include "platform/gl/texture_stage_combine.h"

#include "platform/gl/d3d_to_gl.h"

namespace {

// Texture operations and argument bits past those named in the shared header.
constexpr DWORD kOpModulate4x = 6;
constexpr DWORD kOpAddSigned = 8;
constexpr DWORD kOpAddSigned2x = 9;
constexpr DWORD kOpSubtract = 10;
constexpr DWORD kArgSelectMask = 0x0F;
constexpr DWORD kArgComplement = 0x10;
constexpr DWORD kArgAlphaReplicate = 0x20;

GLenum SourceOf(DWORD arg) {
  switch (arg & kArgSelectMask) {
    case D3DTA_DIFFUSE:
      return GL_PRIMARY_COLOR;
    case D3DTA_TEXTURE:
      return GL_TEXTURE;
    case D3DTA_TFACTOR:
      return GL_CONSTANT;
    default:  // D3DTA_CURRENT, and selectors this device does not draw
      return GL_PREVIOUS;
  }
}

GLenum OperandOf(DWORD arg, bool for_alpha) {
  const bool complement = (arg & kArgComplement) != 0;
  if (for_alpha || (arg & kArgAlphaReplicate) != 0) {
    return complement ? GL_ONE_MINUS_SRC_ALPHA : GL_SRC_ALPHA;
  }
  return complement ? GL_ONE_MINUS_SRC_COLOR : GL_SRC_COLOR;
}

// One operation over its two arguments; operations this device does not draw pass the current
// value through, as a disabled operation does.
CombineFunction FunctionFor(DWORD op, DWORD arg1, DWORD arg2, bool for_alpha) {
  CombineFunction f;
  f.source[0] = SourceOf(arg1);
  f.operand[0] = OperandOf(arg1, for_alpha);
  f.source[1] = SourceOf(arg2);
  f.operand[1] = OperandOf(arg2, for_alpha);
  switch (op) {
    case D3DTOP_SELECTARG1:
      f.mode = GL_REPLACE;
      break;
    case D3DTOP_SELECTARG2:
      f.mode = GL_REPLACE;
      f.source[0] = f.source[1];
      f.operand[0] = f.operand[1];
      break;
    case D3DTOP_MODULATE:
      f.mode = GL_MODULATE;
      break;
    case D3DTOP_MODULATE2X:
      f.mode = GL_MODULATE;
      f.scale = 2.0f;
      break;
    case kOpModulate4x:
      f.mode = GL_MODULATE;
      f.scale = 4.0f;
      break;
    case D3DTOP_ADD:
      f.mode = GL_ADD;
      break;
    case kOpAddSigned:
      f.mode = GL_ADD_SIGNED;
      break;
    case kOpAddSigned2x:
      f.mode = GL_ADD_SIGNED;
      f.scale = 2.0f;
      break;
    case kOpSubtract:
      f.mode = GL_SUBTRACT;
      break;
    default:
      f.mode = GL_REPLACE;
      f.source[0] = GL_PREVIOUS;
      f.operand[0] = for_alpha ? GL_SRC_ALPHA : GL_SRC_COLOR;
      break;
  }
  return f;
}

void SetFunction(const CombineFunction& f, bool alpha) {
  glTexEnvi(GL_TEXTURE_ENV, alpha ? GL_COMBINE_ALPHA : GL_COMBINE_RGB, static_cast<GLint>(f.mode));
  const GLenum source_names[2] = {alpha ? GLenum{GL_SRC0_ALPHA} : GLenum{GL_SRC0_RGB},
                                  alpha ? GLenum{GL_SRC1_ALPHA} : GLenum{GL_SRC1_RGB}};
  const GLenum operand_names[2] = {alpha ? GLenum{GL_OPERAND0_ALPHA} : GLenum{GL_OPERAND0_RGB},
                                   alpha ? GLenum{GL_OPERAND1_ALPHA} : GLenum{GL_OPERAND1_RGB}};
  for (int i = 0; i < 2; ++i) {
    glTexEnvi(GL_TEXTURE_ENV, source_names[i], static_cast<GLint>(f.source[i]));
    glTexEnvi(GL_TEXTURE_ENV, operand_names[i], static_cast<GLint>(f.operand[i]));
  }
  glTexEnvf(GL_TEXTURE_ENV, alpha ? GL_ALPHA_SCALE : GL_RGB_SCALE, f.scale);
}

}  // namespace

Stage0Combine DescribeStage0(const DWORD* s, bool has_texture) {
  Stage0Combine combine;
  combine.texturing = has_texture && s[D3DTSS_COLOROP] != D3DTOP_DISABLE;
  combine.rgb = FunctionFor(s[D3DTSS_COLOROP], s[D3DTSS_COLORARG1], s[D3DTSS_COLORARG2], false);
  combine.alpha = FunctionFor(s[D3DTSS_ALPHAOP], s[D3DTSS_ALPHAARG1], s[D3DTSS_ALPHAARG2], true);
  return combine;
}

void ApplyStage0Combine(const Stage0Combine& combine, D3DCOLOR texture_factor) {
  glActiveTexture(GL_TEXTURE0);
  if (!combine.texturing) {
    glDisable(GL_TEXTURE_2D);
    return;
  }
  glEnable(GL_TEXTURE_2D);
  glTexEnvi(GL_TEXTURE_ENV, GL_TEXTURE_ENV_MODE, GL_COMBINE);
  SetFunction(combine.rgb, false);
  SetFunction(combine.alpha, true);
  const ColourRgba factor = ColourFromD3d(texture_factor);
  const GLfloat factor_rgba[4] = {factor.r, factor.g, factor.b, factor.a};
  glTexEnvfv(GL_TEXTURE_ENV, GL_TEXTURE_ENV_COLOR, factor_rgba);
}
