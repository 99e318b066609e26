// Size and colour over a particle's life, and the whole update of a particle stuck to a surface.
#include "host/envelope_storage.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "simulation/envelope_sampling.h"

namespace {

float NotNegative(float size) {
  return size < 0.0f ? 0.0f : size;
}

float ValueOr(Tev_EnvelopeStorage* envelope, float x, float absent) {
  return envelope ? envelope->GetEnvelopeValue(x) : absent;
}

// A captured colour byte scaled by an offset envelope (when present) at the attached fraction u.
std::int32_t ScaledByte(std::int32_t captured, Tev_EnvelopeStorage* envelope, float u) {
  if (!envelope) return captured;
  return TruncateToInt(static_cast<float>(captured) * envelope->GetEnvelopeValue(u));
}

}  // namespace

void Tev_AdvancedParticleEmitter::ApplySizeEnvelope(Particle& p) {
  if (!p.Sliding) {
    p.Size = sim::LiveSize(Step.Envelopes, p);
    return;
  }
  // Sliding: the envelope is an offset added to the multiplier and the size captured on contact.
  const float offset = ValueOr(Frame.SlidingSizeOffsetEnvelope, p.NormalizedAge, 0.0f);
  p.Size = NotNegative(offset + p.SizeMultiplier + p.AttachSize);
}

void Tev_AdvancedParticleEmitter::ApplyColorEnvelopes(Particle& p) {
  // Smoke debug colours are written by the smoke collision instead.
  if (SmokeEnabled && Frame.SmokeSettings->DebugColours) return;
  p.Color = sim::LiveColor(Step.Envelopes, p.NormalizedAge);
}

void Tev_AdvancedParticleEmitter::UpdateAttachedParticle(Particle& p) {
  VerticesDirty = true;
  // Without an attached lifespan the particle keeps its look until the pool is rebuilt.
  if (AttachedLifespan <= 0.0f) return;
  if (p.Age > AttachedLifespan) {
    p.Active = false;
    p.Attached = false;
    return;
  }
  const float u = p.Age / AttachedLifespan;

  if (!AlignToNormals) p.LookAtPoint = LookAtLocal ? p.Position + LookAt : LookAt;

  const float base = p.SizeMultiplier * p.AttachSize;
  float size = base;
  if (Frame.AttachedSizeOffsetEnvelope) {
    const float offset = Frame.AttachedSizeOffsetEnvelope->GetEnvelopeValue(u);
    size = AttachedSizeOffsetAdditive ? base + offset : base * offset;
  }
  p.Size = NotNegative(size);

  p.Color = sim::PackColorClamped(ScaledByte(p.AttachAlpha, Frame.AttachedAlphaOffsetEnvelope, u),
                                  ScaledByte(p.AttachRed, Frame.AttachedRedOffsetEnvelope, u),
                                  ScaledByte(p.AttachGreen, Frame.AttachedGreenOffsetEnvelope, u),
                                  ScaledByte(p.AttachBlue, Frame.AttachedBlueOffsetEnvelope, u));
}
