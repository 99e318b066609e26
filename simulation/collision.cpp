// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::CollisionStage(Particle&) {}
