// The inline vector helpers of the per-particle loops give exactly what the D3DX functions they
// stand for give, bit for bit, for ordinary, tiny, huge and non-finite vectors.
#include <bit>
#include <cstdint>
#include <limits>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "simulation/vector_math.h"

namespace {

bool SameBits(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return std::bit_cast<std::uint32_t>(a.x) == std::bit_cast<std::uint32_t>(b.x) &&
         std::bit_cast<std::uint32_t>(a.y) == std::bit_cast<std::uint32_t>(b.y) &&
         std::bit_cast<std::uint32_t>(a.z) == std::bit_cast<std::uint32_t>(b.z);
}

// Random vectors of every magnitude, with the special values mixed in.
std::vector<D3DXVECTOR3> Vectors() {
  constexpr float kInf = std::numeric_limits<float>::infinity();
  const float nan = std::numeric_limits<float>::quiet_NaN();
  const float specials[] = {0.0f, -0.0f, 1.0f, -1.0f, 1e-45f, 1e-38f, 3e38f, kInf, -kInf, nan};
  std::mt19937 engine(5);
  std::uniform_real_distribution<float> mantissa(-1.0f, 1.0f);
  std::uniform_int_distribution<int> exponent(-140, 127);
  std::uniform_int_distribution<int> pick(0, 9);
  const auto component = [&]() {
    if (pick(engine) == 0) return specials[pick(engine)];
    return std::ldexp(mantissa(engine), exponent(engine) / (pick(engine) < 5 ? 8 : 1));
  };
  std::vector<D3DXVECTOR3> vectors;
  for (int i = 0; i < 20000; ++i) vectors.push_back({component(), component(), component()});
  return vectors;
}

TEST(VectorMath, UnitAndCrossMatchD3DXBitForBit) {
  const std::vector<D3DXVECTOR3> vectors = Vectors();
  for (std::size_t i = 0; i + 1 < vectors.size(); ++i) {
    const D3DXVECTOR3& a = vectors[i];
    const D3DXVECTOR3& b = vectors[i + 1];
    D3DXVECTOR3 expected;
    D3DXVec3Normalize(&expected, &a);
    ASSERT_TRUE(SameBits(sim::Unit(a), expected)) << i;
    D3DXVec3Cross(&expected, &a, &b);
    ASSERT_TRUE(SameBits(sim::Cross(a, b), expected)) << i;
    ASSERT_EQ(std::bit_cast<std::uint32_t>(sim::Length(a)),
              std::bit_cast<std::uint32_t>(D3DXVec3Length(&a)))
        << i;
  }
}

}  // namespace
