#include "platform/gl/point_program.h"

#include <algorithm>
#include <vector>

#include "platform/gl/d3d_to_gl.h"

namespace {

// GLSL for the compatibility profile: fixed-function matrices and arrays in, gl_FrontColor and
// gl_TexCoord[0] out for the fixed-function fragment stage.
constexpr char kVertexSource[] = R"(#version 450 compatibility
layout(location = 7) in float ape_point_size;
uniform bool vertex_size;
uniform float state_size;
uniform bool scale;
uniform vec3 scale_abc;
uniform float viewport_height;
uniform vec2 size_range;
uniform vec4 colour_scale;
void main() {
  vec4 eye = gl_ModelViewMatrix * gl_Vertex;
  gl_Position = gl_ProjectionMatrix * eye;
  float size = vertex_size ? ape_point_size : state_size;
  if (scale) {
    // Direct3D 9: viewport height * size * sqrt(1 / (A + B d + C d^2)), d the eye distance.
    float d = length(eye.xyz);
    float denominator = scale_abc.x + scale_abc.y * d + scale_abc.z * d * d;
    size = denominator > 0.0 ? viewport_height * size * sqrt(1.0 / denominator) : size_range.y;
  }
  size = clamp(size, size_range.x, size_range.y);
  // A point of no size covers no pixel centre; GL would still draw one pixel, so it is moved
  // out of the clip volume instead.
  if (!(size > 0.0)) gl_Position = vec4(0.0, 0.0, -2.0, 1.0);
  gl_PointSize = max(size, 1.0);
  gl_FrontColor = gl_Color * colour_scale;
  gl_BackColor = gl_FrontColor;
  gl_TexCoord[0] = gl_MultiTexCoord0;
}
)";

// v when it is a number >= 0, else `otherwise`.
float NonNegativeOr(float v, float otherwise) {
  return v >= 0.0f ? v : otherwise;
}

std::string ShaderLog(GLuint shader) {
  GLint length = 0;
  glGetShaderiv(shader, GL_INFO_LOG_LENGTH, &length);
  std::vector<char> text(static_cast<std::size_t>(std::max(length, 1)), '\0');
  glGetShaderInfoLog(shader, length, nullptr, text.data());
  return text.data();
}

std::string ProgramLog(GLuint program) {
  GLint length = 0;
  glGetProgramiv(program, GL_INFO_LOG_LENGTH, &length);
  std::vector<char> text(static_cast<std::size_t>(std::max(length, 1)), '\0');
  glGetProgramInfoLog(program, length, nullptr, text.data());
  return text.data();
}

}  // namespace

PointParams DescribePoints(const DWORD* rs, bool vertex_has_size, bool vertex_has_diffuse,
                           UINT viewport_height_px, float driver_max_px) {
  PointParams p;
  p.vertex_size = vertex_has_size;
  p.state_size = StateBitsToFloat(rs[D3DRS_POINTSIZE]);
  p.scale = rs[D3DRS_POINTSCALEENABLE] != FALSE;
  p.scale_a = StateBitsToFloat(rs[D3DRS_POINTSCALE_A]);
  p.scale_b = StateBitsToFloat(rs[D3DRS_POINTSCALE_B]);
  p.scale_c = StateBitsToFloat(rs[D3DRS_POINTSCALE_C]);
  p.viewport_height_px = static_cast<float>(viewport_height_px);
  const float driver_max = NonNegativeOr(driver_max_px, 1.0f);
  p.max_px =
      std::min(NonNegativeOr(StateBitsToFloat(rs[D3DRS_POINTSIZE_MAX]), driver_max), driver_max);
  p.min_px = std::min(NonNegativeOr(StateBitsToFloat(rs[D3DRS_POINTSIZE_MIN]), 0.0f), p.max_px);
  p.lighting = rs[D3DRS_LIGHTING] != FALSE;
  p.lit_alpha_from_vertex = LitAlphaFromVertex(rs, vertex_has_diffuse);
  return p;
}

bool PointProgram::Build(std::string* error) {
  const GLuint shader = glCreateShader(GL_VERTEX_SHADER);
  const char* source = kVertexSource;
  glShaderSource(shader, 1, &source, nullptr);
  glCompileShader(shader);
  GLint ok = GL_FALSE;
  glGetShaderiv(shader, GL_COMPILE_STATUS, &ok);
  if (ok != GL_TRUE) {
    *error = "GlDevice: the point vertex shader does not compile: " + ShaderLog(shader);
    glDeleteShader(shader);
    return false;
  }
  program_ = glCreateProgram();
  glAttachShader(program_, shader);
  glLinkProgram(program_);
  glDeleteShader(shader);  // stays alive while attached
  glGetProgramiv(program_, GL_LINK_STATUS, &ok);
  if (ok != GL_TRUE) {
    *error = "GlDevice: the point program does not link: " + ProgramLog(program_);
    Destroy();
    return false;
  }
  vertex_size_ = glGetUniformLocation(program_, "vertex_size");
  state_size_ = glGetUniformLocation(program_, "state_size");
  scale_ = glGetUniformLocation(program_, "scale");
  scale_abc_ = glGetUniformLocation(program_, "scale_abc");
  viewport_height_ = glGetUniformLocation(program_, "viewport_height");
  size_range_ = glGetUniformLocation(program_, "size_range");
  colour_scale_ = glGetUniformLocation(program_, "colour_scale");
  return true;
}

void PointProgram::Use(const PointParams& p) const {
  glUseProgram(program_);
  glUniform1i(vertex_size_, p.vertex_size ? 1 : 0);
  glUniform1f(state_size_, p.state_size);
  glUniform1i(scale_, p.scale ? 1 : 0);
  glUniform3f(scale_abc_, p.scale_a, p.scale_b, p.scale_c);
  glUniform1f(viewport_height_, p.viewport_height_px);
  glUniform2f(size_range_, p.min_px, p.max_px);
  if (p.lighting) {
    glUniform4f(colour_scale_, 0.0f, 0.0f, 0.0f, p.lit_alpha_from_vertex ? 1.0f : 0.0f);
  } else {
    glUniform4f(colour_scale_, 1.0f, 1.0f, 1.0f, 1.0f);
  }
}

void PointProgram::Stop() {
  glUseProgram(0);
}

void PointProgram::Destroy() {
  if (program_ != 0) glDeleteProgram(program_);
  program_ = 0;
}
