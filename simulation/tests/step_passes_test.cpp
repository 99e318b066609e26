// What the logic step and the frame do in shared passes must equal what the separate rules give:
// the catch-up updates of a frame's newborns reuse the look their first update sampled, and the
// point-sprite vertices are built in the interpolation's pass over the pool.
#include <bit>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <limits>
#include <vector>

#include "simulation/envelope_sampling.h"
#include "simulation/tests/emitter_fixture.h"

namespace {

constexpr float kInf = std::numeric_limits<float>::infinity();
constexpr float kNaN = std::numeric_limits<float>::quiet_NaN();

bool SameBits(float a, float b) {
  return std::bit_cast<std::uint32_t>(a) == std::bit_cast<std::uint32_t>(b);
}
bool SameBits(const D3DXVECTOR3& a, const D3DXVECTOR3& b) {
  return SameBits(a.x, b.x) && SameBits(a.y, b.y) && SameBits(a.z, b.z);
}

class StepPasses : public EmitterTest {
 protected:
  // A fountain drawn as point sprites: births every frame (so newborns catch up several updates),
  // gravity, a speed limit, size and colour envelopes (red and green share key x's, blue not),
  // lives short enough that some end.
  void LinkFountain() {
    LinkBasics(400.0f, 60.0f, 3000.0f);
    SetValue(kLinkHardwareParticles, 1.0f);
    SetValue(kLinkLifespanMin, 0.2f);
    SetValue(kLinkLifespanMax, 0.6f);
    SetValue(kLinkInitialForceStrength, 0.3f);
    SetValue(kLinkSizeOffsetMax, 1.5f);
    SetValue(kLinkMaximumSpeed, 0.25f);
    SetVector(kLinkGlobalForce, {0.0f, -0.01f, 0.002f});
    SetEnvelope(kLinkSizeEnvelope, {{0.0f, 1.0f}, {0.3f, 4.0f}, {1.0f, -0.5f}});
    SetEnvelope(kLinkVertexAlphaEnvelope, {{0.0f, 300.0f}, {0.5f, 128.5f}, {1.0f, 0.0f}});
    SetEnvelope(kLinkRedColorEnvelope, {{0.0f, 10.0f}, {0.5f, 250.0f}, {1.0f, 0.0f}});
    SetEnvelope(kLinkGreenColorEnvelope, {{0.0f, -20.0f}, {0.5f, 60.0f}, {1.0f, 255.9f}});
    SetEnvelope(kLinkBlueColorEnvelope, {{0.1f, 0.0f}, {0.9f, 255.0f}});
    Start();
  }
};

// Records given 1 to 6 updates in one step, against the same records updated one call at a time
// (each call samples afresh): every field the update writes, bit for bit.
TEST_F(StepPasses, CatchUpUpdatesGiveWhatSeparateUpdatesGive) {
  LinkFountain();
  RunFrames(20, 1000.0 / 60.0);
  std::srand(7);
  for (Particle& p : emitter->Particles) {
    p.PendingSteps = 1 + std::rand() % 6;
    p.Age += 0.01f * static_cast<float>(std::rand() % 10);
  }
  const std::vector<Particle> before = emitter->Particles;
  emitter->RunLogicStep();
  const std::vector<Particle> stepped = emitter->Particles;
  emitter->Particles = before;
  for (int i = 0; i < emitter->ParticleCount; ++i)
    for (int k = 0; k < before[static_cast<std::size_t>(i)].PendingSteps; ++k)
      emitter->UpdateParticle(i);
  int live = 0;
  for (int i = 0; i < emitter->ParticleCount; ++i) {
    SCOPED_TRACE(i);
    const Particle& a = stepped[static_cast<std::size_t>(i)];
    const Particle& b = P(i);
    live += a.Active;
    EXPECT_EQ(a.Active, b.Active);
    EXPECT_TRUE(SameBits(a.Size, b.Size) && SameBits(a.NormalizedAge, b.NormalizedAge));
    EXPECT_EQ(a.Color, b.Color);
    EXPECT_TRUE(SameBits(a.Position, b.Position) && SameBits(a.Velocity, b.Velocity));
  }
  EXPECT_GT(live, 100);
}

// After each working frame the vertex array holds exactly what rebuilding it from the pool gives.
TEST_F(StepPasses, PointSpritesBuiltWithTheInterpolationMatchARebuild) {
  LinkFountain();
  for (int frame = 0; frame < 30; ++frame) {
    RunFrame(frame % 3 == 0 ? 7.0 : 1000.0 / 60.0);  // some frames run no step
    const std::size_t slots = emitter->PointSpriteSlots();
    ASSERT_EQ(slots, 400u);
    const std::vector<PointSpriteVertex> built(emitter->PointSpriteVertices,
                                               emitter->PointSpriteVertices + slots);
    emitter->UpdatePointSpriteVertexBuffer();
    EXPECT_EQ(
        std::memcmp(built.data(), emitter->PointSpriteVertices, slots * sizeof(PointSpriteVertex)),
        0)
        << "frame " << frame;
  }
}

// The branch-free colour byte is ColorComponent's low eight bits for every kind of value.
TEST(ColorLowByte, IsTheLowByteOfTheColourComponent) {
  const float values[] = {0.0f,           -0.0f,  0.5f,          127.9f, 254.99f, 255.0f,
                          255.5f,         256.0f, 1e10f,         -0.5f,  -1.0f,   -255.5f,
                          -2147483648.0f, -3e9f,  2147483648.0f, kInf,   -kInf,   kNaN};
  for (float v : values)
    EXPECT_EQ(sim::ColorLowByte(v), static_cast<std::uint32_t>(ColorComponent(v)) & 255u) << v;
}

}  // namespace
