// The object-data channel: lists, the Direct3D buffers on the MemoryDevice, the draw's exact
// device calls and pre-draw states, copies that never share buffers, and the built-in shapes.
#include <bit>
#include <climits>
#include <cstring>
#include <functional>

#include "host/object_data_channel.h"
#include "host/tests/test_channels.h"

namespace {

// The first `count` elements of type T of a locked buffer, widened to 32 bits.
template <typename T, typename Buffer>
std::vector<DWORD> ReadBuffer(Buffer* buffer, std::size_t count) {
  void* data = nullptr;
  EXPECT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_READONLY), S_OK);
  std::vector<DWORD> elements(static_cast<T*>(data), static_cast<T*>(data) + count);
  buffer->Unlock();
  return elements;
}

using ObjectData = HostContextTest;

TEST_F(ObjectData, ListsRefuseIndicesOutsideThemAndNothingIsBuiltWithoutADevice) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(2);
  mesh.SetIndexCount(2);
  EXPECT_EQ(mesh.GetVertexColor(1), 0xFFFFFFFFu);  // unwritten vertices are opaque white
  for (int at : {-1, 2, INT_MAX, INT_MIN}) {
    EXPECT_FALSE(mesh.SetVertexPosition({1, 1, 1}, at) || mesh.SetVertexNormal({1, 1, 1}, at) ||
                 mesh.SetVertexTUCoord(0, {1, 1}, at) || mesh.SetVertexColor(1, at) ||
                 mesh.SetIndex(1, at))
        << at;
    EXPECT_EQ(mesh.GetVertexColor(static_cast<DWORD>(at)), 0u) << at;
  }
  EXPECT_FALSE(mesh.SetVertexTUCoord(1, {1, 1}, 0));  // only texture set 0 exists
  mesh.SetVertexCount(-3);
  mesh.SetIndexCount(INT_MIN);
  EXPECT_EQ(mesh.GetVertexCount() + mesh.GetIndexCount(), 0);
  mesh.BuildQuad(1, 1);
  EXPECT_FALSE(mesh.CreateVertexBuffer());
  Tev_DX8_DeviceChannel no_device;
  EXPECT_FALSE(mesh.CreateVertexBuffer());
  mesh.StreamVertexData();  // nothing to draw on: it simply returns
  mesh.DoCustomPreRenderStates();
}

class ObjectDataOnDevice : public DeviceTest {
 protected:
  // A triangle list of `triangles` triangles over `vertices` distinct vertices.
  static void Fill(Tev_DX8_ObjectDataChannel& mesh, int vertices, int triangles) {
    mesh.SetVertexCount(vertices);
    for (int v = 0; v < vertices; ++v) {
      const float f = static_cast<float>(v);
      mesh.SetVertexPosition({f, f + 0.5f, -f}, v);
      mesh.SetVertexNormal({0, 1, 0}, v);
      mesh.SetVertexTUCoord(0, {f / 8.0f, 1.0f - f / 8.0f}, v);
      mesh.SetVertexColor(0xFF000000u | static_cast<DWORD>(v), v);
    }
    mesh.SetIndexCount(triangles * 3);
    for (int i = 0; i < triangles * 3; ++i)
      mesh.SetIndex(static_cast<DWORD>((i * 7) % vertices), i);
  }
};

TEST_F(ObjectDataOnDevice, IndicesAre16BitUntilTheVerticesNeedMore) {
  for (const auto& [vertices, size] : {std::pair{3, 2u}, {65536, 2u}, {65537, 4u}}) {
    Tev_DX8_ObjectDataChannel mesh;
    mesh.SetVertexCount(vertices);
    mesh.SetIndexCount(6);
    const DWORD last = static_cast<DWORD>(vertices - 1), wanted[6] = {0, 1, last, last, 1, 2};
    for (int i = 0; i < 6; ++i) mesh.SetIndex(wanted[i], i);
    ASSERT_TRUE(mesh.CreateVertexBuffer());
    D3DINDEXBUFFER_DESC desc{};
    ASSERT_EQ(mesh.GetIndexBuffer()->GetDesc(&desc), S_OK);
    ASSERT_EQ(desc.Format, size == 4 ? D3DFMT_INDEX32 : D3DFMT_INDEX16);
    IDirect3DIndexBuffer9* buffer = mesh.GetIndexBuffer();
    EXPECT_EQ(size == 4 ? ReadBuffer<DWORD>(buffer, 6) : ReadBuffer<std::uint16_t>(buffer, 6),
              std::vector<DWORD>(wanted, wanted + 6))
        << vertices;
  }
}

TEST_F(ObjectDataOnDevice, FailedBuildsLeaveNoBuffers) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  const std::function<void()> failures[] = {
      [&] { device_->FailNextCreateVertexBuffer(); }, [&] { device_->FailNextCreateIndexBuffer(); },
      [&] { device_->FailNextBufferLock(); },
      [&] { mesh.SetIndex(4, 5); }};  // an index past the vertices; last, as it stays
  for (const auto& fail : failures) {
    ASSERT_TRUE(mesh.CreateVertexBuffer());  // the failed rebuild must drop these too
    fail();
    EXPECT_FALSE(mesh.CreateVertexBuffer());
    EXPECT_TRUE(!mesh.VertexBuffer && !mesh.GetIndexBuffer() && device_->LiveObjectCount() == 0);
  }
}

// The base's states: unlit, stage 0 colour = texture x diffuse. The vertex buffer: 36 bytes a
// vertex. The draw: the buffers as built, however the lists changed since.
TEST_F(ObjectDataOnDevice, StatesVertexLayoutAndDrawAreExact) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.DoCustomPreRenderStates();
  EXPECT_EQ(device_->RenderState(D3DRS_LIGHTING), static_cast<DWORD>(FALSE));
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLOROP), static_cast<DWORD>(D3DTOP_MODULATE));
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLORARG1), D3DTA_TEXTURE);
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLORARG2), D3DTA_DIFFUSE);
  Fill(mesh, 5, 3);
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 1.5f, -2.0f, 3.0f);
  mesh.SetWorldMatrix(world);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  const std::vector<DWORD> words = ReadBuffer<DWORD>(mesh.VertexBuffer, 5 * 9);
  for (std::size_t v = 0; v < 5; ++v) {
    const float f = static_cast<float>(v);
    const float position_normal_uv[] = {f, f + 0.5f, -f, 0, 1, 0, f / 8.0f, 1.0f - f / 8.0f};
    for (std::size_t k = 0; k < 8; ++k)
      EXPECT_EQ(words[v * 9 + k + (k >= 6)], std::bit_cast<std::uint32_t>(position_normal_uv[k]));
    EXPECT_EQ(words[v * 9 + 6], 0xFF000000u | v);  // the colour, after position and normal
  }
  mesh.SetVertexCount(400);
  mesh.SetIndexCount(900);
  device_->ClearCalls();
  mesh.StreamVertexData();
  std::vector<std::uint64_t> transform = {D3DTS_WORLD};
  for (const auto& row : world.m)
    for (float v : row) transform.push_back(std::bit_cast<std::uint32_t>(v));
  const std::vector<DeviceCall> expected = {
      {"SetTransform", transform},
      {"SetStreamSource", {0, device_->ObjectId(mesh.VertexBuffer), 0, 36}},
      {"SetFVF", {Tev_DX8_ObjectDataChannel::kFvf}},
      {"SetIndices", {device_->ObjectId(mesh.GetIndexBuffer())}},
      {"DrawIndexedPrimitive", {D3DPT_TRIANGLELIST, 0, 0, 5, 0, 3}}};
  EXPECT_EQ(device_->Calls(), expected) << ::testing::PrintToString(device_->CallStrings());
}

TEST_F(ObjectDataOnDevice, CopiesNeverShareBuffers) {
  auto original = std::make_unique<Tev_DX8_ObjectDataChannel>();
  Fill(*original, 4, 2);
  ASSERT_TRUE(original->CreateVertexBuffer());
  auto copy = std::make_unique<Tev_DX8_ObjectDataChannel>(*original);
  EXPECT_TRUE(!copy->VertexBuffer && copy->GetVertexPosition(3) == original->GetVertexPosition(3));
  Tev_DX8_ObjectDataChannel assigned;
  Fill(assigned, 3, 1);
  ASSERT_TRUE(assigned.CreateVertexBuffer());
  assigned = *original;  // gives back its own buffers, takes none
  EXPECT_TRUE(!assigned.VertexBuffer && assigned.GetVertexCount() == 4);
  original.reset();
  EXPECT_EQ(device_->LiveObjectCount(), 0);
  ASSERT_TRUE(copy->CreateVertexBuffer() && copy->CreateVertexBuffer());
  EXPECT_EQ(device_->LiveObjectCount(), 2);  // rebuilding released the first buffers
  copy->Release();
  EXPECT_EQ(device_->LiveObjectCount() + copy->GetVertexCount() + copy->GetIndexCount(), 0);
}

using BuiltInShapes = HostContextTest;
using Mesh = Tev_DX8_ObjectDataChannel;

TEST_F(BuiltInShapes, HaveOutwardNormalsAndClockwiseFrontFaces) {
  struct Case {
    void (*build)(Mesh&);
    int vertices, triangles;
    bool closed;  // surrounds its centre; flat shapes face +Y
  };
  const Case cases[] = {
      {[](Mesh& m) { m.BuildQuad(2.0f, 3.0f); }, 4, 2, false},
      {[](Mesh& m) { m.BuildBox(D3DXVECTOR3(-1.0f, 2.0f, 0.5f)); }, 24, 12, true},
      {[](Mesh& m) { m.BuildUvSphere(1.5f, 16, 8); }, 17 * 9, 2 * 16 * 8 - 2 * 16, true},
      {[](Mesh& m) { m.BuildUvSphere(1.0f, 1, 1); }, 4 * 3, 2 * 3, true},  // clamped to 3 x 2
      {[](Mesh& m) { m.BuildDisc(1.0f, 12); }, 13, 12, false}};
  for (const Case& c : cases) {
    SCOPED_TRACE(&c - cases);
    Mesh mesh;
    c.build(mesh);
    ASSERT_EQ(mesh.GetVertexCount(), c.vertices);
    ASSERT_EQ(mesh.GetIndexCount(), c.triangles * 3);
    auto outward = [&](const D3DXVECTOR3& p) { return c.closed ? p : D3DXVECTOR3(0, 1, 0); };
    for (DWORD v = 0; v < static_cast<DWORD>(c.vertices); ++v) {
      const D3DXVECTOR3 normal = mesh.GetVertexNormals(v), out = outward(mesh.GetVertexPosition(v));
      EXPECT_NEAR(D3DXVec3Length(&normal), 1.0f, 1e-5f) << v;
      EXPECT_GT(D3DXVec3Dot(&normal, &out), 0.0f) << v;
    }
    // Direct3D culls counter-clockwise faces: cross(b - a, c - a) must point out of the shape.
    for (DWORD t = 0; t < static_cast<DWORD>(c.triangles * 3); t += 3) {
      D3DXVECTOR3 p[3], face;
      for (DWORD k = 0; k < 3; ++k) p[k] = mesh.GetVertexPosition(mesh.GetIndexes(t + k));
      const D3DXVECTOR3 ab = p[1] - p[0], ac = p[2] - p[0], out = outward((p[0] + p[1] + p[2]) / 3);
      D3DXVec3Cross(&face, &ab, &ac);
      EXPECT_GT(D3DXVec3Dot(&face, &out), 1e-6f * D3DXVec3Length(&out)) << "triangle " << t / 3;
    }
  }
}

TEST_F(BuiltInShapes, UnusableSizesGiveNothing) {
  Mesh mesh;
  mesh.BuildBox(D3DXVECTOR3(1.0f, 2.0f, 3.0f));
  mesh.BuildQuad(0.0f, 1.0f);  // replaces the box with nothing
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  mesh.BuildBox({1, kNaN, 1});
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  mesh.BuildUvSphere(kInf, 8, 8);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  mesh.BuildDisc(-0.0f, 8);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
}

}  // namespace
