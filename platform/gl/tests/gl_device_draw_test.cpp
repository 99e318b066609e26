// Known scenes drawn on GlDevice and read back: orientation, shading, culling, depth, texturing,
// blending, lighting, Clear, viewports, transforms and clipping.
#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <tuple>
#include <vector>

#include "platform/d3dx_math.h"
#include "platform/gl/tests/gl_test_device.h"

namespace {

TEST_F(GlDeviceTest, PicturesReadTopRowFirstAndTexturesFromTheirTopLeftCorner) {
  Draw(Quad(-1, 0, 1, 1, 0.5f, kRed), kColouredFvf);  // the upper half of clip space
  Read();
  EXPECT_EQ(CountNear(kRed), int(kSize * kSize / 2));
  EXPECT_TRUE(PixelNear(Pixel(10, 31), kRed));
  EXPECT_TRUE(PixelNear(Pixel(10, 32), kBlack));
  MakeTexture(2, 2, {kRed, kGreen, kBlue, kWhite});
  Draw(TexturedQuad(kWhite), kTexturedFvf);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(10, 10), kRed));
  EXPECT_TRUE(PixelNear(Pixel(54, 10), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(10, 54), kBlue));
  EXPECT_TRUE(PixelNear(Pixel(54, 54), kWhite));
}

TEST_F(GlDeviceTest, GouraudShadingBlendsAndFlatShadingTakesTheFirstVertex) {
  Draw(
      std::vector<ColouredVertex>{
          {-1.0f, -1.0f, 0.5f, kRed}, {-1.0f, 1.0f, 0.5f, kGreen}, {1.0f, -1.0f, 0.5f, kBlue}},
      kColouredFvf);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(21, 42), 0xFF555555, 12));  // near the centroid: a third of each
  SetStates({D3DRS_SHADEMODE, D3DSHADE_FLAT});
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 1), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(21, 42), kRed));
}

TEST_F(GlDeviceTest, CullModeDropsTheWindingItNamesAsSeenOnScreen) {
  const ColouredVertex left{-0.8f, -0.8f, 0.5f, kGreen}, top{0.0f, 0.8f, 0.5f, kGreen},
      right{0.8f, -0.8f, 0.5f, kGreen};
  // The default, D3DCULL_CCW, keeps clockwise triangles.
  const std::tuple<DWORD, bool, bool> cases[] = {{D3DCULL_CCW, true, true},
                                                 {D3DCULL_CCW, false, false},
                                                 {D3DCULL_CW, true, false},
                                                 {D3DCULL_NONE, false, true}};
  for (const auto& [cull_mode, clockwise, drawn] : cases) {
    SetStates({D3DRS_CULLMODE, cull_mode});
    ClearTo(kBlack);
    Draw(clockwise ? std::vector{left, top, right} : std::vector{left, right, top}, kColouredFvf);
    Read();
    EXPECT_TRUE(PixelNear(Pixel(32, 40), drawn ? kGreen : kBlack)) << cull_mode << clockwise;
  }
}

TEST_F(GlDeviceTest, DepthStatesDecideWhetherTheNearQuadDrawnFirstHidesTheFarOne) {
  std::vector<ColouredVertex> both = Quad(-0.5f, -0.5f, 0.5f, 0.5f, 0.2f, kRed);
  for (const ColouredVertex& v : Quad(-0.5f, -0.5f, 0.5f, 0.5f, 0.8f, kGreen)) both.push_back(v);
  const std::tuple<DWORD, DWORD, DWORD, D3DCOLOR> cases[] = {
      {D3DZB_TRUE, TRUE, D3DCMP_LESSEQUAL, kRed},
      {D3DZB_FALSE, TRUE, D3DCMP_LESSEQUAL, kGreen},
      {D3DZB_TRUE, FALSE, D3DCMP_LESSEQUAL, kGreen},
      {D3DZB_TRUE, TRUE, D3DCMP_GREATER, kBlack}};
  for (const auto& [enable, write, function, seen] : cases) {
    SetStates({D3DRS_ZENABLE, enable, D3DRS_ZWRITEENABLE, write, D3DRS_ZFUNC, function});
    ClearTo(kBlack);
    Draw(both, kColouredFvf);
    Read();
    EXPECT_TRUE(PixelNear(Pixel(32, 32), seen)) << enable << write << function;
  }
}

TEST_F(GlDeviceTest, TextureStageZeroCombinesTextureAndDiffuse) {
  MakeTexture(1, 1, {kGreen});
  // A green texture under a grey vertex colour.
  const std::tuple<DWORD, DWORD, DWORD, D3DCOLOR> cases[] = {
      {D3DTOP_MODULATE, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF008000},
      {D3DTOP_SELECTARG2, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF808080},
      {D3DTOP_ADD, D3DTA_TEXTURE, D3DTA_DIFFUSE | 0x10 /* complement */, 0xFF7FFF7F},
      {D3DTOP_DISABLE, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF808080}};
  for (const auto& [op, arg1, arg2, expected] : cases) {
    SetStage0({D3DTSS_COLOROP, op, D3DTSS_COLORARG1, arg1, D3DTSS_COLORARG2, arg2});
    Draw(TexturedQuad(0xFF808080), kTexturedFvf);
    Read();
    EXPECT_TRUE(PixelNear(Pixel(32, 32), expected)) << op;
  }
}

// The emitter's fading pass: alpha = vertex alpha x texture alpha, blended over what is there.
TEST_F(GlDeviceTest, FadingPassBlendsByVertexAlphaTimesTextureAlpha) {
  Draw(Quad(-1, -1, 1, 1, 0.5f, kGreen), kColouredFvf);
  MakeTexture(1, 1, {0x80FF0000});
  SetStates({D3DRS_ALPHABLENDENABLE, TRUE, D3DRS_SRCBLEND, D3DBLEND_SRCALPHA, D3DRS_DESTBLEND,
             D3DBLEND_INVSRCALPHA});
  SetStage0({D3DTSS_ALPHAARG1, D3DTA_DIFFUSE, D3DTSS_ALPHAARG2, D3DTA_TEXTURE, D3DTSS_ALPHAOP,
             D3DTOP_MODULATE});
  std::vector<TexturedVertex> quad = TexturedQuad(kWhite, 0.4f);
  for (int i = 3; i < 6; ++i) quad[i].colour = 0x80FFFFFF;  // the lower-left triangle fades more
  Draw(quad, kTexturedFvf);
  Read();
  // a = 128/255: red 128, green 255 (1 - a) = 127, alpha a*a + 1 (1 - a) = 0.75.
  EXPECT_TRUE(PixelNear(Pixel(50, 14), 0xBF807F00));
  // a = (128/255)^2 = 0.252: red 64, green 191, alpha 0.252^2 + 0.748 = 0.81.
  EXPECT_TRUE(PixelNear(Pixel(14, 50), 0xCE40BF00, 3));
}

TEST_F(GlDeviceTest, BlendOperationAlphaTestAndColourMaskApply) {
  SetStates({D3DRS_ALPHABLENDENABLE, TRUE, D3DRS_SRCBLEND, D3DBLEND_SRCALPHA, D3DRS_DESTBLEND,
             D3DBLEND_ONE, D3DRS_BLENDOP, 3 /* REVSUBTRACT */, D3DRS_ALPHATESTENABLE, TRUE,
             D3DRS_ALPHAREF, 0x80, D3DRS_ALPHAFUNC, D3DCMP_GREATER, D3DRS_COLORWRITEENABLE,
             2 | 8 /* green, alpha */});
  ClearTo(0xFF408020);
  std::vector<ColouredVertex> pair = Quad(-1, -1, 0, 1, 0.5f, 0x80FFFFFF);
  for (const ColouredVertex& v : Quad(0, -1, 1, 1, 0.5f, 0xC0204080)) pair.push_back(v);
  Draw(pair, kColouredFvf);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(16, 32), 0xFF408020));  // alpha 0x80 is not greater: untouched
  // The target less 0.75 of the source, in green and alpha only.
  EXPECT_TRUE(PixelNear(Pixel(48, 32), 0x6E405020));
}

TEST_F(GlDeviceTest, DefaultLightingWithoutLightsDrawsBlackWithTheVertexAlpha) {
  ClearTo(kWhite);
  SetStates({D3DRS_LIGHTING, TRUE});
  Draw(Quad(-1, -1, 1, 1, 0.5f, 0x80FF00FF), kColouredFvf);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), 0x80000000));
}

// The viewport places clip space in its rectangle, and Clear keeps to it.
TEST_F(GlDeviceTest, ClearIgnoresTheWriteMasksAndKeepsToTheViewportAndRectangles) {
  SetStates({D3DRS_COLORWRITEENABLE, 0, D3DRS_ZWRITEENABLE, FALSE});
  Draw(Quad(-1, -1, 1, 1, 0.1f, kRed), kColouredFvf);  // colour writes are off: no change
  const D3DVIEWPORT9 bottom_right{32, 32, 32, 32, 0.0f, 1.0f};
  ASSERT_EQ(device_->SetViewport(&bottom_right), S_OK);
  for (const D3DVIEWPORT9& outside :  // the target, or depths in [0, 1]
       {D3DVIEWPORT9{16, 0, 64, 64, 0.0f, 1.0f}, D3DVIEWPORT9{0, 0, 64, 64, 0.0f, std::nanf("")}})
    EXPECT_EQ(device_->SetViewport(&outside), D3DERR_INVALIDCALL);
  ClearTo(kBlue, 0.5f);
  const D3DRECT top_left_of_it{0, 0, 48, 48};
  ASSERT_EQ(device_->Clear(1, &top_left_of_it, D3DCLEAR_TARGET, kGreen, 1.0f, 0), S_OK);
  EXPECT_EQ(device_->Clear(2, nullptr, D3DCLEAR_TARGET, kGreen, 1.0f, 0), D3DERR_INVALIDCALL);
  // The depth cleared to 0.5 in spite of the mask: only what is nearer passes LESSEQUAL.
  SetStates({D3DRS_COLORWRITEENABLE, 0xF});
  std::vector<ColouredVertex> pair = Quad(-1, -1, 0, 1, 0.6f, kRed);
  for (const ColouredVertex& v : Quad(0, -1, 1, 1, 0.4f, kWhite)) pair.push_back(v);
  Draw(pair, kColouredFvf);
  Read();
  EXPECT_EQ(CountNear(kBlack), int(kSize * kSize) - 32 * 32);
  EXPECT_EQ(CountNear(kGreen), 16 * 16);
  EXPECT_EQ(CountNear(kBlue), 16 * 16);
  EXPECT_EQ(CountNear(kWhite), 16 * 32);  // the right half of the viewport
}

TEST_F(GlDeviceTest, WorldAppliesBeforeView) {
  D3DXMATRIX world, view;
  ASSERT_EQ(device_->SetTransform(D3DTS_WORLD, D3DXMatrixTranslation(&world, 0.5f, 0, 0)), S_OK);
  ASSERT_EQ(device_->SetTransform(D3DTS_VIEW, D3DXMatrixScaling(&view, 0.5f, 0.5f, 1)), S_OK);
  Draw(Quad(-0.1f, -0.1f, 0.1f, 0.1f, 0.5f, kRed), kColouredFvf);
  Read();
  // Moved to x = 0.5, then halved: clip x 0.25 is pixel 40 (the other order gives 48).
  EXPECT_TRUE(PixelNear(Pixel(40, 32), kRed));
  EXPECT_EQ(CountNear(kRed), 4 * 4);
}

// In front of the near plane Direct3D's z is below 0: clipped, though GL's default [-1, 1] clip
// range would keep it.
TEST_F(GlDeviceTest, DepthIsClippedToDirect3DsZeroToOneRange) {
  D3DXMATRIX projection;
  D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 2.0f, 1.0f, 1.0f, 100.0f);
  ASSERT_EQ(device_->SetTransform(D3DTS_PROJECTION, &projection), S_OK);
  for (const auto& [z, drawn] :
       {std::pair{0.9f, false}, {1.01f, true}, {99.0f, true}, {101.0f, false}}) {
    ClearTo(kBlack);
    Draw(Quad(-z / 2, -z / 2, z / 2, z / 2, z, kRed), kColouredFvf);  // always on screen
    Read();
    EXPECT_TRUE(PixelNear(Pixel(32, 32), drawn ? kRed : kBlack)) << z;
  }
}

TEST_F(GlDeviceTest, IndexedDrawsReadVerticesFromTheBaseVertex) {
  // Two unused vertices, then the quad's four corners.
  Upload(std::vector<ColouredVertex>{{0, 0, 0, kRed},
                                     {0, 0, 0, kRed},
                                     {-1, 1, 0.5f, kGreen},
                                     {1, 1, 0.5f, kGreen},
                                     {1, -1, 0.5f, kGreen},
                                     {-1, -1, 0.5f, kGreen}},
         kColouredFvf);
  MakeIndices(std::vector<std::uint32_t>{0, 1, 2, 0, 2, 3});
  ASSERT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 2, 0, 4, 0, 2), S_OK);
  Read();
  EXPECT_EQ(CountNear(kGreen), int(kSize * kSize));
}

}  // namespace
