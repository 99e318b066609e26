#include "platform/gl/tests/gl_test_device.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <string>

::testing::AssertionResult PixelNear(std::uint32_t actual, std::uint32_t expected, int tolerance) {
  for (int shift = 0; shift < 32; shift += 8) {
    if (std::abs(int((actual >> shift) & 0xFF) - int((expected >> shift) & 0xFF)) > tolerance) {
      char text[64];
      std::snprintf(text, sizeof text, "pixel %08X, expected %08X +-%d", actual, expected,
                    tolerance);
      return ::testing::AssertionFailure() << text;
    }
  }
  return ::testing::AssertionSuccess();
}

std::vector<ColouredVertex> Quad(float x0, float y0, float x1, float y1, float z, D3DCOLOR colour) {
  return {{x0, y1, z, colour}, {x1, y1, z, colour}, {x1, y0, z, colour},
          {x0, y1, z, colour}, {x1, y0, z, colour}, {x0, y0, z, colour}};
}

std::vector<TexturedVertex> TexturedQuad(D3DCOLOR colour, float z) {
  return {{-1, 1, z, colour, 0, 0}, {1, 1, z, colour, 1, 0},  {1, -1, z, colour, 1, 1},
          {-1, 1, z, colour, 0, 0}, {1, -1, z, colour, 1, 1}, {-1, -1, z, colour, 0, 1}};
}

namespace {

// Copies `size` bytes into a vertex or index buffer through a lock of all of it.
template <typename Buffer>
void Fill(Buffer* buffer, const void* bytes, UINT size) {
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, size, &data, 0), S_OK);
  std::memcpy(data, bytes, size);
  EXPECT_EQ(buffer->Unlock(), S_OK);
}

}  // namespace

void GlDeviceTest::SetUp() {
  std::string error;
  device_ = GlDevice::Create(kSize, kSize, &error);
  if (device_ == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  SetStates({D3DRS_LIGHTING, FALSE});
  ClearTo(kBlack);
}

void GlDeviceTest::TearDown() {
  for (IUnknown* object : owned_) object->Release();
  if (device_ == nullptr) return;
  EXPECT_EQ(device_->LiveObjectCount(), 0);
  device_->Release();
}

void GlDeviceTest::SetStates(std::initializer_list<DWORD> states_and_values, bool stage0) {
  const DWORD* v = states_and_values.begin();
  for (std::size_t i = 0; i + 1 < states_and_values.size(); i += 2) {
    EXPECT_EQ(stage0 ? device_->SetTextureStageState(0, D3DTEXTURESTAGESTATETYPE(v[i]), v[i + 1])
                     : device_->SetRenderState(D3DRENDERSTATETYPE(v[i]), v[i + 1]),
              S_OK);
  }
}

void GlDeviceTest::ClearTo(D3DCOLOR colour, float z) {
  EXPECT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, colour, z, 0), S_OK);
}

IDirect3DVertexBuffer9* GlDeviceTest::Upload(const void* vertices, UINT bytes, UINT stride,
                                             DWORD fvf) {
  IDirect3DVertexBuffer9* buffer = nullptr;
  EXPECT_EQ(device_->CreateVertexBuffer(bytes, 0, fvf, D3DPOOL_MANAGED, &buffer, nullptr), S_OK);
  if (buffer == nullptr) return nullptr;
  owned_.push_back(buffer);
  Fill(buffer, vertices, bytes);
  EXPECT_EQ(device_->SetStreamSource(0, buffer, 0, stride), S_OK);
  EXPECT_EQ(device_->SetFVF(fvf), S_OK);
  return buffer;
}

IDirect3DIndexBuffer9* GlDeviceTest::MakeIndices(const void* indices, UINT bytes,
                                                 D3DFORMAT format) {
  IDirect3DIndexBuffer9* buffer = nullptr;
  EXPECT_EQ(device_->CreateIndexBuffer(bytes, 0, format, D3DPOOL_MANAGED, &buffer, nullptr), S_OK);
  if (buffer == nullptr) return nullptr;
  owned_.push_back(buffer);
  Fill(buffer, indices, bytes);
  EXPECT_EQ(device_->SetIndices(buffer), S_OK);
  return buffer;
}

IDirect3DTexture9* GlDeviceTest::MakeTexture(UINT width, UINT height,
                                             const std::vector<D3DCOLOR>& texels,
                                             D3DFORMAT format) {
  IDirect3DTexture9* texture = nullptr;
  EXPECT_EQ(device_->CreateTexture(width, height, 1, 0, format, D3DPOOL_MANAGED, &texture, nullptr),
            S_OK);
  if (texture == nullptr) return nullptr;
  owned_.push_back(texture);
  D3DLOCKED_RECT locked{};
  EXPECT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  for (UINT y = 0; y < height; ++y) {
    std::memcpy(static_cast<BYTE*>(locked.pBits) + std::size_t(y) * locked.Pitch,
                texels.data() + std::size_t(y) * width, width * sizeof(D3DCOLOR));
  }
  EXPECT_EQ(texture->UnlockRect(0), S_OK);
  EXPECT_EQ(device_->SetTexture(0, texture), S_OK);
  return texture;
}

void GlDeviceTest::Read() {
  device_->ReadPixels(&pixels_);
  ASSERT_EQ(pixels_.size(), std::size_t{kSize} * kSize);
}

std::uint32_t GlDeviceTest::Pixel(int x, int y) const {
  return pixels_.at(static_cast<std::size_t>(y) * kSize + static_cast<std::size_t>(x));
}

int GlDeviceTest::CountNear(std::uint32_t colour, int tolerance) const {
  int count = 0;
  for (std::uint32_t p : pixels_) count += PixelNear(p, colour, tolerance) ? 1 : 0;
  return count;
}
