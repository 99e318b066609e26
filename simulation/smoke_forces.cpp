// Smoke stages of the live update (L9): strength, drag, pair forces between smoke particles,
// smoke collision, and the push away from the surface ahead.
#include "host/envelope_storage.h"
#include "host/multi_collision_manager.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "simulation/smoke_pairs.h"
#include "simulation/vector_math.h"

namespace {

void ApplyDrag(const Tev_AdvPE_SmokeSettings& smoke, Particle& p) {
  if (!(smoke.Drag < 1.0f)) return;
  if (smoke.DragFadesWithAge > 0.0f)
    p.Velocity *= (1.0f - p.NormalizedAge) * smoke.Drag;
  else
    p.Velocity *= smoke.Drag;
}

// Pushes the particle away from the surface it is heading for, within the envelope's reach.
void AddSurfaceRepulsion(Tev_AdvancedParticleEmitter& e, Particle& p, Tev_EnvelopeStorage& envelope,
                         float strength) {
  D3DXVECTOR3 origin = p.Position;
  D3DXVECTOR3 probe = sim::Unit(p.Velocity) * envelope.GetMaxIndex();
  D3DXVECTOR3 hitPoint;
  D3DXVECTOR3 hitNormal;
  float hitCosine = 0.0f;
  if (e.Frame.CollisionManager->GetClosestFrontFaceCollision(&origin, &probe, &hitPoint, &hitNormal,
                                                             &hitCosine) < 0)
    return;
  const D3DXVECTOR3 d = p.Position - hitPoint;
  const float r = sim::Length(d);
  // A hit at the particle's own position gives no direction to push along.
  if (r == 0.0f) return;
  p.SmokeForce += (d / r) * envelope.GetEnvelopeValue(r) * strength;
}

}  // namespace

void Tev_AdvancedParticleEmitter::SmokeStage(int index) {
  Particle& p = Particles[index];
  const Tev_AdvPE_SmokeSettings& smoke = *Frame.SmokeSettings;
  const float strength = smoke.ForceStrengthEnvelope
                             ? smoke.ForceStrengthEnvelope->GetEnvelopeValue(p.NormalizedAge)
                             : 0.0f;
  ApplyDrag(smoke, p);
  p.SmokeForce = sim::kZeroVector;
  if ((smoke.RepulsionEnvelope || smoke.AttractionEnvelope) && p.Active) {
    if (Step.SmokePairs.Prepared())
      Step.SmokePairs.AddPairForces(Particles, ParticleCount, index, strength);
    else
      sim::AddPairForcesAllPairs(Particles, ParticleCount, index, sim::PairEnvelopes(smoke),
                                 strength);
  }
  if (Frame.CollisionManager && smoke.CollisionEnabled) SmokeCollisionStage(p);
  if (Frame.CollisionManager && smoke.SurfaceRepulsionEnvelope)
    AddSurfaceRepulsion(*this, p, *smoke.SurfaceRepulsionEnvelope, strength);
}
