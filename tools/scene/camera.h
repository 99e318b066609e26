// The Direct3D view and projection transforms of a scene camera (left-handed, depth 0..1).
#pragma once

#include "platform/d3dx_math.h"
#include "tools/scene/scene.h"

namespace apescene {

D3DXMATRIX CameraView(const Camera& camera, double seconds);
D3DXMATRIX CameraProjection(const Camera& camera, int width, int height);

}  // namespace apescene
