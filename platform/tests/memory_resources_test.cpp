#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <functional>
#include <vector>

#include "platform/d3d9_interfaces.h"
#include "platform/memory_device.h"
#include "platform/tests/memory_device_fixture.h"

namespace {

TEST_F(MemoryDeviceTest, BufferBytesRoundTripThroughLocks) {
  IDirect3DVertexBuffer9* buffer = NewVertexBuffer(64);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, 0), S_OK);
  for (int i = 0; i < 64; ++i) static_cast<BYTE*>(data)[i] = static_cast<BYTE>(i * 3);
  ASSERT_EQ(buffer->Unlock(), S_OK);

  ASSERT_EQ(buffer->Lock(10, 4, &data, D3DLOCK_READONLY), S_OK);
  const BYTE* bytes = static_cast<const BYTE*>(data);
  EXPECT_EQ(bytes[0], 30);
  EXPECT_EQ(bytes[3], 39);
  ASSERT_EQ(buffer->Unlock(), S_OK);

  D3DVERTEXBUFFER_DESC desc{};
  ASSERT_EQ(buffer->GetDesc(&desc), S_OK);
  EXPECT_EQ(desc.Size, 64u);
  EXPECT_EQ(desc.FVF, D3DFVF_XYZ);
  EXPECT_EQ(buffer->Release(), 0u);
}

struct LockRangeCase {
  UINT offset, size;
  bool ok;
};

class BufferLockRange : public MemoryDeviceTest,
                        public testing::WithParamInterface<LockRangeCase> {};

TEST_P(BufferLockRange, RefusesRangesPastTheEnd) {
  IDirect3DIndexBuffer9* buffer = NewIndexBuffer(32);
  void* data = reinterpret_cast<void*>(1);
  const HRESULT hr = buffer->Lock(GetParam().offset, GetParam().size, &data, 0);
  if (GetParam().ok) {
    EXPECT_EQ(hr, S_OK);
    EXPECT_NE(data, nullptr);
    EXPECT_EQ(buffer->Unlock(), S_OK);
  } else {
    EXPECT_EQ(hr, D3DERR_INVALIDCALL);
    EXPECT_EQ(data, nullptr);
    EXPECT_EQ(buffer->Unlock(), D3DERR_INVALIDCALL);  // nothing was locked
  }
  buffer->Release();
}

INSTANTIATE_TEST_SUITE_P(Table, BufferLockRange,
                         testing::Values(LockRangeCase{0, 0, true}, LockRangeCase{0, 32, true},
                                         LockRangeCase{31, 1, true}, LockRangeCase{31, 0, true},
                                         LockRangeCase{32, 0, false}, LockRangeCase{0, 33, false},
                                         LockRangeCase{16, 17, false},
                                         LockRangeCase{1, 0xFFFFFFFFu, false},
                                         LockRangeCase{0xFFFFFFF0u, 0x20, false}));

TEST_F(MemoryDeviceTest, TexturePitchPadsRowsAndIsHonoured) {
  IDirect3DTexture9* texture = NewTexture(3, 2);
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  ASSERT_EQ(locked.Pitch, 16);  // 12 bytes of pixels, padded
  for (int y = 0; y < 2; ++y)
    for (int x = 0; x < 3; ++x) {
      const std::uint32_t pixel = 0xFF000000u | static_cast<std::uint32_t>(y * 16 + x);
      std::memcpy(static_cast<BYTE*>(locked.pBits) + y * locked.Pitch + x * 4, &pixel, 4);
    }
  ASSERT_EQ(texture->UnlockRect(0), S_OK);

  const RECT second_row_middle{1, 1, 2, 2};
  ASSERT_EQ(texture->LockRect(0, &locked, &second_row_middle, D3DLOCK_READONLY), S_OK);
  std::uint32_t pixel = 0;
  std::memcpy(&pixel, locked.pBits, 4);
  EXPECT_EQ(pixel, 0xFF000011u);
  ASSERT_EQ(texture->UnlockRect(0), S_OK);
  texture->Release();
}

struct PitchCase {
  UINT width;
  D3DFORMAT format;
  INT pitch;
};

class TexturePitch : public MemoryDeviceTest, public testing::WithParamInterface<PitchCase> {};

TEST_P(TexturePitch, IsTheRowRoundedUpToSixteenBytes) {
  IDirect3DTexture9* texture = NewTexture(GetParam().width, 1, 1, GetParam().format);
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  EXPECT_EQ(locked.Pitch, GetParam().pitch);
  texture->UnlockRect(0);
  texture->Release();
}

INSTANTIATE_TEST_SUITE_P(
    Table, TexturePitch,
    testing::Values(PitchCase{1, D3DFMT_A8R8G8B8, 16}, PitchCase{4, D3DFMT_A8R8G8B8, 16},
                    PitchCase{5, D3DFMT_X8R8G8B8, 32}, PitchCase{64, D3DFMT_A8R8G8B8, 256},
                    PitchCase{3, D3DFMT_R5G6B5, 16}, PitchCase{17, D3DFMT_A8, 32}));

TEST_F(MemoryDeviceTest, FullMipChainOnRequest) {
  IDirect3DTexture9* texture = NewTexture(8, 4, 0);
  ASSERT_EQ(texture->GetLevelCount(), 4u);
  const UINT sizes[4][2] = {{8, 4}, {4, 2}, {2, 1}, {1, 1}};
  for (UINT level = 0; level < 4; ++level) {
    D3DSURFACE_DESC desc{};
    ASSERT_EQ(texture->GetLevelDesc(level, &desc), S_OK);
    EXPECT_EQ(desc.Width, sizes[level][0]);
    EXPECT_EQ(desc.Height, sizes[level][1]);
    EXPECT_EQ(desc.Format, D3DFMT_A8R8G8B8);
  }
  D3DSURFACE_DESC desc{};
  EXPECT_EQ(texture->GetLevelDesc(4, &desc), D3DERR_INVALIDCALL);
  texture->Release();
}

struct BadTextureCase {
  UINT width, height, levels;
  D3DFORMAT format;
};

class TextureCreationRefused : public MemoryDeviceTest,
                               public testing::WithParamInterface<BadTextureCase> {};

TEST_P(TextureCreationRefused, AnswersInvalidCallAndNull) {
  IDirect3DTexture9* texture = reinterpret_cast<IDirect3DTexture9*>(1);
  EXPECT_EQ(device_->CreateTexture(GetParam().width, GetParam().height, GetParam().levels, 0,
                                   GetParam().format, D3DPOOL_MANAGED, &texture, nullptr),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(texture, nullptr);
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

INSTANTIATE_TEST_SUITE_P(Table, TextureCreationRefused,
                         testing::Values(BadTextureCase{0, 4, 1, D3DFMT_A8R8G8B8},
                                         BadTextureCase{4, 0, 1, D3DFMT_A8R8G8B8},
                                         BadTextureCase{8, 4, 5, D3DFMT_A8R8G8B8},
                                         BadTextureCase{4, 4, 1, D3DFMT_UNKNOWN},
                                         BadTextureCase{4, 4, 1, D3DFMT_INDEX16},
                                         BadTextureCase{100000, 4, 1, D3DFMT_A8R8G8B8}));

TEST_F(MemoryDeviceTest, TextureLocksAreCheckedPerLevel) {
  IDirect3DTexture9* texture = NewTexture(4, 4, 2);
  D3DLOCKED_RECT locked{};
  const RECT outside{2, 2, 5, 3};
  EXPECT_EQ(texture->LockRect(0, &locked, &outside, 0), D3DERR_INVALIDCALL);
  const RECT empty{1, 1, 1, 2};
  EXPECT_EQ(texture->LockRect(0, &locked, &empty, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture->LockRect(2, &locked, nullptr, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture->UnlockRect(0), D3DERR_INVALIDCALL);
  ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  EXPECT_EQ(texture->LockRect(0, &locked, nullptr, 0), D3DERR_INVALIDCALL);  // already locked
  EXPECT_EQ(texture->LockRect(1, &locked, nullptr, 0), S_OK);                // other level
  EXPECT_EQ(texture->UnlockRect(1), S_OK);
  EXPECT_EQ(texture->UnlockRect(0), S_OK);
  texture->Release();
}

TEST_F(MemoryDeviceTest, LiveObjectCountFollowsReleases) {
  IDirect3DVertexBuffer9* vertices = NewVertexBuffer(16);
  IDirect3DIndexBuffer9* indices = NewIndexBuffer(16);
  IDirect3DTexture9* texture = NewTexture(2, 2);
  EXPECT_EQ(device_->LiveObjectCount(), 3);
  EXPECT_EQ(texture->AddRef(), 2u);
  EXPECT_EQ(texture->Release(), 1u);
  EXPECT_EQ(device_->LiveObjectCount(), 3);
  EXPECT_EQ(texture->Release(), 0u);
  EXPECT_EQ(device_->LiveObjectCount(), 2);
  vertices->Release();
  indices->Release();
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

TEST(MemoryDeviceLifetime, ObjectsMayOutliveTheDevice) {
  MemoryDevice* device = MemoryDevice::Create();
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(device->CreateVertexBuffer(8, 0, 0, D3DPOOL_MANAGED, &buffer, nullptr), S_OK);
  EXPECT_EQ(device->Release(), 0u);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, 0), S_OK);
  std::memset(data, 0xAB, 8);
  EXPECT_EQ(buffer->Unlock(), S_OK);
  EXPECT_EQ(buffer->Release(), 0u);
}

// One injected failure: arm it, then make the call of that kind twice.
struct InjectionCase {
  const char* what;
  std::function<void(MemoryDevice&)> arm;
  // Makes the call; answers its result and whether its output was left null.
  std::function<std::pair<HRESULT, bool>(MemoryDevice&)> call;
};

std::pair<HRESULT, bool> CreateVertices(MemoryDevice& d) {
  IDirect3DVertexBuffer9* b = reinterpret_cast<IDirect3DVertexBuffer9*>(1);
  const HRESULT hr = d.CreateVertexBuffer(16, 0, 0, D3DPOOL_MANAGED, &b, nullptr);
  const bool null = b == nullptr;
  if (!null) b->Release();
  return {hr, null};
}

std::pair<HRESULT, bool> CreateIndices(MemoryDevice& d) {
  IDirect3DIndexBuffer9* b = reinterpret_cast<IDirect3DIndexBuffer9*>(1);
  const HRESULT hr = d.CreateIndexBuffer(16, 0, D3DFMT_INDEX16, D3DPOOL_MANAGED, &b, nullptr);
  const bool null = b == nullptr;
  if (!null) b->Release();
  return {hr, null};
}

std::pair<HRESULT, bool> CreateTextureThroughD3DX(MemoryDevice& d) {
  IDirect3DTexture9* t = reinterpret_cast<IDirect3DTexture9*>(1);
  const HRESULT hr = D3DXCreateTexture(&d, 4, 4, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &t);
  const bool null = t == nullptr;
  if (!null) t->Release();
  return {hr, null};
}

template <class Buffer>
std::pair<HRESULT, bool> LockBuffer(Buffer* buffer) {
  void* data = reinterpret_cast<void*>(1);
  const HRESULT hr = buffer->Lock(0, 0, &data, 0);
  if (SUCCEEDED(hr)) buffer->Unlock();
  buffer->Release();
  return {hr, data == nullptr};
}

std::pair<HRESULT, bool> LockVertices(MemoryDevice& d) {
  IDirect3DVertexBuffer9* b = nullptr;
  d.CreateVertexBuffer(16, 0, 0, D3DPOOL_MANAGED, &b, nullptr);
  return LockBuffer(b);
}

std::pair<HRESULT, bool> LockIndices(MemoryDevice& d) {
  IDirect3DIndexBuffer9* b = nullptr;
  d.CreateIndexBuffer(16, 0, D3DFMT_INDEX32, D3DPOOL_MANAGED, &b, nullptr);
  return LockBuffer(b);
}

std::pair<HRESULT, bool> LockTexture(MemoryDevice& d) {
  IDirect3DTexture9* t = nullptr;
  d.CreateTexture(4, 4, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &t, nullptr);
  D3DLOCKED_RECT locked{7, reinterpret_cast<void*>(1)};
  const HRESULT hr = t->LockRect(0, &locked, nullptr, 0);
  if (SUCCEEDED(hr)) t->UnlockRect(0);
  t->Release();
  return {hr, locked.pBits == nullptr};
}

class FailureInjection : public MemoryDeviceTest,
                         public testing::WithParamInterface<InjectionCase> {};

TEST_P(FailureInjection, FailsExactlyOnce) {
  GetParam().arm(*device_);
  const auto [first, first_null] = GetParam().call(*device_);
  EXPECT_EQ(first, D3DERR_INVALIDCALL);
  EXPECT_TRUE(first_null);
  const auto [second, second_null] = GetParam().call(*device_);
  EXPECT_EQ(second, S_OK);
  EXPECT_FALSE(second_null);
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

INSTANTIATE_TEST_SUITE_P(
    Kinds, FailureInjection,
    testing::Values(InjectionCase{"create_vertex_buffer", &MemoryDevice::FailNextCreateVertexBuffer,
                                  CreateVertices},
                    InjectionCase{"create_index_buffer", &MemoryDevice::FailNextCreateIndexBuffer,
                                  CreateIndices},
                    InjectionCase{"create_texture", &MemoryDevice::FailNextCreateTexture,
                                  CreateTextureThroughD3DX},
                    InjectionCase{"vertex_lock", &MemoryDevice::FailNextBufferLock, LockVertices},
                    InjectionCase{"index_lock", &MemoryDevice::FailNextBufferLock, LockIndices},
                    InjectionCase{"texture_lock", &MemoryDevice::FailNextTextureLock, LockTexture}),
    [](const testing::TestParamInfo<InjectionCase>& info) { return std::string(info.param.what); });

TEST_F(MemoryDeviceTest, InjectedFailuresWaitForTheirOwnKind) {
  device_->FailNextTextureLock();
  EXPECT_EQ(LockVertices(*device_).first, S_OK);
  EXPECT_EQ(CreateTextureThroughD3DX(*device_).first, S_OK);
  EXPECT_EQ(LockTexture(*device_).first, D3DERR_INVALIDCALL);
  device_->FailNextBufferLock();
  EXPECT_EQ(LockTexture(*device_).first, S_OK);
  EXPECT_EQ(LockIndices(*device_).first, D3DERR_INVALIDCALL);
  EXPECT_EQ(LockVertices(*device_).first, S_OK);
}

TEST(D3DXCreateTextureHelper, ForwardsToTheDevice) {
  MemoryDevice* device = MemoryDevice::Create();
  IDirect3DTexture9* texture = nullptr;
  ASSERT_EQ(D3DXCreateTexture(device, 8, 2, 1, D3DUSAGE_DYNAMIC, D3DFMT_A8R8G8B8, D3DPOOL_DEFAULT,
                              &texture),
            S_OK);
  ASSERT_NE(texture, nullptr);
  EXPECT_EQ(device->CallStrings(), std::vector<std::string>{"CreateTexture(8, 2, 1, 512, 21, 0)"});
  texture->Release();
  device->Release();

  texture = reinterpret_cast<IDirect3DTexture9*>(1);
  EXPECT_EQ(D3DXCreateTexture(nullptr, 8, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_DEFAULT, &texture),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(texture, nullptr);
}

}  // namespace
