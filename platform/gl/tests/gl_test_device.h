// Shared pieces of the GlDevice tests: a fixture that makes a small device (or skips when this
// machine cannot make a GL context), the vertex records drawn, and pixel checks.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <utility>
#include <vector>

#include "platform/gl/gl_device.h"

constexpr D3DCOLOR kBlack = 0xFF000000, kRed = 0xFFFF0000, kGreen = 0xFF00FF00;
constexpr D3DCOLOR kBlue = 0xFF0000FF, kWhite = 0xFFFFFFFF;

struct ColouredVertex {  // kColouredFvf
  float x, y, z;
  D3DCOLOR colour;
};
struct TexturedVertex {  // kTexturedFvf
  float x, y, z;
  D3DCOLOR colour;
  float u, v;
};
struct PointVertex {  // kPointFvf
  float x, y, z;
  float size;
  D3DCOLOR colour;
};
constexpr DWORD kColouredFvf = D3DFVF_XYZ | D3DFVF_DIFFUSE;
constexpr DWORD kTexturedFvf = D3DFVF_XYZ | D3DFVF_DIFFUSE | D3DFVF_TEX1;
constexpr DWORD kPointFvf = D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE;

// Passes when every channel is within `tolerance` of the expected one.
::testing::AssertionResult PixelNear(std::uint32_t actual, std::uint32_t expected,
                                     int tolerance = 2);

// A triangle-list quad over x0..x1, y0..y1 in clip space at depth z, clockwise as seen.
std::vector<ColouredVertex> Quad(float x0, float y0, float x1, float y1, float z, D3DCOLOR colour);
// The full-screen quad with u and v running from the top-left corner.
std::vector<TexturedVertex> TexturedQuad(D3DCOLOR colour, float z = 0.5f);

// A kSize x kSize device, lighting off (so vertex colours draw as they are, as the emitter's
// base sets it), cleared to black with depth 1.
class GlDeviceTest : public ::testing::Test {
 public:
  static constexpr UINT kSize = 64;  // pixels a side

 protected:
  void SetUp() override;
  void TearDown() override;

  // Render states, or stage 0's states, from a list of state, value, state, value...
  void SetStates(std::initializer_list<DWORD> states_and_values, bool stage0 = false);
  void SetStage0(std::initializer_list<DWORD> states_and_values) {
    SetStates(states_and_values, true);
  }
  void ClearTo(D3DCOLOR colour, float z = 1.0f);
  // A vertex buffer holding these vertices, bound to stream 0 with their stride and FVF.
  IDirect3DVertexBuffer9* Upload(const void* vertices, UINT bytes, UINT stride, DWORD fvf);
  template <typename Vertex>
  IDirect3DVertexBuffer9* Upload(const std::vector<Vertex>& vertices, DWORD fvf) {
    return Upload(vertices.data(), static_cast<UINT>(vertices.size() * sizeof(Vertex)),
                  sizeof(Vertex), fvf);
  }
  // Uploads the vertices and draws all of them.
  template <typename Vertex>
  void Draw(const std::vector<Vertex>& vertices, DWORD fvf,
            D3DPRIMITIVETYPE type = D3DPT_TRIANGLELIST) {
    Upload(vertices, fvf);
    const auto count = UINT(type == D3DPT_POINTLIST ? vertices.size() : vertices.size() / 3);
    EXPECT_EQ(device_->DrawPrimitive(type, 0, count), S_OK);
  }
  // An index buffer holding these 16- or 32-bit indices, bound.
  template <typename Index>
  IDirect3DIndexBuffer9* MakeIndices(const std::vector<Index>& indices) {
    return MakeIndices(indices.data(), UINT(indices.size() * sizeof(Index)),
                       sizeof(Index) == 2 ? D3DFMT_INDEX16 : D3DFMT_INDEX32);
  }
  IDirect3DIndexBuffer9* MakeIndices(const void* indices, UINT bytes, D3DFORMAT format);
  // A one-level texture filled row by row from `texels` (top row first), bound to stage 0.
  IDirect3DTexture9* MakeTexture(UINT width, UINT height, const std::vector<D3DCOLOR>& texels,
                                 D3DFORMAT format = D3DFMT_A8R8G8B8);
  // The framebuffer read back; pixel (x, y) counts from the top-left corner.
  void Read();
  std::uint32_t Pixel(int x, int y) const;
  // How many pixels of the last Read are within the tolerance of `colour`.
  int CountNear(std::uint32_t colour, int tolerance = 0) const;

  GlDevice* device_ = nullptr;
  std::vector<std::uint32_t> pixels_;
  std::vector<IUnknown*> owned_;  // released in TearDown
};
