#include "platform/gl/gl_pipeline_state.h"

#include "platform/gl/d3d_to_gl.h"

namespace {

// Render states past those named in the shared header, with their published numbers.
constexpr std::uint32_t kSeparateAlphaBlendEnable = 206;
constexpr std::uint32_t kSrcBlendAlpha = 207;
constexpr std::uint32_t kDestBlendAlpha = 208;
constexpr std::uint32_t kBlendOpAlpha = 209;
constexpr std::uint32_t kBlendFactor = 193;

constexpr DWORD kColourWriteRed = 1;
constexpr DWORD kColourWriteGreen = 2;
constexpr DWORD kColourWriteBlue = 4;
constexpr DWORD kColourWriteAlpha = 8;

void Enable(GLenum capability, bool on) {
  if (on) {
    glEnable(capability);
  } else {
    glDisable(capability);
  }
}

GLboolean Flag(bool on) {
  return on ? GL_TRUE : GL_FALSE;
}

void ApplyBlending(const DWORD* rs) {
  Enable(GL_BLEND, rs[D3DRS_ALPHABLENDENABLE] != FALSE);
  const BlendFactors colour = BlendFactorsFor(rs[D3DRS_SRCBLEND], rs[D3DRS_DESTBLEND]);
  const GLenum colour_equation = BlendEquation(rs[D3DRS_BLENDOP]);
  BlendFactors alpha = colour;
  GLenum alpha_equation = colour_equation;
  if (rs[kSeparateAlphaBlendEnable] != FALSE) {
    alpha = BlendFactorsFor(rs[kSrcBlendAlpha], rs[kDestBlendAlpha]);
    alpha_equation = BlendEquation(rs[kBlendOpAlpha]);
  }
  glBlendFuncSeparate(colour.source, colour.destination, alpha.source, alpha.destination);
  glBlendEquationSeparate(colour_equation, alpha_equation);
  const ColourRgba factor = ColourFromD3d(rs[kBlendFactor]);
  glBlendColor(factor.r, factor.g, factor.b, factor.a);
}

}  // namespace

void SetFixedPipelineDefaults() {
  glDisable(GL_DITHER);
  glProvokingVertex(GL_FIRST_VERTEX_CONVENTION);
  glClipControl(GL_LOWER_LEFT, GL_ZERO_TO_ONE);
  glPointParameteri(GL_POINT_SPRITE_COORD_ORIGIN, GL_UPPER_LEFT);
  glEnable(GL_PROGRAM_POINT_SIZE);
  const GLfloat black[4] = {0.0f, 0.0f, 0.0f, 0.0f};
  glLightModelfv(GL_LIGHT_MODEL_AMBIENT, black);
  glMaterialfv(GL_FRONT_AND_BACK, GL_AMBIENT, black);
  glMaterialfv(GL_FRONT_AND_BACK, GL_EMISSION, black);
  glMaterialfv(GL_FRONT_AND_BACK, GL_SPECULAR, black);
  glColorMaterial(GL_FRONT_AND_BACK, GL_DIFFUSE);
}

void ApplyRenderStates(const DWORD* rs) {
  Enable(GL_DEPTH_TEST, rs[D3DRS_ZENABLE] != D3DZB_FALSE);
  glDepthMask(Flag(rs[D3DRS_ZWRITEENABLE] != FALSE));
  glDepthFunc(CompareFunction(rs[D3DRS_ZFUNC], GL_LEQUAL));

  ApplyBlending(rs);

  Enable(GL_ALPHA_TEST, rs[D3DRS_ALPHATESTENABLE] != FALSE);
  glAlphaFunc(CompareFunction(rs[D3DRS_ALPHAFUNC], GL_ALWAYS),
              static_cast<GLfloat>(rs[D3DRS_ALPHAREF] & 0xFFu) / 255.0f);

  const CullSetup cull = CullFor(rs[D3DRS_CULLMODE]);
  Enable(GL_CULL_FACE, cull.enabled);
  glFrontFace(cull.front_face);
  glCullFace(GL_BACK);

  const DWORD mask = rs[D3DRS_COLORWRITEENABLE];
  glColorMask(Flag((mask & kColourWriteRed) != 0), Flag((mask & kColourWriteGreen) != 0),
              Flag((mask & kColourWriteBlue) != 0), Flag((mask & kColourWriteAlpha) != 0));

  glPolygonMode(GL_FRONT_AND_BACK, PolygonMode(rs[D3DRS_FILLMODE]));
  glShadeModel(rs[D3DRS_SHADEMODE] == D3DSHADE_FLAT ? GL_FLAT : GL_SMOOTH);
}

void ApplyLighting(const DWORD* rs, bool vertex_has_diffuse) {
  if (rs[D3DRS_LIGHTING] == FALSE) {
    glDisable(GL_LIGHTING);
    glDisable(GL_COLOR_MATERIAL);
    return;
  }
  glEnable(GL_LIGHTING);
  if (LitAlphaFromVertex(rs, vertex_has_diffuse)) {
    glEnable(GL_COLOR_MATERIAL);  // the diffuse material follows the vertex colour
  } else {
    glDisable(GL_COLOR_MATERIAL);
    const GLfloat zero[4] = {0.0f, 0.0f, 0.0f, 0.0f};
    glMaterialfv(GL_FRONT_AND_BACK, GL_DIFFUSE, zero);
  }
}

void ApplyTransforms(const D3DMATRIX& world, const D3DMATRIX& view, const D3DMATRIX& projection) {
  glMatrixMode(GL_PROJECTION);
  glLoadMatrixf(&projection.m[0][0]);
  glMatrixMode(GL_MODELVIEW);
  glLoadMatrixf(&view.m[0][0]);
  glMultMatrixf(&world.m[0][0]);
}

void ApplyViewport(const D3DVIEWPORT9& v, UINT target_height) {
  // SetViewport keeps the viewport inside the target, so every value fits a GLint.
  glViewport(static_cast<GLint>(v.X), static_cast<GLint>(target_height - v.Y - v.Height),
             static_cast<GLsizei>(v.Width), static_cast<GLsizei>(v.Height));
  glDepthRangef(v.MinZ, v.MaxZ);
}

void ApplyPointSprites(const DWORD* rs, bool drawing_points) {
  const bool sprites = drawing_points && rs[D3DRS_POINTSPRITEENABLE] != FALSE;
  Enable(GL_POINT_SPRITE, sprites);
  glActiveTexture(GL_TEXTURE0);
  glTexEnvi(GL_POINT_SPRITE, GL_COORD_REPLACE, sprites ? GL_TRUE : GL_FALSE);
}
