// Point lists: per-vertex and state sizes, Direct3D's distance scaling, clamping, and point
// sprite texture coordinates.
#include <gtest/gtest.h>

#include <cmath>
#include <tuple>
#include <vector>

#include "platform/d3dx_math.h"
#include "platform/gl/tests/gl_test_device.h"

namespace {

class GlPointTest : public GlDeviceTest {
 protected:
  void SetUp() override {
    GlDeviceTest::SetUp();
    if (device_ != nullptr) SetFloat(D3DRS_POINTSIZE_MIN, 0.0f);
  }
  void SetFloat(D3DRENDERSTATETYPE state, float value) {
    SetStates({state, FloatToStateBits(value)});
  }
  void DrawPoint(float x, float y, float z, float size, D3DCOLOR colour = kRed) {
    ClearTo(kBlack);
    Draw(std::vector<PointVertex>{{x, y, z, size, colour}}, kPointFvf, D3DPT_POINTLIST);
    Read();
  }
  // The side, in pixels, of the one square point drawn.
  float Side() const { return std::sqrt(float(CountNear(kRed))); }
};

TEST_F(GlPointTest, SizeIsThePixelsOfTheVertexOrTheStateClampedToTheRange) {
  DrawPoint(0.0f, 0.0f, 0.5f, 8.0f);
  EXPECT_EQ(CountNear(kRed), 8 * 8);
  EXPECT_TRUE(PixelNear(Pixel(28, 28), kRed));
  EXPECT_TRUE(PixelNear(Pixel(35, 35), kRed));
  // size, min, max; the side expected
  const std::tuple<float, float, float, int> cases[] = {
      {20, 0, 10, 10}, {1, 4, 64, 4}, {0, 0, 64, 0}, {100, 0, 64, 64}};
  for (const auto& [size, min, max, side] : cases) {
    SetFloat(D3DRS_POINTSIZE_MIN, min);
    SetFloat(D3DRS_POINTSIZE_MAX, max);
    DrawPoint(0.0f, 0.0f, 0.5f, size);
    EXPECT_EQ(CountNear(kRed), side * side) << size;
  }
  SetFloat(D3DRS_POINTSIZE, 6.0f);  // for vertices without a size of their own
  ClearTo(kBlack);
  Draw(std::vector<ColouredVertex>{{0.0f, 0.0f, 0.5f, kGreen}}, kColouredFvf, D3DPT_POINTLIST);
  Read();
  EXPECT_EQ(CountNear(kGreen), 6 * 6);
}

TEST_F(GlPointTest, ScaledSizeIsViewportHeightTimesSizeOverTheAttenuationAtEyeDistance) {
  D3DXMATRIX projection;  // 90 degrees looking down +z
  D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 2.0f, 1.0f, 0.5f, 100.0f);
  ASSERT_EQ(device_->SetTransform(D3DTS_PROJECTION, &projection), S_OK);
  SetStates({D3DRS_POINTSCALEENABLE, TRUE});
  // a, b, c, the point's x and z, and its size; the last is off the axis, where the distance
  // is not the depth (which would give 14.4 px).
  const std::tuple<float, float, float, float, float, float> cases[] = {
      {0, 0, 1, 0, 4, 1}, {1, 0, 0, 0, 4, 0.25f}, {0, 1, 0, 0, 4, 0.5f},
      {1, 1, 1, 0, 4, 2}, {0, 0, 1, 0, 2, 0.5f},  {0, 0, 1, 2, 3, 0.676f}};
  for (const auto& [a, b, c, x, z, size] : cases) {
    SetFloat(D3DRS_POINTSCALE_A, a);
    SetFloat(D3DRS_POINTSCALE_B, b);
    SetFloat(D3DRS_POINTSCALE_C, c);
    DrawPoint(x, 0.0f, z, size);
    const float d = std::hypot(x, z);
    const float expected_px = kSize * size * std::sqrt(1.0f / (a + b * d + c * d * d));
    EXPECT_NEAR(Side(), expected_px, 1.0f) << a << ", " << b << ", " << c << " at " << x;
  }
}

TEST_F(GlPointTest, SpriteTextureCoordinatesRunFromTheTopLeftCornerWithoutSpritesOneTexel) {
  MakeTexture(2, 2, {kRed, kGreen, kBlue, kWhite});
  DrawPoint(0.0f, 0.0f, 0.5f, 16.0f, kWhite);
  EXPECT_EQ(CountNear(kRed), 16 * 16);
  SetStates({D3DRS_POINTSPRITEENABLE, TRUE});
  DrawPoint(0.0f, 0.0f, 0.5f, 16.0f, kWhite);
  EXPECT_TRUE(PixelNear(Pixel(26, 26), kRed));
  EXPECT_TRUE(PixelNear(Pixel(37, 26), kGreen));
  EXPECT_TRUE(PixelNear(Pixel(26, 37), kBlue));
  EXPECT_TRUE(PixelNear(Pixel(37, 37), kWhite));
}

}  // namespace
