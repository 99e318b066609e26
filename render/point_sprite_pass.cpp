// The point-sprite path's render pass: point-sprite states around the shared textured pass.
#include "host/device_channel.h"
#include "plugin/advanced_particle_emitter.h"
#include "render/pass_states.h"

namespace {

constexpr float kPointSizeMinimum = 0.0f;
// Distance attenuation 1 / (A + B d + C d^2) with all three factors 1.
constexpr float kPointScaleFactor = 1.0f;

// Float states travel as their bit patterns.
void SetPointSpriteStates(Tev_DX8_DeviceChannel& channel) {
  channel.SetRenderState(D3DRS_POINTSPRITEENABLE, TRUE);
  channel.SetRenderState(D3DRS_POINTSCALEENABLE, TRUE);
  channel.SetRenderState(D3DRS_POINTSIZE_MIN, FloatToStateBits(kPointSizeMinimum));
  channel.SetRenderState(D3DRS_POINTSCALE_A, FloatToStateBits(kPointScaleFactor));
  channel.SetRenderState(D3DRS_POINTSCALE_B, FloatToStateBits(kPointScaleFactor));
  channel.SetRenderState(D3DRS_POINTSCALE_C, FloatToStateBits(kPointScaleFactor));
}

// The minimum size and scale factors stay on the device; only the two switches go off.
void ClearPointSpriteStates(Tev_DX8_DeviceChannel& channel) {
  channel.SetRenderState(D3DRS_POINTSPRITEENABLE, FALSE);
  channel.SetRenderState(D3DRS_POINTSCALEENABLE, FALSE);
}

}  // namespace

void Tev_AdvancedParticleEmitter::RenderPointSprites() {
  if (DeviceChannel == nullptr) return;
  SetPointSpriteStates(*DeviceChannel);
  RunTexturedPass(
      *this, [](Tev_AdvancedParticleEmitter& emitter) { emitter.StreamPointSprites(); },
      DepthAfterFading::TestOnly);
  ClearPointSpriteStates(*DeviceChannel);
}
