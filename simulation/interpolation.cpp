// InterpolateParticles: the drawn state a fraction t into the next logic step.
#include "plugin/advanced_particle_emitter.h"

void Tev_AdvancedParticleEmitter::InterpolateParticles(float t) {
  for (int i = 0; i < ParticleCount; ++i) {
    Particle& p = Particles[i];
    p.RenderPosition = p.Position + p.Velocity * t;
    // Attached particles keep the facing point set when they attached or by their own update.
    if (p.Attached) continue;
    if (AlignToNormals && p.Sliding)
      p.LookAtPoint = p.RenderPosition + p.SurfaceNormal;
    else if (LookAtLocal)
      p.LookAtPoint = p.Position + LookAt;
    else
      p.LookAtPoint = LookAt;
  }
  if (!SpinEnabled) return;
  // The stored spin per step, not scaled by the time scale (the logic step scales it).
  for (int i = 0; i < ParticleCount; ++i) {
    Particle& p = Particles[i];
    p.RenderSpinAngle = p.SpinAngle + t * p.SpinSpeed;
  }
}
