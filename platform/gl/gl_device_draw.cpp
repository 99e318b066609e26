// GlDevice: the draws and Clear. Every draw is checked against the bound buffers first, since
// GL would read past a buffer's end without complaint.
#include <algorithm>
#include <climits>
#include <cstdint>
#include <cstring>
#include <vector>

#include "platform/gl/call_recorder.h"
#include "platform/gl/d3d_to_gl.h"
#include "platform/gl/fvf_layout.h"
#include "platform/gl/gl_buffers.h"
#include "platform/gl/gl_device.h"
#include "platform/gl/gl_device_state.h"
#include "platform/gl/gl_pipeline_state.h"
#include "platform/gl/gl_texture.h"
#include "platform/gl/texture_stage_combine.h"

namespace {

constexpr std::uint32_t kTextureFactor = 60;  // render state D3DRS_TEXTUREFACTOR
constexpr DWORD kTexcoordIndexMask = 0xFFFF;  // the set; higher bits ask for generated ones
constexpr std::uint32_t kTexcoordSetBytes = 8;

const void* BufferOffset(std::uint64_t bytes) {
  return reinterpret_cast<const void*>(static_cast<std::uintptr_t>(bytes));
}

void BindVertexArrays(const FvfLayout& layout, GLuint buffer, UINT offset, UINT stride,
                      DWORD texcoord_set) {
  const GLsizei gl_stride = static_cast<GLsizei>(stride);
  glBindBuffer(GL_ARRAY_BUFFER, buffer);
  glEnableClientState(GL_VERTEX_ARRAY);
  glVertexPointer(3, GL_FLOAT, gl_stride, BufferOffset(offset));
  if (layout.normal >= 0) {
    glEnableClientState(GL_NORMAL_ARRAY);
    glNormalPointer(GL_FLOAT, gl_stride, BufferOffset(std::uint64_t{offset} + layout.normal));
  } else {
    glDisableClientState(GL_NORMAL_ARRAY);
  }
  if (layout.diffuse >= 0) {
    // A D3DCOLOR's bytes in memory are blue, green, red, alpha.
    glEnableClientState(GL_COLOR_ARRAY);
    glColorPointer(GL_BGRA, GL_UNSIGNED_BYTE, gl_stride,
                   BufferOffset(std::uint64_t{offset} + layout.diffuse));
  } else {
    glDisableClientState(GL_COLOR_ARRAY);
    glColor4f(1.0f, 1.0f, 1.0f, 1.0f);  // Direct3D's diffuse colour for vertices without one
  }
  glClientActiveTexture(GL_TEXTURE0);
  if (texcoord_set < layout.texcoord_sets) {
    glEnableClientState(GL_TEXTURE_COORD_ARRAY);
    glTexCoordPointer(
        2, GL_FLOAT, gl_stride,
        BufferOffset(std::uint64_t{offset} + layout.texcoords + texcoord_set * kTexcoordSetBytes));
  } else {
    glDisableClientState(GL_TEXTURE_COORD_ARRAY);
    glMultiTexCoord4f(GL_TEXTURE0, 0.0f, 0.0f, 0.0f, 1.0f);
  }
  if (layout.point_size >= 0) {
    glEnableVertexAttribArray(PointProgram::kSizeAttribute);
    glVertexAttribPointer(PointProgram::kSizeAttribute, 1, GL_FLOAT, GL_FALSE, gl_stride,
                          BufferOffset(std::uint64_t{offset} + layout.point_size));
  } else {
    glDisableVertexAttribArray(PointProgram::kSizeAttribute);
  }
}

void BindStage0Texture(GlDevice::State& s) {
  IDirect3DTexture9* texture = s.journal->textures[0];
  const GLuint name = texture != nullptr ? GlTextureName(texture) : 0;
  ApplyStage0Combine(DescribeStage0(s.stage_states[0], name != 0), s.render_states[kTextureFactor]);
  glActiveTexture(GL_TEXTURE0);
  glBindTexture(GL_TEXTURE_2D, name);
  if (name != 0) {
    const GLint filter = s.linear_filtering ? GL_LINEAR : GL_NEAREST;
    glTextureParameteri(name, GL_TEXTURE_MIN_FILTER, filter);
    glTextureParameteri(name, GL_TEXTURE_MAG_FILTER, filter);
  }
}

// Everything a draw needs in GL: states, transforms, texture, arrays, and the point program for
// point lists (fixed-function vertex processing otherwise).
void PrepareDraw(GlDevice::State& s, const FvfLayout& layout, bool points) {
  s.context->MakeCurrent();
  const DWORD* rs = s.render_states;
  ApplyViewport(s.viewport, s.context->Height());
  ApplyTransforms(s.transforms[D3DTS_WORLD], s.transforms[D3DTS_VIEW],
                  s.transforms[D3DTS_PROJECTION]);
  ApplyRenderStates(rs);
  BindStage0Texture(s);
  const DeviceJournal& j = *s.journal;
  BindVertexArrays(layout, ViewOfGlBuffer(j.stream).name, j.stream_offset, j.stream_stride,
                   s.stage_states[0][D3DTSS_TEXCOORDINDEX] & kTexcoordIndexMask);
  const bool has_diffuse = layout.diffuse >= 0;
  if (points) {
    glDisable(GL_LIGHTING);
    s.points.Use(DescribePoints(rs, layout.point_size >= 0, has_diffuse, s.viewport.Height,
                                s.context->MaxPointSizePx()));
  } else {
    PointProgram::Stop();
    ApplyLighting(rs, has_diffuse);
  }
  ApplyPointSprites(rs, points);
}

// The bound stream's layout, or false when the FVF cannot be drawn or does not fit the stride.
bool StreamLayout(const GlDevice::State& s, FvfLayout* layout) {
  return DescribeFvf(s.fvf, layout) && s.journal->stream_stride >= layout->size;
}

// Bytes a draw reads from the stream: up to the end of vertex `last`.
bool VertexInStream(const DeviceJournal& j, const FvfLayout& layout, std::int64_t vertex) {
  if (vertex < 0) return false;
  const std::uint64_t end =
      j.stream_offset + static_cast<std::uint64_t>(vertex) * j.stream_stride + layout.size;
  return end <= ViewOfGlBuffer(j.stream).bytes->size();
}

// The smallest and largest index of a run in an index buffer's CPU copy.
void IndexRange(const std::vector<BYTE>& bytes, std::uint64_t first_byte, std::uint64_t count,
                UINT index_bytes, std::uint32_t* lowest, std::uint32_t* highest) {
  *lowest = UINT32_MAX;
  *highest = 0;
  for (std::uint64_t i = 0; i < count; ++i) {
    std::uint32_t index = 0;
    if (index_bytes == 2) {
      std::uint16_t narrow = 0;
      std::memcpy(&narrow, bytes.data() + first_byte + i * 2, 2);
      index = narrow;
    } else {
      std::memcpy(&index, bytes.data() + first_byte + i * 4, 4);
    }
    *lowest = std::min(*lowest, index);
    *highest = std::max(*highest, index);
  }
}

// A D3D rectangle (top-left origin) as a GL scissor box, clipped to the viewport; false when
// nothing of it is left.
bool ScissorFor(const D3DRECT& r, const D3DVIEWPORT9& v, UINT target_height, GLint box[4]) {
  const std::int64_t left = std::max<std::int64_t>(r.x1, v.X);
  const std::int64_t top = std::max<std::int64_t>(r.y1, v.Y);
  const std::int64_t right = std::min<std::int64_t>(r.x2, std::int64_t{v.X} + v.Width);
  const std::int64_t bottom = std::min<std::int64_t>(r.y2, std::int64_t{v.Y} + v.Height);
  if (left >= right || top >= bottom) return false;
  box[0] = static_cast<GLint>(left);
  box[1] = static_cast<GLint>(target_height - bottom);
  box[2] = static_cast<GLint>(right - left);
  box[3] = static_cast<GLint>(bottom - top);
  return true;
}

}  // namespace

HRESULT GlDevice::DrawPrimitive(D3DPRIMITIVETYPE type, UINT start_vertex, UINT primitive_count) {
  State& s = *state_;
  DeviceJournal& j = *s.journal;
  LogCall(j, "DrawPrimitive", {type, start_vertex, primitive_count});
  const PrimitiveDraw draw = PrimitiveFor(type, primitive_count);
  FvfLayout layout;
  if (draw.vertices == 0 || j.stream == nullptr || j.stream_stride == 0 ||
      !StreamLayout(s, &layout)) {
    return D3DERR_INVALIDCALL;
  }
  const std::int64_t last =
      std::int64_t{start_vertex} + static_cast<std::int64_t>(draw.vertices) - 1;
  if (!VertexInStream(j, layout, last) || last > INT_MAX) return D3DERR_INVALIDCALL;
  PrepareDraw(s, layout, draw.mode == GL_POINTS);
  glDrawArrays(draw.mode, static_cast<GLint>(start_vertex), static_cast<GLsizei>(draw.vertices));
  return TakeGlErrors();
}

HRESULT GlDevice::DrawIndexedPrimitive(D3DPRIMITIVETYPE type, INT base_vertex_index,
                                       UINT min_vertex_index, UINT num_vertices, UINT start_index,
                                       UINT primitive_count) {
  State& s = *state_;
  DeviceJournal& j = *s.journal;
  LogCall(j, "DrawIndexedPrimitive",
          {type, SignedArg(base_vertex_index), min_vertex_index, num_vertices, start_index,
           primitive_count});
  const PrimitiveDraw draw = PrimitiveFor(type, primitive_count);
  FvfLayout layout;
  if (draw.vertices == 0 || j.stream == nullptr || j.stream_stride == 0 || j.indices == nullptr ||
      !StreamLayout(s, &layout)) {
    return D3DERR_INVALIDCALL;
  }
  D3DINDEXBUFFER_DESC desc{};
  j.indices->GetDesc(&desc);
  const UINT index_bytes = desc.Format == D3DFMT_INDEX32 ? 4 : 2;
  const std::uint64_t first_byte = std::uint64_t{start_index} * index_bytes;
  const GlBufferView indices = ViewOfGlBuffer(j.indices);
  if (first_byte + draw.vertices * index_bytes > indices.bytes->size() || draw.vertices > INT_MAX) {
    return D3DERR_INVALIDCALL;
  }
  // Every vertex the indices name must lie in the stream (min_vertex_index and num_vertices are
  // only hints in Direct3D, so the indices themselves are read).
  std::uint32_t lowest = 0, highest = 0;
  IndexRange(*indices.bytes, first_byte, draw.vertices, index_bytes, &lowest, &highest);
  if (!VertexInStream(j, layout, std::int64_t{base_vertex_index} + lowest) ||
      !VertexInStream(j, layout, std::int64_t{base_vertex_index} + highest) ||
      std::int64_t{base_vertex_index} + highest > INT_MAX) {
    return D3DERR_INVALIDCALL;
  }
  PrepareDraw(s, layout, draw.mode == GL_POINTS);
  glBindBuffer(GL_ELEMENT_ARRAY_BUFFER, indices.name);
  glDrawElementsBaseVertex(draw.mode, static_cast<GLsizei>(draw.vertices),
                           index_bytes == 4 ? GL_UNSIGNED_INT : GL_UNSIGNED_SHORT,
                           BufferOffset(first_byte), base_vertex_index);
  return TakeGlErrors();
}

HRESULT GlDevice::Clear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color, float z,
                        DWORD stencil) {
  State& s = *state_;
  LogClear(*s.journal, count, rects, flags, color, z, stencil);
  if (count != 0 && rects == nullptr) return D3DERR_INVALIDCALL;
  if ((flags & D3DCLEAR_ZBUFFER) != 0 && !(z >= 0.0f && z <= 1.0f)) return D3DERR_INVALIDCALL;
  GLbitfield mask = 0;
  if ((flags & D3DCLEAR_TARGET) != 0) mask |= GL_COLOR_BUFFER_BIT;
  if ((flags & D3DCLEAR_ZBUFFER) != 0) mask |= GL_DEPTH_BUFFER_BIT;
  if ((flags & D3DCLEAR_STENCIL) != 0) mask |= GL_STENCIL_BUFFER_BIT;
  if (mask == 0) return S_OK;
  s.context->MakeCurrent();
  // Clear writes whatever the write masks say; the next draw sets them from the states again.
  glColorMask(GL_TRUE, GL_TRUE, GL_TRUE, GL_TRUE);
  glDepthMask(GL_TRUE);
  glStencilMask(0xFFu);
  const ColourRgba c = ColourFromD3d(color);
  glClearColor(c.r, c.g, c.b, c.a);
  glClearDepth(z);
  glClearStencil(static_cast<GLint>(stencil & 0xFFu));
  // Direct3D clears the viewport, or the given rectangles inside it.
  const D3DVIEWPORT9& v = s.viewport;
  const D3DRECT whole{static_cast<std::int32_t>(v.X), static_cast<std::int32_t>(v.Y),
                      static_cast<std::int32_t>(v.X + v.Width),
                      static_cast<std::int32_t>(v.Y + v.Height)};
  glEnable(GL_SCISSOR_TEST);
  for (DWORD i = 0; i < std::max<DWORD>(count, 1); ++i) {
    GLint box[4];
    if (!ScissorFor(count == 0 ? whole : rects[i], v, Height(), box)) continue;
    glScissor(box[0], box[1], box[2], box[3]);
    glClear(mask);
  }
  glDisable(GL_SCISSOR_TEST);
  return TakeGlErrors();
}
