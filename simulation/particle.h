// One particle of the emitter's pool: a plain value record.
#pragma once

#include <cstdint>

#include "platform/d3dx_math.h"

struct Particle {
  float Lifespan = 0.0f;       // seconds of free flight
  float NormalizedAge = 0.0f;  // Age / Lifespan: where the lifetime envelopes are read
  float Size = 0.0f;           // full edge length (quads) or point size
  float SizeMultiplier = 0.0f;
  float Age = 0.0f;  // seconds since birth, restarted when the particle attaches
  bool Active = false;
  std::uint32_t Color = 0;  // A8R8G8B8
  bool Attached = false;
  bool Sliding = false;
  float SpinSpeed = 0.0f;         // radians per logic step
  float SpinAngle = 0.0f;         // radians after the last logic step, reset outside +-360
  float RenderSpinAngle = 0.0f;   // radians, drawn this frame
  std::int32_t PendingSteps = 1;  // updates to run in the next logic step
  D3DXVECTOR3 RenderPosition{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 Velocity{0.0f, 0.0f, 0.0f};  // distance per logic step
  D3DXVECTOR3 Position{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 LookAtPoint{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 SurfaceNormal{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 SmokeForce{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 AttractorForce{0.0f, 0.0f, 0.0f};
  bool Bouncing = false;
  std::int32_t AttachAlpha = 0;
  std::int32_t AttachRed = 0;
  std::int32_t AttachGreen = 0;
  std::int32_t AttachBlue = 0;
  float AttachSize = 0.0f;
};
