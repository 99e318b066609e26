#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "platform/d3d9_interfaces.h"
#include "platform/memory_device.h"
#include "platform/tests/memory_device_fixture.h"

namespace {

using Strings = std::vector<std::string>;

TEST(DeviceCallText, IsNameAndArgumentsInParentheses) {
  EXPECT_EQ((DeviceCall{"SetRenderState", {27, 1}}).ToString(), "SetRenderState(27, 1)");
  EXPECT_EQ((DeviceCall{"BeginScene", {}}).ToString(), "BeginScene()");
}

TEST_F(MemoryDeviceTest, LogsAPointSpritePassInOrder) {
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(
      device_->CreateVertexBuffer(40, D3DUSAGE_DYNAMIC | D3DUSAGE_WRITEONLY,
                                  D3DFVF_XYZ | D3DFVF_DIFFUSE, D3DPOOL_DEFAULT, &buffer, nullptr),
      S_OK);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_DISCARD), S_OK);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  DWORD saved = 0;
  device_->GetRenderState(D3DRS_SRCBLEND, &saved);
  device_->SetRenderState(D3DRS_POINTSIZE, FloatToStateBits(1.0f));
  device_->SetTexture(0, nullptr);
  device_->SetStreamSource(0, buffer, 0, 20);
  device_->SetFVF(D3DFVF_XYZ | D3DFVF_DIFFUSE);
  device_->DrawPrimitive(D3DPT_POINTLIST, 0, 2);
  device_->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, 0xFF000000u, 1.0f, 0);
  device_->GetViewport(nullptr);

  EXPECT_EQ(device_->CallStrings(),
            (Strings{"CreateVertexBuffer(40, 520, 66, 0)", "VertexBuffer.Lock(1, 0, 0, 8192)",
                     "VertexBuffer.Unlock(1)", "GetRenderState(19)",
                     "SetRenderState(154, 1065353216)", "SetTexture(0, 0)",
                     "SetStreamSource(0, 1, 0, 20)", "SetFVF(66)", "DrawPrimitive(1, 0, 2)",
                     "Clear(0, 3, 4278190080, 1065353216, 0)", "GetViewport()"}));
  EXPECT_EQ(device_->Calls()[3], (DeviceCall{"GetRenderState", {D3DRS_SRCBLEND}}));

  device_->ClearCalls();
  EXPECT_TRUE(device_->Calls().empty());
  buffer->Release();
  EXPECT_TRUE(device_->Calls().empty());  // reference counting is not logged
}

TEST_F(MemoryDeviceTest, IdsFollowCreationOrderAcrossKinds) {
  IDirect3DVertexBuffer9* vertices = NewVertexBuffer(16);
  device_->FailNextCreateTexture();
  IDirect3DTexture9* failed = nullptr;
  device_->CreateTexture(2, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &failed, nullptr);
  IDirect3DTexture9* texture = NewTexture(2, 2);
  IDirect3DIndexBuffer9* indices = NewIndexBuffer(6);
  EXPECT_EQ(device_->ObjectId(vertices), 1u);
  EXPECT_EQ(device_->ObjectId(texture), 2u);  // a failed creation takes no id
  EXPECT_EQ(device_->ObjectId(indices), 3u);
  EXPECT_EQ(device_->ObjectId(nullptr), 0u);

  device_->ClearCalls();
  device_->SetTexture(1, texture);
  device_->SetIndices(indices);
  D3DLOCKED_RECT locked{};
  texture->LockRect(0, &locked, nullptr, D3DLOCK_READONLY);
  texture->UnlockRect(0);
  const RECT part{1, 0, 2, 1};
  texture->LockRect(0, &locked, &part, 0);
  void* data = nullptr;
  indices->Lock(2, 4, &data, 0);
  indices->Unlock();
  EXPECT_EQ(device_->CallStrings(),
            (Strings{"SetTexture(1, 2)", "SetIndices(3)", "Texture.LockRect(2, 0, 0, 0, 2, 2, 16)",
                     "Texture.UnlockRect(2, 0)", "Texture.LockRect(2, 0, 1, 0, 2, 1, 0)",
                     "IndexBuffer.Lock(3, 2, 4, 0)", "IndexBuffer.Unlock(3)"}));
  texture->UnlockRect(0);
  vertices->Release();
  texture->Release();
  indices->Release();
}

TEST_F(MemoryDeviceTest, LogsMatricesViewportsAndSignedArgumentsByValue) {
  D3DXMATRIX scale;
  D3DXMatrixScaling(&scale, 2, 2, 2);
  device_->SetTransform(D3DTS_WORLD, &scale);
  const D3DVIEWPORT9 viewport{0, 0, 8, 6, 0.0f, 1.0f};
  device_->SetViewport(&viewport);
  device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, -1, 0, 4, 0, 2);

  const std::vector<DeviceCall>& calls = device_->Calls();
  ASSERT_EQ(calls.size(), 3u);
  ASSERT_EQ(calls[0].Args.size(), 17u);
  EXPECT_EQ(calls[0].Args[0], std::uint64_t{D3DTS_WORLD});
  EXPECT_EQ(calls[0].Args[1], FloatToStateBits(2.0f));   // _11
  EXPECT_EQ(calls[0].Args[16], FloatToStateBits(1.0f));  // _44
  EXPECT_EQ(calls[1].ToString(), "SetViewport(0, 0, 8, 6, 0, 1065353216)");
  EXPECT_EQ(calls[2].Args[1], ~std::uint64_t{0});  // -1 sign-extended
}

}  // namespace
