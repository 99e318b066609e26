// The point-sprite buffers: creation, refill, draw, and their failures.
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "render/tests/render_test_support.h"

namespace {

constexpr std::uint64_t kUsage = D3DUSAGE_WRITEONLY | D3DUSAGE_POINTS | D3DUSAGE_DYNAMIC;

class PointSpritesTest : public RenderTest {
 protected:
  std::vector<PointSpriteVertex> BufferVertices() {
    IDirect3DVertexBuffer9* buffer = Emitter().PointSpriteVertexBuffer;
    D3DVERTEXBUFFER_DESC desc{};
    void* data = nullptr;
    if (buffer == nullptr || FAILED(buffer->GetDesc(&desc)) ||
        FAILED(buffer->Lock(0, 0, &data, D3DLOCK_READONLY))) {
      ADD_FAILURE() << "point-sprite buffer cannot be read";
      return {};
    }
    std::vector<PointSpriteVertex> vertices(desc.Size / sizeof(PointSpriteVertex));
    std::memcpy(vertices.data(), data, vertices.size() * sizeof(PointSpriteVertex));
    buffer->Unlock();
    return vertices;
  }
};

void ExpectVertex(const PointSpriteVertex& v, D3DXVECTOR3 position, float size,
                  std::uint32_t color) {
  EXPECT_EQ(v.Position, position);
  EXPECT_EQ(v.Size, size);
  EXPECT_EQ(v.Color, color);
}

TEST_F(PointSpritesTest, OneParticleMakesATwentyByteDynamicBufferAndDrawsOnePoint) {
  SetPool({LiveParticle({1, 2, 3}, {0, 0, 0}, 4.0f, 0x80FF0000)});
  Emitter().InitializePointSpriteVertexBuffer();
  ASSERT_NE(Emitter().PointSpriteVertexBuffer, nullptr);
  EXPECT_EQ(TakeCalls(), std::vector<std::string>{
                             Call("CreateVertexBuffer", {20, kUsage, 0x62, D3DPOOL_DEFAULT})});
  Emitter().UpdatePointSpriteVertexBuffer();
  const std::uint64_t id = IdOf(Emitter().PointSpriteVertexBuffer);
  EXPECT_EQ(TakeCalls(), (std::vector<std::string>{Call("VertexBuffer.Lock", {id, 0, 20, 0}),
                                                   Call("VertexBuffer.Unlock", {id})}));
  const auto vertices = BufferVertices();
  ASSERT_EQ(vertices.size(), 1u);
  ExpectVertex(vertices[0], {1, 2, 3}, 4.0f, 0x80FF0000);

  TakeCalls();
  Emitter().StreamPointSprites();
  EXPECT_EQ(TakeCalls(), (std::vector<std::string>{
                             Call("SetStreamSource", {0, id, 0, 20}), Call("SetFVF", {0x62}),
                             Call("DrawPrimitive", {D3DPT_POINTLIST, 0, 1})}));
  EXPECT_TRUE(messages_.empty());
}

TEST_F(PointSpritesTest, EverySlotIsWrittenAndDeadOnesShrinkToNothing) {
  Particle dead = LiveParticle({4, 5, 6}, {0, 0, 0}, 3.0f, 0xFF00FF00);
  dead.Active = false;
  SetPool({LiveParticle({1, 1, 1}, {0, 0, 0}, 2.0f, 0xFF0000FF), dead, Particle{}});
  Emitter().InitializePointSpriteVertexBuffer();
  Emitter().UpdatePointSpriteVertexBuffer();
  const auto vertices = BufferVertices();
  ASSERT_EQ(vertices.size(), 3u);
  ExpectVertex(vertices[0], {1, 1, 1}, 2.0f, 0xFF0000FF);
  ExpectVertex(vertices[1], {4, 5, 6}, 0.0f, 0xFF00FF00);  // dead: kept in place, size 0
  ExpectVertex(vertices[2], {0, 0, 0}, 0.0f, 0);           // never born
  EXPECT_EQ(std::memcmp(vertices.data(), Emitter().PointSpriteVertices, 60), 0);
}

TEST_F(PointSpritesTest, FailedCreationIsReportedAndTheBufferSkipped) {
  SetPool({LiveParticle({1, 1, 1}, {0, 0, 0}, 2.0f, 0xFF0000FF)});
  device_->FailNextCreateVertexBuffer();
  Emitter().InitializePointSpriteVertexBuffer();
  EXPECT_EQ(Emitter().PointSpriteVertexBuffer, nullptr);
  EXPECT_EQ(messages_, std::vector<std::string>{"APE: Failed to Create PS VB"});
  TakeCalls();
  Emitter().UpdatePointSpriteVertexBuffer();
  Emitter().StreamPointSprites();
  EXPECT_TRUE(TakeCalls().empty());
  // The CPU copy is still kept up to date.
  EXPECT_EQ(Emitter().PointSpriteVertices[0].Size, 2.0f);
  EXPECT_EQ(messages_.size(), 1u);
}

TEST_F(PointSpritesTest, FailedLockKeepsThePreviousContents) {
  SetPool({LiveParticle({1, 1, 1}, {0, 0, 0}, 2.0f, 0xFF0000FF)});
  Emitter().InitializePointSpriteVertexBuffer();
  Emitter().UpdatePointSpriteVertexBuffer();
  Emitter().Particles[0].RenderPosition = {7, 7, 7};
  TakeCalls();
  device_->FailNextBufferLock();
  Emitter().UpdatePointSpriteVertexBuffer();
  EXPECT_EQ(messages_, std::vector<std::string>{"APE: Failed to WRITE PS VB"});
  EXPECT_EQ(TakeCalls().size(), 1u);  // the failed lock, no unlock
  ExpectVertex(BufferVertices()[0], {1, 1, 1}, 2.0f, 0xFF0000FF);

  // The next update goes through again.
  Emitter().UpdatePointSpriteVertexBuffer();
  ExpectVertex(BufferVertices()[0], {7, 7, 7}, 2.0f, 0xFF0000FF);
}

TEST_F(PointSpritesTest, RecreatingReleasesTheEarlierBuffer) {
  SetPool({Particle{}, Particle{}});
  Emitter().InitializePointSpriteVertexBuffer();
  const int live = device_->LiveObjectCount();
  Emitter().InitializePointSpriteVertexBuffer();
  EXPECT_EQ(device_->LiveObjectCount(), live);
}

TEST(PointSpritesWithoutDevice, NothingIsCreatedOrDrawn) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  std::vector<std::string> messages;
  context.DebugMessages.SetSink([&](const char* text) { messages.emplace_back(text); });
  Tev_AdvancedParticleEmitter emitter;
  ASSERT_EQ(emitter.DeviceChannel, nullptr);
  emitter.Particles.resize(2);
  emitter.ParticleCount = 2;
  emitter.InitializePointSpriteVertexBuffer();
  emitter.UpdatePointSpriteVertexBuffer();
  emitter.RenderPointSprites();
  emitter.RenderSprites();
  EXPECT_EQ(emitter.PointSpriteVertexBuffer, nullptr);
  EXPECT_EQ(messages, std::vector<std::string>{"APE: Failed to Create PS VB"});
}

}  // namespace
