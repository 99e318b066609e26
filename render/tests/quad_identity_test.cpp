// The block-wise quad build against the rule written out slot by slot with the D3DX functions:
// random pools (ordinary, vertical, tied, coincident, huge, tiny and non-finite facings, dead and
// attached slots, every spin angle) must give the same vertex bytes, with and without spin and
// a composite texture, for pool sizes that do and do not fill the last block.
#include <cmath>
#include <cstring>
#include <limits>
#include <random>
#include <vector>

#include "render/tests/render_test_support.h"

namespace {

// Slot i's four corners by the rule, one D3DX call at a time.
void ReferenceQuad(const Particle& p, bool spin, bool composite, LocalVertex* corners) {
  const D3DXVECTOR3 right_axis(1.0f, 0.0f, 0.0f);
  const D3DXVECTOR3 up_axis(0.0f, 1.0f, 0.0f);
  const float h = p.Active ? p.Size * 0.5f : 0.0f;
  const float offset = composite && p.Attached ? 0.5f : 0.0f;
  const float span = composite ? 0.5f : 1.0f;
  const D3DXVECTOR3 to_look_at = p.LookAtPoint - p.RenderPosition;
  D3DXVECTOR3 n;
  D3DXVec3Normalize(&n, &to_look_at);
  D3DXVECTOR3 r;
  D3DXVECTOR3 u;
  D3DXVECTOR3 cross;
  if (std::fabs(n.x) + std::fabs(n.z) < std::fabs(n.y)) {
    D3DXVec3Cross(&cross, &n, &right_axis);
    D3DXVec3Normalize(&u, &cross);
    D3DXVec3Cross(&r, &u, &n);
  } else {
    D3DXVec3Cross(&cross, &up_axis, &n);
    D3DXVec3Normalize(&r, &cross);
    D3DXVec3Cross(&u, &n, &r);
  }
  D3DXVECTOR3 a = r * h;
  D3DXVECTOR3 b = u * h;
  if (spin) {
    const float c = static_cast<float>(std::cos(static_cast<double>(p.RenderSpinAngle)));
    const float s = static_cast<float>(std::sin(static_cast<double>(p.RenderSpinAngle)));
    a = (r * h) * c + (u * h) * s;
    b = (u * h) * c + ((-r) * h) * s;
  }
  const D3DXVECTOR3& at = p.RenderPosition;
  corners[0] = {at + a + b, n, p.Color, 0.0f, offset};
  corners[1] = {at - a + b, n, p.Color, 1.0f, offset};
  corners[2] = {at - a - b, n, p.Color, 1.0f, offset + span};
  corners[3] = {at + a - b, n, p.Color, 0.0f, offset + span};
}

class QuadPools {
 public:
  explicit QuadPools(unsigned seed) : engine_(seed) {}

  std::vector<Particle> Pool(int count) {
    std::vector<Particle> pool(static_cast<std::size_t>(count));
    for (Particle& p : pool) {
      p.Active = Pick(8) != 0;
      p.Attached = Pick(4) == 0;
      p.Size = Pick(10) == 0 ? Special() : Between(-1.0f, 4.0f);
      p.Color = static_cast<std::uint32_t>(engine_());
      p.RenderPosition = Vector(100.0f);
      p.LookAtPoint = Facing(p.RenderPosition);
      p.RenderSpinAngle = Pick(10) == 0 ? Special() : Between(-400.0f, 400.0f);
    }
    return pool;
  }

 private:
  int Pick(int n) { return std::uniform_int_distribution<int>(0, n - 1)(engine_); }
  float Between(float low, float high) {
    return std::uniform_real_distribution<float>(low, high)(engine_);
  }
  float Special() {
    constexpr float kInf = std::numeric_limits<float>::infinity();
    const float values[] = {0.0f,   -0.0f, 1e-45f,
                            1e-30f, 3e38f, -3e38f,
                            kInf,   -kInf, std::numeric_limits<float>::quiet_NaN()};
    return values[Pick(9)];
  }
  D3DXVECTOR3 Vector(float range) {
    return {Between(-range, range), Between(-range, range), Between(-range, range)};
  }
  // A facing point: anywhere, straight up or down, on the tie |x| + |z| = |y|, at the particle
  // itself, a hair away, or at a special coordinate.
  D3DXVECTOR3 Facing(const D3DXVECTOR3& at) {
    switch (Pick(8)) {
      case 0:
        return {at.x, at.y + Between(-5.0f, 5.0f), at.z};
      case 1:
        return {at.x + 1.0f, at.y + 2.0f, at.z + 1.0f};
      case 2:
        return at;
      case 3:
        return {std::nextafter(at.x, 1e9f), at.y, at.z};
      case 4:
        return {Special(), at.y, Special()};
      default:
        return at + Vector(50.0f);
    }
  }

  std::mt19937 engine_;
};

// Bit for bit, except that a NaN matches any NaN: which NaN an operation passes on when both
// operands are NaN depends on their order, which the compiler may swap.
bool SameVertex(const LocalVertex& a, const LocalVertex& b) {
  const float fa[] = {a.Position.x, a.Position.y, a.Position.z, a.Normal.x,
                      a.Normal.y,   a.Normal.z,   a.Tu,         a.Tv};
  const float fb[] = {b.Position.x, b.Position.y, b.Position.z, b.Normal.x,
                      b.Normal.y,   b.Normal.z,   b.Tu,         b.Tv};
  for (int k = 0; k < 8; ++k) {
    if (std::isnan(fa[k]) && std::isnan(fb[k])) continue;
    if (std::memcmp(&fa[k], &fb[k], sizeof(float)) != 0) return false;
  }
  return a.Color == b.Color;
}

class QuadIdentity : public RenderTest {};

TEST_F(QuadIdentity, BlocksGiveTheRulesBytesForRandomPools) {
  QuadPools pools(21);
  for (int round = 0; round < 40; ++round) {
    const int count = 1 + round * 13 % 97;  // full and partial last blocks
    const bool spin = round % 2 == 1;
    const bool composite = round % 4 >= 2;
    SetPool(pools.Pool(count));
    Emitter().SpinEnabled = spin;
    Emitter().HasCompositeTexture = composite;
    Emitter().InitializeLocalVertexBuffer();
    Emitter().UpdateLocalVertexBuffer();
    for (int i = 0; i < count; ++i) {
      LocalVertex expected[4];
      ReferenceQuad(Emitter().Particles[static_cast<std::size_t>(i)], spin, composite, expected);
      for (int c = 0; c < 4; ++c)
        ASSERT_TRUE(SameVertex(expected[c], Emitter().LocalVertices[4 * i + c]))
            << "round " << round << ", slot " << i << ", corner " << c;
    }
  }
}

}  // namespace
