// Buffers and textures: locks that reach the picture, lifetimes, several devices, and the draws
// the device refuses.
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <tuple>
#include <vector>

#include "platform/gl/tests/gl_test_device.h"

namespace {

// Writes `quad`'s vertices from `first` on through a lock of the buffer, then draws.
void Rewrite(IDirect3DVertexBuffer9* buffer, const std::vector<ColouredVertex>& quad, UINT first,
             DWORD flags) {
  const UINT offset = first * sizeof(ColouredVertex);
  const UINT bytes = UINT((quad.size() - first) * sizeof(ColouredVertex));
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(offset, flags == D3DLOCK_DISCARD ? 0 : bytes, &data, flags), S_OK);
  std::memcpy(data, quad.data() + first, bytes);
  ASSERT_EQ(buffer->Unlock(), S_OK);
}

TEST_F(GlDeviceTest, RelockedVertexDataReachesTheNextDrawOnceTheLastLockIsReleased) {
  IDirect3DVertexBuffer9* buffer = Upload(Quad(-1, -1, 1, 1, 0.5f, kRed), kColouredFvf);
  void* outer = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &outer, 0), S_OK);  // nested: the upload waits for the outer lock
  Rewrite(buffer, Quad(-1, -1, 1, 1, 0.5f, kGreen), 0, D3DLOCK_DISCARD);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  EXPECT_EQ(buffer->Unlock(), D3DERR_INVALIDCALL);
  Read();
  EXPECT_EQ(CountNear(kRed), int(kSize * kSize));
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  Read();
  EXPECT_EQ(CountNear(kGreen), int(kSize * kSize));
  // A partial lock of the second triangle only: the first stays green.
  Rewrite(buffer, Quad(-1, -1, 1, 1, 0.5f, kBlue), 3, D3DLOCK_NOOVERWRITE);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(50, 10), kGreen));  // upper-right triangle
  EXPECT_TRUE(PixelNear(Pixel(10, 50), kBlue));   // lower-left triangle
}

TEST_F(GlDeviceTest, TextureRectLocksHonourThePitchAndX8TexturesDrawOpaque) {
  // Three texels a row: the pitch is padded past 12 bytes. X8: the unused byte is zero.
  IDirect3DTexture9* texture =
      MakeTexture(3, 1, {0x00FF0000, 0x00FF0000, 0x00FF0000}, D3DFMT_X8R8G8B8);
  const RECT middle{1, 0, 2, 1};
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture->LockRect(0, &locked, &middle, 0), S_OK);
  *static_cast<D3DCOLOR*>(locked.pBits) = 0x0000FF00;
  EXPECT_EQ(texture->LockRect(0, &locked, nullptr, 0), D3DERR_INVALIDCALL);  // already locked
  ASSERT_EQ(texture->UnlockRect(0), S_OK);
  SetStates({D3DRS_ALPHABLENDENABLE, TRUE, D3DRS_SRCBLEND, D3DBLEND_SRCALPHA, D3DRS_DESTBLEND,
             D3DBLEND_INVSRCALPHA});
  Draw(TexturedQuad(kWhite), kTexturedFvf);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(5, 32), kRed));
  EXPECT_TRUE(PixelNear(Pixel(32, 32), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(58, 32), kRed));
}

// Two devices draw their own pictures, and buffers may outlive their device.
TEST(GlDeviceLifetimeTest, ObjectsOutliveTheirDeviceAndTwoDevicesDrawTheirOwnPictures) {
  std::string error;
  EXPECT_EQ(GlDevice::Create(0, 16, &error), nullptr);
  EXPECT_NE(error.find("width"), std::string::npos) << error;
  GlDevice* first = GlDevice::Create(4, 4, &error);
  if (first == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  GlDevice* second = GlDevice::Create(6, 2, &error);
  ASSERT_NE(second, nullptr) << error;
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(second->CreateVertexBuffer(64, 0, 0, D3DPOOL_DEFAULT, &buffer, nullptr), S_OK);
  ASSERT_EQ(first->Clear(0, nullptr, D3DCLEAR_TARGET, kRed, 1.0f, 0), S_OK);
  ASSERT_EQ(second->Clear(0, nullptr, D3DCLEAR_TARGET, kBlue, 1.0f, 0), S_OK);
  EXPECT_EQ(second->Release(), 0u);
  std::vector<std::uint32_t> pixels;
  first->ReadPixels(&pixels);
  EXPECT_EQ(pixels, std::vector<std::uint32_t>(16, kRed));
  first->Release();
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_DISCARD), S_OK);
  std::memset(data, 0x7F, 64);
  EXPECT_EQ(buffer->Unlock(), S_OK);  // uploads through the context the buffer keeps alive
  EXPECT_EQ(buffer->Release(), 0u);
}

TEST_F(GlDeviceTest, DrawsOutsideTheStreamOrOfAFormatItCannotHoldAreRefusedWithoutDrawing) {
  // FVF, stride, type, start and count of six 16-byte vertices: past the end, counts that
  // overflow, no primitives, an unknown type, pretransformed vertices, a stride below the FVF's
  // size, no stride.
  constexpr D3DPRIMITIVETYPE kList = D3DPT_TRIANGLELIST;
  const std::tuple<DWORD, UINT, D3DPRIMITIVETYPE, UINT, UINT> cases[] = {
      {kColouredFvf, 16, kList, 1, 2},
      {kColouredFvf, 16, kList, 0, 0xFFFFFFFFu},
      {kColouredFvf, 16, D3DPT_POINTLIST, 0xFFFFFFFFu, 1},
      {kColouredFvf, 16, kList, 0, 0},
      {kColouredFvf, 16, D3DPRIMITIVETYPE(9), 0, 1},
      {0x004 | D3DFVF_DIFFUSE, 16, kList, 0, 1},
      {kTexturedFvf, 16, kList, 0, 1},
      {kColouredFvf, 0, kList, 0, 1}};
  IDirect3DVertexBuffer9* buffer = Upload(Quad(-1, -1, 1, 1, 0.5f, kRed), kColouredFvf);
  for (const auto& [fvf, stride, type, start, count] : cases) {
    ASSERT_EQ(device_->SetStreamSource(0, buffer, 0, stride), S_OK);
    ASSERT_EQ(device_->SetFVF(fvf), S_OK);
    EXPECT_EQ(device_->DrawPrimitive(type, start, count), D3DERR_INVALIDCALL) << count;
  }
  // Indexed draws read their indices: each must name a vertex of the stream.
  ASSERT_EQ(device_->SetStreamSource(0, buffer, 0, 16), S_OK);
  ASSERT_EQ(device_->SetFVF(kColouredFvf), S_OK);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 6, 0, 1), D3DERR_INVALIDCALL);
  MakeIndices(std::vector<std::uint16_t>{0, 1, 6});  // the quad's vertices are 0 to 5
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 6, 0, 1), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, -1, 0, 6, 0, 1), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 6, 1, 1), D3DERR_INVALIDCALL);
  // A released buffer is unbound, and a draw from it refused.
  owned_.erase(owned_.begin());
  EXPECT_EQ(buffer->Release(), 0u);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, 1), D3DERR_INVALIDCALL);
  Read();
  EXPECT_EQ(CountNear(kBlack), int(kSize * kSize));
  // Nor can another device's objects be bound.
  MemoryDevice* other = MemoryDevice::Create();
  IDirect3DVertexBuffer9* foreign = nullptr;
  other->CreateVertexBuffer(64, 0, 0, D3DPOOL_DEFAULT, &foreign, nullptr);
  EXPECT_EQ(device_->SetStreamSource(0, foreign, 0, 16), D3DERR_INVALIDCALL);
  foreign->Release();
  other->Release();
}

}  // namespace
