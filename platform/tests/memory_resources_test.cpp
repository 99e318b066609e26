#include <gtest/gtest.h>

#include <tuple>

#include "platform/memory_resources.h"
#include "platform/tests/memory_device_fixture.h"

namespace {

TEST_F(MemoryDeviceTest, BufferLocksShareTheBytesAndStayInsideTheBuffer) {
  IDirect3DIndexBuffer9* buffer = NewIndexBuffer(32);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, 0), S_OK);
  static_cast<BYTE*>(data)[13] = 39;
  ASSERT_EQ(buffer->Lock(10, 4, &data, D3DLOCK_READONLY), S_OK);  // locks may nest
  EXPECT_EQ(static_cast<const BYTE*>(data)[3], 39);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  // Size 0 locks to the end; offset + size must not wrap around.
  const std::tuple<UINT, UINT, bool> cases[] = {
      {0, 32, true}, {31, 0, true}, {32, 0, false}, {16, 17, false}, {1, 0xFFFFFFFFu, false}};
  for (const auto& [offset, size, ok] : cases) {
    data = &data;
    EXPECT_EQ(buffer->Lock(offset, size, &data, 0), ok ? S_OK : D3DERR_INVALIDCALL) << offset;
    EXPECT_EQ(data != nullptr, ok) << offset;
    EXPECT_EQ(buffer->Unlock(), ok ? S_OK : D3DERR_INVALIDCALL);  // only what was locked
  }
}

TEST_F(MemoryDeviceTest, TextureRowsArePaddedToSixteenBytesAndLocksAreCheckedPerLevel) {
  const std::tuple<UINT, D3DFORMAT, INT> pitches[] = {
      {2, D3DFMT_A8R8G8B8, 16}, {5, D3DFMT_X8R8G8B8, 32}, {17, D3DFMT_A8, 32}};
  for (const auto& [width, format, pitch] : pitches) {
    IDirect3DTexture9* texture = NewTexture(width, 2, 1, format);
    D3DLOCKED_RECT locked{};
    ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
    EXPECT_EQ(locked.Pitch, pitch) << width << " pixels of format " << format;
    const BYTE* whole = static_cast<const BYTE*>(locked.pBits);
    texture->UnlockRect(0);
    const RECT second_row{1, 1, 2, 2};
    ASSERT_EQ(texture->LockRect(0, &locked, &second_row, D3DLOCK_READONLY), S_OK);
    EXPECT_EQ(static_cast<const BYTE*>(locked.pBits), whole + pitch + TextureBytesPerPixel(format));
    texture->UnlockRect(0);
  }
  IDirect3DTexture9* texture = NewTexture(4, 4, 2);
  D3DLOCKED_RECT locked{};
  const RECT outside{2, 2, 5, 3};
  EXPECT_EQ(texture->LockRect(0, &locked, &outside, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture->LockRect(2, &locked, nullptr, 0), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture->UnlockRect(0), D3DERR_INVALIDCALL);
  ASSERT_EQ(texture->LockRect(0, &locked, nullptr, 0), S_OK);
  EXPECT_EQ(texture->LockRect(0, &locked, nullptr, 0), D3DERR_INVALIDCALL);  // already locked
  EXPECT_EQ(texture->LockRect(1, &locked, nullptr, 0), S_OK);                // other level
  EXPECT_EQ(texture->UnlockRect(1), S_OK);
  EXPECT_EQ(texture->UnlockRect(0), S_OK);
}

TEST_F(MemoryDeviceTest, LevelsZeroGivesTheFullMipChainAndBadTexturesAreRefused) {
  IDirect3DTexture9* texture = NewTexture(8, 4, 0);
  EXPECT_EQ(texture->GetLevelCount(), 4u);  // 8 x 4, 4 x 2, 2 x 1, 1 x 1
  D3DSURFACE_DESC desc{};
  ASSERT_EQ(texture->GetLevelDesc(2, &desc), S_OK);
  EXPECT_EQ(std::pair(desc.Width, desc.Height), std::pair(2u, 1u));
  EXPECT_EQ(texture->GetLevelDesc(4, &desc), D3DERR_INVALIDCALL);
  const std::tuple<UINT, UINT, UINT, D3DFORMAT> refused[] = {
      {0, 4, 1, D3DFMT_A8R8G8B8}, {4, 0, 1, D3DFMT_A8R8G8B8}, {8, 4, 5, D3DFMT_A8R8G8B8},
      {4, 4, 1, D3DFMT_UNKNOWN},  {4, 4, 1, D3DFMT_INDEX16},  {100000, 4, 1, D3DFMT_A8R8G8B8}};
  for (const auto& [width, height, levels, format] : refused) {
    texture = reinterpret_cast<IDirect3DTexture9*>(1);
    EXPECT_EQ(device_->CreateTexture(width, height, levels, 0, format, D3DPOOL_MANAGED, &texture,
                                     nullptr),
              D3DERR_INVALIDCALL);
    EXPECT_EQ(texture, nullptr);
  }
}

TEST(MemoryDeviceLifetime, DeviceIsReferenceCountedAndObjectsMayOutliveIt) {
  MemoryDevice* device = MemoryDevice::Create();
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(device->CreateVertexBuffer(8, 0, 0, D3DPOOL_MANAGED, &buffer, nullptr), S_OK);
  EXPECT_EQ(device->AddRef(), 2u);
  EXPECT_EQ(device->Release(), 1u);
  EXPECT_EQ(device->Release(), 0u);  // deleted: the sanitizers flag any later use of it
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, 0), S_OK);
  static_cast<BYTE*>(data)[7] = 0xAB;
  EXPECT_EQ(buffer->Unlock(), S_OK);
  EXPECT_EQ(buffer->Release(), 0u);
}

// Armed together, each injected failure waits for a call of its own kind, fails it with a null
// output, and is then used up.
TEST_F(MemoryDeviceTest, InjectedFailuresFailTheNextCallOfTheirKindOnce) {
  IDirect3DVertexBuffer9* buffer = NewVertexBuffer(16);
  IDirect3DTexture9* texture = NewTexture(4, 4);
  device_->FailNextCreateVertexBuffer();
  device_->FailNextCreateIndexBuffer();
  device_->FailNextCreateTexture();
  device_->FailNextBufferLock();
  device_->FailNextTextureLock();
  for (const HRESULT expected : {D3DERR_INVALIDCALL, S_OK}) {
    D3DLOCKED_RECT locked{7, &locked};
    void* data = &data;
    auto* vertices = reinterpret_cast<IDirect3DVertexBuffer9*>(1);
    auto* indices = reinterpret_cast<IDirect3DIndexBuffer9*>(1);
    auto* created = reinterpret_cast<IDirect3DTexture9*>(1);
    EXPECT_EQ(texture->LockRect(0, &locked, nullptr, 0), expected);
    EXPECT_EQ(buffer->Lock(0, 0, &data, 0), expected);
    EXPECT_EQ(device_->CreateVertexBuffer(16, 0, 0, D3DPOOL_MANAGED, &vertices, nullptr), expected);
    EXPECT_EQ(device_->CreateIndexBuffer(16, 0, D3DFMT_INDEX32, D3DPOOL_MANAGED, &indices, nullptr),
              expected);
    // D3DX forwards to the device.
    EXPECT_EQ(D3DXCreateTexture(device_, 4, 4, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &created),
              expected);
    if (expected == S_OK) {
      owned_.insert(owned_.end(), {vertices, indices, created});
    } else {
      EXPECT_TRUE(!locked.pBits && !data && !vertices && !indices && !created);
    }
  }
  EXPECT_EQ(texture->UnlockRect(0), S_OK);
  EXPECT_EQ(buffer->Unlock(), S_OK);
  IDirect3DTexture9* none = texture;
  EXPECT_EQ(D3DXCreateTexture(nullptr, 1, 1, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &none),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(none, nullptr);
}

}  // namespace
