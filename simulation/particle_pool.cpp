// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

int Tev_AdvancedParticleEmitter::GetInactiveParticle() { return -1; }
int Tev_AdvancedParticleEmitter::GetOldestParticle() { return 0; }
bool Tev_AdvancedParticleEmitter::GetIfParticleActive(int) { return false; }
D3DXVECTOR3 Tev_AdvancedParticleEmitter::GetParticlePosition(int) { return {0, 0, 0}; }
