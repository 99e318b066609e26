// "AdvPE_Attractor": a point force field for particles.
//
// The force at a point p, with d = Position - p and r = |d|:
//   radial  = Strength * f(r) * d / r                       (towards Position; negative repels)
//   swirl   = VortexStrength * f(r) * unit(VortexAxis x (p - Position))
//   f(r)    = 1 / max(r, MinimumRadius)^2                    (InverseSquare)
//           = max(0, 1 - r / Radius), 0 when Radius <= 0      (Linear)
// At Position itself, and on the vortex axis, the direction is zero and so is that part of the
// force. The result is always finite: NaN parts become 0 and the components are kept within the
// float range.
//
// Linked values override the public fields: every GetForceAtPosition reads the links afresh, so
// a host may change them at any time. The fields themselves are never written by the links.
#pragma once

#include "host/qen_channel.h"
#include "platform/d3dx_math.h"

class Tev_AdvPE_Attractor : public Qen_Channel {
 public:
  enum class Falloff { InverseSquare, Linear };

  // The child links, by index.
  enum Link : int {
    kLinkPosition = 0,        // "Position" (Value Vector)
    kLinkStrength = 1,        // "Strength" (Value)
    kLinkLinearFalloff = 2,   // "Linear Falloff?" (Value): yes selects Falloff::Linear
    kLinkMinimumRadius = 3,   // "Minimum Radius" (Value)
    kLinkRadius = 4,          // "Radius" (Value)
    kLinkVortexStrength = 5,  // "Vortex Strength" (Value)
    kLinkVortexAxis = 6,      // "Vortex Axis" (Value Vector)
    kLinkCount = 7,
  };

  Tev_AdvPE_Attractor();
  ChannelType GetChannelType() override;
  void DoDependencyInit(Qen_List* list) override;  // the link types

  // The force at `position`; finite for every finite input, zero for a non-finite one.
  D3DXVECTOR3 GetForceAtPosition(D3DXVECTOR3 position);

  // The field's settings as the links and fields give them now: what GetForceAtPosition reads
  // afresh on every call. A caller evaluating many points while nothing can change the links
  // (a logic step) takes them once and gets the same forces from ForceAt.
  struct Field {
    bool Linear = false;
    D3DXVECTOR3 Centre{0.0f, 0.0f, 0.0f};
    D3DXVECTOR3 Axis{0.0f, 1.0f, 0.0f};
    float Strength = 0.0f;
    float VortexStrength = 0.0f;
    float MinimumRadius = 0.0f;
    float Radius = 0.0f;
  };
  Field TakeField();
  static D3DXVECTOR3 ForceAt(const Field& field, D3DXVECTOR3 position);

  // Host API.
  D3DXVECTOR3 Position{0.0f, 0.0f, 0.0f};
  float Strength = 1.0f;  // negative repels
  Falloff FalloffMode = Falloff::InverseSquare;
  float MinimumRadius = 0.1f;  // inverse-square: caps the force near the centre
  float Radius = 1.0f;         // linear: force reaches zero here
  float VortexStrength = 0.0f;
  D3DXVECTOR3 VortexAxis{0.0f, 1.0f, 0.0f};
};
