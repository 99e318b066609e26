// Known scenes drawn on GlDevice and read back: colours, windings, depth, blending, texturing,
// lighting, transforms, viewports and Clear.
#include <gtest/gtest.h>

#include <cmath>
#include <vector>

#include "platform/d3dx_math.h"
#include "platform/gl/tests/gl_test_device.h"

namespace {

constexpr D3DCOLOR kBlack = 0xFF000000;
constexpr D3DCOLOR kRed = 0xFFFF0000;
constexpr D3DCOLOR kGreen = 0xFF00FF00;
constexpr D3DCOLOR kBlue = 0xFF0000FF;
constexpr D3DCOLOR kWhite = 0xFFFFFFFF;

class GlDrawTest : public GlDeviceTest {
 protected:
  void ClearTo(D3DCOLOR colour, float z = 1.0f) {
    ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, colour, z, 0), S_OK);
  }
  void DrawList(const std::vector<ColouredVertex>& vertices) {
    Upload(vertices, kColouredFvf);
    ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, UINT(vertices.size() / 3)), S_OK);
  }
};

TEST_F(GlDrawTest, ClearFillsTheTargetWithTheColour) {
  ClearTo(0xFF336699);
  Read();
  EXPECT_EQ(CountNear(0xFF336699, 0), int(kSize * kSize));
}

TEST_F(GlDrawTest, ReadPixelsGivesTheTopRowFirst) {
  Unlit();
  ClearTo(kBlack);
  DrawList(Quad(-1, 0, 1, 1, 0.5f, kRed));  // the upper half of clip space
  Read();
  EXPECT_TRUE(PixelNear(Pixel(10, 5), kRed));
  EXPECT_TRUE(PixelNear(Pixel(10, 31), kRed));
  EXPECT_TRUE(PixelNear(Pixel(10, 32), kBlack));
  EXPECT_TRUE(PixelNear(Pixel(10, 60), kBlack));
}

TEST_F(GlDrawTest, ColouredTriangleCoversItsInteriorOnly) {
  Unlit();
  ClearTo(kBlack);
  // Apex up, clockwise as seen.
  DrawList({{-0.5f, -0.5f, 0.5f, kBlue}, {0.0f, 0.5f, 0.5f, kBlue}, {0.5f, -0.5f, 0.5f, kBlue}});
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 40), kBlue));   // inside, near the base
  EXPECT_TRUE(PixelNear(Pixel(32, 20), kBlue));   // inside, near the apex
  EXPECT_TRUE(PixelNear(Pixel(20, 20), kBlack));  // beside the apex
  EXPECT_TRUE(PixelNear(Pixel(32, 50), kBlack));  // below the base
  // Half of a 32 x 32 box.
  EXPECT_NEAR(CountNear(kBlue), 32 * 32 / 2, 40);
}

TEST_F(GlDrawTest, GouraudShadingBlendsAndFlatShadingTakesTheFirstVertex) {
  Unlit();
  const std::vector<ColouredVertex> triangle = {
      {-1.0f, -1.0f, 0.5f, kRed}, {-1.0f, 1.0f, 0.5f, kGreen}, {1.0f, -1.0f, 0.5f, kBlue}};
  ClearTo(kBlack);
  DrawList(triangle);
  Read();
  // Near the centroid (-1/3, -1/3): about a third of each.
  const Argb mixed = Channels(Pixel(21, 42));
  EXPECT_NEAR(mixed.r, 85, 12);
  EXPECT_NEAR(mixed.g, 85, 12);
  EXPECT_NEAR(mixed.b, 85, 12);

  ASSERT_EQ(device_->SetRenderState(D3DRS_SHADEMODE, D3DSHADE_FLAT), S_OK);
  ClearTo(kBlack);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 1), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(21, 42), kRed));
}

struct WindingCase {
  const char* name;
  DWORD cull_mode;
  bool clockwise;
  bool drawn;
};

class GlWindingTest : public GlDrawTest, public ::testing::WithParamInterface<WindingCase> {};

TEST_P(GlWindingTest, CullModeKeepsOrDropsTheTriangle) {
  const WindingCase& c = GetParam();
  Unlit();
  if (c.cull_mode != 0) {
    ASSERT_EQ(device_->SetRenderState(D3DRS_CULLMODE, c.cull_mode), S_OK);
  }
  ClearTo(kBlack);
  const ColouredVertex left{-0.8f, -0.8f, 0.5f, kGreen};
  const ColouredVertex top{0.0f, 0.8f, 0.5f, kGreen};
  const ColouredVertex right{0.8f, -0.8f, 0.5f, kGreen};
  DrawList(c.clockwise ? std::vector<ColouredVertex>{left, top, right}
                       : std::vector<ColouredVertex>{left, right, top});
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 40), c.drawn ? kGreen : kBlack));
}

INSTANTIATE_TEST_SUITE_P(
    Windings, GlWindingTest,
    ::testing::Values(WindingCase{"DefaultKeepsClockwise", 0, true, true},
                      WindingCase{"DefaultCullsCounterClockwise", 0, false, false},
                      WindingCase{"CullCwDropsClockwise", D3DCULL_CW, true, false},
                      WindingCase{"CullCwKeepsCounterClockwise", D3DCULL_CW, false, true},
                      WindingCase{"CullNoneKeepsClockwise", D3DCULL_NONE, true, true},
                      WindingCase{"CullNoneKeepsCounterClockwise", D3DCULL_NONE, false, true}),
    [](const auto& info) { return std::string(info.param.name); });

struct DepthCase {
  const char* name;
  DWORD z_enable;
  DWORD z_write;
  DWORD z_func;
  D3DCOLOR seen;  // the near red quad is drawn first, the far green one second
};

class GlDepthTest : public GlDrawTest, public ::testing::WithParamInterface<DepthCase> {};

TEST_P(GlDepthTest, NearQuadDrawnFirstHidesOrNotTheFarOne) {
  const DepthCase& c = GetParam();
  Unlit();
  ASSERT_EQ(device_->SetRenderState(D3DRS_ZENABLE, c.z_enable), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ZWRITEENABLE, c.z_write), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ZFUNC, c.z_func), S_OK);
  ClearTo(kBlack);
  std::vector<ColouredVertex> both = Quad(-0.5f, -0.5f, 0.5f, 0.5f, 0.2f, kRed);
  for (const ColouredVertex& v : Quad(-0.5f, -0.5f, 0.5f, 0.5f, 0.8f, kGreen)) both.push_back(v);
  DrawList(both);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), c.seen));
}

INSTANTIATE_TEST_SUITE_P(
    DepthStates, GlDepthTest,
    ::testing::Values(DepthCase{"TestAndWrite", D3DZB_TRUE, TRUE, D3DCMP_LESSEQUAL, kRed},
                      DepthCase{"NoTest", D3DZB_FALSE, TRUE, D3DCMP_LESSEQUAL, kGreen},
                      DepthCase{"NoWrite", D3DZB_TRUE, FALSE, D3DCMP_LESSEQUAL, kGreen},
                      DepthCase{"Greater", D3DZB_TRUE, TRUE, D3DCMP_GREATER, kBlack},
                      DepthCase{"Always", D3DZB_TRUE, TRUE, D3DCMP_ALWAYS, kGreen}),
    [](const auto& info) { return std::string(info.param.name); });

// A full-screen textured quad, u and v from the top-left corner, clockwise as seen.
std::vector<TexturedVertex> TexturedQuad(D3DCOLOR colour, float z = 0.5f) {
  return {{-1, 1, z, colour, 0, 0}, {1, 1, z, colour, 1, 0},  {1, -1, z, colour, 1, 1},
          {-1, 1, z, colour, 0, 0}, {1, -1, z, colour, 1, 1}, {-1, -1, z, colour, 0, 1}};
}

TEST_F(GlDrawTest, TextureRowsAndColumnsLandWhereTheirCoordinatesSay) {
  Unlit();
  ClearTo(kBlack);
  IDirect3DTexture9* texture = MakeTexture(2, 2, {kRed, kGreen, kBlue, kWhite});
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  Upload(TexturedQuad(kWhite), kTexturedFvf);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(10, 10), kRed));
  EXPECT_TRUE(PixelNear(Pixel(54, 10), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(10, 54), kBlue));
  EXPECT_TRUE(PixelNear(Pixel(54, 54), kWhite));
}

TEST_F(GlDrawTest, TexturedQuadBlendsOverAnotherWithModulatedAlpha) {
  Unlit();
  ClearTo(kBlack);
  DrawList(Quad(-1, -1, 1, 1, 0.5f, kGreen));
  // The emitter's fading pass: alpha = vertex alpha x texture alpha, blended over what is there.
  IDirect3DTexture9* texture = MakeTexture(1, 1, {0x80FF0000});
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_SRCBLEND, D3DBLEND_SRCALPHA), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_DESTBLEND, D3DBLEND_INVSRCALPHA), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_ALPHAARG1, D3DTA_DIFFUSE), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_ALPHAARG2, D3DTA_TEXTURE), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_ALPHAOP, D3DTOP_MODULATE), S_OK);
  std::vector<TexturedVertex> quad = TexturedQuad(kWhite, 0.4f);
  for (int i = 3; i < 6; ++i) quad[i].colour = 0x80FFFFFF;  // the lower-left triangle fades more
  Upload(quad, kTexturedFvf);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  Read();
  // a = 128/255: red 128, green 255 (1 - a) = 127, alpha a*a + 1 (1 - a) = 0.75.
  EXPECT_TRUE(PixelNear(Pixel(50, 14), 0xBF807F00));
  // a = (128/255)^2 = 0.252: red 64, green 191, alpha 0.252^2 + 0.748 = 0.81.
  EXPECT_TRUE(PixelNear(Pixel(14, 50), 0xCE40BF00, 3));
}

struct StageCase {
  const char* name;
  DWORD colour_op, colour_arg1, colour_arg2;
  D3DCOLOR expected;  // texture 0xFF00FF00 (green) under a vertex colour 0xFF808080 (grey)
};

class GlStageTest : public GlDrawTest, public ::testing::WithParamInterface<StageCase> {};

TEST_P(GlStageTest, ColourOperationCombinesTextureAndDiffuse) {
  const StageCase& c = GetParam();
  Unlit();
  ClearTo(kBlack);
  ASSERT_EQ(device_->SetTexture(0, MakeTexture(1, 1, {kGreen})), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_COLOROP, c.colour_op), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_COLORARG1, c.colour_arg1), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_COLORARG2, c.colour_arg2), S_OK);
  Upload(TexturedQuad(0xFF808080), kTexturedFvf);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), c.expected));
}

INSTANTIATE_TEST_SUITE_P(
    Stage0, GlStageTest,
    ::testing::Values(
        StageCase{"Modulate", D3DTOP_MODULATE, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF008000},
        StageCase{"SelectTexture", D3DTOP_SELECTARG1, D3DTA_TEXTURE, D3DTA_DIFFUSE, kGreen},
        StageCase{"SelectDiffuse", D3DTOP_SELECTARG2, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF808080},
        StageCase{"SelectCurrent", D3DTOP_SELECTARG1, D3DTA_CURRENT, D3DTA_TEXTURE, 0xFF808080},
        StageCase{"Disable", D3DTOP_DISABLE, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF808080},
        StageCase{"Add", D3DTOP_ADD, D3DTA_TEXTURE, D3DTA_DIFFUSE, 0xFF80FF80}),
    [](const auto& info) { return std::string(info.param.name); });

struct BlendCase {
  const char* name;
  DWORD source, destination, op;
  D3DCOLOR over;      // drawn over 0xFF408020
  D3DCOLOR expected;  // rgb only: the target's alpha is not checked
};

class GlBlendTest : public GlDrawTest, public ::testing::WithParamInterface<BlendCase> {};

TEST_P(GlBlendTest, FactorsAndOperationCombineSourceAndTarget) {
  const BlendCase& c = GetParam();
  Unlit();
  ClearTo(0xFF408020);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_SRCBLEND, c.source), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_DESTBLEND, c.destination), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_BLENDOP, c.op), S_OK);
  DrawList(Quad(-1, -1, 1, 1, 0.5f, c.over));
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32) | 0xFF000000, c.expected | 0xFF000000));
}

INSTANTIATE_TEST_SUITE_P(Blending, GlBlendTest,
                         ::testing::Values(BlendCase{"Additive", D3DBLEND_ONE, D3DBLEND_ONE,
                                                     D3DBLENDOP_ADD, 0xFF204010, 0x60C030},
                                           BlendCase{"Multiply", D3DBLEND_DESTCOLOR, D3DBLEND_ZERO,
                                                     D3DBLENDOP_ADD, 0xFF808080, 0x204010},
                                           BlendCase{"AlphaAdditive", D3DBLEND_SRCALPHA,
                                                     D3DBLEND_ONE, D3DBLENDOP_ADD, 0x80FFFFFF,
                                                     0xC0FFA0},
                                           BlendCase{"ReverseSubtract", D3DBLEND_ONE, D3DBLEND_ONE,
                                                     3 /* REVSUBTRACT */, 0xFF200010, 0x208010}),
                         [](const auto& info) { return std::string(info.param.name); });

TEST_F(GlDrawTest, AlphaTestDropsFragmentsThatFailTheReference) {
  Unlit();
  ClearTo(kBlack);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHATESTENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHAREF, 0x80), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHAFUNC, D3DCMP_GREATER), S_OK);
  std::vector<ColouredVertex> pair = Quad(-1, -1, 0, 1, 0.5f, 0x40FF0000);
  for (const ColouredVertex& v : Quad(0, -1, 1, 1, 0.5f, 0xC000FF00)) pair.push_back(v);
  DrawList(pair);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(16, 32), kBlack));
  EXPECT_TRUE(PixelNear(Pixel(48, 32), 0xC000FF00));
}

TEST_F(GlDrawTest, WithoutATextureTheDiffuseColourPassesThrough) {
  Unlit();
  ClearTo(kBlack);
  Upload(TexturedQuad(0xFF405060), kTexturedFvf);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_TRIANGLELIST, 0, 2), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), 0xFF405060));
}

TEST_F(GlDrawTest, DefaultLightingWithoutLightsDrawsBlackWithTheVertexAlpha) {
  ClearTo(kWhite);  // lighting stays at Direct3D's default, on
  DrawList(Quad(-1, -1, 1, 1, 0.5f, 0x80FF00FF));
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), 0x80000000));
}

TEST_F(GlDrawTest, ColourWriteMaskKeepsTheMaskedChannels) {
  Unlit();
  ClearTo(kBlack);
  ASSERT_EQ(device_->SetRenderState(D3DRS_COLORWRITEENABLE, 1 /* red */), S_OK);
  DrawList(Quad(-1, -1, 1, 1, 0.5f, kWhite));
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), 0xFFFF0000));
}

TEST_F(GlDrawTest, ClearWorksWithColourAndDepthWritesOff) {
  Unlit();
  ClearTo(kBlack);
  ASSERT_EQ(device_->SetRenderState(D3DRS_COLORWRITEENABLE, 0), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ZWRITEENABLE, FALSE), S_OK);
  DrawList(Quad(-1, -1, 1, 1, 0.1f, kRed));  // colour writes are off: no change
  Read();
  EXPECT_EQ(CountNear(kBlack, 0), int(kSize * kSize));
  ClearTo(kBlue, 0.5f);  // with both write masks off since the draw
  Read();
  EXPECT_EQ(CountNear(kBlue, 0), int(kSize * kSize));

  // The depth buffer holds 0.5: only what is nearer passes the default LESSEQUAL test.
  ASSERT_EQ(device_->SetRenderState(D3DRS_COLORWRITEENABLE, 0xF), S_OK);
  std::vector<ColouredVertex> pair = Quad(-1, -1, 0, 1, 0.6f, kRed);
  for (const ColouredVertex& v : Quad(0, -1, 1, 1, 0.4f, kGreen)) pair.push_back(v);
  DrawList(pair);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(16, 32), kBlue));
  EXPECT_TRUE(PixelNear(Pixel(48, 32), kGreen));
}

TEST_F(GlDrawTest, ClearRectanglesAndTheViewportLimitWhatIsCleared) {
  ClearTo(kBlack);
  const D3DRECT top_left{0, 0, 32, 32};
  ASSERT_EQ(device_->Clear(1, &top_left, D3DCLEAR_TARGET, kRed, 1.0f, 0), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(5, 5), kRed));
  EXPECT_TRUE(PixelNear(Pixel(40, 5), kBlack));
  EXPECT_TRUE(PixelNear(Pixel(5, 40), kBlack));
  EXPECT_EQ(CountNear(kRed, 0), 32 * 32);

  const D3DVIEWPORT9 bottom_right{32, 32, 32, 32, 0.0f, 1.0f};
  ASSERT_EQ(device_->SetViewport(&bottom_right), S_OK);
  ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET, kGreen, 1.0f, 0), S_OK);
  Read();
  EXPECT_TRUE(PixelNear(Pixel(50, 50), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(5, 5), kRed));
  EXPECT_EQ(CountNear(kGreen, 0), 32 * 32);

  EXPECT_EQ(device_->Clear(2, nullptr, D3DCLEAR_TARGET, kGreen, 1.0f, 0), D3DERR_INVALIDCALL);
}

TEST_F(GlDrawTest, ViewportPlacesClipSpaceInItsRectangle) {
  Unlit();
  ClearTo(kBlack);
  const D3DVIEWPORT9 top_right{32, 0, 32, 32, 0.0f, 1.0f};
  ASSERT_EQ(device_->SetViewport(&top_right), S_OK);
  DrawList(Quad(-1, -1, 1, 1, 0.5f, kRed));
  Read();
  EXPECT_EQ(CountNear(kRed, 0), 32 * 32);
  EXPECT_TRUE(PixelNear(Pixel(48, 16), kRed));
  EXPECT_TRUE(PixelNear(Pixel(16, 16), kBlack));
  EXPECT_TRUE(PixelNear(Pixel(48, 48), kBlack));
}

TEST_F(GlDrawTest, ViewportOutsideTheTargetIsRefusedAndKept) {
  const D3DVIEWPORT9 too_wide{16, 0, 64, 64, 0.0f, 1.0f};
  EXPECT_EQ(device_->SetViewport(&too_wide), D3DERR_INVALIDCALL);
  const D3DVIEWPORT9 bad_depth{0, 0, 64, 64, 0.0f, std::nanf("")};
  EXPECT_EQ(device_->SetViewport(&bad_depth), D3DERR_INVALIDCALL);
  D3DVIEWPORT9 v{};
  ASSERT_EQ(device_->GetViewport(&v), S_OK);
  EXPECT_EQ(v.X, 0u);
  EXPECT_EQ(v.Width, kSize);
  EXPECT_EQ(v.Height, kSize);
  EXPECT_EQ(v.MaxZ, 1.0f);
}

// Where Direct3D puts a point: row vector times world, view and projection, divided by w.
void ExpectedPixel(const D3DXVECTOR3& p, const D3DXMATRIX& m, float* x, float* y) {
  D3DXVECTOR3 ndc;
  D3DXVec3TransformCoord(&ndc, &p, &m);
  *x = (ndc.x + 1.0f) * 0.5f * GlDeviceTest::kSize;
  *y = (1.0f - ndc.y) * 0.5f * GlDeviceTest::kSize;
}

TEST_F(GlDrawTest, WorldViewAndProjectionPlaceGeometryAsDirect3DDoes) {
  Unlit();
  ASSERT_EQ(device_->SetRenderState(D3DRS_CULLMODE, D3DCULL_NONE), S_OK);
  D3DXMATRIX rotation, translation, world, view, projection;
  D3DXMatrixRotationZ(&rotation, 0.5f);
  D3DXMatrixTranslation(&translation, 0.5f, 0.5f, 1.0f);
  world = rotation * translation;
  const D3DXVECTOR3 eye(5.0f, 0.0f, -3.0f), at(0.0f, 0.0f, 0.0f), up(0.0f, 1.0f, 0.0f);
  D3DXMatrixLookAtLH(&view, &eye, &at, &up);
  D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 3.0f, 1.0f, 1.0f, 100.0f);
  ASSERT_EQ(device_->SetTransform(D3DTS_WORLD, &world), S_OK);
  ASSERT_EQ(device_->SetTransform(D3DTS_VIEW, &view), S_OK);
  ASSERT_EQ(device_->SetTransform(D3DTS_PROJECTION, &projection), S_OK);

  // A small object-space square around (1, 0, 0).
  ClearTo(kBlack);
  DrawList(Quad(0.85f, -0.15f, 1.15f, 0.15f, 0.0f, kRed));
  Read();
  float x = 0, y = 0;
  ExpectedPixel(D3DXVECTOR3(1.0f, 0.0f, 0.0f), world * view * projection, &x, &y);
  EXPECT_TRUE(PixelNear(Pixel(int(x), int(y)), kRed)) << "at " << x << ", " << y;
  EXPECT_LT(CountNear(kRed), 40);
  // The other order would put it elsewhere, so the check above tells the orders apart.
  float wrong_x = 0, wrong_y = 0;
  ExpectedPixel(D3DXVECTOR3(1.0f, 0.0f, 0.0f), view * world * projection, &wrong_x, &wrong_y);
  EXPECT_GT(std::hypot(wrong_x - x, wrong_y - y), 6.0f);
}

struct ClipCase {
  const char* name;
  float z;  // view-space depth of a quad; the near plane is at 1, the far one at 100
  bool drawn;
};

class GlClipTest : public GlDrawTest, public ::testing::WithParamInterface<ClipCase> {};

TEST_P(GlClipTest, DepthIsClippedToDirect3DsZeroToOneRange) {
  const ClipCase& c = GetParam();
  Unlit();
  D3DXMATRIX projection;
  D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 2.0f, 1.0f, 1.0f, 100.0f);
  ASSERT_EQ(device_->SetTransform(D3DTS_PROJECTION, &projection), S_OK);
  ClearTo(kBlack);
  const float half = 0.5f * c.z;  // half the view's width at that depth: always on screen
  DrawList(Quad(-half, -half, half, half, c.z, kRed));
  Read();
  EXPECT_TRUE(PixelNear(Pixel(32, 32), c.drawn ? kRed : kBlack));
}

// In front of the near plane Direct3D's z is below 0: clipped, though GL's default [-1, 1]
// clip range would keep it.
INSTANTIATE_TEST_SUITE_P(Planes, GlClipTest,
                         ::testing::Values(ClipCase{"InFrontOfNear", 0.9f, false},
                                           ClipCase{"JustPastNear", 1.01f, true},
                                           ClipCase{"Middle", 50.0f, true},
                                           ClipCase{"JustBeforeFar", 99.0f, true},
                                           ClipCase{"BeyondFar", 101.0f, false}),
                         [](const auto& info) { return std::string(info.param.name); });

TEST_F(GlDrawTest, IndexedDrawReadsVerticesFromTheBaseVertex) {
  Unlit();
  ClearTo(kBlack);
  // Two unused vertices, then the quad's four corners.
  std::vector<ColouredVertex> vertices = {{0, 0, 0, kRed},       {0, 0, 0, kRed},
                                          {-1, 1, 0.5f, kGreen}, {1, 1, 0.5f, kGreen},
                                          {1, -1, 0.5f, kGreen}, {-1, -1, 0.5f, kGreen}};
  Upload(vertices, kColouredFvf);
  for (D3DFORMAT format : {D3DFMT_INDEX16, D3DFMT_INDEX32}) {
    const UINT size = format == D3DFMT_INDEX16 ? 2 : 4;
    IDirect3DIndexBuffer9* indices = nullptr;
    ASSERT_EQ(device_->CreateIndexBuffer(6 * size, 0, format, D3DPOOL_MANAGED, &indices, nullptr),
              S_OK);
    owned_.push_back(indices);
    void* data = nullptr;
    ASSERT_EQ(indices->Lock(0, 0, &data, 0), S_OK);
    const std::uint32_t order[6] = {0, 1, 2, 0, 2, 3};
    for (int i = 0; i < 6; ++i) {
      if (size == 2) {
        static_cast<std::uint16_t*>(data)[i] = static_cast<std::uint16_t>(order[i]);
      } else {
        static_cast<std::uint32_t*>(data)[i] = order[i];
      }
    }
    ASSERT_EQ(indices->Unlock(), S_OK);
    ASSERT_EQ(device_->SetIndices(indices), S_OK);
    ClearTo(kBlack);
    ASSERT_EQ(device_->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 2, 0, 4, 0, 2), S_OK);
    Read();
    EXPECT_EQ(CountNear(kGreen, 0), int(kSize * kSize)) << "format " << format;
  }
}

}  // namespace
