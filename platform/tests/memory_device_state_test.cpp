#include <gtest/gtest.h>

#include <cstring>
#include <tuple>
#include <utility>

#include "platform/tests/memory_device_fixture.h"

namespace {

TEST_F(MemoryDeviceTest, StatesStartAtDirect3DDefaults) {
  const std::pair<D3DRENDERSTATETYPE, DWORD> render[] = {
      {D3DRS_ZENABLE, D3DZB_TRUE},
      {D3DRS_ZFUNC, D3DCMP_LESSEQUAL},
      {D3DRS_CULLMODE, D3DCULL_CCW},
      {D3DRS_LIGHTING, TRUE},
      {static_cast<D3DRENDERSTATETYPE>(145), 1},  // D3DRS_DIFFUSEMATERIALSOURCE: D3DMCS_COLOR1
      {D3DRS_POINTSIZE, 0x3F800000u},
      {D3DRS_POINTSCALE_A, 0x3F800000u},   // 1.0f
      {D3DRS_POINTSIZE_MAX, 0x42800000u},  // 64.0f
      {D3DRS_COLORWRITEENABLE, 0xF}};
  for (const auto& [state, value] : render) {
    DWORD got = 0xDEADBEEF;
    EXPECT_TRUE(device_->GetRenderState(state, &got) == S_OK && got == value) << state;
  }
  // Stage 0 modulates colour and selects texture alpha; the later stages are disabled.
  const std::tuple<D3DTEXTURESTAGESTATETYPE, DWORD, DWORD> stages[] = {
      {D3DTSS_COLOROP, D3DTOP_MODULATE, D3DTOP_DISABLE},
      {D3DTSS_ALPHAOP, D3DTOP_SELECTARG1, D3DTOP_DISABLE},
      {D3DTSS_COLORARG1, D3DTA_TEXTURE, D3DTA_TEXTURE},
      {D3DTSS_ALPHAARG2, D3DTA_CURRENT, D3DTA_CURRENT}};
  for (DWORD stage = 0; stage < kD3DTextureStageCount; ++stage) {
    for (const auto& [type, first, later] : stages)
      EXPECT_EQ(device_->TextureStageState(stage, type), stage == 0 ? first : later) << stage;
    EXPECT_EQ(device_->TextureStageState(stage, D3DTSS_TEXCOORDINDEX), stage);
  }
}

TEST_F(MemoryDeviceTest, StatesAreKeptPerStageAndRefusedOutOfRange) {
  ASSERT_EQ(device_->SetTextureStageState(1, D3DTSS_COLOROP, D3DTOP_ADD), S_OK);
  EXPECT_EQ(device_->TextureStageState(1, D3DTSS_COLOROP), DWORD{D3DTOP_ADD});
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLOROP), DWORD{D3DTOP_MODULATE});
  const auto beyond = static_cast<D3DRENDERSTATETYPE>(kD3DRenderStateCount);
  EXPECT_EQ(device_->SetRenderState(beyond, 1), D3DERR_INVALIDCALL);
  DWORD got = 77;
  EXPECT_EQ(device_->GetRenderState(beyond, &got), D3DERR_INVALIDCALL);
  EXPECT_EQ(got, 77u);
  EXPECT_EQ(device_->GetRenderState(D3DRS_ZENABLE, nullptr), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->SetTextureStageState(kD3DTextureStageCount, D3DTSS_COLOROP, 1),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->SetTexture(kD3DTextureStageCount, nullptr), D3DERR_INVALIDCALL);
}

TEST_F(MemoryDeviceTest, TransformsStartAtIdentityAndKeepWhatIsSetInTheirTable) {
  D3DXMATRIX identity, move;
  D3DXMatrixIdentity(&identity);
  ASSERT_EQ(device_->SetTransform(D3DTS_VIEW, D3DXMatrixTranslation(&move, 1, 2, 3)), S_OK);
  const D3DMATRIX view = device_->Transform(D3DTS_VIEW);
  const D3DMATRIX projection = device_->Transform(D3DTS_PROJECTION);
  EXPECT_EQ(std::memcmp(&view, &move, sizeof view), 0);
  EXPECT_EQ(std::memcmp(&projection, &identity, sizeof view), 0);
  EXPECT_EQ(device_->SetTransform(static_cast<D3DTRANSFORMSTATETYPE>(1), &move),
            D3DERR_INVALIDCALL);
}

TEST_F(MemoryDeviceTest, BindingsTakeNoReferenceAndReleasedObjectsAreUnbound) {
  IDirect3DVertexBuffer9* vertices = NewVertexBuffer(64);
  IDirect3DIndexBuffer9* indices = NewIndexBuffer(12);
  IDirect3DTexture9* texture = NewTexture(4, 4);
  ASSERT_EQ(device_->SetStreamSource(0, vertices, 0, 16), S_OK);
  ASSERT_EQ(device_->SetIndices(indices), S_OK);
  ASSERT_EQ(device_->SetTexture(3, texture), S_OK);
  EXPECT_EQ(device_->BoundStream(), vertices);
  EXPECT_EQ(device_->BoundIndices(), indices);
  EXPECT_EQ(device_->BoundTexture(3), texture);
  ReleaseOwned();
  EXPECT_EQ(device_->BoundTexture(3), nullptr);
  EXPECT_EQ(device_->BoundStream(), nullptr);
  EXPECT_EQ(device_->BoundIndices(), nullptr);

  // Nor can another device's objects be bound.
  MemoryDevice* other = MemoryDevice::Create();
  IDirect3DTexture9* foreign = nullptr;
  other->CreateTexture(2, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &foreign, nullptr);
  EXPECT_EQ(device_->SetTexture(0, foreign), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->ObjectId(foreign), 0u);
  foreign->Release();
  other->Release();
}

TEST_F(MemoryDeviceTest, DrawsStayWithinTheBoundBuffersAndScenesPair) {
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, 1), D3DERR_INVALIDCALL);  // nothing bound
  ASSERT_EQ(device_->SetStreamSource(0, NewVertexBuffer(80), 0, 20), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, 4), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 1, 4), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLESTRIP, 0, 2), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 4, 0, 2), D3DERR_INVALIDCALL);
  ASSERT_EQ(device_->SetIndices(NewIndexBuffer(12)), S_OK);  // six 16-bit indices
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 4, 0, 2), S_OK);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 4, 3, 2), D3DERR_INVALIDCALL);

  EXPECT_EQ(device_->EndScene(), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->BeginScene(), S_OK);
  EXPECT_EQ(device_->BeginScene(), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->EndScene(), S_OK);
}

}  // namespace
