// GlDevice keeps MemoryDevice's log: the same calls give the same entries, ids and defaults.
#include <gtest/gtest.h>

#include <cstring>
#include <functional>
#include <string>
#include <vector>

#include "platform/gl/tests/gl_test_device.h"

namespace {

// Every kind of call, valid and refused, as a caller would make them; resources released.
void Script(IDirect3DDevice9* d) {
  IDirect3DVertexBuffer9* vb = nullptr;
  IDirect3DIndexBuffer9* ib = nullptr;
  IDirect3DTexture9* texture = nullptr;
  d->CreateVertexBuffer(3 * sizeof(PointVertex),
                        D3DUSAGE_WRITEONLY | D3DUSAGE_DYNAMIC | D3DUSAGE_POINTS, kPointFvf,
                        D3DPOOL_DEFAULT, &vb, nullptr);
  d->CreateIndexBuffer(12, 0, D3DFMT_INDEX16, D3DPOOL_MANAGED, &ib, nullptr);
  D3DXCreateTexture(d, 3, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture);
  IDirect3DTexture9* refused = nullptr;
  d->CreateTexture(0, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &refused, nullptr);

  void* data = nullptr;
  vb->Lock(0, 0, &data, D3DLOCK_DISCARD);
  const PointVertex points[3] = {
      {0, 0, 0.5f, 4, 0xFFFF0000}, {0.5f, 0, 0.5f, 4, 0x80FF0000}, {0, 0.5f, 0.5f, 4, 0x4000FF00}};
  std::memcpy(data, points, sizeof points);
  vb->Unlock();
  vb->Lock(100, 0, &data, 0);  // refused, still logged
  ib->Lock(0, 12, &data, 0);
  std::memset(data, 0, 12);
  ib->Unlock();
  D3DLOCKED_RECT locked{};
  texture->LockRect(0, &locked, nullptr, 0);
  texture->UnlockRect(0);
  const RECT part{1, 0, 3, 2};
  texture->LockRect(0, &locked, &part, D3DLOCK_READONLY);
  texture->UnlockRect(0);
  texture->UnlockRect(0);  // refused

  d->BeginScene();
  d->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, 0xFF102030, 1.0f, 0);
  const D3DRECT rects[2] = {{0, 0, 2, 2}, {-1, 3, 5, 9}};
  d->Clear(2, rects, D3DCLEAR_TARGET, 0xFF405060, 0.25f, 7);
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 0.25f, -0.5f, 1.0f);
  d->SetTransform(D3DTS_WORLD, &world);
  d->SetTransform(D3DTS_VIEW, nullptr);  // refused
  D3DMATRIX back{};
  d->GetTransform(D3DTS_WORLD, &back);
  const D3DVIEWPORT9 viewport{0, 0, 8, 8, 0.0f, 1.0f};
  d->SetViewport(&viewport);
  D3DVIEWPORT9 read_viewport{};
  d->GetViewport(&read_viewport);

  // The emitter's fading point-sprite pass.
  DWORD src = 0, dest = 0, blend = 0;
  d->SetRenderState(D3DRS_POINTSPRITEENABLE, TRUE);
  d->SetRenderState(D3DRS_POINTSCALEENABLE, TRUE);
  d->SetRenderState(D3DRS_POINTSIZE_MIN, FloatToStateBits(0.0f));
  d->SetRenderState(D3DRS_POINTSCALE_A, FloatToStateBits(1.0f));
  d->GetRenderState(D3DRS_SRCBLEND, &src);
  d->GetRenderState(D3DRS_DESTBLEND, &dest);
  d->GetRenderState(D3DRS_ALPHABLENDENABLE, &blend);
  d->SetTexture(0, texture);
  d->SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE);
  d->SetTextureStageState(0, D3DTSS_ALPHAOP, D3DTOP_MODULATE);
  DWORD op = 0;
  d->GetTextureStageState(0, D3DTSS_ALPHAOP, &op);
  d->SetStreamSource(0, vb, 0, sizeof(PointVertex));
  d->SetFVF(kPointFvf);
  d->DrawPrimitive(D3DPT_POINTLIST, 0, 3);
  d->DrawPrimitive(D3DPT_POINTLIST, 0, 4);  // refused: past the end
  d->SetIndices(ib);
  d->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 3, 0, 2);
  d->SetRenderState(D3DRS_SRCBLEND, src);
  d->SetRenderState(static_cast<D3DRENDERSTATETYPE>(kD3DRenderStateCount), 1);  // refused
  d->SetTextureStageState(kD3DTextureStageCount, D3DTSS_COLOROP, 1);            // refused
  d->EndScene();
  d->EndScene();  // refused

  d->SetTexture(0, nullptr);
  d->SetStreamSource(0, nullptr, 0, 0);
  vb->Release();
  ib->Release();
  texture->Release();
}

class GlCallLogTest : public GlDeviceTest {};

TEST_F(GlCallLogTest, SameCallsGiveTheSameLogAsMemoryDevice) {
  MemoryDevice* reference = MemoryDevice::Create();
  Script(reference);
  Script(device_);
  EXPECT_EQ(device_->CallStrings(), reference->CallStrings());
  EXPECT_EQ(device_->Calls(), reference->Calls());
  EXPECT_GT(device_->Calls().size(), 40u);
  reference->Release();
}

TEST_F(GlCallLogTest, ObjectIdsCountUpInCreationOrder) {
  IDirect3DVertexBuffer9* vb = nullptr;
  IDirect3DTexture9* texture = nullptr;
  IDirect3DTexture9* refused = nullptr;
  ASSERT_EQ(device_->CreateVertexBuffer(16, 0, 0, D3DPOOL_DEFAULT, &vb, nullptr), S_OK);
  device_->CreateTexture(1, 1, 1, 0, D3DFMT_R5G6B5, D3DPOOL_MANAGED, &refused, nullptr);
  ASSERT_EQ(device_->CreateTexture(1, 1, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture, nullptr),
            S_OK);
  owned_ = {vb, texture};
  EXPECT_EQ(device_->ObjectId(vb), 1u);
  EXPECT_EQ(device_->ObjectId(texture), 2u);  // a refused creation takes no id
  EXPECT_EQ(device_->ObjectId(nullptr), 0u);
  device_->ClearCalls();
  device_->SetTexture(0, texture);
  EXPECT_EQ(device_->CallStrings(), std::vector<std::string>{"SetTexture(0, 2)"});
}

TEST_F(GlCallLogTest, StatesStartAtTheReferenceDefaults) {
  MemoryDevice* reference = MemoryDevice::Create();
  for (std::uint32_t s = 0; s < kD3DRenderStateCount; ++s) {
    DWORD gl_value = 1234, reference_value = 5678;
    const auto state = static_cast<D3DRENDERSTATETYPE>(s);
    ASSERT_EQ(device_->GetRenderState(state, &gl_value), S_OK);
    ASSERT_EQ(reference->GetRenderState(state, &reference_value), S_OK);
    EXPECT_EQ(gl_value, reference_value) << "render state " << s;
  }
  for (DWORD stage = 0; stage < kD3DTextureStageCount; ++stage) {
    for (std::uint32_t t = 0; t < kD3DTextureStageStateCount; ++t) {
      DWORD gl_value = 1234, reference_value = 5678;
      const auto type = static_cast<D3DTEXTURESTAGESTATETYPE>(t);
      ASSERT_EQ(device_->GetTextureStageState(stage, type, &gl_value), S_OK);
      ASSERT_EQ(reference->GetTextureStageState(stage, type, &reference_value), S_OK);
      EXPECT_EQ(gl_value, reference_value) << "stage " << stage << " state " << t;
    }
  }
  // A few of Direct3D's defaults the drawing depends on, spelled out.
  DWORD v = 0;
  device_->GetRenderState(D3DRS_CULLMODE, &v);
  EXPECT_EQ(v, DWORD{D3DCULL_CCW});
  device_->GetRenderState(D3DRS_LIGHTING, &v);
  EXPECT_EQ(v, DWORD{TRUE});
  device_->GetRenderState(D3DRS_POINTSIZE_MAX, &v);
  EXPECT_EQ(StateBitsToFloat(v), 64.0f);
  reference->Release();
}

TEST_F(GlCallLogTest, UnsupportedStatesAreKeptAndAnsweredBack) {
  const auto fog_colour = static_cast<D3DRENDERSTATETYPE>(34);
  ASSERT_EQ(device_->SetRenderState(fog_colour, 0xFF123456), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_FOGENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(3, D3DTSS_COLOROP, D3DTOP_ADD), S_OK);
  DWORD v = 0;
  ASSERT_EQ(device_->GetRenderState(fog_colour, &v), S_OK);
  EXPECT_EQ(v, 0xFF123456u);
  ASSERT_EQ(device_->GetTextureStageState(3, D3DTSS_COLOROP, &v), S_OK);
  EXPECT_EQ(v, DWORD{D3DTOP_ADD});
  D3DXMATRIX texture_matrix;
  D3DXMatrixScaling(&texture_matrix, 2.0f, 3.0f, 4.0f);
  ASSERT_EQ(device_->SetTransform(D3DTS_TEXTURE0, &texture_matrix), S_OK);
  D3DMATRIX back{};
  ASSERT_EQ(device_->GetTransform(D3DTS_TEXTURE0, &back), S_OK);
  EXPECT_EQ(std::memcmp(&back, &texture_matrix, sizeof back), 0);
  EXPECT_EQ(device_->GetTransform(static_cast<D3DTRANSFORMSTATETYPE>(1), &back),
            D3DERR_INVALIDCALL);
}

}  // namespace
