// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::ApplySizeEnvelope(Particle&) {}
void Tev_AdvancedParticleEmitter::ApplyColorEnvelopes(Particle&) {}
void Tev_AdvancedParticleEmitter::UpdateAttachedParticle(Particle&) {}
