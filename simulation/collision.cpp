// The collision stage of the live update: probe along this step's motion, report the hit, keep a
// sliding particle on its surface, and let a free one attach, slide, bounce or die by the rates.
#include <cstdint>

#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "simulation/vector_math.h"

namespace {

// Sticking particles rest this far above the surface.
constexpr float kAttachedClearance = 0.01f;

struct Hit {
  int Id;
  D3DXVECTOR3 Point;
  D3DXVECTOR3 Normal;  // unit length
  float Cosine;        // the probe's unit direction . Normal
};

void Report(Tev_AdvancedParticleEmitter& e, const Hit& hit) {
  auto& frame = e.Frame;
  // Id + 1, so that 0 keeps meaning no collision.
  if (frame.OutCollisionId)
    frame.OutCollisionId->SetValue(static_cast<float>(static_cast<std::int64_t>(hit.Id) + 1));
  if (frame.OutCollisionPosition) frame.OutCollisionPosition->SetVector(hit.Point);
  if (frame.OutCollisionNormal) frame.OutCollisionNormal->SetVector(hit.Normal);
}

// The look at the moment of contact, from each main envelope that is present.
void CaptureLook(const Tev_AdvancedParticleEmitter& e, Particle& p) {
  const float x = p.NormalizedAge;
  if (e.AlphaEnvelope) p.AttachAlpha = ColorComponent(e.AlphaEnvelope->GetEnvelopeValue(x));
  if (e.RedEnvelope) p.AttachRed = ColorComponent(e.RedEnvelope->GetEnvelopeValue(x));
  if (e.GreenEnvelope) p.AttachGreen = ColorComponent(e.GreenEnvelope->GetEnvelopeValue(x));
  if (e.BlueEnvelope) p.AttachBlue = ColorComponent(e.BlueEnvelope->GetEnvelopeValue(x));
  if (e.SizeEnvelope) p.AttachSize = e.SizeEnvelope->GetEnvelopeValue(x);
}

void StartSliding(const Tev_AdvancedParticleEmitter& e, Particle& p, const Hit& hit) {
  p.Sliding = true;
  p.Velocity = sim::kZeroVector;
  p.Position = hit.Point + hit.Normal * e.AttachedSlidingHeight;
  p.SurfaceNormal = hit.Normal;
}

void Stick(const Tev_AdvancedParticleEmitter& e, Particle& p, const Hit& hit) {
  p.Attached = true;
  p.Velocity = sim::kZeroVector;
  p.Position = hit.Point + hit.Normal * kAttachedClearance;
  p.RenderPosition = p.Position;
  p.Age = 0.0f;  // the attached life starts
  if (e.AlignToNormals) p.LookAtPoint = p.Position + hit.Normal;
  p.SpinSpeed = 0.0f;
}

// The mirror image of the direction about the surface, at half the speed.
void Bounce(Particle& p, const D3DXVECTOR3& direction, const Hit& hit) {
  const float speed = sim::Length(p.Velocity);
  p.Velocity = (direction - hit.Normal * (2.0f * hit.Cosine)) * speed * 0.5f;
  p.Bouncing = true;
}

}  // namespace

void Tev_AdvancedParticleEmitter::CollisionStage(Particle& p) {
  const D3DXVECTOR3 direction = sim::Unit(p.Velocity);
  const float reach = sim::Length(p.Velocity) + AttachedSlidingHeight;
  D3DXVECTOR3 ray = direction * reach;
  D3DXVECTOR3 origin = p.Position;
  Hit hit{};
  hit.Id = Frame.CollisionManager->GetClosestFrontFaceCollision(&origin, &ray, &hit.Point,
                                                                &hit.Normal, &hit.Cosine);
  if (hit.Id < 0) return;

  const auto drawSucceeds = [this](float rate) {
    return static_cast<float>(RandInt(0, 100)) * 0.01f < rate;
  };
  if (ReportCollisions && !p.Sliding && drawSucceeds(CollisionReportRate)) Report(*this, hit);

  if (p.Sliding) {
    // Stays on the surface: this step's motion continued in the surface plane.
    const D3DXVECTOR3 onSurface = sim::ProjectOntoPlane(p.Position + ray, hit.Point, hit.Normal);
    p.Position = onSurface + hit.Normal * AttachedSlidingHeight;
    p.Velocity = onSurface - hit.Point;
    p.SurfaceNormal = hit.Normal;
    return;
  }
  if (!CollisionResponse) return;

  if (drawSucceeds(AttachRate)) {
    CaptureLook(*this, p);
    if (drawSucceeds(AttachedSlideRate))
      StartSliding(*this, p, hit);
    else
      Stick(*this, p, hit);
  } else if (drawSucceeds(BounceRate)) {
    Bounce(p, direction, hit);
  } else {
    p.Active = false;
  }
}
