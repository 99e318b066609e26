// Three-component float32 vector helpers of the particle arithmetic, written out per component so
// that every result is the float32 result the simulation is defined by.
#pragma once

#include <cmath>

#include "platform/d3dx_math.h"

namespace sim {

inline constexpr D3DXVECTOR3 kZeroVector{0.0f, 0.0f, 0.0f};

// The sum of the squared components, added in x, y, z order.
inline float SquaredLength(const D3DXVECTOR3& v) {
  return v.x * v.x + v.y * v.y + v.z * v.z;
}

// Square root of the sum of the squared components.
inline float Length(const D3DXVECTOR3& v) {
  return std::sqrt(SquaredLength(v));
}

inline float Dot(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return a.x * b.x + a.y * b.y + a.z * b.z;
}

inline bool IsFinite(const D3DXVECTOR3& v) {
  return std::isfinite(v.x) && std::isfinite(v.y) && std::isfinite(v.z);
}

// D3DXVec3Normalize, inline for the per-particle loops: each component divided by the length,
// and a zero vector stays zero.
inline D3DXVECTOR3 Unit(const D3DXVECTOR3& v) {
  const float length = Length(v);
  if (length == 0.0f) return kZeroVector;
  return {v.x / length, v.y / length, v.z / length};
}

// D3DXVec3Cross, inline: a x b with the operands in the order given.
inline D3DXVECTOR3 Cross(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}

// `point` moved along the unit `normal` onto the plane through `onPlane`.
inline D3DXVECTOR3 ProjectOntoPlane(const D3DXVECTOR3& point, const D3DXVECTOR3& onPlane,
                                    const D3DXVECTOR3& normal) {
  const float distance = Dot(normal, point) - Dot(normal, onPlane);
  return point - normal * distance;
}

}  // namespace sim
