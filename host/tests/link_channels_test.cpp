// The texture link channel and the device channel, on the reference MemoryDevice: what the
// emitter's rendering tests do not reach (references, failures, other levels). Link channels
// are never copied.
#include <cstring>

#include "host/link_channels.h"
#include "host/tests/test_channels.h"

namespace {

using LinkChannels = HostContextTest;

TEST_F(LinkChannels, ChannelsHoldTheirOwnReferencesAndFailWithoutADevice) {
  Tev_DX8_DeviceChannel channel;
  Qen_TextureChannel texture;
  EXPECT_EQ(channel.SetRenderState(D3DRS_LIGHTING, FALSE), D3DERR_INVALIDCALL);
  EXPECT_TRUE(texture.CreateTexture(4, 4) < 0 && texture.SetToStage(0) < 0 && !texture.IsLoaded());
  MemoryDevice* device = MemoryDevice::Create();
  channel.SetDevice(device);
  device->Release();          // the channel's reference is the only one now
  channel.SetDevice(device);  // the same device again must not drop it
  EXPECT_EQ(FindDevice(&context_), device);
  EXPECT_EQ(channel.SetTextureStageState(1, D3DTSS_COLOROP, D3DTOP_ADD), S_OK);
  EXPECT_EQ(device->TextureStageState(1, D3DTSS_COLOROP), static_cast<DWORD>(D3DTOP_ADD));

  ASSERT_EQ(texture.CreateTexture(4, 4), S_OK);
  texture.SetTexture(texture.GetTexture());  // the same texture again must not drop it
  EXPECT_EQ(texture.GetWidth(), 4u);
  texture.ReleaseTexture();
  EXPECT_EQ(device->LiveObjectCount(), 0);
}

using TextureChannel = DeviceTest;

TEST_F(TextureChannel, WorksOnLevelZeroAndKeepsItsTextureWhenCreationFails) {
  Qen_TextureChannel texture;
  ASSERT_EQ(texture.CreateTexture(4, 4), S_OK);
  ASSERT_EQ(texture.CreateTexture(16, 2), S_OK);  // replaces the first, releasing it
  device_->FailNextCreateTexture();
  EXPECT_EQ(texture.CreateTexture(32, 32), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->LiveObjectCount(), 1);
  EXPECT_TRUE(texture.GetWidth() == 16 && texture.GetHeight() == 2);
  EXPECT_EQ(texture.GetLevelDesc(0).Format, D3DFMT_A8R8G8B8);
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture.LockLevel(0, &locked), S_OK);
  ASSERT_GE(locked.Pitch, 16 * 4);
  std::memset(static_cast<std::uint8_t*>(locked.pBits) + locked.Pitch, 0x7F, 16 * 4);
  EXPECT_EQ(texture.UnlockLevel(0), S_OK);
  EXPECT_EQ(texture.GetLevelDesc(1).Width, 0u);
  EXPECT_TRUE(texture.LockLevel(1, &locked) < 0 && texture.LockLevel(0, nullptr) < 0);
  EXPECT_EQ(texture.SetToStage(0), S_OK);
  EXPECT_EQ(device_->BoundTexture(0), texture.GetTexture());
  EXPECT_EQ(Qen_TextureChannel().SetToStage(0), S_OK);  // no texture unbinds
  EXPECT_EQ(device_->BoundTexture(0), nullptr);
}

}  // namespace
