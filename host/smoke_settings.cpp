#include "host/smoke_settings.h"

#include <cmath>

#include "host/envelope_storage.h"
#include "host/link_values.h"
#include "host/sibling_links.h"
#include "host/type_guids.h"

namespace {

constexpr const char* kEnvelope = "EnvelopeStorage";
constexpr const char* kValue = "Value";

constexpr SiblingLink kLinks[Tev_AdvPE_SmokeSettings::kLinkCount] = {
    {"Repulsion Envelope", kEnvelope, kEnvelopeStorageGuid},
    {"Attraction Envelope", kEnvelope, kEnvelopeStorageGuid},
    {"Surface Repulsion Envelope", kEnvelope, kEnvelopeStorageGuid},
    {"Force Strength Envelope", kEnvelope, kEnvelopeStorageGuid},
    {"Collision Probe Minimum", kValue, kValueGuid},
    {"Approach Speed Factor", kValue, kValueGuid},
    {"Collision Enabled?", kValue, kValueGuid},
    {"Contact Speed Factor", kValue, kValueGuid},
    {"Recheck Collision?", kValue, kValueGuid},
    {"Drag", kValue, kValueGuid},
    {"Drag Fades With Age?", kValue, kValueGuid},
    {"Max Speed Fades With Age?", kValue, kValueGuid},
    {"Global Force Fades With Age?", kValue, kValueGuid},
    {"Debug Colours?", kValue, kValueGuid},
};

// The linked envelope, made ready for sampling, or null.
Tev_EnvelopeStorage* EnvelopeLink(const Qen_Channel& owner, int index) {
  Tev_EnvelopeStorage* envelope = LinkAs<Tev_EnvelopeStorage>(owner, index);
  if (envelope) envelope->Initialize();
  return envelope;
}

// The linked number, or `fallback` when the link is missing or holds a non-finite value.
float NumberOr(const Qen_Channel& owner, int index, float fallback) {
  Qen_ValueChannel* link = ValueLink(owner, index);
  if (!link) return fallback;
  const float value = link->GetValue();
  return std::isfinite(value) ? value : fallback;
}

float YesOrNoAsNumber(const Qen_Channel& owner, int index) {
  return YesOrNo(owner, index) ? 1.0f : 0.0f;
}

}  // namespace

Tev_AdvPE_SmokeSettings::Tev_AdvPE_SmokeSettings() {
  DeclareSiblingLinks(*this, kLinks, kLinkCount);
}

void Tev_AdvPE_SmokeSettings::FetchAllSettings() {
  RepulsionEnvelope = EnvelopeLink(*this, kLinkRepulsionEnvelope);
  AttractionEnvelope = EnvelopeLink(*this, kLinkAttractionEnvelope);
  SurfaceRepulsionEnvelope = EnvelopeLink(*this, kLinkSurfaceRepulsionEnvelope);
  ForceStrengthEnvelope = EnvelopeLink(*this, kLinkForceStrengthEnvelope);
  CollisionProbeMinimum =
      NumberOr(*this, kLinkCollisionProbeMinimum, kDefaultCollisionProbeMinimum);
  ApproachSpeedFactor = NumberOr(*this, kLinkApproachSpeedFactor, kDefaultApproachSpeedFactor);
  CollisionEnabled = YesOrNo(*this, kLinkCollisionEnabled);
  ContactSpeedFactor = NumberOr(*this, kLinkContactSpeedFactor, kDefaultContactSpeedFactor);
  RecheckCollision = YesOrNo(*this, kLinkRecheckCollision);
  Drag = NumberOr(*this, kLinkDrag, kDefaultDrag);
  DragFadesWithAge = YesOrNoAsNumber(*this, kLinkDragFadesWithAge);
  MaxSpeedFadesWithAge = YesOrNoAsNumber(*this, kLinkMaxSpeedFadesWithAge);
  GlobalForceFadesWithAge = YesOrNoAsNumber(*this, kLinkGlobalForceFadesWithAge);
  DebugColours = YesOrNo(*this, kLinkDebugColours);
}

void Tev_AdvPE_SmokeSettings::DoDependencyInit(Qen_List* list) {
  AddChannelGuidDepend(kEnvelopeStorageGuid, list);
  AddChannelGuidDepend(kValueGuid, list);
}
