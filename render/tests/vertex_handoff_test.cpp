// The quad mesh declared to the object-data base, and the per-frame copy into its buffer.
#include <cstring>
#include <vector>

#include <gtest/gtest.h>

#include "render/tests/render_test_support.h"

namespace {

class VertexHandoffTest : public RenderTest {
 protected:
  // Initialization's quad-path sequence for a pool of `count` live particles in a row.
  void DeclareQuads(int count) {
    std::vector<Particle> pool;
    pool.reserve(count);
    for (int i = 0; i < count; ++i) {
      pool.push_back(LiveParticle({float(i), 0, 0}, {float(i), 0, 1}, 1.0f, 0xFF000000u | i));
    }
    SetPool(std::move(pool));
    Emitter().InitializeLocalVertexBuffer();
    Emitter().UpdateLocalVertexBuffer();
    Emitter().InitializeBaseClassBuffers();
  }

  // The bytes of the base's vertex buffer.
  std::vector<BYTE> BaseBufferBytes() {
    IDirect3DVertexBuffer9* buffer = Emitter().VertexBuffer;
    D3DVERTEXBUFFER_DESC desc{};
    void* data = nullptr;
    if (buffer == nullptr || FAILED(buffer->GetDesc(&desc)) ||
        FAILED(buffer->Lock(0, 0, &data, D3DLOCK_READONLY))) {
      ADD_FAILURE() << "base vertex buffer cannot be read";
      return {};
    }
    std::vector<BYTE> bytes(static_cast<const BYTE*>(data),
                            static_cast<const BYTE*>(data) + desc.Size);
    buffer->Unlock();
    return bytes;
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
    const LocalVertex& local = e.LocalVertices[v];
    EXPECT_EQ(e.GetVertexPosition(v), local.Position);
    EXPECT_EQ(e.GetVertexNormals(v), local.Normal);
    EXPECT_EQ(e.GetVertexTUV(0, v), D3DXVECTOR2(local.Tu, local.Tv));
    EXPECT_EQ(e.GetVertexColor(v), local.Color);
  }
  // The base built its buffer in the emitter's layout.
  EXPECT_EQ(BaseBufferBytes(), LocalBytes());
}

struct MeshCase {
  int Particles;
  D3DFORMAT IndexFormat;
};
void PrintTo(const MeshCase& c, std::ostream* os) {
  *os << c.Particles << " particles";
}

class MeshSizeTest : public VertexHandoffTest, public testing::WithParamInterface<MeshCase> {};

// Counted in 32 bits, the declaration never wraps; the index buffer widens only once vertex
// numbers need more than 16 bits.
TEST_P(MeshSizeTest, LastQuadIsDeclaredAndBuiltWithoutWrapping) {
  const MeshCase& c = GetParam();
  DeclareQuads(c.Particles);
  Tev_AdvancedParticleEmitter& e = Emitter();
  ASSERT_EQ(e.GetVertexCount(), 4 * c.Particles);
  ASSERT_EQ(e.GetIndexCount(), 6 * c.Particles);

  const DWORD last_vertex = 4 * DWORD(c.Particles - 1);
  const DWORD last_position = 6 * DWORD(c.Particles - 1);
  const DWORD corners[] = {0, 1, 2, 2, 3, 0};
  for (DWORD k = 0; k < 6; ++k)
    EXPECT_EQ(e.GetIndexes(last_position + k), last_vertex + corners[k]);

  IDirect3DIndexBuffer9* indices = e.GetIndexBuffer();
  ASSERT_NE(indices, nullptr);
  D3DINDEXBUFFER_DESC desc{};
  ASSERT_TRUE(SUCCEEDED(indices->GetDesc(&desc)));
  EXPECT_EQ(desc.Format, c.IndexFormat);
  const std::size_t index_size = c.IndexFormat == D3DFMT_INDEX16 ? 2 : 4;
  ASSERT_EQ(desc.Size, 6 * std::size_t(c.Particles) * index_size);
  void* data = nullptr;
  ASSERT_TRUE(SUCCEEDED(indices->Lock(0, 0, &data, D3DLOCK_READONLY)));
  for (DWORD k = 0; k < 6; ++k) {
    std::uint32_t value = 0;
    std::memcpy(&value, static_cast<const BYTE*>(data) + (last_position + k) * index_size,
                index_size);
    EXPECT_EQ(value, last_vertex + corners[k]) << "index position " << last_position + k;
  }
  indices->Unlock();
  EXPECT_EQ(BaseBufferBytes(), LocalBytes());
}

INSTANTIATE_TEST_SUITE_P(
    Counts, MeshSizeTest,
    testing::Values(MeshCase{10922, D3DFMT_INDEX16},  // 65532 index positions
                    MeshCase{10923, D3DFMT_INDEX16},  // 65538 positions, vertex numbers fit
                    MeshCase{16384, D3DFMT_INDEX16},  // 65536 vertices: numbers up to 65535
                    MeshCase{16385, D3DFMT_INDEX32}),
    [](const testing::TestParamInfo<MeshCase>& info) {
      return std::to_string(info.param.Particles);
    });

TEST_F(VertexHandoffTest, RedeclaringReleasesTheEarlierMesh) {
  DeclareQuads(3);
  const int live = device_->LiveObjectCount();
  DeclareQuads(3);
  EXPECT_EQ(device_->LiveObjectCount(), live);
  EXPECT_EQ(Emitter().GetIndexCount(), 18);
}

TEST_F(VertexHandoffTest, WriteCopiesTheRebuiltQuadsInOneDiscardLock) {
  DeclareQuads(2);
  Emitter().Particles[1].RenderPosition = {5, 6, 7};
  Emitter().UpdateLocalVertexBuffer();
  TakeCalls();
  EXPECT_TRUE(Emitter().WriteLocalVertexBufferToBaseClass());
  const std::uint64_t id = IdOf(Emitter().VertexBuffer);
  EXPECT_EQ(TakeCalls(),
            (std::vector<std::string>{Call("VertexBuffer.Lock", {id, 0, 0, D3DLOCK_DISCARD}),
                                      Call("VertexBuffer.Unlock", {id})}));
  EXPECT_EQ(BaseBufferBytes(), LocalBytes());
  EXPECT_EQ(Emitter().GetVertexCount(), 8);
  EXPECT_TRUE(messages_.empty());
}

TEST_F(VertexHandoffTest, WriteWithoutABaseBufferSaysSoAndCopiesNothing) {
  SetPool({LiveParticle({0, 0, 0}, {0, 0, 1}, 1.0f, 0xFFFFFFFF)});
  Emitter().InitializeLocalVertexBuffer();
  Emitter().UpdateLocalVertexBuffer();
  EXPECT_FALSE(Emitter().WriteLocalVertexBufferToBaseClass());
  EXPECT_EQ(messages_, std::vector<std::string>{"APE: failed to find base vertex buffer"});
}

TEST_F(VertexHandoffTest, FailedBaseBufferCreationLeavesNothingToWrite) {
  device_->FailNextCreateVertexBuffer();
  DeclareQuads(1);
  EXPECT_EQ(Emitter().VertexBuffer, nullptr);
  EXPECT_FALSE(Emitter().WriteLocalVertexBufferToBaseClass());
  EXPECT_EQ(messages_, std::vector<std::string>{"APE: failed to find base vertex buffer"});
}

TEST_F(VertexHandoffTest, FailedLockCopiesNothingAndAnswersFalse) {
  DeclareQuads(1);
  const std::vector<BYTE> before = BaseBufferBytes();
  Emitter().Particles[0].RenderPosition = {9, 9, 9};
  Emitter().UpdateLocalVertexBuffer();
  TakeCalls();
  device_->FailNextBufferLock();
  EXPECT_FALSE(Emitter().WriteLocalVertexBufferToBaseClass());
  ASSERT_EQ(messages_.size(), 1u);
  EXPECT_EQ(messages_[0].rfind("APE: ", 0), 0u);
  // Only the failed lock: nothing unlocked that was not locked.
  EXPECT_EQ(TakeCalls().size(), 1u);
  EXPECT_EQ(BaseBufferBytes(), before);
}

}  // namespace
