// Buffers and textures: locks that reach the picture, bounds, lifetimes, several devices, and
// the draws the device refuses.
#include <gtest/gtest.h>

#include <cstring>
#include <string>
#include <vector>

#include "platform/gl/tests/gl_test_device.h"

namespace {

constexpr D3DCOLOR kBlack = 0xFF000000;
constexpr D3DCOLOR kRed = 0xFFFF0000;
constexpr D3DCOLOR kGreen = 0xFF00FF00;
constexpr D3DCOLOR kBlue = 0xFF0000FF;

class GlResourceTest : public GlDeviceTest {
 protected:
  void SetUp() override {
    GlDeviceTest::SetUp();
    if (device_ != nullptr) Unlit();
  }
  void ClearAndDraw(UINT triangles) {
    ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, kBlack, 1.0f, 0),
              S_OK);
    ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, triangles), S_OK);
    Read();
  }
};

TEST_F(GlResourceTest, RelockedVertexDataReachesTheNextDraw) {
  IDirect3DVertexBuffer9* buffer = Upload(Quad(-1, -1, 1, 1, 0.5f, kRed), kColouredFvf);
  ClearAndDraw(2);
  EXPECT_EQ(CountNear(kRed, 0), int(kSize * kSize));

  // Discard: the whole buffer is rewritten green.
  const std::vector<ColouredVertex> green = Quad(-1, -1, 1, 1, 0.5f, kGreen);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_DISCARD), S_OK);
  std::memcpy(data, green.data(), green.size() * sizeof(ColouredVertex));
  ASSERT_EQ(buffer->Unlock(), S_OK);
  ClearAndDraw(2);
  EXPECT_EQ(CountNear(kGreen, 0), int(kSize * kSize));

  // A partial lock of the second triangle only: the first stays green.
  const UINT second = 3 * sizeof(ColouredVertex);
  ASSERT_EQ(buffer->Lock(second, second, &data, D3DLOCK_NOOVERWRITE), S_OK);
  const std::vector<ColouredVertex> blue = Quad(-1, -1, 1, 1, 0.5f, kBlue);
  std::memcpy(data, blue.data() + 3, second);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  ClearAndDraw(2);
  EXPECT_TRUE(PixelNear(Pixel(50, 10), kGreen));  // upper-right triangle
  EXPECT_TRUE(PixelNear(Pixel(10, 50), kBlue));   // lower-left triangle
}

TEST_F(GlResourceTest, NestedLocksUploadWhenTheLastIsReleased) {
  IDirect3DVertexBuffer9* buffer = Upload(Quad(-1, -1, 1, 1, 0.5f, kRed), kColouredFvf);
  void* first = nullptr;
  void* second = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &first, 0), S_OK);
  ASSERT_EQ(buffer->Lock(0, 0, &second, 0), S_OK);
  const std::vector<ColouredVertex> green = Quad(-1, -1, 1, 1, 0.5f, kGreen);
  std::memcpy(second, green.data(), green.size() * sizeof(ColouredVertex));
  ASSERT_EQ(buffer->Unlock(), S_OK);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  EXPECT_EQ(buffer->Unlock(), D3DERR_INVALIDCALL);
  ClearAndDraw(2);
  EXPECT_EQ(CountNear(kGreen, 0), int(kSize * kSize));
}

TEST_F(GlResourceTest, LocksOutsideTheBufferAreRefused) {
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(device_->CreateVertexBuffer(64, 0, kColouredFvf, D3DPOOL_DEFAULT, &buffer, nullptr),
            S_OK);
  owned_.push_back(buffer);
  void* data = reinterpret_cast<void*>(1);
  EXPECT_EQ(buffer->Lock(60, 8, &data, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(data, nullptr);
  EXPECT_EQ(buffer->Lock(65, 0, &data, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(buffer->Lock(0, 0, nullptr, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(buffer->Lock(64, 0, &data, 0), S_OK);  // an empty lock at the end
  EXPECT_EQ(buffer->Unlock(), S_OK);
  D3DVERTEXBUFFER_DESC desc{};
  ASSERT_EQ(buffer->GetDesc(&desc), S_OK);
  EXPECT_EQ(desc.Size, 64u);
  EXPECT_EQ(desc.FVF, kColouredFvf);
  IDirect3DVertexBuffer9* empty = nullptr;
  EXPECT_EQ(device_->CreateVertexBuffer(0, 0, 0, D3DPOOL_DEFAULT, &empty, nullptr),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(empty, nullptr);
}

std::vector<TexturedVertex> FullScreenTextured() {
  const D3DCOLOR w = 0xFFFFFFFF;
  return {{-1, 1, 0.5f, w, 0, 0}, {1, 1, 0.5f, w, 1, 0},  {1, -1, 0.5f, w, 1, 1},
          {-1, 1, 0.5f, w, 0, 0}, {1, -1, 0.5f, w, 1, 1}, {-1, -1, 0.5f, w, 0, 1}};
}

TEST_F(GlResourceTest, TextureSubRectangleLockChangesOnlyThoseTexels) {
  // Three texels wide: the pitch is padded past 12 bytes and must be honoured.
  IDirect3DTexture9* texture = MakeTexture(3, 1, {kRed, kRed, kRed});
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  const RECT middle{1, 0, 2, 1};
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture->LockRect(0, &locked, &middle, 0), S_OK);
  EXPECT_GE(locked.Pitch, 12);
  *static_cast<D3DCOLOR*>(locked.pBits) = kGreen;
  EXPECT_EQ(texture->LockRect(0, &locked, nullptr, 0), D3DERR_INVALIDCALL);  // already locked
  ASSERT_EQ(texture->UnlockRect(0), S_OK);
  EXPECT_EQ(texture->UnlockRect(0), D3DERR_INVALIDCALL);
  Upload(FullScreenTextured(), kTexturedFvf);
  ClearAndDraw(2);
  EXPECT_TRUE(PixelNear(Pixel(5, 32), kRed));
  EXPECT_TRUE(PixelNear(Pixel(32, 32), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(58, 32), kRed));
}

TEST_F(GlResourceTest, TextureRefusesWhatItCannotHold) {
  IDirect3DTexture9* texture = reinterpret_cast<IDirect3DTexture9*>(1);
  EXPECT_EQ(device_->CreateTexture(4, 4, 1, 0, D3DFMT_R5G6B5, D3DPOOL_MANAGED, &texture, nullptr),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(texture, nullptr);
  EXPECT_EQ(device_->CreateTexture(0, 4, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture, nullptr),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->CreateTexture(4, 4, 4, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture, nullptr),
            D3DERR_INVALIDCALL);  // a 4 x 4 chain has three levels
  ASSERT_EQ(device_->CreateTexture(4, 4, 0, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture, nullptr),
            S_OK);
  owned_.push_back(texture);
  EXPECT_EQ(texture->GetLevelCount(), 3u);
  D3DSURFACE_DESC desc{};
  ASSERT_EQ(texture->GetLevelDesc(2, &desc), S_OK);
  EXPECT_EQ(desc.Width, 1u);
  D3DLOCKED_RECT locked{};
  const RECT outside{2, 2, 5, 3};
  EXPECT_EQ(texture->LockRect(0, &locked, &outside, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture->LockRect(3, &locked, nullptr, 0), D3DERR_INVALIDCALL);
}

TEST_F(GlResourceTest, X8R8G8B8TexturesDrawOpaque) {
  IDirect3DTexture9* texture = nullptr;
  ASSERT_EQ(device_->CreateTexture(1, 1, 1, 0, D3DFMT_X8R8G8B8, D3DPOOL_MANAGED, &texture, nullptr),
            S_OK);
  owned_.push_back(texture);
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  *static_cast<D3DCOLOR*>(locked.pBits) = 0x00FF0000;  // the unused byte is zero
  ASSERT_EQ(texture->UnlockRect(0), S_OK);
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_SRCBLEND, D3DBLEND_SRCALPHA), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_DESTBLEND, D3DBLEND_INVSRCALPHA), S_OK);
  Upload(FullScreenTextured(), kTexturedFvf);
  ClearAndDraw(2);
  EXPECT_TRUE(PixelNear(Pixel(32, 32), kRed));
}

TEST_F(GlResourceTest, ReleasedBufferIsUnboundAndItsDrawRefused) {
  IDirect3DVertexBuffer9* buffer = nullptr;
  const std::vector<ColouredVertex> quad = Quad(-1, -1, 1, 1, 0.5f, kRed);
  const UINT bytes = UINT(quad.size() * sizeof(ColouredVertex));
  ASSERT_EQ(device_->CreateVertexBuffer(bytes, 0, kColouredFvf, D3DPOOL_DEFAULT, &buffer, nullptr),
            S_OK);
  ASSERT_EQ(device_->SetStreamSource(0, buffer, 0, sizeof(ColouredVertex)), S_OK);
  ASSERT_EQ(device_->SetFVF(kColouredFvf), S_OK);
  EXPECT_EQ(device_->LiveObjectCount(), 1);
  EXPECT_EQ(buffer->Release(), 0u);
  EXPECT_EQ(device_->LiveObjectCount(), 0);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), D3DERR_INVALIDCALL);
}

TEST(GlDeviceLifetimeTest, BuffersAndTexturesMayOutliveTheirDevice) {
  std::string error;
  GlDevice* device = GlDevice::Create(8, 8, &error);
  if (device == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  IDirect3DVertexBuffer9* buffer = nullptr;
  IDirect3DTexture9* texture = nullptr;
  ASSERT_EQ(device->CreateVertexBuffer(64, 0, 0, D3DPOOL_DEFAULT, &buffer, nullptr), S_OK);
  ASSERT_EQ(device->CreateTexture(2, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture, nullptr),
            S_OK);
  EXPECT_EQ(device->Release(), 0u);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_DISCARD), S_OK);
  std::memset(data, 0x7F, 64);
  EXPECT_EQ(buffer->Unlock(), S_OK);
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  EXPECT_EQ(texture->UnlockRect(0), S_OK);
  EXPECT_EQ(buffer->Release(), 0u);
  EXPECT_EQ(texture->Release(), 0u);
}

TEST(GlDeviceLifetimeTest, TwoDevicesDrawTheirOwnPictures) {
  std::string error;
  GlDevice* first = GlDevice::Create(4, 4, &error);
  if (first == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  GlDevice* second = GlDevice::Create(6, 2, &error);
  ASSERT_NE(second, nullptr) << error;
  ASSERT_EQ(first->Clear(0, nullptr, D3DCLEAR_TARGET, kRed, 1.0f, 0), S_OK);
  ASSERT_EQ(second->Clear(0, nullptr, D3DCLEAR_TARGET, kBlue, 1.0f, 0), S_OK);
  std::vector<std::uint32_t> pixels;
  first->ReadPixels(&pixels);
  EXPECT_EQ(pixels, std::vector<std::uint32_t>(16, kRed));
  second->Release();
  first->ReadPixels(&pixels);  // still alive with the other one gone
  EXPECT_EQ(pixels, std::vector<std::uint32_t>(16, kRed));
  first->Release();
}

TEST(GlDeviceCreateTest, ZeroSizeIsRefusedWithAReason) {
  std::string error;
  EXPECT_EQ(GlDevice::Create(0, 16, &error), nullptr);
  EXPECT_NE(error.find("width"), std::string::npos) << error;
}

struct RefusedDraw {
  const char* name;
  DWORD fvf;
  UINT stride;
  D3DPRIMITIVETYPE type;
  UINT start;
  UINT count;
};

class GlRefusedDrawTest : public GlResourceTest,
                          public ::testing::WithParamInterface<RefusedDraw> {};

TEST_P(GlRefusedDrawTest, DrawIsRefusedWithoutDrawing) {
  const RefusedDraw& c = GetParam();
  Upload(Quad(-1, -1, 1, 1, 0.5f, kRed), kColouredFvf);  // six 16-byte vertices
  ASSERT_EQ(device_->SetFVF(c.fvf), S_OK);
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(device_->CreateVertexBuffer(6 * 16, 0, 0, D3DPOOL_DEFAULT, &buffer, nullptr), S_OK);
  owned_.push_back(buffer);
  ASSERT_EQ(device_->SetStreamSource(0, buffer, 0, c.stride), S_OK);
  ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET, kBlack, 1.0f, 0), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(c.type, c.start, c.count), D3DERR_INVALIDCALL);
  Read();
  EXPECT_EQ(CountNear(kBlack, 0), int(kSize * kSize));
}

INSTANTIATE_TEST_SUITE_P(
    Refusals, GlRefusedDrawTest,
    ::testing::Values(
        RefusedDraw{"PastTheEnd", kColouredFvf, 16, D3DPT_TRIANGLELIST, 1, 2},
        RefusedDraw{"HugeCount", kColouredFvf, 16, D3DPT_TRIANGLELIST, 0, 0xFFFFFFFFu},
        RefusedDraw{"HugeStart", kColouredFvf, 16, D3DPT_POINTLIST, 0xFFFFFFFFu, 1},
        RefusedDraw{"NoPrimitives", kColouredFvf, 16, D3DPT_TRIANGLELIST, 0, 0},
        RefusedDraw{"UnknownType", kColouredFvf, 16, static_cast<D3DPRIMITIVETYPE>(9), 0, 1},
        RefusedDraw{"PretransformedFvf", 0x004 | D3DFVF_DIFFUSE, 16, D3DPT_TRIANGLELIST, 0, 1},
        RefusedDraw{"StrideBelowFvf", kTexturedFvf, 16, D3DPT_TRIANGLELIST, 0, 1},
        RefusedDraw{"ZeroStride", kColouredFvf, 0, D3DPT_TRIANGLELIST, 0, 1}),
    [](const auto& info) { return std::string(info.param.name); });

TEST_F(GlResourceTest, IndexedDrawNamingVerticesOutsideTheStreamIsRefused) {
  Upload(Quad(-1, -1, 1, 1, 0.5f, kRed), kColouredFvf);  // vertices 0 to 5
  IDirect3DIndexBuffer9* indices = nullptr;
  ASSERT_EQ(device_->CreateIndexBuffer(6, 0, D3DFMT_INDEX16, D3DPOOL_MANAGED, &indices, nullptr),
            S_OK);
  owned_.push_back(indices);
  void* data = nullptr;
  ASSERT_EQ(indices->Lock(0, 0, &data, 0), S_OK);
  const std::uint16_t order[3] = {0, 1, 6};
  std::memcpy(data, order, sizeof order);
  ASSERT_EQ(indices->Unlock(), S_OK);
  ASSERT_EQ(device_->SetIndices(indices), S_OK);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 6, 0, 1), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, -1, 0, 6, 0, 1), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 6, 1, 1),
            D3DERR_INVALIDCALL);  // past the index buffer's end
  ASSERT_EQ(device_->SetIndices(nullptr), S_OK);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 6, 0, 1), D3DERR_INVALIDCALL);
}

TEST_F(GlResourceTest, ObjectsOfAnotherDeviceCannotBeBound) {
  MemoryDevice* other = MemoryDevice::Create();
  IDirect3DVertexBuffer9* foreign = nullptr;
  ASSERT_EQ(other->CreateVertexBuffer(64, 0, 0, D3DPOOL_DEFAULT, &foreign, nullptr), S_OK);
  IDirect3DTexture9* foreign_texture = nullptr;
  ASSERT_EQ(
      other->CreateTexture(1, 1, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &foreign_texture, nullptr),
      S_OK);
  EXPECT_EQ(device_->SetStreamSource(0, foreign, 0, 16), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->SetTexture(0, foreign_texture), D3DERR_INVALIDCALL);
  foreign->Release();
  foreign_texture->Release();
  other->Release();
}

}  // namespace
