#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "platform/tests/memory_device_fixture.h"

namespace {

TEST_F(MemoryDeviceTest, LogsEveryCallWithItsArgumentsAndObjectIdsInOrder) {
  IDirect3DVertexBuffer9* vertices = nullptr;
  Own(device_->CreateVertexBuffer(40, D3DUSAGE_DYNAMIC | D3DUSAGE_WRITEONLY,
                                  D3DFVF_XYZ | D3DFVF_DIFFUSE, D3DPOOL_DEFAULT, &vertices, nullptr),
      vertices);
  device_->FailNextCreateTexture();
  IDirect3DTexture9* texture = nullptr;
  D3DXCreateTexture(device_, 8, 2, 1, D3DUSAGE_DYNAMIC, D3DFMT_A8R8G8B8, D3DPOOL_DEFAULT, &texture);
  texture = NewTexture(2, 2);
  IDirect3DIndexBuffer9* indices = NewIndexBuffer(6);
  void* data = nullptr;
  vertices->Lock(0, 0, &data, D3DLOCK_DISCARD);
  indices->Unlock();  // refused (nothing locked), and logged all the same
  D3DLOCKED_RECT locked{};
  texture->LockRect(0, &locked, nullptr, D3DLOCK_READONLY);
  texture->UnlockRect(0);
  const RECT part{1, 0, 2, 1};
  texture->LockRect(0, &locked, &part, 0);
  texture->UnlockRect(0);
  device_->SetRenderState(D3DRS_POINTSIZE, FloatToStateBits(1.0f));
  device_->SetTexture(1, texture);
  device_->SetStreamSource(0, vertices, 0, 20);
  device_->SetIndices(indices);
  device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, -1, 0, 4, 0, 2);
  const D3DRECT rect{-1, 2, 3, 4};
  device_->Clear(1, &rect, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, 0xFF000000u, 1.0f, 0);
  const D3DVIEWPORT9 viewport{0, 0, 8, 6, 0.0f, 1.0f};
  device_->SetViewport(&viewport);
  device_->GetViewport(nullptr);
  vertices->AddRef();
  vertices->Release();  // reference counting is not logged
  // Ids count creations in order, whatever the kind; a failed creation takes none.
  EXPECT_EQ(device_->CallStrings(),
            (std::vector<std::string>{
                "CreateVertexBuffer(40, 520, 66, 0)", "CreateTexture(8, 2, 1, 512, 21, 0)",
                "CreateTexture(2, 2, 1, 0, 21, 1)", "CreateIndexBuffer(6, 0, 101, 1)",
                "VertexBuffer.Lock(1, 0, 0, 8192)", "IndexBuffer.Unlock(3)",
                "Texture.LockRect(2, 0, 0, 0, 2, 2, 16)",  // a null rect is the whole level
                "Texture.UnlockRect(2, 0)", "Texture.LockRect(2, 0, 1, 0, 2, 1, 0)",
                "Texture.UnlockRect(2, 0)", "SetRenderState(154, 1065353216)", "SetTexture(1, 2)",
                "SetStreamSource(0, 1, 0, 20)", "SetIndices(3)",
                "DrawIndexedPrimitive(4, 18446744073709551615, 0, 4, 0, 2)",  // -1 sign-extended
                "Clear(1, 18446744073709551615, 2, 3, 4, 3, 4278190080, 1065353216, 0)",
                "SetViewport(0, 0, 8, 6, 0, 1065353216)", "GetViewport()"}));

  device_->ClearCalls();
  D3DXMATRIX move;
  device_->SetTransform(D3DTS_WORLD, D3DXMatrixTranslation(&move, 5, 0, 0));
  const std::vector<std::uint64_t> args = device_->Calls().at(0).Args;
  ASSERT_EQ(args.size(), 17u);  // the state, then the matrix row by row
  EXPECT_EQ(args[0], std::uint64_t{D3DTS_WORLD});
  EXPECT_EQ(args[13], FloatToStateBits(5.0f));  // _41
}

}  // namespace
