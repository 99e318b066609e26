#include <gtest/gtest.h>

#include "platform/d3dx_math.h"
#include "platform/memory_device.h"
#include "platform/tests/memory_device_fixture.h"

namespace {

D3DXMATRIX AsD3DX(const D3DMATRIX& m) {
  D3DXMATRIX x;
  static_cast<D3DMATRIX&>(x) = m;
  return x;
}

TEST(MemoryDeviceLifetime, IsReferenceCounted) {
  MemoryDevice* device = MemoryDevice::Create();
  EXPECT_EQ(device->AddRef(), 2u);
  EXPECT_EQ(device->Release(), 1u);
  EXPECT_EQ(device->Release(), 0u);  // deleted: the sanitizers flag any later use
}

struct RenderStateCase {
  D3DRENDERSTATETYPE state;
  DWORD value;
};

class RenderStateDefaults : public MemoryDeviceTest,
                            public testing::WithParamInterface<RenderStateCase> {};

TEST_P(RenderStateDefaults, StartAtDirect3DDefaults) {
  EXPECT_EQ(device_->RenderState(GetParam().state), GetParam().value);
  DWORD got = 0xDEADBEEF;
  ASSERT_EQ(device_->GetRenderState(GetParam().state, &got), S_OK);
  EXPECT_EQ(got, GetParam().value);
}

INSTANTIATE_TEST_SUITE_P(
    Table, RenderStateDefaults,
    testing::Values(
        RenderStateCase{D3DRS_ZENABLE, D3DZB_TRUE}, RenderStateCase{D3DRS_FILLMODE, D3DFILL_SOLID},
        RenderStateCase{D3DRS_SHADEMODE, D3DSHADE_GOURAUD},
        RenderStateCase{D3DRS_ZWRITEENABLE, TRUE}, RenderStateCase{D3DRS_ALPHATESTENABLE, FALSE},
        RenderStateCase{D3DRS_LASTPIXEL, TRUE}, RenderStateCase{D3DRS_SRCBLEND, D3DBLEND_ONE},
        RenderStateCase{D3DRS_DESTBLEND, D3DBLEND_ZERO},
        RenderStateCase{D3DRS_CULLMODE, D3DCULL_CCW},
        RenderStateCase{D3DRS_ZFUNC, D3DCMP_LESSEQUAL}, RenderStateCase{D3DRS_ALPHAREF, 0},
        RenderStateCase{D3DRS_ALPHAFUNC, D3DCMP_ALWAYS}, RenderStateCase{D3DRS_DITHERENABLE, FALSE},
        RenderStateCase{D3DRS_ALPHABLENDENABLE, FALSE}, RenderStateCase{D3DRS_FOGENABLE, FALSE},
        RenderStateCase{D3DRS_SPECULARENABLE, FALSE}, RenderStateCase{D3DRS_LIGHTING, TRUE},
        RenderStateCase{D3DRS_AMBIENT, 0}, RenderStateCase{D3DRS_COLORVERTEX, TRUE},
        RenderStateCase{D3DRS_NORMALIZENORMALS, FALSE},
        RenderStateCase{D3DRS_POINTSIZE, 0x3F800000u},      // 1.0f
        RenderStateCase{D3DRS_POINTSIZE_MIN, 0x3F800000u},  // 1.0f
        RenderStateCase{D3DRS_POINTSPRITEENABLE, FALSE},
        RenderStateCase{D3DRS_POINTSCALEENABLE, FALSE},
        RenderStateCase{D3DRS_POINTSCALE_A, 0x3F800000u},  // 1.0f
        RenderStateCase{D3DRS_POINTSCALE_B, 0}, RenderStateCase{D3DRS_POINTSCALE_C, 0},
        RenderStateCase{D3DRS_POINTSIZE_MAX, 0x42800000u},  // 64.0f
        RenderStateCase{D3DRS_COLORWRITEENABLE, 0xF},
        RenderStateCase{D3DRS_BLENDOP, D3DBLENDOP_ADD}));

struct StageCase {
  D3DTEXTURESTAGESTATETYPE type;
  DWORD stage0;
  DWORD later;  // every stage after the first, TEXCOORDINDEX excepted
};

class StageStateDefaults : public MemoryDeviceTest,
                           public testing::WithParamInterface<StageCase> {};

TEST_P(StageStateDefaults, StartAtDirect3DDefaults) {
  EXPECT_EQ(device_->TextureStageState(0, GetParam().type), GetParam().stage0);
  for (DWORD stage = 1; stage < kD3DTextureStageCount; ++stage) {
    DWORD got = 0xDEADBEEF;
    ASSERT_EQ(device_->GetTextureStageState(stage, GetParam().type, &got), S_OK);
    EXPECT_EQ(got, GetParam().later) << "stage " << stage;
  }
}

INSTANTIATE_TEST_SUITE_P(Table, StageStateDefaults,
                         testing::Values(StageCase{D3DTSS_COLOROP, D3DTOP_MODULATE, D3DTOP_DISABLE},
                                         StageCase{D3DTSS_ALPHAOP, D3DTOP_SELECTARG1,
                                                   D3DTOP_DISABLE},
                                         StageCase{D3DTSS_COLORARG1, D3DTA_TEXTURE, D3DTA_TEXTURE},
                                         StageCase{D3DTSS_COLORARG2, D3DTA_CURRENT, D3DTA_CURRENT},
                                         StageCase{D3DTSS_ALPHAARG1, D3DTA_TEXTURE, D3DTA_TEXTURE},
                                         StageCase{D3DTSS_ALPHAARG2, D3DTA_CURRENT, D3DTA_CURRENT},
                                         StageCase{D3DTSS_TEXTURETRANSFORMFLAGS, 0, 0}));

TEST_F(MemoryDeviceTest, TexCoordIndexDefaultsToTheStage) {
  for (DWORD stage = 0; stage < kD3DTextureStageCount; ++stage)
    EXPECT_EQ(device_->TextureStageState(stage, D3DTSS_TEXCOORDINDEX), stage);
}

TEST_F(MemoryDeviceTest, RenderStatesAreSetAndRead) {
  ASSERT_EQ(device_->SetRenderState(D3DRS_SRCBLEND, D3DBLEND_SRCALPHA), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_POINTSIZE, FloatToStateBits(3.5f)), S_OK);
  DWORD got = 0;
  ASSERT_EQ(device_->GetRenderState(D3DRS_SRCBLEND, &got), S_OK);
  EXPECT_EQ(got, DWORD{D3DBLEND_SRCALPHA});
  EXPECT_EQ(StateBitsToFloat(device_->RenderState(D3DRS_POINTSIZE)), 3.5f);
  EXPECT_EQ(device_->RenderState(D3DRS_DESTBLEND), DWORD{D3DBLEND_ZERO});  // untouched
}

TEST_F(MemoryDeviceTest, OutOfRangeStatesAreRefused) {
  const auto beyond = static_cast<D3DRENDERSTATETYPE>(kD3DRenderStateCount);
  EXPECT_EQ(device_->SetRenderState(beyond, 1), D3DERR_INVALIDCALL);
  DWORD got = 77;
  EXPECT_EQ(device_->GetRenderState(beyond, &got), D3DERR_INVALIDCALL);
  EXPECT_EQ(got, 77u);
  EXPECT_EQ(device_->SetTextureStageState(kD3DTextureStageCount, D3DTSS_COLOROP, 1),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->SetTexture(kD3DTextureStageCount, nullptr), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->GetRenderState(D3DRS_ZENABLE, nullptr), D3DERR_INVALIDCALL);
}

TEST_F(MemoryDeviceTest, TextureStageStatesAreSetPerStage) {
  ASSERT_EQ(device_->SetTextureStageState(1, D3DTSS_COLOROP, D3DTOP_ADD), S_OK);
  EXPECT_EQ(device_->TextureStageState(1, D3DTSS_COLOROP), DWORD{D3DTOP_ADD});
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLOROP), DWORD{D3DTOP_MODULATE});
  EXPECT_EQ(device_->TextureStageState(2, D3DTSS_COLOROP), DWORD{D3DTOP_DISABLE});
}

TEST_F(MemoryDeviceTest, TransformsStartAtIdentityAndKeepWhatIsSet) {
  D3DXMATRIX identity, move;
  D3DXMatrixIdentity(&identity);
  D3DXMatrixTranslation(&move, 1, 2, 3);
  D3DMATRIX got{};
  ASSERT_EQ(device_->GetTransform(D3DTS_WORLD, &got), S_OK);
  EXPECT_EQ(AsD3DX(got), identity);

  ASSERT_EQ(device_->SetTransform(D3DTS_VIEW, &move), S_OK);
  ASSERT_EQ(device_->GetTransform(D3DTS_VIEW, &got), S_OK);
  EXPECT_EQ(AsD3DX(got), move);
  const D3DMATRIX projection = device_->Transform(D3DTS_PROJECTION);
  EXPECT_EQ(AsD3DX(projection), identity);
  EXPECT_EQ(device_->SetTransform(static_cast<D3DTRANSFORMSTATETYPE>(1), &move),
            D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->SetTransform(D3DTS_WORLD, nullptr), D3DERR_INVALIDCALL);
}

TEST_F(MemoryDeviceTest, ViewportIsKept) {
  const D3DVIEWPORT9 set{10, 20, 300, 200, 0.25f, 0.75f};
  ASSERT_EQ(device_->SetViewport(&set), S_OK);
  D3DVIEWPORT9 got{};
  ASSERT_EQ(device_->GetViewport(&got), S_OK);
  EXPECT_EQ(got.X, 10u);
  EXPECT_EQ(got.Height, 200u);
  EXPECT_EQ(got.MaxZ, 0.75f);
}

TEST_F(MemoryDeviceTest, BindingsAreKept) {
  IDirect3DVertexBuffer9* vertices = NewVertexBuffer(64);
  IDirect3DIndexBuffer9* indices = NewIndexBuffer(12);
  IDirect3DTexture9* texture = NewTexture(4, 4);
  ASSERT_EQ(device_->SetStreamSource(0, vertices, 0, 16), S_OK);
  ASSERT_EQ(device_->SetIndices(indices), S_OK);
  ASSERT_EQ(device_->SetTexture(3, texture), S_OK);
  ASSERT_EQ(device_->SetFVF(D3DFVF_XYZ | D3DFVF_DIFFUSE), S_OK);
  EXPECT_EQ(device_->BoundStream(), vertices);
  EXPECT_EQ(device_->BoundStreamStride(), 16u);
  EXPECT_EQ(device_->BoundIndices(), indices);
  EXPECT_EQ(device_->BoundTexture(3), texture);
  EXPECT_EQ(device_->BoundTexture(0), nullptr);
  EXPECT_EQ(device_->BoundFvf(), D3DFVF_XYZ | D3DFVF_DIFFUSE);

  // Binding takes no reference; a released object is unbound rather than left dangling.
  EXPECT_EQ(texture->Release(), 0u);
  EXPECT_EQ(device_->BoundTexture(3), nullptr);
  vertices->Release();
  indices->Release();
  EXPECT_EQ(device_->BoundStream(), nullptr);
  EXPECT_EQ(device_->BoundIndices(), nullptr);
}

TEST_F(MemoryDeviceTest, ObjectsOfAnotherDeviceCannotBeBound) {
  MemoryDevice* other = MemoryDevice::Create();
  IDirect3DTexture9* foreign = nullptr;
  ASSERT_EQ(other->CreateTexture(2, 2, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &foreign, nullptr),
            S_OK);
  EXPECT_EQ(device_->SetTexture(0, foreign), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->BoundTexture(0), nullptr);
  EXPECT_EQ(device_->ObjectId(foreign), 0u);
  foreign->Release();
  other->Release();
}

TEST_F(MemoryDeviceTest, DrawsWithinTheBoundBuffers) {
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, 1), D3DERR_INVALIDCALL);  // nothing bound
  IDirect3DVertexBuffer9* vertices = NewVertexBuffer(80);
  ASSERT_EQ(device_->SetStreamSource(0, vertices, 0, 20), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, 4), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 1, 4), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLESTRIP, 0, 2), S_OK);
  EXPECT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), D3DERR_INVALIDCALL);

  IDirect3DIndexBuffer9* indices = NewIndexBuffer(12);  // six 16-bit indices
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 4, 0, 2), D3DERR_INVALIDCALL);
  ASSERT_EQ(device_->SetIndices(indices), S_OK);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 4, 0, 2), S_OK);
  EXPECT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, 4, 3, 2), D3DERR_INVALIDCALL);
  vertices->Release();
  indices->Release();
}

TEST_F(MemoryDeviceTest, ScenesPair) {
  EXPECT_EQ(device_->EndScene(), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->BeginScene(), S_OK);
  EXPECT_EQ(device_->BeginScene(), D3DERR_INVALIDCALL);
  EXPECT_EQ(device_->EndScene(), S_OK);
}

}  // namespace
