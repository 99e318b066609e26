// Placeholder bodies until this concern is written; replaced by its owner.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::InitializeLocalVertexBuffer() {}
void Tev_AdvancedParticleEmitter::InitializeBaseClassBuffers() {}
bool Tev_AdvancedParticleEmitter::WriteLocalVertexBufferToBaseClass() { return false; }
