// The per-particle logic update: dispatch, and the live stages L1 to L14 (death, forces, speed
// limit, size, collision, smoke, move, attractors, facing, spin, colour).
#include "host/attractor.h"
#include "host/envelope_storage.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"
#include "simulation/vector_math.h"

namespace {

// The speed limit m and global force G of this update, faded with age in smoke mode.
struct FadedMotion {
  float MaximumSpeed;
  D3DXVECTOR3 GlobalForce;
};

FadedMotion FadeWithAge(const Tev_AdvancedParticleEmitter& e, const Particle& p) {
  FadedMotion motion{e.MaximumSpeed, e.GlobalForce};
  if (e.SmokeEnabled) {
    const Tev_AdvPE_SmokeSettings& smoke = *e.Frame.SmokeSettings;
    if (smoke.MaxSpeedFadesWithAge > 0.0f)
      motion.MaximumSpeed = (1.0f - p.NormalizedAge) * e.MaximumSpeed;
    if (smoke.GlobalForceFadesWithAge > 0.0f)
      motion.GlobalForce = e.GlobalForce * (1.0f - p.NormalizedAge);
  }
  return motion;
}

void IntegrateVelocity(const Tev_AdvancedParticleEmitter& e, Particle& p,
                       const FadedMotion& motion) {
  const float s = e.SimulationScaler;
  p.Velocity += (motion.GlobalForce + p.SmokeForce + p.AttractorForce) * s * s;
  if (!e.HasMaximumSpeed) return;
  const float limit = motion.MaximumSpeed * s;
  if (limit < sim::Length(p.Velocity)) p.Velocity = sim::Unit(p.Velocity) * limit;
}

void Move(Tev_AdvancedParticleEmitter& e, Particle& p) {
  if (!e.PlacedBySmokeCollision) p.Position += p.Velocity;
  p.RenderPosition = p.Position;
  e.PlacedBySmokeCollision = false;
}

// Gathered now, applied at the next update's velocity integration.
void GatherAttractorForce(const Tev_AdvancedParticleEmitter& e, Particle& p) {
  p.AttractorForce = sim::kZeroVector;
  if (p.Sliding && e.SlidingAttractorImmunity) return;
  if (e.Step.AttractorsTaken) {
    for (Tev_AdvPE_Attractor* attractor : e.Step.Attractors)
      p.AttractorForce += attractor->GetForceAtPosition(p.RenderPosition);
    return;
  }
  const int count = e.GetChildLinkPositionCount(kLinkAttractors);
  for (int a = 0; a < count; ++a) {
    auto* attractor =
        static_cast<Tev_AdvPE_Attractor*>(e.GetChildFromLinkPosition(kLinkAttractors, a));
    if (attractor) p.AttractorForce += attractor->GetForceAtPosition(p.RenderPosition);
  }
}

// "LookAt" is a point, or with "LookAt_Local" an offset from the particle; sliding particles
// aligned to normals face along the surface normal.
void Face(const Tev_AdvancedParticleEmitter& e, Particle& p) {
  if (p.Attached) return;
  if (e.AlignToNormals && p.Sliding)
    p.LookAtPoint = p.Position + p.SurfaceNormal;
  else if (e.LookAtLocal)
    p.LookAtPoint = p.Position + e.LookAt;
  else
    p.LookAtPoint = e.LookAt;
}

// The angle is handed to sine and cosine unconverted; it is reset (not wrapped) beyond +-360.
void Spin(const Tev_AdvancedParticleEmitter& e, Particle& p) {
  if (!e.SpinEnabled) return;
  p.SpinAngle += p.SpinSpeed * e.SimulationScaler;
  if (p.SpinAngle > 360.0f || p.SpinAngle < -360.0f) p.SpinAngle = 0.0f;
  p.RenderSpinAngle = p.SpinAngle;
}

bool CollisionStageRuns(const Tev_AdvancedParticleEmitter& e) {
  return e.Frame.CollisionManager && (e.ReportCollisions || e.CollisionResponse);
}

}  // namespace

void Tev_AdvancedParticleEmitter::UpdateParticle(int index) {
  Particle& p = Particles[index];
  if (p.Attached && p.Active)
    UpdateAttachedParticle(p);
  else if (p.Active)
    UpdateLiveParticle(index);
}

void Tev_AdvancedParticleEmitter::UpdateLiveParticle(int index) {
  Particle& p = Particles[index];
  VerticesDirty = true;
  if (p.Age > p.Lifespan) {
    p.Active = false;
    return;
  }
  p.NormalizedAge = p.Age / p.Lifespan;
  // Only the smoke stage sets and clears the smoke force: with smoke off it must not keep
  // pushing with what it gathered last.
  if (!SmokeEnabled) p.SmokeForce = sim::kZeroVector;
  IntegrateVelocity(*this, p, FadeWithAge(*this, p));
  ApplySizeEnvelope(p);
  // The collision may kill, attach or redirect the particle; the stages below run on regardless.
  if (CollisionStageRuns(*this)) CollisionStage(p);
  if (SmokeEnabled) SmokeStage(index);
  Move(*this, p);
  GatherAttractorForce(*this, p);
  Face(*this, p);
  Spin(*this, p);
  ApplyColorEnvelopes(p);
}
