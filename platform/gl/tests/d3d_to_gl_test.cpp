// The pure translations from Direct3D values to GL ones; no GL context needed.
#include <gtest/gtest.h>

#include <cmath>
#include <tuple>

#include "platform/gl/d3d_to_gl.h"
#include "platform/gl/fvf_layout.h"
#include "platform/gl/point_program.h"
#include "platform/memory_device.h"

namespace {

TEST(D3dToGlTest, PrimitiveCountsBecomeVertexCountsAndUnknownValuesKeepDefaults) {
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
  // The blend values that set both factors; unknown values keep Direct3D's defaults.
  EXPECT_EQ(BlendFactorsFor(12 /* BOTHSRCALPHA */, D3DBLEND_ONE).destination,
            GLenum{GL_ONE_MINUS_SRC_ALPHA});
  EXPECT_EQ(BlendFactorsFor(13 /* BOTHINVSRCALPHA */, D3DBLEND_ONE).destination,
            GLenum{GL_SRC_ALPHA});
  EXPECT_EQ(BlendFactorsFor(0, 99).destination, GLenum{GL_ZERO});
  EXPECT_EQ(BlendEquation(77), GLenum{GL_FUNC_ADD});
  EXPECT_EQ(CompareFunction(9, GL_ALWAYS), GLenum{GL_ALWAYS});
}

TEST(D3dToGlTest, FvfPartsLieInDirect3DsOrderAndUndrawableFormatsAreRefused) {
  // size, then the offsets of normal, point size, diffuse and the first texture set (-1: none)
  const std::tuple<DWORD, UINT, int, int, int, int> drawable[] = {
      {D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1, 36, 12, -1, 24, 28},  // quads
      {D3DFVF_XYZ | D3DFVF_PSIZE | D3DFVF_DIFFUSE, 20, -1, 12, 16, -1},  // point sprites
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

// Render states at Direct3D's defaults, from the reference device.
struct Defaults {
  DWORD rs[kD3DRenderStateCount] = {};
  Defaults() {
    MemoryDevice* reference = MemoryDevice::Create();
    for (std::uint32_t i = 0; i < kD3DRenderStateCount; ++i)
      rs[i] = reference->RenderState(static_cast<D3DRENDERSTATETYPE>(i));
    reference->Release();
  }
};

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

}  // namespace
