#include <gtest/gtest.h>

#include <cmath>
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

void ExpectNear(const D3DXVECTOR4& actual, const D3DXVECTOR4& expected) {
  EXPECT_NEAR(actual.x, expected.x, kTolerance);
  EXPECT_NEAR(actual.y, expected.y, kTolerance);
  EXPECT_NEAR(actual.z, expected.z, kTolerance);
  EXPECT_NEAR(actual.w, expected.w, kTolerance);
}

void ExpectNear(const D3DXMATRIX& actual, const D3DXMATRIX& expected) {
  for (int r = 0; r < 4; ++r)
    for (int c = 0; c < 4; ++c)
      EXPECT_NEAR(actual.m[r][c], expected.m[r][c], kTolerance) << "row " << r << " col " << c;
}

D3DXVECTOR3 TransformCoord(const D3DXVECTOR3& v, const D3DXMATRIX& m) {
  D3DXVECTOR3 out;
  D3DXVec3TransformCoord(&out, &v, &m);
  return out;
}

D3DXMATRIX Identity() {
  D3DXMATRIX m;
  return *D3DXMatrixIdentity(&m);
}

TEST(D3DXVector, NormalizeKeepsAZeroVectorZero) {
  const D3DXVECTOR3 zero(0, 0, 0);
  D3DXVECTOR3 out(9, 9, 9);
  EXPECT_EQ(D3DXVec3Normalize(&out, &zero), &out);
  EXPECT_EQ(out, zero);
}

TEST(D3DXVector, NormalizeDividesByTheLengthInPlace) {
  D3DXVECTOR3 v(3, 0, -4);
  D3DXVec3Normalize(&v, &v);
  EXPECT_EQ(v, D3DXVECTOR3(3.0f / 5.0f, 0.0f, -4.0f / 5.0f));
}

TEST(D3DXVector, CrossDotAndLength) {
  const D3DXVECTOR3 a(1, 2, 3), b(4, 5, 6), x(1, 0, 0), y(0, 1, 0);
  D3DXVECTOR3 out;
  EXPECT_EQ(*D3DXVec3Cross(&out, &a, &b), D3DXVECTOR3(-3, 6, -3));
  EXPECT_EQ(*D3DXVec3Cross(&out, &x, &y), D3DXVECTOR3(0, 0, 1));
  EXPECT_EQ(D3DXVec3Dot(&a, &b), 32.0f);
  const D3DXVECTOR3 c(2, 3, 6);
  EXPECT_EQ(D3DXVec3Length(&c), 7.0f);
}

TEST(D3DXVector, TransformAppliesTheFourthRowWithoutDividingByW) {
  D3DXMATRIX m;
  D3DXMatrixTranslation(&m, 10, 20, 30);
  m._44 = 2.0f;  // w must come out 2 and x, y, z stay undivided
  const D3DXVECTOR3 v(1, 2, 3);
  D3DXVECTOR4 out;
  ExpectNear(*D3DXVec3Transform(&out, &v, &m), D3DXVECTOR4(11, 22, 33, 2));
  ExpectNear(TransformCoord(v, m), D3DXVECTOR3(5.5f, 11, 16.5f));
  D3DXVECTOR3 normal;
  ExpectNear(*D3DXVec3TransformNormal(&normal, &v, &m), v);
}

struct RotationCase {
  const char* what;
  D3DXMATRIX* (*rotate)(D3DXMATRIX*, float);
  D3DXVECTOR3 from, to;
};

class D3DXRotation : public testing::TestWithParam<RotationCase> {};

// A quarter turn about each axis, in the left-handed sense D3DX uses.
TEST_P(D3DXRotation, QuarterTurnMapsAxisToAxis) {
  D3DXMATRIX m;
  GetParam().rotate(&m, kHalfPi);
  ExpectNear(TransformCoord(GetParam().from, m), GetParam().to);
}

INSTANTIATE_TEST_SUITE_P(
    Axes, D3DXRotation,
    testing::Values(RotationCase{"x", D3DXMatrixRotationX, {0, 1, 0}, {0, 0, 1}},
                    RotationCase{"y", D3DXMatrixRotationY, {0, 0, 1}, {1, 0, 0}},
                    RotationCase{"z", D3DXMatrixRotationZ, {1, 0, 0}, {0, 1, 0}}),
    [](const testing::TestParamInfo<RotationCase>& info) { return std::string(info.param.what); });

TEST(D3DXMatrix, YawPitchRollIsRollThenPitchThenYaw) {
  D3DXMATRIX ypr, z, x, y;
  D3DXMatrixRotationYawPitchRoll(&ypr, 0.3f, -0.7f, 1.1f);
  D3DXMatrixRotationZ(&z, 1.1f);
  D3DXMatrixRotationX(&x, -0.7f);
  D3DXMatrixRotationY(&y, 0.3f);
  ExpectNear(ypr, z * x * y);
}

TEST(D3DXMatrix, ConstructorTakesRowsInOrder) {
  const D3DXMATRIX m(1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16);
  EXPECT_EQ(m._12, 2.0f);
  EXPECT_EQ(m._21, 5.0f);
  EXPECT_EQ(m.m[3][0], 13.0f);
  EXPECT_EQ(m._44, 16.0f);
}

TEST(D3DXMatrix, EqualityComparesEveryElement) {
  const D3DXMATRIX base(1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 14, 15, 16);
  EXPECT_TRUE(base == base);
  for (int i = 0; i < 16; ++i) {
    D3DXMATRIX other = base;
    other.m[i / 4][i % 4] += 0.5f;
    EXPECT_FALSE(other == base) << "element " << i;
  }
}

TEST(D3DXMatrix, ProductAppliesTheLeftMatrixFirst) {
  D3DXMATRIX move, scale;
  D3DXMatrixTranslation(&move, 1, 0, 0);
  D3DXMatrixScaling(&scale, 2, 3, 4);
  const D3DXVECTOR3 origin(0, 0, 0);
  ExpectNear(TransformCoord(origin, move * scale), D3DXVECTOR3(2, 0, 0));
  ExpectNear(TransformCoord(origin, scale * move), D3DXVECTOR3(1, 0, 0));

  D3DXMATRIX product = move;  // the output may be an input
  D3DXMatrixMultiply(&product, &product, &scale);
  EXPECT_EQ(product, move * scale);
}

TEST(D3DXMatrix, InverseRoundTrips) {
  D3DXMATRIX rotate, move, scale;
  D3DXMatrixRotationYawPitchRoll(&rotate, 0.4f, 0.2f, -0.9f);
  D3DXMatrixTranslation(&move, 3, -7, 12);
  D3DXMatrixScaling(&scale, 2, 3, 4);
  const D3DXMATRIX m = scale * rotate * move;
  D3DXMATRIX inverse;
  float determinant = 0;
  ASSERT_EQ(D3DXMatrixInverse(&inverse, &determinant, &m), &inverse);
  EXPECT_NEAR(determinant, 24.0f, 1e-4f);
  ExpectNear(m * inverse, Identity());
  ExpectNear(inverse * m, Identity());
}

TEST(D3DXMatrix, SingularInverseIsNullAndLeavesTheOutputAlone) {
  D3DXMATRIX flat;
  D3DXMatrixScaling(&flat, 1, 0, 1);
  D3DXMATRIX out = Identity();
  float determinant = 5;
  EXPECT_EQ(D3DXMatrixInverse(&out, &determinant, &flat), nullptr);
  EXPECT_EQ(determinant, 0.0f);
  EXPECT_EQ(out, Identity());
}

TEST(D3DXCamera, LookAtLHBuildsTheViewBasis) {
  const D3DXVECTOR3 eye(10, 0, 0), at(0, 0, 0), up(0, 1, 0);
  D3DXMATRIX view;
  D3DXMatrixLookAtLH(&view, &eye, &at, &up);
  // Looking down -x with y up, left-handed: right is +z.
  ExpectNear(view, D3DXMATRIX(0, 0, -1, 0, 0, 1, 0, 0, 1, 0, 0, 0, 0, 0, 10, 1));
  ExpectNear(TransformCoord(D3DXVECTOR3(0, 0, 5), view), D3DXVECTOR3(5, 0, 10));
}

TEST(D3DXCamera, PerspectiveFovLHMapsNearAndFarToZeroAndOne) {
  D3DXMATRIX projection;
  D3DXMatrixPerspectiveFovLH(&projection, kHalfPi, 2.0f, 1.0f, 101.0f);
  ExpectNear(projection, D3DXMATRIX(0.5f, 0, 0, 0, 0, 1, 0, 0, 0, 0, 1.01f, 1, 0, 0, -1.01f, 0));
  ExpectNear(TransformCoord(D3DXVECTOR3(2, 1, 1), projection), D3DXVECTOR3(1, 1, 0));
  EXPECT_NEAR(TransformCoord(D3DXVECTOR3(0, 0, 101), projection).z, 1.0f, kTolerance);
}

TEST(D3DXCamera, KnownCameraMapsAPointToKnownClipCoordinates) {
  const D3DXVECTOR3 eye(0, 0, -10), at(0, 0, 0), up(0, 1, 0);
  D3DXMATRIX view, projection;
  D3DXMatrixLookAtLH(&view, &eye, &at, &up);
  D3DXMatrixPerspectiveFovLH(&projection, kHalfPi, 2.0f, 1.0f, 101.0f);
  const D3DXVECTOR3 point(5, 2.5f, 0);
  D3DXVECTOR4 clip;
  const D3DXMATRIX view_projection = view * projection;
  D3DXVec3Transform(&clip, &point, &view_projection);
  ExpectNear(clip, D3DXVECTOR4(2.5f, 2.5f, 9.09f, 10));
}

}  // namespace
