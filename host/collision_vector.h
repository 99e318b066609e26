// A double-precision 3-vector for the geometry and force code: it works in double so that float
// inputs anywhere in their range neither overflow nor lose the precision the answers need, and
// converts back to float only through ToFiniteFloat.
#pragma once

#include <algorithm>
#include <cfloat>
#include <cmath>

#include "platform/d3dx_math.h"

struct Vec3d {
  double x = 0.0, y = 0.0, z = 0.0;

  Vec3d operator+(const Vec3d& v) const { return {x + v.x, y + v.y, z + v.z}; }
  Vec3d operator-(const Vec3d& v) const { return {x - v.x, y - v.y, z - v.z}; }
  Vec3d operator-() const { return {-x, -y, -z}; }
  Vec3d operator*(double f) const { return {x * f, y * f, z * f}; }
  Vec3d& operator+=(const Vec3d& v) { return *this = *this + v; }
};

inline Vec3d ToVec3d(const D3DXVECTOR3& v) {
  return {v.x, v.y, v.z};
}
inline double Dot(const Vec3d& a, const Vec3d& b) {
  return a.x * b.x + a.y * b.y + a.z * b.z;
}
inline Vec3d Cross(const Vec3d& a, const Vec3d& b) {
  return {a.y * b.z - a.z * b.y, a.z * b.x - a.x * b.z, a.x * b.y - a.y * b.x};
}
inline double Length(const Vec3d& v) {
  return std::sqrt(Dot(v, v));
}
inline bool IsFinite(const Vec3d& v) {
  return std::isfinite(v.x) && std::isfinite(v.y) && std::isfinite(v.z);
}
inline bool IsFinite(const D3DXVECTOR3& v) {
  return std::isfinite(v.x) && std::isfinite(v.y) && std::isfinite(v.z);
}

// The unit vector along v, or zero when v has no usable direction (zero or non-finite length).
inline Vec3d Normalized(const Vec3d& v) {
  const double length = Length(v);
  if (!(length > 0.0) || !std::isfinite(length)) return {};
  return v * (1.0 / length);
}

// A double as a float that is never NaN or infinite: NaN gives 0, values beyond the float range
// give its nearest end (a plain conversion of those would be undefined).
inline float ToFiniteFloat(double value) {
  if (std::isnan(value)) return 0.0f;
  return static_cast<float>(
      std::clamp(value, -static_cast<double>(FLT_MAX), static_cast<double>(FLT_MAX)));
}
inline D3DXVECTOR3 ToFiniteFloat(const Vec3d& v) {
  return {ToFiniteFloat(v.x), ToFiniteFloat(v.y), ToFiniteFloat(v.z)};
}

// The point (x, y, z, 1) times the row-convention matrix, divided by w (non-finite when w is 0).
inline Vec3d TransformCoord(const D3DXMATRIX& m, const Vec3d& p) {
  const double x = p.x * m._11 + p.y * m._21 + p.z * m._31 + m._41;
  const double y = p.x * m._12 + p.y * m._22 + p.z * m._32 + m._42;
  const double z = p.x * m._13 + p.y * m._23 + p.z * m._33 + m._43;
  const double w = p.x * m._14 + p.y * m._24 + p.z * m._34 + m._44;
  return Vec3d{x, y, z} * (1.0 / w);
}
