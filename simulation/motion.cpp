// The per-particle logic update: dispatch, and the live stages L1 to L14 (death, forces, speed
// limit, size, collision, smoke, move, attractors, facing, spin, colour).
#include <bit>
#include <cstdint>

#include "host/attractor.h"
#include "host/envelope_storage.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"
#include "simulation/envelope_sampling.h"
#include "simulation/vector_math.h"

namespace {

// The stage helpers below are inline into the step's one loop: out of line, their calls were a
// tenth of a basic update.

// What the live update branches on that holds for a whole logic step (only the link reading
// stage changes these), read once per step instead of once per particle.
struct LiveStepFacts {
  bool SmokeFades;  // smoke mode with the speed limit or the global force fading with age
  bool SpeedLimit;  // "Maximum Speed" linked
  bool Collision;   // the collision stage runs
  bool Smoke;       // the smoke stages run
  bool Colours;     // the colour envelopes write the colour (not smoke debug colours)
  bool Spin;
  bool AlignToNormals;
  bool LookAtLocal;
  bool SlidingImmunity;
  float Scale;  // SimulationScaler
};

LiveStepFacts FactsOf(const Tev_AdvancedParticleEmitter& e) {
  const Tev_AdvPE_SmokeSettings* smoke = e.SmokeEnabled ? e.Frame.SmokeSettings : nullptr;
  LiveStepFacts facts{};
  facts.SmokeFades =
      smoke && (smoke->MaxSpeedFadesWithAge > 0.0f || smoke->GlobalForceFadesWithAge > 0.0f);
  facts.SpeedLimit = e.HasMaximumSpeed;
  facts.Collision = e.Frame.CollisionManager && (e.ReportCollisions || e.CollisionResponse);
  facts.Smoke = e.SmokeEnabled;
  facts.Colours = !(smoke && smoke->DebugColours);
  facts.Spin = e.SpinEnabled;
  facts.AlignToNormals = e.AlignToNormals;
  facts.LookAtLocal = e.LookAtLocal;
  facts.SlidingImmunity = e.SlidingAttractorImmunity;
  facts.Scale = e.SimulationScaler;
  return facts;
}

// The speed limit m and global force G of this update, faded with age in smoke mode.
struct FadedMotion {
  float MaximumSpeed;
  D3DXVECTOR3 GlobalForce;
};

FadedMotion FadeWithAge(const Tev_AdvancedParticleEmitter& e, const Particle& p) {
  FadedMotion motion{e.MaximumSpeed, e.GlobalForce};
  const Tev_AdvPE_SmokeSettings& smoke = *e.Frame.SmokeSettings;
  if (smoke.MaxSpeedFadesWithAge > 0.0f)
    motion.MaximumSpeed = (1.0f - p.NormalizedAge) * e.MaximumSpeed;
  if (smoke.GlobalForceFadesWithAge > 0.0f)
    motion.GlobalForce = e.GlobalForce * (1.0f - p.NormalizedAge);
  return motion;
}

[[gnu::always_inline]] inline void LimitSpeed(Particle& p, float maximumSpeed, float s) {
  const float limit = maximumSpeed * s;
  if (limit < sim::Length(p.Velocity)) p.Velocity = sim::Unit(p.Velocity) * limit;
}

[[gnu::always_inline]] inline void IntegrateVelocity(const Tev_AdvancedParticleEmitter& e,
                                                     const LiveStepFacts& facts, Particle& p) {
  const float s = facts.Scale;
  const FadedMotion motion =
      facts.SmokeFades ? FadeWithAge(e, p) : FadedMotion{e.MaximumSpeed, e.GlobalForce};
  p.Velocity += (motion.GlobalForce + p.SmokeForce + p.AttractorForce) * s * s;
  if (facts.SpeedLimit) LimitSpeed(p, motion.MaximumSpeed, s);
}

[[gnu::always_inline]] inline void Move(Tev_AdvancedParticleEmitter& e, Particle& p) {
  if (!e.PlacedBySmokeCollision) p.Position += p.Velocity;
  p.RenderPosition = p.Position;
  e.PlacedBySmokeCollision = false;
}

// Gathered now, applied at the next update's velocity integration.
[[gnu::always_inline]] inline void GatherAttractorForce(const Tev_AdvancedParticleEmitter& e,
                                                        const LiveStepFacts& facts, Particle& p) {
  p.AttractorForce = sim::kZeroVector;
  if (p.Sliding && facts.SlidingImmunity) return;
  if (e.Step.AttractorsTaken) {
    for (const Tev_AdvPE_Attractor::Field& field : e.Step.Attractors)
      p.AttractorForce += Tev_AdvPE_Attractor::ForceAt(field, p.RenderPosition);
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
[[gnu::always_inline]] inline void Face(const Tev_AdvancedParticleEmitter& e,
                                        const LiveStepFacts& facts, Particle& p) {
  if (p.Attached) return;
  if (facts.AlignToNormals && p.Sliding)
    p.LookAtPoint = p.Position + p.SurfaceNormal;
  else if (facts.LookAtLocal)
    p.LookAtPoint = p.Position + e.LookAt;
  else
    p.LookAtPoint = e.LookAt;
}

// The angle is handed to sine and cosine unconverted; it is reset (not wrapped) beyond +-360.
[[gnu::always_inline]] inline void Spin(const LiveStepFacts& facts, Particle& p) {
  if (!facts.Spin) return;
  p.SpinAngle += p.SpinSpeed * facts.Scale;
  if (p.SpinAngle > 360.0f || p.SpinAngle < -360.0f) p.SpinAngle = 0.0f;
  p.RenderSpinAngle = p.SpinAngle;
}

// The size and colour a record's earlier update in this step sampled. They depend only on the
// normalised age (and the size multiplier), which stays the same through a newborn's catch-up
// updates (ageing is per frame): those take them from here instead of sampling again.
struct SampledLook {
  bool HasSize = false;
  std::uint32_t SizeAge = 0;  // bits of the normalised age and of the multiplier sampled
  std::uint32_t SizeMultiplier = 0;
  float Size = 0.0f;
  bool HasColor = false;
  std::uint32_t ColorAge = 0;
  std::uint32_t Color = 0;
};

[[gnu::always_inline]] inline float SizeOf(const sim::MainEnvelopeViews& views, const Particle& p,
                                           SampledLook& look) {
  const auto age = std::bit_cast<std::uint32_t>(p.NormalizedAge);
  const auto multiplier = std::bit_cast<std::uint32_t>(p.SizeMultiplier);
  if (look.HasSize && look.SizeAge == age && look.SizeMultiplier == multiplier) return look.Size;
  look.HasSize = true;
  look.SizeAge = age;
  look.SizeMultiplier = multiplier;
  look.Size = sim::LiveSize(views, p);
  return look.Size;
}

[[gnu::always_inline]] inline std::uint32_t ColorOf(const sim::MainEnvelopeViews& views,
                                                    const Particle& p, SampledLook& look) {
  const auto age = std::bit_cast<std::uint32_t>(p.NormalizedAge);
  if (look.HasColor && look.ColorAge == age) return look.Color;
  look.HasColor = true;
  look.ColorAge = age;
  look.Color = sim::LiveColor(views, p.NormalizedAge);
  return look.Color;
}

// A record's only update in the step: nothing to reuse.
struct NoLook {};

[[gnu::always_inline]] inline float SizeOf(const sim::MainEnvelopeViews& views, const Particle& p,
                                           NoLook&) {
  return sim::LiveSize(views, p);
}

[[gnu::always_inline]] inline std::uint32_t ColorOf(const sim::MainEnvelopeViews& views,
                                                    const Particle& p, NoLook&) {
  return sim::LiveColor(views, p.NormalizedAge);
}

// The whole update of one live particle. Inline into the step's loop, with the step's facts and
// envelope views held there.
template <typename Look>
[[gnu::always_inline]] inline void UpdateLive(Tev_AdvancedParticleEmitter& e, int index,
                                              const LiveStepFacts& facts,
                                              const sim::MainEnvelopeViews& views, Look& look) {
  Particle& p = e.Particles[index];
  e.VerticesDirty = true;
  if (p.Age > p.Lifespan) {
    p.Active = false;
    return;
  }
  p.NormalizedAge = p.Age / p.Lifespan;
  // Only the smoke stage sets and clears the smoke force: with smoke off it must not keep
  // pushing with what it gathered last.
  if (!facts.Smoke) p.SmokeForce = sim::kZeroVector;
  IntegrateVelocity(e, facts, p);
  if (p.Sliding)
    e.ApplySizeEnvelope(p);
  else
    p.Size = SizeOf(views, p, look);
  // The collision may kill, attach or redirect the particle; the stages below run on regardless.
  if (facts.Collision) e.CollisionStage(p);
  if (facts.Smoke) e.SmokeStage(index);
  Move(e, p);
  GatherAttractorForce(e, facts, p);
  Face(e, facts, p);
  Spin(facts, p);
  if (facts.Colours) p.Color = ColorOf(views, p, look);
}

template <typename Look>
[[gnu::always_inline]] inline void Update(Tev_AdvancedParticleEmitter& e, int index,
                                          const LiveStepFacts& facts,
                                          const sim::MainEnvelopeViews& views, Look& look) {
  Particle& p = e.Particles[index];
  if (p.Attached && p.Active)
    e.UpdateAttachedParticle(p);
  else if (p.Active)
    UpdateLive(e, index, facts, views, look);
}

// Every record's pending updates in index order, each record first aged when the frame's ageing
// is left to this step.
template <bool kAgeing>
void UpdateAll(Tev_AdvancedParticleEmitter& e, float ageSeconds) {
  const LiveStepFacts facts = FactsOf(e);
  const sim::MainEnvelopeViews views = e.Step.Envelopes;
  int i = 0;
  try {
    for (; i < e.ParticleCount; ++i) {
      if (kAgeing) e.Particles[i].Age += ageSeconds;
      const std::int32_t steps = e.Particles[i].PendingSteps;
      if (steps == 1) {
        NoLook none;
        Update(e, i, facts, views, none);
      } else {
        SampledLook look;
        for (std::int32_t k = 0; k < steps; ++k) Update(e, i, facts, views, look);
      }
      e.Particles[i].PendingSteps = 1;
    }
  } catch (...) {
    // Every record still ages in its frame.
    if (kAgeing)
      for (++i; i < e.ParticleCount; ++i) e.Particles[i].Age += ageSeconds;
    throw;
  }
}

}  // namespace

void Tev_AdvancedParticleEmitter::UpdateParticles() {
  if (!Step.AgeingPending) return UpdateAll<false>(*this, 0.0f);
  Step.AgeingPending = false;
  UpdateAll<true>(*this, Step.AgeSeconds);
}

void Tev_AdvancedParticleEmitter::UpdateParticle(int index) {
  // Outside a logic step the update samples the envelopes linked now.
  if (!Step.EnvelopesTaken) Step.Envelopes = sim::TakeMainEnvelopeViews(*this);
  NoLook none;
  Update(*this, index, FactsOf(*this), Step.Envelopes, none);
}

void Tev_AdvancedParticleEmitter::UpdateLiveParticle(int index) {
  if (!Step.EnvelopesTaken) Step.Envelopes = sim::TakeMainEnvelopeViews(*this);
  NoLook none;
  UpdateLive(*this, index, FactsOf(*this), Step.Envelopes, none);
}
