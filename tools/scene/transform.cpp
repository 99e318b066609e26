#include "tools/scene/transform.h"

#include <numbers>

namespace apescene {
namespace {

float Radians(float degrees) {
  return degrees * std::numbers::pi_v<float> / 180.0f;
}

}  // namespace

D3DXMATRIX ComposeTransform(const Transform& transform) {
  D3DXMATRIX scale, rotation, translation;
  D3DXMatrixScaling(&scale, transform.Scale.x, transform.Scale.y, transform.Scale.z);
  const D3DXVECTOR3& r = transform.RotationDegrees;
  if (transform.Order == Transform::RotationOrder::YawPitchRoll) {
    D3DXMatrixRotationYawPitchRoll(&rotation, Radians(r.x), Radians(r.y), Radians(r.z));
  } else {
    D3DXMATRIX rx, ry, rz;
    D3DXMatrixRotationX(&rx, Radians(r.x));
    D3DXMatrixRotationY(&ry, Radians(r.y));
    D3DXMatrixRotationZ(&rz, Radians(r.z));
    rotation = rx * ry * rz;
  }
  D3DXMatrixTranslation(&translation, transform.Translation.x, transform.Translation.y,
                        transform.Translation.z);
  return scale * rotation * translation;
}

}  // namespace apescene
