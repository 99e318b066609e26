// The point-sprite buffers: creation, refill, draw, and their failures.
#include <cstring>
#include <vector>

#include "render/tests/render_test_support.h"

namespace {

using PointSpritesTest = RenderTest;

// Every slot is written; a dead one keeps its place with size 0, a never-born one is all zero.
TEST_F(PointSpritesTest, EverySlotBecomesOnePointOfTheDynamicBuffer) {
  Particle dead = LiveParticle({4, 5, 6}, {0, 0, 0}, 3.0f, 0xFF00FF00);
  dead.Active = false;
  SetPool({LiveParticle({1, 2, 3}, {0, 0, 0}, 4.0f, 0x80FF0000), dead, Particle{}});
  Emitter().InitializePointSpriteVertexBuffer();
  Emitter().UpdatePointSpriteVertexBuffer();
  const std::uint64_t id = IdOf(Emitter().PointSpriteVertexBuffer);
  EXPECT_EQ(TakeCalls(),
            (Calls{Call("CreateVertexBuffer",
                        {60, D3DUSAGE_WRITEONLY | D3DUSAGE_POINTS | D3DUSAGE_DYNAMIC, 0x62,
                         D3DPOOL_DEFAULT}),
                   Call("VertexBuffer.Lock", {id, 0, 60, 0}), Call("VertexBuffer.Unlock", {id})}));
  const PointSpriteVertex expected[] = {
      {{1, 2, 3}, 4.0f, 0x80FF0000}, {{4, 5, 6}, 0.0f, 0xFF00FF00}, {{0, 0, 0}, 0.0f, 0}};
  const std::vector<BYTE> bytes = BufferBytes(Emitter().PointSpriteVertexBuffer);
  ASSERT_EQ(bytes.size(), sizeof(expected));
  EXPECT_EQ(std::memcmp(bytes.data(), expected, sizeof(expected)), 0);
  TakeCalls();
  Emitter().StreamPointSprites();
  EXPECT_EQ(TakeCalls(), (Calls{Call("SetStreamSource", {0, id, 0, 20}), Call("SetFVF", {0x62}),
                                Call("DrawPrimitive", {D3DPT_POINTLIST, 0, 3})}));
  EXPECT_TRUE(messages_.empty());
}

// A failed lock keeps the previous contents until the next update; a failed creation (or no
// device) leaves no buffer to lock or draw.
TEST_F(PointSpritesTest, FailuresAreReportedAndSkipTheBuffer) {
  SetPool({LiveParticle({1, 1, 1}, {0, 0, 0}, 2.0f, 0xFF0000FF)});
  Emitter().InitializePointSpriteVertexBuffer();
  Emitter().UpdatePointSpriteVertexBuffer();
  const std::vector<BYTE> before = BufferBytes(Emitter().PointSpriteVertexBuffer);
  Emitter().Particles[0].RenderPosition = {7, 7, 7};
  device_->FailNextBufferLock();
  TakeCalls();
  Emitter().UpdatePointSpriteVertexBuffer();
  EXPECT_EQ(TakeCalls().size(), 1u);  // the failed lock, no unlock
  EXPECT_EQ(BufferBytes(Emitter().PointSpriteVertexBuffer), before);
  EXPECT_EQ(messages_, Calls{"APE: Failed to WRITE PS VB"});

  device_->FailNextCreateVertexBuffer();
  Emitter().InitializePointSpriteVertexBuffer();
  EXPECT_EQ(Emitter().PointSpriteVertexBuffer, nullptr);
  Emitter().DeviceChannel = nullptr;
  Emitter().InitializePointSpriteVertexBuffer();
  TakeCalls();
  Emitter().UpdatePointSpriteVertexBuffer();
  Emitter().RenderPointSprites();
  EXPECT_TRUE(TakeCalls().empty());
  EXPECT_EQ(messages_, (Calls{"APE: Failed to WRITE PS VB", "APE: Failed to Create PS VB",
                              "APE: Failed to Create PS VB"}));
}

}  // namespace
