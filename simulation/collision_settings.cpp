// The collision settings members and the output links, re-read every working frame. The link
// reading stage calls these at their places in its order.
#include "host/link_channels.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"

void Tev_AdvancedParticleEmitter::ReadCollisionFlags() {
  BouncingReportCollisions = YesOrNo(*this, kLinkBouncingReportCollisions);
  SlidingAttractorImmunity = YesOrNo(*this, kLinkSlidingAttractorImmunity);
  AlignToNormals = YesOrNo(*this, kLinkAlignToNormals);
}

void Tev_AdvancedParticleEmitter::ReadAttachedSettings() {
  AttachedSlideRate = ValueOr(*this, kLinkAttachedSlideRate, 0.0f);
  // Without an attached lifespan attached particles never end.
  AttachedLifespan = ValueOr(*this, kLinkAttachedLifespan, -1.0f);
  AttachedSlidingHeight = ValueOr(*this, kLinkAttachedSlidingHeight, 0.0f);
}

void Tev_AdvancedParticleEmitter::ReadCollisionOutcomes() {
  ReportCollisions = false;
  if (Qen_ValueChannel* report = ValueLink(*this, kLinkCollisionReportRate)) {
    CollisionReportRate = report->GetValue();
    ReportCollisions = true;
  }

  // A frame without a report leaves the ID at 0; position and normal keep their last values.
  Frame.OutCollisionId = ValueLink(*this, kLinkOutCollisionId);
  Frame.OutCollisionPosition = VectorLink(*this, kLinkOutCollisionPosition);
  Frame.OutCollisionNormal = VectorLink(*this, kLinkOutCollisionNormal);
  if (Frame.OutCollisionId) Frame.OutCollisionId->SetValue(0.0f);

  Qen_ValueChannel* attach = ValueLink(*this, kLinkAttachRate);
  Qen_ValueChannel* bounce = ValueLink(*this, kLinkBounceRate);
  AttachRate = attach ? attach->GetValue() : 0.0f;
  BounceRate = bounce ? bounce->GetValue() : 0.0f;
  CollisionResponse = attach || bounce;
}
