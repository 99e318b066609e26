// Point lists: per-vertex and state sizes, Direct3D's distance scaling, clamping, and point
// sprite texture coordinates.
#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <string>
#include <vector>

#include "platform/d3dx_math.h"
#include "platform/gl/tests/gl_test_device.h"

namespace {

constexpr D3DCOLOR kBlack = 0xFF000000;
constexpr D3DCOLOR kRed = 0xFFFF0000;
constexpr D3DCOLOR kGreen = 0xFF00FF00;
constexpr D3DCOLOR kBlue = 0xFF0000FF;
constexpr D3DCOLOR kWhite = 0xFFFFFFFF;

class GlPointTest : public GlDeviceTest {
 protected:
  void SetUp() override {
    GlDeviceTest::SetUp();
    if (device_ == nullptr) return;
    Unlit();
    SetFloat(D3DRS_POINTSIZE_MIN, 0.0f);
    ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, kBlack, 1.0f, 0),
              S_OK);
  }
  void SetFloat(D3DRENDERSTATETYPE state, float value) {
    ASSERT_EQ(device_->SetRenderState(state, FloatToStateBits(value)), S_OK);
  }
  void DrawPoints(const std::vector<PointVertex>& points) {
    Upload(points, kPointFvf);
    ASSERT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, UINT(points.size())), S_OK);
  }
  // Width and height, in pixels, of the box around every pixel that is not black.
  void LitBox(int* width, int* height) {
    int left = kSize, right = -1, top = kSize, bottom = -1;
    for (int y = 0; y < int(kSize); ++y)
      for (int x = 0; x < int(kSize); ++x)
        if (!PixelNear(Pixel(x, y), kBlack, 0)) {
          left = std::min(left, x), right = std::max(right, x);
          top = std::min(top, y), bottom = std::max(bottom, y);
        }
    *width = right < left ? 0 : right - left + 1;
    *height = bottom < top ? 0 : bottom - top + 1;
  }
  // A 90-degree perspective looking down +z, so eye distance is the point's z on the axis.
  void Perspective() {
    D3DXMATRIX projection;
    D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 2.0f, 1.0f, 0.5f, 100.0f);
    ASSERT_EQ(device_->SetTransform(D3DTS_PROJECTION, &projection), S_OK);
  }
};

TEST_F(GlPointTest, VertexSizeIsInPixelsWithoutScaling) {
  DrawPoints({{0.0f, 0.0f, 0.5f, 8.0f, kRed}});
  Read();
  EXPECT_EQ(CountNear(kRed, 0), 8 * 8);
  int w = 0, h = 0;
  LitBox(&w, &h);
  EXPECT_EQ(w, 8);
  EXPECT_EQ(h, 8);
  EXPECT_TRUE(PixelNear(Pixel(31, 31), kRed));
}

TEST_F(GlPointTest, StateSizeAppliesWhenVerticesHaveNone) {
  SetFloat(D3DRS_POINTSIZE, 6.0f);
  const std::vector<ColouredVertex> point = {{0.0f, 0.0f, 0.5f, kGreen}};
  Upload(point, kColouredFvf);
  ASSERT_EQ(device_->DrawPrimitive(D3DPT_POINTLIST, 0, 1), S_OK);
  Read();
  EXPECT_EQ(CountNear(kGreen, 0), 6 * 6);
}

struct ScaleCase {
  const char* name;
  float a, b, c;
  float distance;  // eye-space
  float size;      // eye-space
};

class GlPointScaleTest : public GlPointTest, public ::testing::WithParamInterface<ScaleCase> {};

TEST_P(GlPointScaleTest, ScaledSizeIsViewportHeightTimesSizeOverTheAttenuation) {
  const ScaleCase& c = GetParam();
  Perspective();
  ASSERT_EQ(device_->SetRenderState(D3DRS_POINTSCALEENABLE, TRUE), S_OK);
  SetFloat(D3DRS_POINTSCALE_A, c.a);
  SetFloat(D3DRS_POINTSCALE_B, c.b);
  SetFloat(D3DRS_POINTSCALE_C, c.c);
  DrawPoints({{0.0f, 0.0f, c.distance, c.size, kRed}});
  Read();
  const float d = c.distance;
  const float expected_px = kSize * c.size * std::sqrt(1.0f / (c.a + c.b * d + c.c * d * d));
  int w = 0, h = 0;
  LitBox(&w, &h);
  EXPECT_NEAR(w, expected_px, 1.0f);
  EXPECT_NEAR(h, expected_px, 1.0f);
}

INSTANTIATE_TEST_SUITE_P(Attenuation, GlPointScaleTest,
                         ::testing::Values(ScaleCase{"Quadratic", 0, 0, 1, 4, 1},       // 16 px
                                           ScaleCase{"Constant", 1, 0, 0, 4, 0.25f},    // 16 px
                                           ScaleCase{"Linear", 0, 1, 0, 4, 0.5f},       // 16 px
                                           ScaleCase{"EmitterFactors", 1, 1, 1, 4, 2},  // 27.9 px
                                           ScaleCase{"Near", 0, 0, 1, 2, 0.5f}),        // 16 px
                         [](const auto& info) { return std::string(info.param.name); });

TEST_F(GlPointTest, ScaledDistanceIsTheEyeSpaceLengthNotDepth) {
  Perspective();
  ASSERT_EQ(device_->SetRenderState(D3DRS_POINTSCALEENABLE, TRUE), S_OK);
  SetFloat(D3DRS_POINTSCALE_A, 0.0f);
  SetFloat(D3DRS_POINTSCALE_C, 1.0f);
  // At (3, 0, 4) the distance is 5: 64 * 1.25 / 5 = 16 px (depth alone would give 20).
  DrawPoints({{3.0f, 0.0f, 4.0f, 1.25f, kRed}});
  Read();
  int w = 0, h = 0;
  LitBox(&w, &h);
  EXPECT_NEAR(h, 16, 1);
}

struct ClampCase {
  const char* name;
  float size, min, max;
  int expected_px;
};

class GlPointClampTest : public GlPointTest, public ::testing::WithParamInterface<ClampCase> {};

TEST_P(GlPointClampTest, SizeIsClampedToTheMinimumAndMaximum) {
  const ClampCase& c = GetParam();
  SetFloat(D3DRS_POINTSIZE_MIN, c.min);
  SetFloat(D3DRS_POINTSIZE_MAX, c.max);
  DrawPoints({{0.0f, 0.0f, 0.5f, c.size, kRed}});
  Read();
  EXPECT_EQ(CountNear(kRed, 0), c.expected_px * c.expected_px);
}

INSTANTIATE_TEST_SUITE_P(Limits, GlPointClampTest,
                         ::testing::Values(ClampCase{"Inside", 10, 0, 64, 10},
                                           ClampCase{"AboveMax", 20, 0, 10, 10},
                                           ClampCase{"BelowMin", 1, 4, 64, 4},
                                           ClampCase{"ZeroDrawsNothing", 0, 0, 64, 0},
                                           ClampCase{"DefaultMaxIs64", 100, 0, 64, 64}),
                         [](const auto& info) { return std::string(info.param.name); });

TEST(GlPointCapTest, DriverMaximumCapsTheSize) {
  constexpr UINT kSide = 300;  // wider than llvmpipe's largest point (255 px)
  std::string error;
  GlDevice* device = GlDevice::Create(kSide, kSide, &error);
  if (device == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  const float cap_px = device->MaxPointSizePx();
  ASSERT_GE(cap_px, 64.0f);
  ASSERT_EQ(device->SetRenderState(D3DRS_LIGHTING, FALSE), S_OK);
  ASSERT_EQ(device->SetRenderState(D3DRS_POINTSIZE_MAX, FloatToStateBits(1.0e6f)), S_OK);
  ASSERT_EQ(device->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, 0xFF000000, 1.0f, 0),
            S_OK);
  const PointVertex point{0.0f, 0.0f, 0.5f, 1.0e5f, kRed};
  IDirect3DVertexBuffer9* buffer = nullptr;
  ASSERT_EQ(
      device->CreateVertexBuffer(sizeof point, 0, kPointFvf, D3DPOOL_DEFAULT, &buffer, nullptr),
      S_OK);
  void* data = nullptr;
  ASSERT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_DISCARD), S_OK);
  std::memcpy(data, &point, sizeof point);
  ASSERT_EQ(buffer->Unlock(), S_OK);
  ASSERT_EQ(device->SetStreamSource(0, buffer, 0, sizeof point), S_OK);
  ASSERT_EQ(device->SetFVF(kPointFvf), S_OK);
  ASSERT_EQ(device->DrawPrimitive(D3DPT_POINTLIST, 0, 1), S_OK);
  std::vector<std::uint32_t> pixels;
  device->ReadPixels(&pixels);
  int lit_in_middle_row = 0;
  for (UINT x = 0; x < kSide; ++x) lit_in_middle_row += pixels[kSide / 2 * kSide + x] == kRed;
  EXPECT_NEAR(lit_in_middle_row, cap_px, 1.0f);
  EXPECT_LT(lit_in_middle_row, int(kSide));
  buffer->Release();
  device->Release();
}

TEST_F(GlPointTest, SpriteTextureCoordinatesRunFromTheTopLeftCorner) {
  IDirect3DTexture9* texture = MakeTexture(2, 2, {kRed, kGreen, kBlue, kWhite});
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_POINTSPRITEENABLE, TRUE), S_OK);
  DrawPoints({{0.0f, 0.0f, 0.5f, 16.0f, kWhite}});
  Read();
  EXPECT_TRUE(PixelNear(Pixel(26, 26), kRed));
  EXPECT_TRUE(PixelNear(Pixel(37, 26), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(26, 37), kBlue));
  EXPECT_TRUE(PixelNear(Pixel(37, 37), kWhite));
}

TEST_F(GlPointTest, WithoutSpritesThePointTakesOneTexel) {
  IDirect3DTexture9* texture = MakeTexture(2, 2, {kRed, kGreen, kBlue, kWhite});
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  DrawPoints({{0.0f, 0.0f, 0.5f, 16.0f, kWhite}});
  Read();
  EXPECT_EQ(CountNear(kRed, 0), 16 * 16);
}

TEST_F(GlPointTest, EmitterFadingPassBlendsSpritesByVertexAlpha) {
  ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET, kBlue, 1.0f, 0), S_OK);
  IDirect3DTexture9* texture = MakeTexture(1, 1, {kWhite});
  ASSERT_EQ(device_->SetTexture(0, texture), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_POINTSPRITEENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_SRCBLEND, D3DBLEND_SRCALPHA), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_DESTBLEND, D3DBLEND_INVSRCALPHA), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_ALPHAARG1, D3DTA_DIFFUSE), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_ALPHAARG2, D3DTA_TEXTURE), S_OK);
  ASSERT_EQ(device_->SetTextureStageState(0, D3DTSS_ALPHAOP, D3DTOP_MODULATE), S_OK);
  DrawPoints({{0.0f, 0.0f, 0.5f, 8.0f, 0x40FF0000}});
  Read();
  // a = 64/255: red 64, blue 191.
  const Argb c = Channels(Pixel(32, 32));
  EXPECT_NEAR(c.r, 64, 2);
  EXPECT_NEAR(c.g, 0, 2);
  EXPECT_NEAR(c.b, 191, 2);
}

TEST_F(GlPointTest, DefaultLightingDrawsPointsBlack) {
  ASSERT_EQ(device_->Clear(0, nullptr, D3DCLEAR_TARGET, kWhite, 1.0f, 0), S_OK);
  ASSERT_EQ(device_->SetRenderState(D3DRS_LIGHTING, TRUE), S_OK);
  DrawPoints({{0.0f, 0.0f, 0.5f, 4.0f, kRed}});
  Read();
  EXPECT_EQ(CountNear(kBlack, 0), 4 * 4);
}

}  // namespace
