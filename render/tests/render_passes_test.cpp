// The two render passes, call by call, and the base operations the emitter switches off.
#include <vector>

#include <gtest/gtest.h>

#include "plugin/link_table.h"
#include "render/tests/render_test_support.h"

namespace {

using Calls = std::vector<std::string>;

constexpr DWORD kOne = 0x3F800000;  // 1.0f as a state's bit pattern
// Blend states set before each pass, so that their restore can be told from the pass's own.
constexpr DWORD kSrcBlendBefore = D3DBLEND_ONE;
constexpr DWORD kDestBlendBefore = D3DBLEND_ZERO;
constexpr DWORD kAlphaBlendBefore = FALSE;

enum class Path { Quads, Points };
enum class Textures {
  None,          // neither texture linked
  ParticleOnly,  // "Particle Texture" only: no composite
  Composite,     // both linked and the composite built
  CompositeLost  // both linked, but the composite could not be created
};

std::uint32_t Grey(UINT, UINT) {
  return 0xFF808080;
}

class RenderPassTest : public RenderTest {
 protected:
  void SetUpPath(Path path) {
    SetPool({LiveParticle({0, 0, 0}, {0, 0, 1}, 1.0f, 0xFFFFFFFF),
             LiveParticle({1, 0, 0}, {1, 0, 1}, 1.0f, 0xFFFFFFFF)});
    if (path == Path::Quads) {
      Emitter().InitializeLocalVertexBuffer();
      Emitter().UpdateLocalVertexBuffer();
      Emitter().InitializeBaseClassBuffers();
    } else {
      Emitter().HardwareParticles = true;
      Emitter().InitializePointSpriteVertexBuffer();
      Emitter().UpdatePointSpriteVertexBuffer();
    }
  }

  void SetUpTextures(Textures textures) {
    if (textures == Textures::None) return;
    particle_texture_ = &MakeTexture(*device_, 4, 4, D3DFMT_A8R8G8B8, Grey);
    LinkTexture(kLinkParticleTexture, *particle_texture_);
    if (textures == Textures::ParticleOnly) return;
    LinkTexture(kLinkAttachedTexture, MakeTexture(*device_, 4, 4, D3DFMT_A8R8G8B8, Grey));
    if (textures == Textures::CompositeLost) device_->FailNextCreateTexture();
    Emitter().BuildCompositeTexture();
    ASSERT_TRUE(Emitter().HasCompositeTexture);
    ASSERT_EQ(Emitter().CompositeTexture == nullptr, textures == Textures::CompositeLost);
  }

  void SetBlendStatesBefore() {
    device_->SetRenderState(D3DRS_SRCBLEND, kSrcBlendBefore);
    device_->SetRenderState(D3DRS_DESTBLEND, kDestBlendBefore);
    device_->SetRenderState(D3DRS_ALPHABLENDENABLE, kAlphaBlendBefore);
    device_->SetRenderState(D3DRS_ZENABLE, D3DZB_FALSE);
    device_->SetRenderState(D3DRS_ZWRITEENABLE, FALSE);
  }

  // What the wrapped draw logs on its own.
  Calls DrawCalls(Path path) {
    TakeCalls();
    if (path == Path::Quads) {
      Emitter().StreamVertexData();
    } else {
      Emitter().StreamPointSprites();
    }
    return TakeCalls();
  }

  Calls BasePreRenderCalls() {
    TakeCalls();
    Emitter().Tev_DX8_ObjectDataChannel::DoCustomPreRenderStates();
    return TakeCalls();
  }

  void RunPass(Path path) {
    if (path == Path::Quads) {
      Emitter().RenderSprites();
    } else {
      Emitter().RenderPointSprites();
    }
  }

  Qen_TextureChannel* particle_texture_ = nullptr;
};

void Append(Calls& to, const Calls& from) {
  to.insert(to.end(), from.begin(), from.end());
}

struct PassCase {
  const char* Name;
  Path PassPath;
  bool Fading;
  Textures Setup;
};
void PrintTo(const PassCase& c, std::ostream* os) {
  *os << c.Name;
}

class PassCallLogTest : public RenderPassTest, public testing::WithParamInterface<PassCase> {};

TEST_P(PassCallLogTest, CallsAreExactlyTheSpecifiedOnes) {
  const PassCase& c = GetParam();
  SetUpPath(c.PassPath);
  SetUpTextures(c.Setup);
  Emitter().UseVertexAlphaFading = c.Fading;
  SetBlendStatesBefore();
  const Calls draw = DrawCalls(c.PassPath);
  const Calls base_states = BasePreRenderCalls();
  messages_.clear();

  Calls expected;
  if (c.PassPath == Path::Points) {
    Append(expected, {Call("SetRenderState", {D3DRS_POINTSPRITEENABLE, TRUE}),
                      Call("SetRenderState", {D3DRS_POINTSCALEENABLE, TRUE}),
                      Call("SetRenderState", {D3DRS_POINTSIZE_MIN, 0}),
                      Call("SetRenderState", {D3DRS_POINTSCALE_A, kOne}),
                      Call("SetRenderState", {D3DRS_POINTSCALE_B, kOne}),
                      Call("SetRenderState", {D3DRS_POINTSCALE_C, kOne})});
  }
  const Calls bind_particle_texture =
      c.Setup == Textures::None
          ? Calls{}
          : Calls{Call("SetTexture", {0, IdOf(particle_texture_->GetTexture())})};
  if (!c.Fading) {
    // The composite is never bound with fading off.
    Append(expected, base_states);
    Append(expected, bind_particle_texture);
    Append(expected, draw);
  } else {
    Append(expected,
           {Call("GetRenderState", {D3DRS_SRCBLEND}), Call("GetRenderState", {D3DRS_DESTBLEND}),
            Call("GetRenderState", {D3DRS_ALPHABLENDENABLE})});
    Append(expected, c.Setup == Textures::Composite
                         ? Calls{Call("SetTexture", {0, IdOf(Emitter().CompositeTexture)})}
                         : bind_particle_texture);
    Append(expected, {Call("SetRenderState", {D3DRS_ALPHABLENDENABLE, TRUE}),
                      Call("SetRenderState", {D3DRS_SRCBLEND, D3DBLEND_SRCALPHA}),
                      Call("SetRenderState", {D3DRS_DESTBLEND, D3DBLEND_INVSRCALPHA}),
                      Call("SetTextureStageState", {0, D3DTSS_ALPHAARG1, D3DTA_DIFFUSE}),
                      Call("SetTextureStageState", {0, D3DTSS_ALPHAARG2, D3DTA_TEXTURE}),
                      Call("SetTextureStageState", {0, D3DTSS_ALPHAOP, D3DTOP_MODULATE})});
    Append(expected, draw);
    expected.push_back(Call("SetRenderState", {D3DRS_ZENABLE, D3DZB_TRUE}));
    // Depth writes are the quad path's only.
    if (c.PassPath == Path::Quads)
      expected.push_back(Call("SetRenderState", {D3DRS_ZWRITEENABLE, TRUE}));
    Append(expected, {Call("SetRenderState", {D3DRS_SRCBLEND, kSrcBlendBefore}),
                      Call("SetRenderState", {D3DRS_DESTBLEND, kDestBlendBefore}),
                      Call("SetRenderState", {D3DRS_ALPHABLENDENABLE, kAlphaBlendBefore})});
  }
  if (c.PassPath == Path::Points) {
    Append(expected, {Call("SetRenderState", {D3DRS_POINTSPRITEENABLE, FALSE}),
                      Call("SetRenderState", {D3DRS_POINTSCALEENABLE, FALSE})});
  }

  RunPass(c.PassPath);
  EXPECT_EQ(TakeCalls(), expected);
  EXPECT_TRUE(messages_.empty());
}

INSTANTIATE_TEST_SUITE_P(
    Passes, PassCallLogTest,
    testing::Values(
        PassCase{"QuadsPlainNoTexture", Path::Quads, false, Textures::None},
        PassCase{"QuadsPlainParticleTexture", Path::Quads, false, Textures::ParticleOnly},
        PassCase{"QuadsPlainWithComposite", Path::Quads, false, Textures::Composite},
        PassCase{"QuadsFadingNoTexture", Path::Quads, true, Textures::None},
        PassCase{"QuadsFadingParticleTexture", Path::Quads, true, Textures::ParticleOnly},
        PassCase{"QuadsFadingComposite", Path::Quads, true, Textures::Composite},
        PassCase{"QuadsFadingCompositeLost", Path::Quads, true, Textures::CompositeLost},
        PassCase{"PointsPlainNoTexture", Path::Points, false, Textures::None},
        PassCase{"PointsPlainWithComposite", Path::Points, false, Textures::Composite},
        PassCase{"PointsFadingNoTexture", Path::Points, true, Textures::None},
        PassCase{"PointsFadingParticleTexture", Path::Points, true, Textures::ParticleOnly},
        PassCase{"PointsFadingComposite", Path::Points, true, Textures::Composite},
        PassCase{"PointsFadingCompositeLost", Path::Points, true, Textures::CompositeLost}),
    [](const testing::TestParamInfo<PassCase>& info) { return info.param.Name; });

TEST_F(RenderPassTest, FadingQuadPassRestoresBlendingAndLeavesDepthOn) {
  SetUpPath(Path::Quads);
  Emitter().UseVertexAlphaFading = true;
  SetBlendStatesBefore();
  Emitter().RenderSprites();
  EXPECT_EQ(device_->RenderState(D3DRS_SRCBLEND), kSrcBlendBefore);
  EXPECT_EQ(device_->RenderState(D3DRS_DESTBLEND), kDestBlendBefore);
  EXPECT_EQ(device_->RenderState(D3DRS_ALPHABLENDENABLE), kAlphaBlendBefore);
  EXPECT_EQ(device_->RenderState(D3DRS_ZENABLE), DWORD{D3DZB_TRUE});
  EXPECT_EQ(device_->RenderState(D3DRS_ZWRITEENABLE), DWORD{TRUE});
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_ALPHAOP), DWORD{D3DTOP_MODULATE});
}

TEST_F(RenderPassTest, FadingPointPassRestoresBlendingAndLeavesDepthWritesAlone) {
  SetUpPath(Path::Points);
  Emitter().UseVertexAlphaFading = true;
  SetBlendStatesBefore();
  Emitter().RenderPointSprites();
  EXPECT_EQ(device_->RenderState(D3DRS_SRCBLEND), kSrcBlendBefore);
  EXPECT_EQ(device_->RenderState(D3DRS_DESTBLEND), kDestBlendBefore);
  EXPECT_EQ(device_->RenderState(D3DRS_ALPHABLENDENABLE), kAlphaBlendBefore);
  EXPECT_EQ(device_->RenderState(D3DRS_ZENABLE), DWORD{D3DZB_TRUE});
  EXPECT_EQ(device_->RenderState(D3DRS_ZWRITEENABLE), DWORD{FALSE});
  // Sprites and scaling off again; size minimum and scale factors stay.
  EXPECT_EQ(device_->RenderState(D3DRS_POINTSPRITEENABLE), DWORD{FALSE});
  EXPECT_EQ(device_->RenderState(D3DRS_POINTSCALEENABLE), DWORD{FALSE});
  EXPECT_EQ(device_->RenderState(D3DRS_POINTSIZE_MIN), FloatToStateBits(0.0f));
  EXPECT_EQ(device_->RenderState(D3DRS_POINTSCALE_A), FloatToStateBits(1.0f));
  EXPECT_EQ(device_->RenderState(D3DRS_POINTSCALE_B), FloatToStateBits(1.0f));
  EXPECT_EQ(device_->RenderState(D3DRS_POINTSCALE_C), FloatToStateBits(1.0f));
}

TEST_F(RenderPassTest, SwitchedOffBaseOperationsTouchNothing) {
  SetUpPath(Path::Quads);
  TakeCalls();
  Tev_DX8_ObjectDataChannel& base = Emitter();
  base.DoCustomPreRenderStates();
  base.SetTextureTransform(0, 1);
  base.StreamTextureMatrices();
  EXPECT_TRUE(TakeCalls().empty());
}

TEST_F(RenderPassTest, AlwaysVisible) {
  Tev_DX8_ObjectDataChannel& base = Emitter();
  EXPECT_TRUE(base.GetIfObjectIsVisible());  // no particle at all
  SetPool({LiveParticle({1e30f, -1e30f, 1e30f}, {0, 0, 0}, 1.0f, 0)});
  EXPECT_TRUE(base.GetIfObjectIsVisible());
}

}  // namespace
