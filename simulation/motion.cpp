// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::UpdateParticle(int) {}
void Tev_AdvancedParticleEmitter::UpdateLiveParticle(int) {}
void Tev_AdvancedParticleEmitter::SmokeStage(int) {}
