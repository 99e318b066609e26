// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::SmokeCollisionStage(Particle&) {}
bool Tev_AdvancedParticleEmitter::SmokeCollisionResponse(float, float, float, float, D3DXVECTOR3*,
                                                         float, D3DXVECTOR3*, D3DXVECTOR3*,
                                                         D3DXVECTOR3*, D3DXVECTOR3*) {
  return false;
}
