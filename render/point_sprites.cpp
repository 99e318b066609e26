// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::InitializePointSpriteVertexBuffer() {}
void Tev_AdvancedParticleEmitter::UpdatePointSpriteVertexBuffer() {}
void Tev_AdvancedParticleEmitter::StreamPointSprites() {}
void Tev_AdvancedParticleEmitter::RenderPointSprites() {}
