// GlDevice keeps MemoryDevice's log and answers: the same calls give the same entries, object ids,
// results and values read back.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstring>
#include <vector>

#include "platform/gl/tests/gl_test_device.h"

namespace {

// Every kind of call, accepted and refused, as a caller makes them; answers what each returned
// and what was read back. Resources are released.
std::vector<std::uint64_t> Script(IDirect3DDevice9* d) {
  std::vector<std::uint64_t> r;
  IDirect3DVertexBuffer9* vb = nullptr;
  IDirect3DIndexBuffer9* ib = nullptr;
  IDirect3DTexture9* texture = nullptr;
  IDirect3DTexture9* refused = nullptr;
  r.push_back(d->CreateVertexBuffer(3 * sizeof(PointVertex), D3DUSAGE_WRITEONLY | D3DUSAGE_DYNAMIC,
                                    kPointFvf, D3DPOOL_DEFAULT, &vb, nullptr));
  r.push_back(d->CreateIndexBuffer(12, 0, D3DFMT_INDEX16, D3DPOOL_MANAGED, &ib, nullptr));
  r.push_back(D3DXCreateTexture(d, 3, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture));
  r.push_back(d->CreateTexture(0, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &refused, nullptr));
  void* data = nullptr;
  r.push_back(vb->Lock(0, 0, &data, D3DLOCK_DISCARD));
  const PointVertex points[3] = {
      {0, 0, 0.5f, 4, 0xFFFF0000}, {0.5f, 0, 0.5f, 4, 0x80FF0000}, {0, 0.5f, 0.5f, 4, 0x4000FF00}};
  std::memcpy(data, points, sizeof points);
  r.push_back(vb->Unlock());
  r.push_back(vb->Lock(100, 0, &data, 0));
  r.push_back(ib->Unlock());  // nothing locked: refused, and logged
  D3DLOCKED_RECT locked{};
  const RECT part{1, 0, 3, 2};
  r.push_back(texture->LockRect(0, &locked, &part, D3DLOCK_READONLY));
  r.push_back(texture->UnlockRect(0));
  r.push_back(texture->UnlockRect(0));

  r.push_back(d->BeginScene());
  r.push_back(d->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, 0xFF102030, 1.0f, 0));
  const D3DRECT rects[2] = {{0, 0, 2, 2}, {-1, 3, 5, 9}};
  r.push_back(d->Clear(2, rects, D3DCLEAR_TARGET, 0xFF405060, 0.25f, 7));
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 0.25f, -0.5f, 1.0f);
  r.push_back(d->SetTransform(D3DTS_WORLD, &world));
  r.push_back(d->SetTransform(D3DTS_VIEW, nullptr));
  D3DMATRIX back{};
  r.push_back(d->GetTransform(D3DTS_WORLD, &back));
  const D3DVIEWPORT9 viewport{0, 0, 8, 8, 0.0f, 1.0f};
  r.push_back(d->SetViewport(&viewport));
  r.push_back(d->GetViewport(nullptr));

  // The emitter's fading point-sprite pass.
  DWORD src = 0;
  r.push_back(d->SetRenderState(D3DRS_POINTSPRITEENABLE, TRUE));
  r.push_back(d->GetRenderState(D3DRS_SRCBLEND, &src));
  r.push_back(src);
  r.push_back(d->SetTexture(0, texture));
  r.push_back(d->SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE));
  r.push_back(d->SetTextureStageState(0, D3DTSS_ALPHAOP, D3DTOP_MODULATE));
  r.push_back(d->SetStreamSource(0, vb, 0, sizeof(PointVertex)));
  r.push_back(d->SetFVF(kPointFvf));
  r.push_back(d->DrawPrimitive(D3DPT_POINTLIST, 0, 3));
  r.push_back(d->DrawPrimitive(D3DPT_POINTLIST, 0, 4));
  r.push_back(d->SetIndices(ib));
  r.push_back(d->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 3, 0, 2));
  r.push_back(d->SetRenderState(D3DRS_SRCBLEND, src));
  r.push_back(d->SetRenderState(static_cast<D3DRENDERSTATETYPE>(kD3DRenderStateCount), 1));
  r.push_back(d->EndScene());
  r.push_back(d->EndScene());
  r.push_back(d->SetStreamSource(0, nullptr, 0, 0));
  for (IUnknown* object : std::initializer_list<IUnknown*>{vb, ib, texture})
    r.push_back(object->Release());
  return r;
}

TEST_F(GlDeviceTest, SameCallsGiveTheSameLogAndAnswersAsMemoryDevice) {
  MemoryDevice* reference = MemoryDevice::Create();
  const std::vector<std::uint64_t> expected = Script(reference);
  device_->ClearCalls();
  EXPECT_EQ(Script(device_), expected);
  EXPECT_EQ(device_->CallStrings(), reference->CallStrings());
  EXPECT_GE(device_->Calls().size(), 30u);  // the script was logged at all
  reference->Release();
}

}  // namespace
