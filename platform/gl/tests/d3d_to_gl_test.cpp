// The pure translations from Direct3D values to GL ones; no GL context needed.
#include <gtest/gtest.h>

#include <cmath>
#include <string>

#include "platform/gl/d3d_to_gl.h"
#include "platform/gl/fvf_layout.h"
#include "platform/gl/point_program.h"
#include "platform/gl/texture_stage_combine.h"
#include "platform/memory_device.h"

namespace {

struct BlendCase {
  DWORD source, destination;
  GLenum gl_source, gl_destination;
};

TEST(D3dToGlTest, BlendFactorsFollowTheirDirect3DNames) {
  const BlendCase cases[] = {
      {D3DBLEND_SRCALPHA, D3DBLEND_INVSRCALPHA, GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA},
      {D3DBLEND_ONE, D3DBLEND_ZERO, GL_ONE, GL_ZERO},
      {D3DBLEND_SRCCOLOR, D3DBLEND_INVSRCCOLOR, GL_SRC_COLOR, GL_ONE_MINUS_SRC_COLOR},
      {D3DBLEND_DESTALPHA, D3DBLEND_INVDESTALPHA, GL_DST_ALPHA, GL_ONE_MINUS_DST_ALPHA},
      {D3DBLEND_DESTCOLOR, D3DBLEND_INVDESTCOLOR, GL_DST_COLOR, GL_ONE_MINUS_DST_COLOR},
      {D3DBLEND_SRCALPHA, D3DBLEND_ONE, GL_SRC_ALPHA, GL_ONE},  // additive
      {12 /* BOTHSRCALPHA */, D3DBLEND_ONE, GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA},
      {13 /* BOTHINVSRCALPHA */, D3DBLEND_ONE, GL_ONE_MINUS_SRC_ALPHA, GL_SRC_ALPHA},
      {0, 99, GL_ONE, GL_ZERO},  // unknown values keep the defaults
  };
  for (const BlendCase& c : cases) {
    const BlendFactors f = BlendFactorsFor(c.source, c.destination);
    EXPECT_EQ(f.source, c.gl_source) << c.source << ", " << c.destination;
    EXPECT_EQ(f.destination, c.gl_destination) << c.source << ", " << c.destination;
  }
  EXPECT_EQ(BlendEquation(D3DBLENDOP_ADD), GLenum{GL_FUNC_ADD});
  EXPECT_EQ(BlendEquation(3), GLenum{GL_FUNC_REVERSE_SUBTRACT});
  EXPECT_EQ(BlendEquation(77), GLenum{GL_FUNC_ADD});
}

TEST(D3dToGlTest, CompareFunctionsMapOneToOne) {
  const std::pair<DWORD, GLenum> cases[] = {
      {D3DCMP_NEVER, GL_NEVER},         {D3DCMP_LESS, GL_LESS},
      {D3DCMP_EQUAL, GL_EQUAL},         {D3DCMP_LESSEQUAL, GL_LEQUAL},
      {D3DCMP_GREATER, GL_GREATER},     {D3DCMP_NOTEQUAL, GL_NOTEQUAL},
      {D3DCMP_GREATEREQUAL, GL_GEQUAL}, {D3DCMP_ALWAYS, GL_ALWAYS}};
  for (const auto& [d3d, gl] : cases) EXPECT_EQ(CompareFunction(d3d, GL_NONE), gl) << d3d;
  EXPECT_EQ(CompareFunction(0, GL_LEQUAL), GLenum{GL_LEQUAL});
  EXPECT_EQ(CompareFunction(9, GL_ALWAYS), GLenum{GL_ALWAYS});
}

struct PrimitiveCase {
  D3DPRIMITIVETYPE type;
  UINT count;
  GLenum mode;
  std::uint64_t vertices;
};

TEST(D3dToGlTest, PrimitiveCountsBecomeVertexCounts) {
  const PrimitiveCase cases[] = {
      {D3DPT_POINTLIST, 5, GL_POINTS, 5},
      {D3DPT_LINELIST, 5, GL_LINES, 10},
      {D3DPT_LINESTRIP, 5, GL_LINE_STRIP, 6},
      {D3DPT_TRIANGLELIST, 5, GL_TRIANGLES, 15},
      {D3DPT_TRIANGLESTRIP, 5, GL_TRIANGLE_STRIP, 7},
      {D3DPT_TRIANGLEFAN, 5, GL_TRIANGLE_FAN, 7},
      {D3DPT_TRIANGLELIST, 0xFFFFFFFFu, GL_TRIANGLES, 3ull * 0xFFFFFFFFu},  // no overflow
      {D3DPT_TRIANGLESTRIP, 0, GL_TRIANGLE_STRIP, 0},
      {static_cast<D3DPRIMITIVETYPE>(0), 5, GL_POINTS, 0},
  };
  for (const PrimitiveCase& c : cases) {
    const PrimitiveDraw draw = PrimitiveFor(c.type, c.count);
    EXPECT_EQ(draw.vertices, c.vertices) << c.type << " x " << c.count;
    if (c.vertices != 0) {
      EXPECT_EQ(draw.mode, c.mode) << c.type;
    }
  }
}

TEST(D3dToGlTest, CullModesCullTheWindingTheyName) {
  EXPECT_FALSE(CullFor(D3DCULL_NONE).enabled);
  EXPECT_TRUE(CullFor(D3DCULL_CCW).enabled);
  EXPECT_EQ(CullFor(D3DCULL_CCW).front_face, GLenum{GL_CW});  // the counter-clockwise back goes
  EXPECT_EQ(CullFor(D3DCULL_CW).front_face, GLenum{GL_CCW});
  EXPECT_FALSE(CullFor(0).enabled);
}

TEST(D3dToGlTest, ColoursSplitIntoRedGreenBlueAlpha) {
  const ColourRgba c = ColourFromD3d(0x80FF4000);
  EXPECT_FLOAT_EQ(c.a, 128.0f / 255.0f);
  EXPECT_FLOAT_EQ(c.r, 1.0f);
  EXPECT_FLOAT_EQ(c.g, 64.0f / 255.0f);
  EXPECT_FLOAT_EQ(c.b, 0.0f);
}

TEST(D3dToGlTest, LitAlphaComesFromTheVertexOnlyWhenItsColourIsTheMaterial) {
  MemoryDevice* reference = MemoryDevice::Create();
  DWORD rs[kD3DRenderStateCount];
  for (std::uint32_t i = 0; i < kD3DRenderStateCount; ++i)
    rs[i] = reference->RenderState(static_cast<D3DRENDERSTATETYPE>(i));
  reference->Release();
  EXPECT_TRUE(LitAlphaFromVertex(rs, true));
  EXPECT_FALSE(LitAlphaFromVertex(rs, false));
  rs[D3DRS_COLORVERTEX] = FALSE;
  EXPECT_FALSE(LitAlphaFromVertex(rs, true));
  rs[D3DRS_COLORVERTEX] = TRUE;
  rs[145] = 0;  // D3DRS_DIFFUSEMATERIALSOURCE = D3DMCS_MATERIAL
  EXPECT_FALSE(LitAlphaFromVertex(rs, true));
}

struct FvfCase {
  const char* name;
  DWORD fvf;
  bool drawable;
  UINT size;
  int normal, point_size, diffuse, texcoords;
};

class FvfLayoutTest : public ::testing::TestWithParam<FvfCase> {};

TEST_P(FvfLayoutTest, PartsLieInDirect3DsOrder) {
  const FvfCase& c = GetParam();
  FvfLayout layout;
  ASSERT_EQ(DescribeFvf(c.fvf, &layout), c.drawable);
  if (!c.drawable) return;
  EXPECT_EQ(layout.size, c.size);
  EXPECT_EQ(layout.normal, c.normal);
  EXPECT_EQ(layout.point_size, c.point_size);
  EXPECT_EQ(layout.diffuse, c.diffuse);
  EXPECT_EQ(layout.texcoords, c.texcoords);
}

INSTANTIATE_TEST_SUITE_P(
    Formats, FvfLayoutTest,
    ::testing::Values(
        // The quad path's 36-byte vertex and the point-sprite path's 20-byte one.
        FvfCase{"LocalVertex", D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1, true, 36,
                12, -1, 24, 28},
        FvfCase{"PointSprite", D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE, true, 20, -1, 12, 16,
                -1},
        FvfCase{"Coloured", D3DFVF_XYZ | D3DFVF_DIFFUSE, true, 16, -1, -1, 12, -1},
        FvfCase{"ColouredTextured", D3DFVF_XYZ | D3DFVF_DIFFUSE | D3DFVF_TEX1, true, 24, -1, -1, 12,
                16},
        FvfCase{"PositionOnly", D3DFVF_XYZ, true, 12, -1, -1, -1, -1},
        FvfCase{"TwoSetsAndSpecular", D3DFVF_XYZ | D3DFVF_SPECULAR | (2u << 8), true, 32, -1, -1,
                -1, 16},
        FvfCase{"Pretransformed", 0x004 | D3DFVF_DIFFUSE, false, 0, 0, 0, 0, 0},
        FvfCase{"NoPosition", D3DFVF_DIFFUSE, false, 0, 0, 0, 0, 0},
        FvfCase{"ThreeFloatTexcoords", D3DFVF_XYZ | D3DFVF_TEX1 | (1u << 16), false, 0, 0, 0, 0, 0},
        FvfCase{"NineSets", D3DFVF_XYZ | (9u << 8), false, 0, 0, 0, 0, 0}),
    [](const auto& info) { return std::string(info.param.name); });

// Stage 0's states at Direct3D's defaults, with changes.
struct StageStates {
  DWORD s[kD3DTextureStageStateCount] = {};
  StageStates() {
    s[D3DTSS_COLOROP] = D3DTOP_MODULATE;
    s[D3DTSS_COLORARG1] = D3DTA_TEXTURE;
    s[D3DTSS_COLORARG2] = D3DTA_CURRENT;
    s[D3DTSS_ALPHAOP] = D3DTOP_SELECTARG1;
    s[D3DTSS_ALPHAARG1] = D3DTA_TEXTURE;
    s[D3DTSS_ALPHAARG2] = D3DTA_CURRENT;
  }
};

TEST(TextureStageCombineTest, DefaultsModulateColourAndSelectTextureAlpha) {
  const StageStates st;
  const Stage0Combine c = DescribeStage0(st.s, true);
  EXPECT_TRUE(c.texturing);
  EXPECT_EQ(c.rgb.mode, GLenum{GL_MODULATE});
  EXPECT_EQ(c.rgb.source[0], GLenum{GL_TEXTURE});
  EXPECT_EQ(c.rgb.source[1], GLenum{GL_PREVIOUS});
  EXPECT_EQ(c.alpha.mode, GLenum{GL_REPLACE});
  EXPECT_EQ(c.alpha.source[0], GLenum{GL_TEXTURE});
  EXPECT_EQ(c.alpha.operand[0], GLenum{GL_SRC_ALPHA});
}

TEST(TextureStageCombineTest, EmitterFadingModulatesDiffuseAndTextureAlpha) {
  StageStates st;
  st.s[D3DTSS_ALPHAARG1] = D3DTA_DIFFUSE;
  st.s[D3DTSS_ALPHAARG2] = D3DTA_TEXTURE;
  st.s[D3DTSS_ALPHAOP] = D3DTOP_MODULATE;
  const CombineFunction a = DescribeStage0(st.s, true).alpha;
  EXPECT_EQ(a.mode, GLenum{GL_MODULATE});
  EXPECT_EQ(a.source[0], GLenum{GL_PRIMARY_COLOR});
  EXPECT_EQ(a.source[1], GLenum{GL_TEXTURE});
}

TEST(TextureStageCombineTest, SelectArg2AndModifiersAndScales) {
  StageStates st;
  st.s[D3DTSS_COLOROP] = D3DTOP_SELECTARG2;
  st.s[D3DTSS_COLORARG2] = D3DTA_DIFFUSE | 0x10;  // complement
  st.s[D3DTSS_ALPHAOP] = D3DTOP_MODULATE2X;
  st.s[D3DTSS_ALPHAARG2] = D3DTA_TFACTOR;
  const Stage0Combine c = DescribeStage0(st.s, true);
  EXPECT_EQ(c.rgb.mode, GLenum{GL_REPLACE});
  EXPECT_EQ(c.rgb.source[0], GLenum{GL_PRIMARY_COLOR});
  EXPECT_EQ(c.rgb.operand[0], GLenum{GL_ONE_MINUS_SRC_COLOR});
  EXPECT_EQ(c.alpha.scale, 2.0f);
  EXPECT_EQ(c.alpha.source[1], GLenum{GL_CONSTANT});
  st.s[D3DTSS_COLORARG1] = D3DTA_TEXTURE | 0x20;  // alpha replicate
  st.s[D3DTSS_COLOROP] = D3DTOP_SELECTARG1;
  EXPECT_EQ(DescribeStage0(st.s, true).rgb.operand[0], GLenum{GL_SRC_ALPHA});
}

TEST(TextureStageCombineTest, NoTextureOrDisabledColourTurnsTheUnitOff) {
  StageStates st;
  EXPECT_FALSE(DescribeStage0(st.s, false).texturing);
  st.s[D3DTSS_COLOROP] = D3DTOP_DISABLE;
  EXPECT_FALSE(DescribeStage0(st.s, true).texturing);
}

TEST(TextureStageCombineTest, UnknownOperationsPassTheCurrentValue) {
  StageStates st;
  st.s[D3DTSS_ALPHAOP] = 25;  // D3DTOP_LERP, not drawn here
  const CombineFunction a = DescribeStage0(st.s, true).alpha;
  EXPECT_EQ(a.mode, GLenum{GL_REPLACE});
  EXPECT_EQ(a.source[0], GLenum{GL_PREVIOUS});
}

// Render states at Direct3D's defaults.
struct RenderStates {
  DWORD s[kD3DRenderStateCount] = {};
  RenderStates() {
    MemoryDevice* reference = MemoryDevice::Create();
    for (std::uint32_t i = 0; i < kD3DRenderStateCount; ++i)
      s[i] = reference->RenderState(static_cast<D3DRENDERSTATETYPE>(i));
    reference->Release();
  }
};

TEST(PointParamsTest, DefaultsClampToOneAndSixtyFourPixels) {
  const RenderStates rs;
  const PointParams p = DescribePoints(rs.s, false, true, 480, 255.0f);
  EXPECT_FALSE(p.scale);
  EXPECT_EQ(p.state_size, 1.0f);
  EXPECT_EQ(p.min_px, 1.0f);
  EXPECT_EQ(p.max_px, 64.0f);
  EXPECT_EQ(p.viewport_height_px, 480.0f);
  EXPECT_TRUE(p.lighting);
}

struct RangeCase {
  const char* name;
  float min, max, driver_max;
  float expected_min, expected_max;
};

class PointRangeTest : public ::testing::TestWithParam<RangeCase> {};

TEST_P(PointRangeTest, RangeIsOrderedAndWithinTheDriver) {
  const RangeCase& c = GetParam();
  RenderStates rs;
  rs.s[D3DRS_POINTSIZE_MIN] = FloatToStateBits(c.min);
  rs.s[D3DRS_POINTSIZE_MAX] = FloatToStateBits(c.max);
  const PointParams p = DescribePoints(rs.s, true, true, 100, c.driver_max);
  EXPECT_EQ(p.min_px, c.expected_min);
  EXPECT_EQ(p.max_px, c.expected_max);
}

INSTANTIATE_TEST_SUITE_P(Ranges, PointRangeTest,
                         ::testing::Values(RangeCase{"Plain", 0, 64, 255, 0, 64},
                                           RangeCase{"DriverCaps", 0, 1000, 255, 0, 255},
                                           RangeCase{"MinAboveMax", 80, 64, 255, 64, 64},
                                           RangeCase{"NegativeMin", -5, 64, 255, 0, 64},
                                           RangeCase{"NanMin", std::nanf(""), 64, 255, 0, 64},
                                           RangeCase{"NanMax", 0, std::nanf(""), 255, 0, 255},
                                           RangeCase{"InfiniteMax", 0, INFINITY, 255, 0, 255}),
                         [](const auto& info) { return std::string(info.param.name); });

TEST(PointParamsTest, LightingWithoutVertexColourTakesTheZeroMaterialAlpha) {
  RenderStates rs;
  EXPECT_TRUE(DescribePoints(rs.s, true, true, 100, 255).lit_alpha_from_vertex);
  EXPECT_FALSE(DescribePoints(rs.s, true, false, 100, 255).lit_alpha_from_vertex);
  rs.s[D3DRS_LIGHTING] = FALSE;
  EXPECT_FALSE(DescribePoints(rs.s, true, true, 100, 255).lighting);
}

}  // namespace
