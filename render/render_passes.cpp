// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::RenderSprites() {}
void Tev_AdvancedParticleEmitter::DoCustomPreRenderStates() {}
void Tev_AdvancedParticleEmitter::SetTextureTransform(int, int) {}
void Tev_AdvancedParticleEmitter::StreamTextureMatrices() {}
bool Tev_AdvancedParticleEmitter::GetIfObjectIsVisible() { return true; }
