// The quad mesh declared to the object-data base, and the per-frame copy into its buffer.
#include <vector>

#include "render/tests/render_test_support.h"

namespace {

class VertexHandoffTest : public RenderTest {
 protected:
  // Initialization's quad-path sequence for `count` live particles in a row.
  void DeclareQuads(int count) {
    std::vector<Particle> pool;
    for (int i = 0; i < count; ++i)
      pool.push_back(LiveParticle({float(i), 0, 0}, {float(i), 0, 1}, 1.0f, 0xFF000000u | i));
    SetPool(std::move(pool));
    Emitter().InitializeLocalVertexBuffer();
    Emitter().UpdateLocalVertexBuffer();
    Emitter().InitializeBaseClassBuffers();
  }
  std::vector<BYTE> LocalBytes() {
    const auto* first = reinterpret_cast<const BYTE*>(Emitter().LocalVertices);
    return {first, first + Emitter().ParticleCount * 4 * sizeof(LocalVertex)};
  }
};

TEST_F(VertexHandoffTest, OneParticleDeclaresFourVerticesAndSixIndices) {
  DeclareQuads(1);
  Tev_AdvancedParticleEmitter& e = Emitter();
  ASSERT_EQ(e.GetVertexCount(), 4);
  ASSERT_EQ(e.GetIndexCount(), 6);
  const DWORD expected[] = {0, 1, 2, 2, 3, 0};
  for (DWORD p = 0; p < 6; ++p) EXPECT_EQ(e.GetIndexes(p), expected[p]) << "position " << p;
  for (int v = 0; v < 4; ++v) {
    EXPECT_EQ(e.GetVertexPosition(v), e.LocalVertices[v].Position);
    EXPECT_EQ(e.GetVertexNormals(v), e.LocalVertices[v].Normal);
    EXPECT_EQ(e.GetVertexTUV(0, v), D3DXVECTOR2(e.LocalVertices[v].Tu, e.LocalVertices[v].Tv));
    EXPECT_EQ(e.GetVertexColor(v), e.LocalVertices[v].Color);
  }
  EXPECT_EQ(BufferBytes(e.VertexBuffer), LocalBytes());  // the base's buffer in the same layout
}

// Counted in 32 bits the declaration never wraps; the index buffer widens once vertex numbers
// need more than 16 bits.
TEST_F(VertexHandoffTest, TheLastQuadOfALargePoolIsDeclaredWithoutWrapping) {
  for (const auto& [count, format] : {std::pair{10922, D3DFMT_INDEX16}, {16385, D3DFMT_INDEX32}}) {
    DeclareQuads(count);
    ASSERT_EQ(Emitter().GetIndexCount(), 6 * count);
    const DWORD last_vertex = 4 * DWORD(count - 1), last_position = 6 * DWORD(count - 1);
    const DWORD corners[] = {0, 1, 2, 2, 3, 0};
    for (DWORD k = 0; k < 6; ++k)
      EXPECT_EQ(Emitter().GetIndexes(last_position + k), last_vertex + corners[k]);
    D3DINDEXBUFFER_DESC desc{};
    ASSERT_TRUE(SUCCEEDED(Emitter().GetIndexBuffer()->GetDesc(&desc)));
    EXPECT_EQ(desc.Format, format) << count;
  }
}

// One whole-buffer lock with discard, or a message and false without a buffer; a failed lock
// copies nothing and unlocks nothing.
TEST_F(VertexHandoffTest, WriteCopiesTheRebuiltQuadsInOneDiscardLock) {
  DeclareQuads(2);
  Emitter().Particles[1].RenderPosition = {5, 6, 7};
  Emitter().UpdateLocalVertexBuffer();
  TakeCalls();
  EXPECT_TRUE(Emitter().WriteLocalVertexBufferToBaseClass());
  const std::uint64_t id = IdOf(Emitter().VertexBuffer);
  EXPECT_EQ(TakeCalls(), (Calls{Call("VertexBuffer.Lock", {id, 0, 0, D3DLOCK_DISCARD}),
                                Call("VertexBuffer.Unlock", {id})}));
  const std::vector<BYTE> written = BufferBytes(Emitter().VertexBuffer);
  EXPECT_EQ(written, LocalBytes());
  Emitter().Particles[1].RenderPosition = {9, 9, 9};
  Emitter().UpdateLocalVertexBuffer();
  device_->FailNextBufferLock();
  TakeCalls();
  EXPECT_FALSE(Emitter().WriteLocalVertexBufferToBaseClass());
  EXPECT_EQ(TakeCalls().size(), 1u);
  EXPECT_EQ(BufferBytes(Emitter().VertexBuffer), written);
  EXPECT_EQ(messages_.size(), 1u);

  device_->FailNextCreateVertexBuffer();
  DeclareQuads(1);
  EXPECT_FALSE(Emitter().WriteLocalVertexBufferToBaseClass());
  EXPECT_EQ(messages_.back(), "APE: failed to find base vertex buffer");
}

}  // namespace
