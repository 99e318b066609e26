// The quad path's render pass, and the base-class operations the emitter switches off.
#include "plugin/advanced_particle_emitter.h"
#include "render/pass_states.h"

void Tev_AdvancedParticleEmitter::RenderSprites() {
  RunTexturedPass(
      *this, [](Tev_AdvancedParticleEmitter& emitter) { emitter.StreamVertexData(); },
      DepthAfterFading::TestAndWrite);
}

// The passes set their own states and call the base's pre-draw states explicitly.
void Tev_AdvancedParticleEmitter::DoCustomPreRenderStates() {}

// Quads carry their own texture rows; no texture transform or matrices apply.
void Tev_AdvancedParticleEmitter::SetTextureTransform(int, int) {}
void Tev_AdvancedParticleEmitter::StreamTextureMatrices() {}

// Particles move every frame; the mesh's bounding box says nothing about where they are.
bool Tev_AdvancedParticleEmitter::GetIfObjectIsVisible() {
  return true;
}
