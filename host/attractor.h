// "AdvPE_Attractor": a point force field for particles.
#pragma once

#include "host/qen_channel.h"
#include "platform/d3dx_math.h"

class Tev_AdvPE_Attractor : public Qen_Channel {
 public:
  enum class Falloff { InverseSquare, Linear };

  Tev_AdvPE_Attractor();
  ChannelType GetChannelType() override;

  // The force at `position`; finite for every finite input.
  D3DXVECTOR3 GetForceAtPosition(D3DXVECTOR3 position);

  // Host API.
  D3DXVECTOR3 Position{0.0f, 0.0f, 0.0f};
  float Strength = 1.0f;  // negative repels
  Falloff FalloffMode = Falloff::InverseSquare;
  float MinimumRadius = 0.1f;  // inverse-square: caps the force near the centre
  float Radius = 1.0f;         // linear: force reaches zero here
  float VortexStrength = 0.0f;
  D3DXVECTOR3 VortexAxis{0.0f, 1.0f, 0.0f};
};
