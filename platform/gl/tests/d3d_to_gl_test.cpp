// The pure translations from Direct3D values to GL ones; no GL context needed.
#include <gtest/gtest.h>

#include <cmath>
#include <tuple>

#include "platform/gl/d3d_to_gl.h"
#include "platform/gl/fvf_layout.h"
#include "platform/gl/point_program.h"
#include "platform/gl/texture_stage_combine.h"
#include "platform/memory_device.h"

namespace {

// The blend values that set both factors, and unknown values, which keep the defaults.
TEST(D3dToGlTest, BlendValuesBeyondTheOneToOneFactorsAndEquations) {
  const std::tuple<DWORD, DWORD, GLenum, GLenum> cases[] = {
      {12 /* BOTHSRCALPHA */, D3DBLEND_ONE, GL_SRC_ALPHA, GL_ONE_MINUS_SRC_ALPHA},
      {13 /* BOTHINVSRCALPHA */, D3DBLEND_ONE, GL_ONE_MINUS_SRC_ALPHA, GL_SRC_ALPHA},
      {0, 99, GL_ONE, GL_ZERO}};
  for (const auto& [source, destination, gl_source, gl_destination] : cases) {
    const BlendFactors f = BlendFactorsFor(source, destination);
    EXPECT_EQ(std::pair(f.source, f.destination), std::pair(gl_source, gl_destination)) << source;
  }
  EXPECT_EQ(BlendEquation(77), GLenum{GL_FUNC_ADD});
  EXPECT_EQ(CompareFunction(9, GL_ALWAYS), GLenum{GL_ALWAYS});
}

TEST(D3dToGlTest, PrimitiveCountsBecomeVertexCountsWithoutOverflow) {
  const std::tuple<D3DPRIMITIVETYPE, UINT, GLenum, std::uint64_t> cases[] = {
      {D3DPT_POINTLIST, 5, GL_POINTS, 5},
      {D3DPT_LINELIST, 5, GL_LINES, 10},
      {D3DPT_LINESTRIP, 5, GL_LINE_STRIP, 6},
      {D3DPT_TRIANGLELIST, 5, GL_TRIANGLES, 15},
      {D3DPT_TRIANGLESTRIP, 5, GL_TRIANGLE_STRIP, 7},
      {D3DPT_TRIANGLEFAN, 5, GL_TRIANGLE_FAN, 7},
      {D3DPT_TRIANGLELIST, 0xFFFFFFFFu, GL_TRIANGLES, 3ull * 0xFFFFFFFFu},
      {D3DPT_TRIANGLESTRIP, 0, GL_TRIANGLE_STRIP, 0},
      {static_cast<D3DPRIMITIVETYPE>(0), 5, 0, 0}};
  for (const auto& [type, count, mode, vertices] : cases) {
    const PrimitiveDraw draw = PrimitiveFor(type, count);
    EXPECT_EQ(draw.vertices, vertices) << type << " x " << count;
    EXPECT_TRUE(vertices == 0 || draw.mode == mode) << type;
  }
}

TEST(D3dToGlTest, FvfPartsLieInDirect3DsOrderAndUndrawableFormatsAreRefused) {
  // size, then the offsets of normal, point size, diffuse and the first texture set (-1: none)
  const std::tuple<DWORD, UINT, int, int, int, int> drawable[] = {
      {D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1, 36, 12, -1, 24, 28},  // quads
      {D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE, 20, -1, 12, 16, -1},  // point sprites
      {D3DFVF_XYZ, 12, -1, -1, -1, -1},
      {D3DFVF_XYZ | D3DFVF_SPECULAR | (2u << 8), 32, -1, -1, -1, 16}};
  for (const auto& [fvf, size, normal, point_size, diffuse, texcoords] : drawable) {
    FvfLayout l;
    ASSERT_TRUE(DescribeFvf(fvf, &l)) << fvf;
    EXPECT_EQ(std::tuple(l.size, l.normal, l.point_size, l.diffuse, l.texcoords),
              std::tuple(size, normal, point_size, diffuse, texcoords))
        << fvf;
  }
  // Pretransformed, no position, three-float texture coordinates, nine sets.
  for (DWORD fvf : {0x004u | D3DFVF_DIFFUSE, DWORD{D3DFVF_DIFFUSE},
                    D3DFVF_XYZ | D3DFVF_TEX1 | (1u << 16), D3DFVF_XYZ | (9u << 8)}) {
    FvfLayout l;
    EXPECT_FALSE(DescribeFvf(fvf, &l)) << fvf;
  }
}

// Render states and stage 0's states at Direct3D's defaults, from the reference device.
struct Defaults {
  DWORD rs[kD3DRenderStateCount] = {};
  DWORD s[kD3DTextureStageStateCount] = {};
  Defaults() {
    MemoryDevice* reference = MemoryDevice::Create();
    for (std::uint32_t i = 0; i < kD3DRenderStateCount; ++i)
      rs[i] = reference->RenderState(static_cast<D3DRENDERSTATETYPE>(i));
    for (std::uint32_t i = 0; i < kD3DTextureStageStateCount; ++i)
      s[i] = reference->TextureStageState(0, static_cast<D3DTEXTURESTAGESTATETYPE>(i));
    reference->Release();
  }
};

TEST(TextureStageCombineTest, ArgumentsModifiersAndScalesBecomeCombineSettings) {
  Defaults st;
  st.s[D3DTSS_COLOROP] = D3DTOP_SELECTARG2;
  st.s[D3DTSS_COLORARG2] = D3DTA_DIFFUSE | 0x10;  // complement
  st.s[D3DTSS_ALPHAOP] = D3DTOP_MODULATE2X;
  st.s[D3DTSS_ALPHAARG2] = D3DTA_TFACTOR;
  Stage0Combine c = DescribeStage0(st.s, true);
  EXPECT_EQ(
      std::tuple(c.rgb.mode, c.rgb.source[0], c.rgb.operand[0]),
      std::tuple(GLenum{GL_REPLACE}, GLenum{GL_PRIMARY_COLOR}, GLenum{GL_ONE_MINUS_SRC_COLOR}));
  EXPECT_EQ(std::tuple(c.alpha.mode, c.alpha.scale, c.alpha.source[1], c.alpha.operand[0]),
            std::tuple(GLenum{GL_MODULATE}, 2.0f, GLenum{GL_CONSTANT}, GLenum{GL_SRC_ALPHA}));
  st.s[D3DTSS_COLOROP] = D3DTOP_SELECTARG1;
  st.s[D3DTSS_COLORARG1] = D3DTA_TEXTURE | 0x20;  // alpha replicate
  st.s[D3DTSS_ALPHAOP] = 25;                      // D3DTOP_LERP, not drawn: passes the current
  c = DescribeStage0(st.s, true);
  EXPECT_EQ(c.rgb.operand[0], GLenum{GL_SRC_ALPHA});
  EXPECT_EQ(std::tuple(c.alpha.mode, c.alpha.source[0]),
            std::tuple(GLenum{GL_REPLACE}, GLenum{GL_PREVIOUS}));
  EXPECT_FALSE(DescribeStage0(st.s, false).texturing);  // no texture bound
}

TEST(PointParamsTest, SizeRangeIsOrderedNonNegativeAndWithinTheDriver) {
  // min, max, the driver's largest point; the range expected
  const std::tuple<float, float, float, float, float> cases[] = {
      {1, 64, 255, 1, 64},       {0, 1000, 255, 0, 255},          {80, 64, 255, 64, 64},
      {-5, 64, 255, 0, 64},      {std::nanf(""), 64, 255, 0, 64}, {0, std::nanf(""), 255, 0, 255},
      {0, INFINITY, 255, 0, 255}};
  for (const auto& [min, max, driver_max, expected_min, expected_max] : cases) {
    Defaults d;
    d.rs[D3DRS_POINTSIZE_MIN] = FloatToStateBits(min);
    d.rs[D3DRS_POINTSIZE_MAX] = FloatToStateBits(max);
    const PointParams p = DescribePoints(d.rs, true, true, 100, driver_max);
    EXPECT_EQ(p.min_px, expected_min) << min << " to " << max;
    EXPECT_EQ(p.max_px, expected_max) << min << " to " << max;
  }
}

// Lit without lights, a vertex keeps its alpha only when its diffuse colour is the material.
TEST(PointParamsTest, LitAlphaComesFromTheVertexOnlyWhenItsColourIsTheMaterial) {
  Defaults d;
  EXPECT_TRUE(DescribePoints(d.rs, true, true, 100, 255).lit_alpha_from_vertex);
  EXPECT_FALSE(DescribePoints(d.rs, true, false, 100, 255).lit_alpha_from_vertex);
  d.rs[145] = 0;  // D3DRS_DIFFUSEMATERIALSOURCE = D3DMCS_MATERIAL
  EXPECT_FALSE(LitAlphaFromVertex(d.rs, true));
  d.rs[145] = 1;
  d.rs[D3DRS_COLORVERTEX] = FALSE;
  EXPECT_FALSE(LitAlphaFromVertex(d.rs, true));
}

}  // namespace
