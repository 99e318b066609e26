// Shared pieces of the GlDevice tests: a fixture that makes a small device (or skips when this
// machine cannot make a GL context), vertex records of the formats drawn, and pixel checks.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

#include "platform/gl/gl_device.h"

struct ColouredVertex {  // D3DFVF_XYZ | D3DFVF_DIFFUSE
  float x, y, z;
  D3DCOLOR colour;
};
struct TexturedVertex {  // D3DFVF_XYZ | D3DFVF_DIFFUSE | D3DFVF_TEX1
  float x, y, z;
  D3DCOLOR colour;
  float u, v;
};
struct PointVertex {  // D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE
  float x, y, z;
  float size;
  D3DCOLOR colour;
};
constexpr DWORD kColouredFvf = D3DFVF_XYZ | D3DFVF_DIFFUSE;
constexpr DWORD kTexturedFvf = D3DFVF_XYZ | D3DFVF_DIFFUSE | D3DFVF_TEX1;
constexpr DWORD kPointFvf = D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE;

// The colour channels of an A8R8G8B8 pixel.
struct Argb {
  int a, r, g, b;
};
Argb Channels(std::uint32_t pixel);

// Passes when every channel is within `tolerance` of the expected one.
::testing::AssertionResult PixelNear(std::uint32_t actual, std::uint32_t expected,
                                     int tolerance = 2);

class GlDeviceTest : public ::testing::Test {
 public:
  static constexpr UINT kSize = 64;  // pixels a side

 protected:
  void SetUp() override;
  void TearDown() override;

  // A vertex buffer holding these bytes, bound to stream 0 with this stride and FVF.
  IDirect3DVertexBuffer9* Upload(const void* vertices, UINT bytes, UINT stride, DWORD fvf);
  template <typename Vertex>
  IDirect3DVertexBuffer9* Upload(const std::vector<Vertex>& vertices, DWORD fvf) {
    return Upload(vertices.data(), static_cast<UINT>(vertices.size() * sizeof(Vertex)),
                  sizeof(Vertex), fvf);
  }
  // A one-level A8R8G8B8 texture filled row by row from `texels` (top row first), honouring
  // the pitch it is given.
  IDirect3DTexture9* MakeTexture(UINT width, UINT height, const std::vector<D3DCOLOR>& texels);
  // Lighting off, so that vertex colours draw as they are (the emitter's base does the same).
  void Unlit();
  // The framebuffer, read back; pixel (x, y) counts from the top-left corner.
  void Read();
  std::uint32_t Pixel(int x, int y) const;
  // How many pixels of the last Read equal `colour` within the tolerance.
  int CountNear(std::uint32_t colour, int tolerance = 2) const;

  GlDevice* device_ = nullptr;
  std::vector<std::uint32_t> pixels_;
  std::vector<IUnknown*> owned_;  // released in TearDown
};

// A triangle-list quad covering x0..x1, y0..y1 in clip space at depth z, one colour.
std::vector<ColouredVertex> Quad(float x0, float y0, float x1, float y1, float z, D3DCOLOR colour);
