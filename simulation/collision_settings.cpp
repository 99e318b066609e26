// The collision settings members and the output links, re-read every working frame.
#include "host/link_channels.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"

namespace {

float ValueOr(const Tev_AdvancedParticleEmitter& e, int index, float absent) {
  Qen_ValueChannel* link = ValueLink(e, index);
  return link ? link->GetValue() : absent;
}

bool YesOrNo(const Tev_AdvancedParticleEmitter& e, int index) {
  Qen_ValueChannel* link = ValueLink(e, index);
  return link && IsYes(link->GetValue());
}

}  // namespace

void Tev_AdvancedParticleEmitter::ReadCollisionSettings() {
  AttachedSizeOffsetAdditive = YesOrNo(*this, kLinkAttachedSizeOffsetAdditive);
  BouncingReportCollisions = YesOrNo(*this, kLinkBouncingReportCollisions);
  SlidingAttractorImmunity = YesOrNo(*this, kLinkSlidingAttractorImmunity);
  AlignToNormals = YesOrNo(*this, kLinkAlignToNormals);
  AttachedSlideRate = ValueOr(*this, kLinkAttachedSlideRate, 0.0f);
  // Without an attached lifespan attached particles never end.
  AttachedLifespan = ValueOr(*this, kLinkAttachedLifespan, -1.0f);
  AttachedSlidingHeight = ValueOr(*this, kLinkAttachedSlidingHeight, 0.0f);

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
