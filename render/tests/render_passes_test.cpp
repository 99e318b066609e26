// The two render passes, call by call, and the base operations the emitter switches off.
#include <vector>

#include "render/tests/render_test_support.h"

namespace {

constexpr DWORD kOne = 0x3F800000;  // 1.0f as a state's bit pattern

enum class Textures {
  None,          // neither texture linked
  ParticleOnly,  // "Particle Texture" only: no composite
  Composite,     // both linked and the composite built
  CompositeLost  // both linked, but the composite could not be created
};

std::uint32_t Grey(UINT, UINT) {
  return 0xFF808080;
}

void Append(Calls& to, const Calls& from) {
  to.insert(to.end(), from.begin(), from.end());
}

class RenderPassTest : public RenderTest {
 protected:
  // Two live particles on either path, textures as asked, blending set to be told from the
  // pass's own states. Answers what the draw logs on its own.
  Calls SetUpPass(bool points, Textures textures) {
    SetPool({LiveParticle({0, 0, 0}, {0, 0, 1}, 1.0f, ~0u),
             LiveParticle({1, 0, 0}, {1, 0, 1}, 1.0f, ~0u)});
    Emitter().HardwareParticles = points;
    if (points) {
      Emitter().InitializePointSpriteVertexBuffer();
    } else {
      Emitter().InitializeLocalVertexBuffer();
      Emitter().InitializeBaseClassBuffers();
    }
    if (textures != Textures::None)
      particle_ = &LinkTexture(kLinkParticleTexture, *device_, 4, 4, Grey);
    if (textures == Textures::Composite || textures == Textures::CompositeLost) {
      LinkTexture(kLinkAttachedTexture, *device_, 4, 4, Grey);
      if (textures == Textures::CompositeLost) device_->FailNextCreateTexture();
      Emitter().BuildCompositeTexture();
    }
    device_->SetRenderState(D3DRS_SRCBLEND, D3DBLEND_ONE);
    device_->SetRenderState(D3DRS_DESTBLEND, D3DBLEND_ZERO);
    device_->SetRenderState(D3DRS_ALPHABLENDENABLE, FALSE);
    TakeCalls();
    points ? Emitter().StreamPointSprites() : Emitter().StreamVertexData();
    messages_.clear();
    return TakeCalls();
  }
  Qen_TextureChannel* particle_ = nullptr;
};

TEST_F(RenderPassTest, EachPassMakesExactlyItsCallsInOrder) {
  const struct {
    bool Points, Fading;
    Textures Setup;
  } cases[] = {{false, false, Textures::None},     {false, false, Textures::Composite},
               {false, true, Textures::None},      {false, true, Textures::ParticleOnly},
               {false, true, Textures::Composite}, {false, true, Textures::CompositeLost},
               {true, false, Textures::Composite}, {true, true, Textures::ParticleOnly},
               {true, true, Textures::Composite}};
  for (const auto& c : cases) {
    emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
    const Calls draw = SetUpPass(c.Points, c.Setup);
    Emitter().Tev_DX8_ObjectDataChannel::DoCustomPreRenderStates();
    const Calls base_states = TakeCalls();
    Emitter().UseVertexAlphaFading = c.Fading;

    Calls expected;
    if (c.Points)
      Append(expected, {Call("SetRenderState", {D3DRS_POINTSPRITEENABLE, TRUE}),
                        Call("SetRenderState", {D3DRS_POINTSCALEENABLE, TRUE}),
                        Call("SetRenderState", {D3DRS_POINTSIZE_MIN, 0}),
                        Call("SetRenderState", {D3DRS_POINTSCALE_A, kOne}),
                        Call("SetRenderState", {D3DRS_POINTSCALE_B, kOne}),
                        Call("SetRenderState", {D3DRS_POINTSCALE_C, kOne})});
    // Fading off never binds the composite; a lost composite falls back to "Particle Texture".
    const Calls particle_texture =
        c.Setup == Textures::None ? Calls{}
                                  : Calls{Call("SetTexture", {0, IdOf(particle_->GetTexture())})};
    if (!c.Fading) {
      Append(expected, base_states);
      Append(expected, particle_texture);
      Append(expected, draw);
    } else {
      Append(expected,
             {Call("GetRenderState", {D3DRS_SRCBLEND}), Call("GetRenderState", {D3DRS_DESTBLEND}),
              Call("GetRenderState", {D3DRS_ALPHABLENDENABLE})});
      Append(expected, c.Setup == Textures::Composite
                           ? Calls{Call("SetTexture", {0, IdOf(Emitter().CompositeTexture)})}
                           : particle_texture);
      Append(expected, {Call("SetRenderState", {D3DRS_ALPHABLENDENABLE, TRUE}),
                        Call("SetRenderState", {D3DRS_SRCBLEND, D3DBLEND_SRCALPHA}),
                        Call("SetRenderState", {D3DRS_DESTBLEND, D3DBLEND_INVSRCALPHA}),
                        Call("SetTextureStageState", {0, D3DTSS_ALPHAARG1, D3DTA_DIFFUSE}),
                        Call("SetTextureStageState", {0, D3DTSS_ALPHAARG2, D3DTA_TEXTURE}),
                        Call("SetTextureStageState", {0, D3DTSS_ALPHAOP, D3DTOP_MODULATE})});
      Append(expected, draw);
      expected.push_back(Call("SetRenderState", {D3DRS_ZENABLE, D3DZB_TRUE}));
      if (!c.Points) expected.push_back(Call("SetRenderState", {D3DRS_ZWRITEENABLE, TRUE}));
      Append(expected, {Call("SetRenderState", {D3DRS_SRCBLEND, D3DBLEND_ONE}),
                        Call("SetRenderState", {D3DRS_DESTBLEND, D3DBLEND_ZERO}),
                        Call("SetRenderState", {D3DRS_ALPHABLENDENABLE, FALSE})});
    }
    if (c.Points)
      Append(expected, {Call("SetRenderState", {D3DRS_POINTSPRITEENABLE, FALSE}),
                        Call("SetRenderState", {D3DRS_POINTSCALEENABLE, FALSE})});
    c.Points ? Emitter().RenderPointSprites() : Emitter().RenderSprites();
    EXPECT_EQ(TakeCalls(), expected) << c.Points << c.Fading << static_cast<int>(c.Setup);
    EXPECT_TRUE(messages_.empty());
  }
}

TEST_F(RenderPassTest, SwitchedOffBaseOperationsTouchNothing) {
  SetUpPass(false, Textures::None);
  Tev_DX8_ObjectDataChannel& base = Emitter();
  base.DoCustomPreRenderStates();
  base.SetTextureTransform(0, 1);
  base.StreamTextureMatrices();
  EXPECT_TRUE(TakeCalls().empty());
}

// An emitter without a device channel of its own (made before the host had one): the quad pass
// without fading still draws, since the base finds the device when it draws; the fading pass
// needs the emitter's channel for its states and stays out.
TEST_F(RenderPassTest, WithoutItsDeviceChannelOnlyTheFadingQuadPassStaysOut) {
  const Calls draw = SetUpPass(false, Textures::None);
  Emitter().Tev_DX8_ObjectDataChannel::DoCustomPreRenderStates();
  Calls expected = TakeCalls();
  Append(expected, draw);
  Emitter().DeviceChannel = nullptr;
  Emitter().UseVertexAlphaFading = false;
  Emitter().RenderSprites();
  EXPECT_EQ(TakeCalls(), expected);
  Emitter().UseVertexAlphaFading = true;
  Emitter().RenderSprites();
  EXPECT_TRUE(TakeCalls().empty());
}

// The frame call takes the host's device channel when the emitter was made before it.
TEST_F(RenderPassTest, AFrameTakesADeviceChannelMadeAfterTheEmitter) {
  device_channel_.reset();
  emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
  ASSERT_EQ(Emitter().DeviceChannel, nullptr);
  device_channel_ = std::make_unique<Tev_DX8_DeviceChannel>(device_);
  Emitter().CallChannel();
  EXPECT_EQ(Emitter().DeviceChannel, device_channel_.get());
}

}  // namespace
