// InterpolateParticles: the drawn state a fraction t into the next logic step.
#include "plugin/advanced_particle_emitter.h"
#include "render/point_sprite_vertex.h"

namespace {

[[gnu::always_inline]] inline void Interpolate(const Tev_AdvancedParticleEmitter& e, Particle& p,
                                               float t) {
  p.RenderPosition = p.Position + p.Velocity * t;
  // Attached particles keep the facing point set when they attached or by their own update.
  if (p.Attached) return;
  if (e.AlignToNormals && p.Sliding)
    p.LookAtPoint = p.RenderPosition + p.SurfaceNormal;
  else if (e.LookAtLocal)
    p.LookAtPoint = p.Position + e.LookAt;
  else
    p.LookAtPoint = e.LookAt;
}

// The stored spin per step, not scaled by the time scale (the logic step scales it).
void InterpolateSpin(Tev_AdvancedParticleEmitter& e, float t) {
  if (!e.SpinEnabled) return;
  for (int i = 0; i < e.ParticleCount; ++i) {
    Particle& p = e.Particles[i];
    p.RenderSpinAngle = p.SpinAngle + t * p.SpinSpeed;
  }
}

}  // namespace

void Tev_AdvancedParticleEmitter::InterpolateParticles(float t) {
  for (int i = 0; i < ParticleCount; ++i) Interpolate(*this, Particles[i], t);
  InterpolateSpin(*this, t);
}

void Tev_AdvancedParticleEmitter::InterpolateParticlesAndPointSprites(float t) {
  // Never more slots than records: every slot is reached.
  const std::size_t slots = PointSpriteSlots();
  for (int i = 0; i < ParticleCount; ++i) {
    Particle& p = Particles[i];
    Interpolate(*this, p, t);
    if (static_cast<std::size_t>(i) < slots) PointSpriteVertices[i] = PointSpriteOf(p);
  }
  InterpolateSpin(*this, t);
}
