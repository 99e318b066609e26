// "AdvPE_SmokeSettings": the settings of the emitter's smoke mode, fetched from this channel's own
// links.
//
// FetchAllSettings reads every field from its link (see Link below). A missing link gives the
// field's default as initialised here; so does a number link holding NaN or an infinity, which
// would otherwise spread into every particle's motion. Yes/no links are yes when greater than 0;
// the three "...Fades With Age?" fields hold 1 for yes and 0 for no. Linked envelopes are
// Initialize()d, as the emitter samples these without doing so.
#pragma once

#include "host/qen_channel.h"

class Tev_EnvelopeStorage;

class Tev_AdvPE_SmokeSettings : public Qen_Channel {
 public:
  // The child links, by index.
  enum Link : int {
    kLinkRepulsionEnvelope = 0,         // "Repulsion Envelope" (EnvelopeStorage)
    kLinkAttractionEnvelope = 1,        // "Attraction Envelope" (EnvelopeStorage)
    kLinkSurfaceRepulsionEnvelope = 2,  // "Surface Repulsion Envelope" (EnvelopeStorage)
    kLinkForceStrengthEnvelope = 3,     // "Force Strength Envelope" (EnvelopeStorage)
    kLinkCollisionProbeMinimum = 4,     // "Collision Probe Minimum" (Value)
    kLinkApproachSpeedFactor = 5,       // "Approach Speed Factor" (Value)
    kLinkCollisionEnabled = 6,          // "Collision Enabled?" (Value)
    kLinkContactSpeedFactor = 7,        // "Contact Speed Factor" (Value)
    kLinkRecheckCollision = 8,          // "Recheck Collision?" (Value)
    kLinkDrag = 9,                      // "Drag" (Value)
    kLinkDragFadesWithAge = 10,         // "Drag Fades With Age?" (Value)
    kLinkMaxSpeedFadesWithAge = 11,     // "Max Speed Fades With Age?" (Value)
    kLinkGlobalForceFadesWithAge = 12,  // "Global Force Fades With Age?" (Value)
    kLinkDebugColours = 13,             // "Debug Colours?" (Value)
    kLinkCount = 14,
  };

  // The defaults of the number fields, given when their links are missing.
  static constexpr float kDefaultCollisionProbeMinimum = 0.0f;
  static constexpr float kDefaultApproachSpeedFactor = 1.0f;
  static constexpr float kDefaultContactSpeedFactor = 1.0f;
  static constexpr float kDefaultDrag = 1.0f;  // no drag

  Tev_AdvPE_SmokeSettings();
  ChannelType GetChannelType() override;
  void DoDependencyInit(Qen_List* list) override;  // the link types

  // Fills the fields below from the links; a missing link gives the field's default.
  void FetchAllSettings();

  Tev_EnvelopeStorage* RepulsionEnvelope = nullptr;
  Tev_EnvelopeStorage* AttractionEnvelope = nullptr;
  Tev_EnvelopeStorage* SurfaceRepulsionEnvelope = nullptr;
  Tev_EnvelopeStorage* ForceStrengthEnvelope = nullptr;
  float CollisionProbeMinimum = kDefaultCollisionProbeMinimum;
  float ApproachSpeedFactor = kDefaultApproachSpeedFactor;
  bool CollisionEnabled = false;
  float ContactSpeedFactor = kDefaultContactSpeedFactor;
  bool RecheckCollision = false;
  float Drag = kDefaultDrag;  // 1 applies no drag
  float DragFadesWithAge = 0.0f;
  float MaxSpeedFadesWithAge = 0.0f;
  float GlobalForceFadesWithAge = 0.0f;
  bool DebugColours = false;
};
