// "AdvPE_SmokeSettings": the settings of the emitter's smoke mode, fetched from this channel's own
// links.
#pragma once

#include "host/qen_channel.h"

class Tev_EnvelopeStorage;

class Tev_AdvPE_SmokeSettings : public Qen_Channel {
 public:
  Tev_AdvPE_SmokeSettings();
  ChannelType GetChannelType() override;

  // Fills the fields below from the links; a missing link gives the field's default.
  void FetchAllSettings();

  Tev_EnvelopeStorage* RepulsionEnvelope = nullptr;
  Tev_EnvelopeStorage* AttractionEnvelope = nullptr;
  Tev_EnvelopeStorage* SurfaceRepulsionEnvelope = nullptr;
  Tev_EnvelopeStorage* ForceStrengthEnvelope = nullptr;
  float CollisionProbeMinimum = 0.0f;
  float ApproachSpeedFactor = 1.0f;
  bool CollisionEnabled = false;
  float ContactSpeedFactor = 1.0f;
  bool RecheckCollision = false;
  float Drag = 1.0f;  // 1 applies no drag
  float DragFadesWithAge = 0.0f;
  float MaxSpeedFadesWithAge = 0.0f;
  float GlobalForceFadesWithAge = 0.0f;
  bool DebugColours = false;
};
