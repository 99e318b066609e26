// Placement of a thing in the scene: translation, rotation in degrees and scale, composed as
// scale, then rotation, then translation (row vectors: S * R * T).
#pragma once

#include "platform/d3dx_math.h"

namespace apescene {

struct Transform {
  enum class RotationOrder {
    Xyz,           // about x, then y, then z
    YawPitchRoll,  // roll about z, then pitch about x, then yaw about y
  };
  D3DXVECTOR3 Translation{0.0f, 0.0f, 0.0f};
  D3DXVECTOR3 RotationDegrees{0.0f, 0.0f, 0.0f};  // (x, y, z) or (yaw, pitch, roll)
  RotationOrder Order = RotationOrder::Xyz;
  D3DXVECTOR3 Scale{1.0f, 1.0f, 1.0f};
};

D3DXMATRIX ComposeTransform(const Transform& transform);

}  // namespace apescene
