#include <gtest/gtest.h>

#include <numbers>

#include "platform/d3dx_math.h"

namespace {

constexpr float kTolerance = 1e-5f;
constexpr float kHalfPi = std::numbers::pi_v<float> / 2.0f;

void ExpectNear(const D3DXVECTOR3& actual, const D3DXVECTOR3& expected) {
  EXPECT_NEAR(actual.x, expected.x, kTolerance);
  EXPECT_NEAR(actual.y, expected.y, kTolerance);
  EXPECT_NEAR(actual.z, expected.z, kTolerance);
}
void ExpectNear(const D3DXMATRIX& actual, const D3DXMATRIX& expected) {
  for (int i = 0; i < 16; ++i)
    EXPECT_NEAR(actual.m[i / 4][i % 4], expected.m[i / 4][i % 4], kTolerance) << "element " << i;
}
D3DXVECTOR3 TransformCoord(const D3DXVECTOR3& v, const D3DXMATRIX& m) {
  D3DXVECTOR3 out;
  return *D3DXVec3TransformCoord(&out, &v, &m);
}

TEST(D3DXVector, NormalizeKeepsZeroZeroAndCrossDotLengthFollowTheirDefinitions) {
  D3DXVECTOR3 v(3, 0, -4);
  EXPECT_EQ(*D3DXVec3Normalize(&v, &v), D3DXVECTOR3(0.6f, 0.0f, -0.8f));
  const D3DXVECTOR3 zero(0, 0, 0), a(1, 2, 3), b(4, 5, 6), c(2, 3, 6);
  EXPECT_EQ(*D3DXVec3Normalize(&v, &zero), zero);
  EXPECT_EQ(*D3DXVec3Cross(&v, &a, &b), D3DXVECTOR3(-3, 6, -3));
  EXPECT_EQ(D3DXVec3Dot(&a, &b), 32.0f);
  EXPECT_EQ(D3DXVec3Length(&c), 7.0f);
}

TEST(D3DXVector, TransformAppliesTheFourthRowAndOnlyCoordDividesByW) {
  D3DXMATRIX m;
  D3DXMatrixTranslation(&m, 10, 20, 30);
  m._44 = 2.0f;
  const D3DXVECTOR3 v(1, 2, 3);
  D3DXVECTOR4 out;
  D3DXVec3Transform(&out, &v, &m);
  ExpectNear(D3DXVECTOR3(out.x, out.y, out.z), D3DXVECTOR3(11, 22, 33));
  EXPECT_EQ(out.w, 2.0f);
  ExpectNear(TransformCoord(v, m), D3DXVECTOR3(5.5f, 11, 16.5f));
  D3DXVECTOR3 normal;
  ExpectNear(*D3DXVec3TransformNormal(&normal, &v, &m), v);  // no translation
}

// Quarter turns in D3DX's left-handed sense, and the product applying its left matrix first.
TEST(D3DXMatrix, RotationsTurnAxisToAxisAndYawPitchRollIsRollThenPitchThenYaw) {
  D3DXMATRIX x, y, z, ypr;
  ExpectNear(TransformCoord({0, 1, 0}, *D3DXMatrixRotationX(&x, kHalfPi)), {0, 0, 1});
  ExpectNear(TransformCoord({0, 0, 1}, *D3DXMatrixRotationY(&y, kHalfPi)), {1, 0, 0});
  ExpectNear(TransformCoord({1, 0, 0}, *D3DXMatrixRotationZ(&z, kHalfPi)), {0, 1, 0});
  ExpectNear(TransformCoord({1, 0, 0}, z * x), {0, 0, 1});
  D3DXMatrixRotationYawPitchRoll(&ypr, 0.3f, -0.7f, 1.1f);
  D3DXMatrixRotationZ(&z, 1.1f);
  D3DXMatrixRotationX(&x, -0.7f);
  D3DXMatrixRotationY(&y, 0.3f);
  ExpectNear(ypr, z * x * y);
}

TEST(D3DXMatrix, InverseRoundTripsAndASingularOneLeavesTheOutputAlone) {
  D3DXMATRIX rotate, move, scale, inverse, identity;
  D3DXMatrixIdentity(&identity);
  D3DXMatrixRotationYawPitchRoll(&rotate, 0.4f, 0.2f, -0.9f);
  D3DXMatrixTranslation(&move, 3, -7, 12);
  D3DXMatrixScaling(&scale, 2, 3, 4);
  const D3DXMATRIX m = scale * rotate * move;
  float determinant = 0;
  ASSERT_EQ(D3DXMatrixInverse(&inverse, &determinant, &m), &inverse);
  EXPECT_NEAR(determinant, 24.0f, 1e-4f);
  ExpectNear(m * inverse, identity);
  D3DXMatrixScaling(&scale, 1, 0, 1);
  inverse = identity;
  EXPECT_EQ(D3DXMatrixInverse(&inverse, &determinant, &scale), nullptr);
  EXPECT_EQ(determinant, 0.0f);
  EXPECT_EQ(inverse, identity);
}

TEST(D3DXCamera, LookAtAndPerspectiveFovLHBuildDirect3DsMatrices) {
  const D3DXVECTOR3 eye(10, 0, 0), at(0, 0, 0), up(0, 1, 0);
  D3DXMATRIX view, projection;
  // Looking down -x with y up, left-handed: right is +z.
  D3DXMatrixLookAtLH(&view, &eye, &at, &up);
  ExpectNear(view, D3DXMATRIX(0, 0, -1, 0, 0, 1, 0, 0, 1, 0, 0, 0, 0, 0, 10, 1));
  // Near (1) and far (101) map to depths 0 and 1.
  D3DXMatrixPerspectiveFovLH(&projection, kHalfPi, 2.0f, 1.0f, 101.0f);
  ExpectNear(projection, D3DXMATRIX(0.5f, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1.01f, 1, 0, 0, -1.01f, 0));
}

}  // namespace
