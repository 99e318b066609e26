// D3DX vector and matrix types with the arithmetic D3DX defines for them, and the helpers the
// host and plug-ins call. Row-vector convention: a point is the row (x, y, z, 1) times a matrix,
// so translation lives in the fourth row.
#pragma once

#include "platform/windows_types.h"

struct D3DXVECTOR2 {
  float x, y;
  D3DXVECTOR2() = default;
  constexpr D3DXVECTOR2(float x_, float y_) : x(x_), y(y_) {}
  friend constexpr bool operator==(const D3DXVECTOR2& a, const D3DXVECTOR2& b) {
    return a.x == b.x && a.y == b.y;
  }
};

struct D3DXVECTOR3 {
  float x, y, z;
  D3DXVECTOR3() = default;
  constexpr D3DXVECTOR3(float x_, float y_, float z_) : x(x_), y(y_), z(z_) {}

  D3DXVECTOR3& operator+=(const D3DXVECTOR3& v) {
    x += v.x, y += v.y, z += v.z;
    return *this;
  }
  D3DXVECTOR3& operator-=(const D3DXVECTOR3& v) {
    x -= v.x, y -= v.y, z -= v.z;
    return *this;
  }
  D3DXVECTOR3& operator*=(float f) {
    x *= f, y *= f, z *= f;
    return *this;
  }
  // As D3DX: one reciprocal, then three products.
  D3DXVECTOR3& operator/=(float f) {
    const float inv = 1.0f / f;
    x *= inv, y *= inv, z *= inv;
    return *this;
  }
  D3DXVECTOR3 operator+() const { return *this; }
  D3DXVECTOR3 operator-() const { return {-x, -y, -z}; }
  D3DXVECTOR3 operator+(const D3DXVECTOR3& v) const { return {x + v.x, y + v.y, z + v.z}; }
  D3DXVECTOR3 operator-(const D3DXVECTOR3& v) const { return {x - v.x, y - v.y, z - v.z}; }
  D3DXVECTOR3 operator*(float f) const { return {x * f, y * f, z * f}; }
  D3DXVECTOR3 operator/(float f) const {
    const float inv = 1.0f / f;
    return {x * inv, y * inv, z * inv};
  }
  friend D3DXVECTOR3 operator*(float f, const D3DXVECTOR3& v) { return {f * v.x, f * v.y, f * v.z}; }
  friend constexpr bool operator==(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
    return a.x == b.x && a.y == b.y && a.z == b.z;
  }
};
static_assert(sizeof(D3DXVECTOR3) == 12);

struct D3DXVECTOR4 {
  float x, y, z, w;
  D3DXVECTOR4() = default;
  constexpr D3DXVECTOR4(float x_, float y_, float z_, float w_) : x(x_), y(y_), z(z_), w(w_) {}
};

struct D3DMATRIX {
  union {
    struct {
      float _11, _12, _13, _14;
      float _21, _22, _23, _24;
      float _31, _32, _33, _34;
      float _41, _42, _43, _44;
    };
    float m[4][4];
  };
};

struct D3DXMATRIX : D3DMATRIX {
  D3DXMATRIX() = default;
  D3DXMATRIX(float m11, float m12, float m13, float m14, float m21, float m22, float m23,
             float m24, float m31, float m32, float m33, float m34, float m41, float m42,
             float m43, float m44);
  D3DXMATRIX operator*(const D3DXMATRIX& other) const;
  friend bool operator==(const D3DXMATRIX& a, const D3DXMATRIX& b);
};
static_assert(sizeof(D3DXMATRIX) == 64);

// A zero vector stays zero.
D3DXVECTOR3* D3DXVec3Normalize(D3DXVECTOR3* out, const D3DXVECTOR3* v);
// The row (x, y, z, 1) times the matrix; no division by w.
D3DXVECTOR4* D3DXVec3Transform(D3DXVECTOR4* out, const D3DXVECTOR3* v, const D3DXMATRIX* m);
// The point (x, y, z, 1) times the matrix, divided by w.
D3DXVECTOR3* D3DXVec3TransformCoord(D3DXVECTOR3* out, const D3DXVECTOR3* v, const D3DXMATRIX* m);
// The direction (x, y, z, 0) times the matrix.
D3DXVECTOR3* D3DXVec3TransformNormal(D3DXVECTOR3* out, const D3DXVECTOR3* v,
                                     const D3DXMATRIX* m);
D3DXVECTOR3* D3DXVec3Cross(D3DXVECTOR3* out, const D3DXVECTOR3* a, const D3DXVECTOR3* b);
float D3DXVec3Dot(const D3DXVECTOR3* a, const D3DXVECTOR3* b);
float D3DXVec3Length(const D3DXVECTOR3* v);

D3DXMATRIX* D3DXMatrixIdentity(D3DXMATRIX* out);
D3DXMATRIX* D3DXMatrixMultiply(D3DXMATRIX* out, const D3DXMATRIX* a, const D3DXMATRIX* b);
D3DXMATRIX* D3DXMatrixTranslation(D3DXMATRIX* out, float x, float y, float z);
D3DXMATRIX* D3DXMatrixScaling(D3DXMATRIX* out, float x, float y, float z);
D3DXMATRIX* D3DXMatrixRotationX(D3DXMATRIX* out, float radians);
D3DXMATRIX* D3DXMatrixRotationY(D3DXMATRIX* out, float radians);
D3DXMATRIX* D3DXMatrixRotationZ(D3DXMATRIX* out, float radians);
D3DXMATRIX* D3DXMatrixRotationYawPitchRoll(D3DXMATRIX* out, float yaw, float pitch, float roll);
// Null when the matrix cannot be inverted.
D3DXMATRIX* D3DXMatrixInverse(D3DXMATRIX* out, float* determinant, const D3DXMATRIX* m);
D3DXMATRIX* D3DXMatrixLookAtLH(D3DXMATRIX* out, const D3DXVECTOR3* eye, const D3DXVECTOR3* at,
                               const D3DXVECTOR3* up);
D3DXMATRIX* D3DXMatrixPerspectiveFovLH(D3DXMATRIX* out, float fovy, float aspect, float zn,
                                       float zf);
