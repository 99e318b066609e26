// The built-in link channels and the device channel, on the reference MemoryDevice.
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <memory>
#include <string>

#include "host/device_channel.h"
#include "host/link_channels.h"
#include "host/plugin_loader.h"
#include "host/tests/test_channels.h"
#include "host/type_guids.h"
#include "platform/memory_device.h"

namespace {

struct BuiltInCase {
  const char* name;
  GUID type;
  std::function<Qen_Channel*()> create;
};

class BuiltInTypes : public HostContextTest, public ::testing::WithParamInterface<BuiltInCase> {};

TEST_P(BuiltInTypes, ChannelAndTableAnswerTheSameRecord) {
  const BuiltInCase& c = GetParam();
  std::unique_ptr<Qen_Channel> channel(c.create());
  const ChannelType record = channel->GetChannelType();
  EXPECT_STREQ(record.TypeName, c.name);
  EXPECT_EQ(record.TypeGuid, c.type);
  EXPECT_EQ(record.BaseTypeGuid, GUID{});

  int found = 0;
  for (const BuiltInChannelType& built_in : BuiltInChannelTypes()) {
    if (!(built_in.Record.TypeGuid == c.type)) continue;
    ++found;
    EXPECT_EQ(std::memcmp(&built_in.Record, &record, sizeof(record)), 0);
    std::unique_ptr<Qen_Channel> made(built_in.Create());
    EXPECT_EQ(made->GetChannelType().TypeGuid, c.type);
  }
  EXPECT_EQ(found, 1);
}

INSTANTIATE_TEST_SUITE_P(
    Types, BuiltInTypes,
    ::testing::Values(
        BuiltInCase{"Value", kValueGuid, [] { return new Qen_ValueChannel(); }},
        BuiltInCase{"Value Vector", kValueVectorGuid, [] { return new Qen_ValueVectorChannel(); }},
        BuiltInCase{"Matrix", kMatrixGuid, [] { return new Qen_MatrixChannel(); }},
        BuiltInCase{"Texture", kTextureGuid, [] { return new Qen_TextureChannel(); }},
        BuiltInCase{"DX8 Device", kDeviceChannelGuid, [] { return new Tev_DX8_DeviceChannel(); }}));

using LinkChannels = HostContextTest;

TEST_F(LinkChannels, ValueKeepsItsPreviousValue) {
  Qen_ValueChannel value(2.5f);
  EXPECT_EQ(value.GetValue(), 2.5f);
  EXPECT_EQ(value.GetPreviousValue(), 2.5f);
  value.SetValue(-1.0f);
  value.SetValue(7.0f);
  EXPECT_EQ(value.GetValue(), 7.0f);
  EXPECT_EQ(value.GetPreviousValue(), -1.0f);
}

TEST_F(LinkChannels, VectorAndMatrixHoldWhatIsSet) {
  Qen_ValueVectorChannel vector;
  EXPECT_EQ(vector.GetVector(), D3DXVECTOR3(0, 0, 0));
  vector.SetVector({1.0f, -2.0f, 3.5f});
  EXPECT_EQ(vector.GetVector(), D3DXVECTOR3(1.0f, -2.0f, 3.5f));

  Qen_MatrixChannel matrix;
  D3DXMATRIX identity;
  D3DXMatrixIdentity(&identity);
  EXPECT_EQ(matrix.GetMatrix(), identity);
  D3DXMATRIX moved;
  D3DXMatrixTranslation(&moved, 4.0f, 5.0f, 6.0f);
  matrix.SetMatrix(moved);
  EXPECT_EQ(matrix.GetMatrix()._42, 5.0f);
  EXPECT_EQ(Qen_MatrixChannel(moved).GetMatrix(), moved);
}

TEST_F(LinkChannels, LinkChannelsAreAcceptedOnlyOnLinksOfTheirType) {
  TypedChannel owner(kTypeC);
  owner.SetChildCreateType(LinkRecord(kValueGuid, 0, "Value"), 0);
  Qen_ValueChannel value;
  Qen_ValueVectorChannel vector;
  EXPECT_FALSE(owner.SetChild(0, &vector));
  EXPECT_TRUE(owner.SetChild(0, &value));
}

// A MemoryDevice held by the host's device channel.
class DeviceTest : public HostContextTest {
 protected:
  DeviceTest() : device_(MemoryDevice::Create()), device_channel_(device_) {}
  ~DeviceTest() override { device_->Release(); }

  MemoryDevice* device_;
  Tev_DX8_DeviceChannel device_channel_;
};

TEST_F(DeviceTest, DeviceChannelPassesStatesThrough) {
  EXPECT_EQ(device_channel_.GetDevice(), device_);
  EXPECT_EQ(device_channel_.SetRenderState(D3DRS_LIGHTING, FALSE), S_OK);
  EXPECT_EQ(device_channel_.SetTextureStageState(1, D3DTSS_COLOROP, D3DTOP_ADD), S_OK);
  EXPECT_EQ(device_->RenderState(D3DRS_LIGHTING), static_cast<DWORD>(FALSE));
  EXPECT_EQ(device_->TextureStageState(1, D3DTSS_COLOROP), static_cast<DWORD>(D3DTOP_ADD));
}

TEST(DeviceChannel, WithoutDeviceEveryCallFails) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_DeviceChannel channel;
  EXPECT_EQ(channel.GetDevice(), nullptr);
  EXPECT_EQ(channel.SetRenderState(D3DRS_LIGHTING, FALSE), D3DERR_INVALIDCALL);
  EXPECT_EQ(channel.SetTextureStageState(0, D3DTSS_COLOROP, D3DTOP_ADD), D3DERR_INVALIDCALL);
}

TEST(DeviceChannel, HoldsItsOwnReference) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  MemoryDevice* device = MemoryDevice::Create();
  Tev_DX8_DeviceChannel channel(device);
  channel.SetDevice(device);  // the same device again must not drop it
  device->Release();          // the test's reference; the channel's keeps it alive
  EXPECT_EQ(channel.SetRenderState(D3DRS_ZENABLE, D3DZB_FALSE), S_OK);
  EXPECT_EQ(static_cast<MemoryDevice*>(channel.GetDevice())->RenderState(D3DRS_ZENABLE),
            static_cast<DWORD>(D3DZB_FALSE));
}

TEST_F(DeviceTest, TextureCreatedOnTheHostDevice) {
  Qen_TextureChannel texture;
  EXPECT_FALSE(texture.IsLoaded());
  ASSERT_EQ(texture.CreateTexture(16, 8), S_OK);
  EXPECT_TRUE(texture.IsLoaded());
  EXPECT_EQ(texture.GetWidth(), 16u);
  EXPECT_EQ(texture.GetHeight(), 8u);
  EXPECT_EQ(texture.GetLevelCount(), 1u);
  const D3DSURFACE_DESC desc = texture.GetLevelDesc(0);
  EXPECT_EQ(desc.Format, D3DFMT_A8R8G8B8);
  EXPECT_EQ(desc.Width, 16u);
  EXPECT_EQ(device_->LiveObjectCount(), 1);
}

TEST_F(DeviceTest, OtherLevelsAnswerZeroOrFail) {
  Qen_TextureChannel texture;
  ASSERT_EQ(texture.CreateTexture(4, 4), S_OK);
  D3DLOCKED_RECT locked{};
  for (int level : {1, -1, 100}) {
    const D3DSURFACE_DESC desc = texture.GetLevelDesc(level);
    EXPECT_EQ(desc.Width, 0u) << level;
    EXPECT_EQ(desc.Format, D3DFMT_UNKNOWN) << level;
    EXPECT_EQ(texture.LockLevel(level, &locked), D3DERR_INVALIDCALL) << level;
    EXPECT_EQ(texture.UnlockLevel(level), D3DERR_INVALIDCALL) << level;
  }
  EXPECT_EQ(texture.LockLevel(0, nullptr), D3DERR_INVALIDCALL);
}

TEST_F(DeviceTest, LockLevelGivesRowsOfFourBytesPerTexel) {
  Qen_TextureChannel texture;
  ASSERT_EQ(texture.CreateTexture(16, 2), S_OK);
  D3DLOCKED_RECT locked{};
  ASSERT_EQ(texture.LockLevel(0, &locked), S_OK);
  EXPECT_GE(locked.Pitch, 16 * 4);
  ASSERT_NE(locked.pBits, nullptr);
  auto* last_row = static_cast<std::uint8_t*>(locked.pBits) + locked.Pitch;
  std::memset(last_row, 0x7F, 16 * 4);  // the whole level is writable (ASan checks)
  EXPECT_EQ(texture.UnlockLevel(0), S_OK);
}

TEST_F(DeviceTest, SetToStageBindsOnTheHostDevice) {
  Qen_TextureChannel texture;
  ASSERT_EQ(texture.CreateTexture(2, 2), S_OK);
  EXPECT_EQ(texture.SetToStage(0), S_OK);
  EXPECT_EQ(device_->BoundTexture(0), texture.GetTexture());
  EXPECT_EQ(texture.SetToStage(-1), D3DERR_INVALIDCALL);

  Qen_TextureChannel empty;
  EXPECT_EQ(empty.SetToStage(0), S_OK);
  EXPECT_EQ(device_->BoundTexture(0), nullptr);
}

TEST(TextureChannel, WithoutDeviceChannelNothingIsCreatedOrBound) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Qen_TextureChannel texture;
  EXPECT_EQ(texture.CreateTexture(4, 4), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture.SetToStage(0), D3DERR_INVALIDCALL);
  EXPECT_FALSE(texture.IsLoaded());
  EXPECT_EQ(texture.GetWidth(), 0u);
  EXPECT_EQ(texture.GetLevelCount(), 0u);
}

TEST_F(DeviceTest, FailedCreationKeepsTheHeldTexture) {
  Qen_TextureChannel texture;
  ASSERT_EQ(texture.CreateTexture(8, 8), S_OK);
  device_->FailNextCreateTexture();
  EXPECT_EQ(texture.CreateTexture(32, 32), D3DERR_INVALIDCALL);
  EXPECT_EQ(texture.GetWidth(), 8u);
  EXPECT_EQ(device_->LiveObjectCount(), 1);
}

TEST_F(DeviceTest, TextureReferencesAreCountedAcrossCopies) {
  auto original = std::make_unique<Qen_TextureChannel>();
  ASSERT_EQ(original->CreateTexture(4, 4), S_OK);
  IDirect3DTexture9* held = original->GetTexture();

  auto copy = std::make_unique<Qen_TextureChannel>(*original);
  EXPECT_EQ(copy->GetTexture(), held);
  Qen_TextureChannel assigned;
  assigned = *copy;
  assigned = assigned;
  assigned.SetTexture(held);  // the same texture again must not drop it
  original.reset();
  copy.reset();
  EXPECT_EQ(device_->LiveObjectCount(), 1);
  EXPECT_EQ(assigned.GetWidth(), 4u);

  Qen_TextureChannel borrowed(held);
  assigned.ReleaseTexture();
  EXPECT_EQ(device_->LiveObjectCount(), 1);
  borrowed.SetTexture(nullptr);
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

TEST_F(DeviceTest, ReplacingTheTextureReleasesTheOldOne) {
  Qen_TextureChannel texture;
  ASSERT_EQ(texture.CreateTexture(4, 4), S_OK);
  ASSERT_EQ(texture.CreateTexture(8, 8), S_OK);
  EXPECT_EQ(device_->LiveObjectCount(), 1);
  EXPECT_EQ(texture.GetWidth(), 8u);
}

}  // namespace
