#include "render/pass_states.h"

#include "host/device_channel.h"
#include "host/link_channels.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"

namespace {

// The three blend states a fading pass changes, in the order they are read and put back.
constexpr D3DRENDERSTATETYPE kKeptBlendStates[] = {D3DRS_SRCBLEND, D3DRS_DESTBLEND,
                                                   D3DRS_ALPHABLENDENABLE};
constexpr int kKeptBlendStateCount = 3;

struct KeptBlendStates {
  DWORD Values[kKeptBlendStateCount] = {};
  bool Read[kKeptBlendStateCount] = {};  // a state the device would not tell is not put back
};

KeptBlendStates KeepBlendStates(Tev_DX8_DeviceChannel* channel) {
  KeptBlendStates kept;
  for (int i = 0; i < kKeptBlendStateCount; ++i) {
    IDirect3DDevice9* device = CurrentDevice(channel);
    kept.Read[i] = device != nullptr &&
                   SUCCEEDED(device->GetRenderState(kKeptBlendStates[i], &kept.Values[i]));
  }
  return kept;
}

void RestoreBlendStates(Tev_DX8_DeviceChannel& channel, const KeptBlendStates& kept) {
  for (int i = 0; i < kKeptBlendStateCount; ++i) {
    if (kept.Read[i]) channel.SetRenderState(kKeptBlendStates[i], kept.Values[i]);
  }
}

// Drawn alpha = vertex alpha x texture alpha, blended over what is behind.
void SetFadingStates(Tev_DX8_DeviceChannel& channel) {
  channel.SetRenderState(D3DRS_ALPHABLENDENABLE, TRUE);
  channel.SetRenderState(D3DRS_SRCBLEND, D3DBLEND_SRCALPHA);
  channel.SetRenderState(D3DRS_DESTBLEND, D3DBLEND_INVSRCALPHA);
  channel.SetTextureStageState(0, D3DTSS_ALPHAARG1, D3DTA_DIFFUSE);
  channel.SetTextureStageState(0, D3DTSS_ALPHAARG2, D3DTA_TEXTURE);
  channel.SetTextureStageState(0, D3DTSS_ALPHAOP, D3DTOP_MODULATE);
}

void SetDepthAfterFading(Tev_DX8_DeviceChannel& channel, DepthAfterFading depth) {
  channel.SetRenderState(D3DRS_ZENABLE, D3DZB_TRUE);
  if (depth == DepthAfterFading::TestAndWrite) channel.SetRenderState(D3DRS_ZWRITEENABLE, TRUE);
}

// The "Particle Texture" link, fetched afresh at each use, on stage 0 when linked.
void BindParticleTexture(const Tev_AdvancedParticleEmitter& emitter) {
  if (auto* texture = LinkAs<Qen_TextureChannel>(emitter, kLinkParticleTexture)) {
    texture->SetToStage(0);
  }
}

// The composite when one was built; without it (never asked for, or its creation failed) the
// "Particle Texture" as if there were no composite.
void BindFadingTexture(Tev_AdvancedParticleEmitter& emitter) {
  if (emitter.HasCompositeTexture && emitter.CompositeTexture != nullptr) {
    if (IDirect3DDevice9* device = CurrentDevice(emitter.DeviceChannel)) {
      device->SetTexture(0, emitter.CompositeTexture);
    }
    return;
  }
  BindParticleTexture(emitter);
}

}  // namespace

IDirect3DDevice9* CurrentDevice(Tev_DX8_DeviceChannel* channel) {
  return channel == nullptr ? nullptr : channel->GetDevice();
}

void RunTexturedPass(Tev_AdvancedParticleEmitter& emitter, PassDraw draw, DepthAfterFading depth) {
  if (!emitter.UseVertexAlphaFading) {
    // The base finds its device at draw time; the emitter's device channel is not needed here.
    // The base's own states, not the emitter's empty override.
    emitter.Tev_DX8_ObjectDataChannel::DoCustomPreRenderStates();
    BindParticleTexture(emitter);
    draw(emitter);
    return;
  }
  Tev_DX8_DeviceChannel* channel = emitter.DeviceChannel;
  if (channel == nullptr) return;
  const KeptBlendStates kept = KeepBlendStates(channel);
  BindFadingTexture(emitter);
  SetFadingStates(*channel);
  draw(emitter);
  SetDepthAfterFading(*channel, depth);
  RestoreBlendStates(*channel, kept);
}
