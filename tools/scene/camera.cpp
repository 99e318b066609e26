#include "tools/scene/camera.h"

#include <numbers>

namespace apescene {

D3DXMATRIX CameraView(const Camera& camera, double seconds) {
  const D3DXVECTOR3 eye = camera.Eye.Sample(seconds);
  const D3DXVECTOR3 target = camera.Target.Sample(seconds);
  D3DXMATRIX view;
  D3DXMatrixLookAtLH(&view, &eye, &target, &camera.Up);
  return view;
}

D3DXMATRIX CameraProjection(const Camera& camera, int width, int height) {
  D3DXMATRIX projection;
  D3DXMatrixPerspectiveFovLH(&projection, camera.FovDegrees * std::numbers::pi_v<float> / 180.0f,
                             static_cast<float>(width) / static_cast<float>(height), camera.Near,
                             camera.Far);
  return projection;
}

}  // namespace apescene
