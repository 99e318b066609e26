#include "platform/d3d9_defaults.h"

#include <cstdint>

namespace {

// Render states outside the shared enumeration whose defaults the table also carries.
enum ExtraRenderState : std::uint32_t {
  kFogStart = 36,
  kFogEnd = 37,
  kFogDensity = 38,
  kStencilFail = 53,
  kStencilZFail = 54,
  kStencilPass = 55,
  kStencilFunc = 56,
  kStencilMask = 58,
  kStencilWriteMask = 59,
  kTextureFactor = 60,
  kClipping = 136,
  kLocalViewer = 142,
  kDiffuseMaterialSource = 145,
  kSpecularMaterialSource = 146,
  kMultisampleAntialias = 161,
  kMultisampleMask = 162,
  kPositionDegree = 172,
  kNormalDegree = 173,
  kMinTessellationLevel = 178,
  kMaxTessellationLevel = 179,
  kAdaptiveTessZ = 182,
  kCcwStencilFail = 186,
  kCcwStencilZFail = 187,
  kCcwStencilPass = 188,
  kCcwStencilFunc = 189,
  kColorWriteEnable1 = 190,
  kColorWriteEnable2 = 191,
  kColorWriteEnable3 = 192,
  kBlendFactor = 193,
  kSrcBlendAlpha = 207,
  kDestBlendAlpha = 208,
  kBlendOpAlpha = 209,
};

constexpr DWORD kStencilOpKeep = 1;
constexpr DWORD kMaterialColor1 = 1;
constexpr DWORD kMaterialColor2 = 2;
constexpr DWORD kDegreeLinear = 1;
constexpr DWORD kDegreeCubic = 3;
constexpr DWORD kAllBits = 0xFFFFFFFFu;

// Texture stage states outside the shared enumeration.
constexpr std::uint32_t kColorArg0 = 26;
constexpr std::uint32_t kAlphaArg0 = 27;
constexpr std::uint32_t kResultArg = 28;

struct RenderStateDefault {
  std::uint32_t state;
  DWORD value;
};

// Direct3D 9's documented defaults; every state not listed starts at 0.
const RenderStateDefault kRenderStateDefaults[] = {
    {D3DRS_ZENABLE, D3DZB_TRUE},
    {D3DRS_FILLMODE, D3DFILL_SOLID},
    {D3DRS_SHADEMODE, D3DSHADE_GOURAUD},
    {D3DRS_ZWRITEENABLE, TRUE},
    {D3DRS_ALPHATESTENABLE, FALSE},
    {D3DRS_LASTPIXEL, TRUE},
    {D3DRS_SRCBLEND, D3DBLEND_ONE},
    {D3DRS_DESTBLEND, D3DBLEND_ZERO},
    {D3DRS_CULLMODE, D3DCULL_CCW},
    {D3DRS_ZFUNC, D3DCMP_LESSEQUAL},
    {D3DRS_ALPHAREF, 0},
    {D3DRS_ALPHAFUNC, D3DCMP_ALWAYS},
    {D3DRS_DITHERENABLE, FALSE},
    {D3DRS_ALPHABLENDENABLE, FALSE},
    {D3DRS_FOGENABLE, FALSE},
    {D3DRS_SPECULARENABLE, FALSE},
    {kFogStart, FloatToStateBits(0.0f)},
    {kFogEnd, FloatToStateBits(1.0f)},
    {kFogDensity, FloatToStateBits(1.0f)},
    {kStencilFail, kStencilOpKeep},
    {kStencilZFail, kStencilOpKeep},
    {kStencilPass, kStencilOpKeep},
    {kStencilFunc, D3DCMP_ALWAYS},
    {kStencilMask, kAllBits},
    {kStencilWriteMask, kAllBits},
    {kTextureFactor, kAllBits},
    {kClipping, TRUE},
    {D3DRS_LIGHTING, TRUE},
    {D3DRS_AMBIENT, 0},
    {D3DRS_COLORVERTEX, TRUE},
    {kLocalViewer, TRUE},
    {D3DRS_NORMALIZENORMALS, FALSE},
    {kDiffuseMaterialSource, kMaterialColor1},
    {kSpecularMaterialSource, kMaterialColor2},
    {D3DRS_POINTSIZE, FloatToStateBits(1.0f)},
    {D3DRS_POINTSIZE_MIN, FloatToStateBits(1.0f)},
    {D3DRS_POINTSPRITEENABLE, FALSE},
    {D3DRS_POINTSCALEENABLE, FALSE},
    {D3DRS_POINTSCALE_A, FloatToStateBits(1.0f)},
    {D3DRS_POINTSCALE_B, FloatToStateBits(0.0f)},
    {D3DRS_POINTSCALE_C, FloatToStateBits(0.0f)},
    {kMultisampleAntialias, TRUE},
    {kMultisampleMask, kAllBits},
    {D3DRS_POINTSIZE_MAX, FloatToStateBits(64.0f)},
    {D3DRS_COLORWRITEENABLE, D3DCOLORWRITEENABLE_ALL},
    {D3DRS_BLENDOP, D3DBLENDOP_ADD},
    {kPositionDegree, kDegreeCubic},
    {kNormalDegree, kDegreeLinear},
    {kMinTessellationLevel, FloatToStateBits(1.0f)},
    {kMaxTessellationLevel, FloatToStateBits(1.0f)},
    {kAdaptiveTessZ, FloatToStateBits(1.0f)},
    {kCcwStencilFail, kStencilOpKeep},
    {kCcwStencilZFail, kStencilOpKeep},
    {kCcwStencilPass, kStencilOpKeep},
    {kCcwStencilFunc, D3DCMP_ALWAYS},
    {kColorWriteEnable1, D3DCOLORWRITEENABLE_ALL},
    {kColorWriteEnable2, D3DCOLORWRITEENABLE_ALL},
    {kColorWriteEnable3, D3DCOLORWRITEENABLE_ALL},
    {kBlendFactor, kAllBits},
    {kSrcBlendAlpha, D3DBLEND_ONE},
    {kDestBlendAlpha, D3DBLEND_ZERO},
    {kBlendOpAlpha, D3DBLENDOP_ADD},
};

}  // namespace

DWORD D3D9DefaultRenderState(D3DRENDERSTATETYPE state) {
  for (const RenderStateDefault& d : kRenderStateDefaults)
    if (d.state == state) return d.value;
  return 0;
}

DWORD D3D9DefaultTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type) {
  if (stage >= kD3DTextureStageCount) return 0;
  switch (static_cast<std::uint32_t>(type)) {
    case D3DTSS_COLOROP:
      return stage == 0 ? D3DTOP_MODULATE : D3DTOP_DISABLE;
    case D3DTSS_ALPHAOP:
      return stage == 0 ? D3DTOP_SELECTARG1 : D3DTOP_DISABLE;
    case D3DTSS_COLORARG1:
    case D3DTSS_ALPHAARG1:
      return D3DTA_TEXTURE;
    case D3DTSS_COLORARG2:
    case D3DTSS_ALPHAARG2:
    case kColorArg0:
    case kAlphaArg0:
    case kResultArg:
      return D3DTA_CURRENT;
    case D3DTSS_TEXCOORDINDEX:
      return stage;
    default:
      return 0;
  }
}
