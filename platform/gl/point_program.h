// The one shader of the device: a vertex shader for point draws that works out each point's
// size the way Direct3D 9 does (D3DRS_POINTSIZE or the vertex's PSIZE, optionally scaled by
// distance, clamped). Fragments stay fixed function, so texture stage 0 and point-sprite
// coordinates apply to points as to every other primitive.
#pragma once

#include "platform/gl/gl_api.h"

#include <string>

#include "platform/d3d9_types.h"

struct PointParams {
  bool vertex_size = false;  // sizes from each vertex's PSIZE, else state_size
  float state_size = 1.0f;   // D3DRS_POINTSIZE
  bool scale = false;        // D3DRS_POINTSCALEENABLE: sizes are eye-space lengths
  float scale_a = 1.0f, scale_b = 0.0f, scale_c = 0.0f;
  float viewport_height_px = 1.0f;
  // [D3DRS_POINTSIZE_MIN, min(D3DRS_POINTSIZE_MAX, the driver's largest point)], in pixels,
  // with min <= max and neither negative nor NaN.
  float min_px = 1.0f;
  float max_px = 64.0f;
  // Lighting with no lights: rgb black; alpha the vertex's (1) or the zero material's (0).
  bool lighting = false;
  bool lit_alpha_from_vertex = true;
};

// render_states: the device's kD3DRenderStateCount values.
PointParams DescribePoints(const DWORD* render_states, bool vertex_has_size,
                           bool vertex_has_diffuse, UINT viewport_height_px, float driver_max_px);

class PointProgram {
 public:
  // The generic attribute the per-vertex size is fed through (clear of the slots some drivers
  // alias with the fixed-function arrays).
  static constexpr GLuint kSizeAttribute = 7;

  PointProgram() = default;
  PointProgram(const PointProgram&) = delete;
  PointProgram& operator=(const PointProgram&) = delete;

  // Compiles and links; false with the compiler's log in *error.
  bool Build(std::string* error);
  // Binds the program with these parameters; Stop() returns to fixed function.
  void Use(const PointParams& params) const;
  static void Stop();
  // Deletes the program; the context must be current.
  void Destroy();

 private:
  GLuint program_ = 0;
  GLint vertex_size_ = -1;
  GLint state_size_ = -1;
  GLint scale_ = -1;
  GLint scale_abc_ = -1;
  GLint viewport_height_ = -1;
  GLint size_range_ = -1;
  GLint colour_scale_ = -1;
};
