// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::CallChannel() {}
void Tev_AdvancedParticleEmitter::EnableActiveTimer(float) {}
int Tev_AdvancedParticleEmitter::RandInt(int low, int) { return low; }
void Tev_AdvancedParticleEmitter::RunLogicStep() {}
