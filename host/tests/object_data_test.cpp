// The object-data channel: lists, the Direct3D buffers on the MemoryDevice,
// the draw's exact device calls, pre-draw states and copies that never share buffers.
#include <bit>
#include <climits>
#include <cstring>
#include <functional>

#include "host/object_data_channel.h"
#include "host/tests/test_channels.h"

namespace {

template <typename T>
T ValueAt(const std::vector<std::uint8_t>& bytes, std::size_t offset) {
  T value;
  std::memcpy(&value, bytes.data() + offset, sizeof(value));
  return value;
}

template <typename Buffer>
std::vector<std::uint8_t> ReadBuffer(Buffer* buffer, std::size_t length) {
  void* data = nullptr;
  EXPECT_EQ(buffer->Lock(0, 0, &data, D3DLOCK_READONLY), S_OK);
  std::vector<std::uint8_t> bytes(static_cast<std::uint8_t*>(data),
                                  static_cast<std::uint8_t*>(data) + length);
  buffer->Unlock();
  return bytes;
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
    const DWORD past = static_cast<DWORD>(at);  // 0xFFFFFFFF, 2, 0x7FFFFFFF, 0x80000000
    EXPECT_TRUE(mesh.GetVertexPosition(past) == D3DXVECTOR3(0, 0, 0) && !mesh.GetIndexes(past) &&
                mesh.GetVertexNormals(past) == D3DXVECTOR3(0, 0, 0) && !mesh.GetVertexColor(past) &&
                mesh.GetVertexTUV(0, past) == D3DXVECTOR2(0, 0))
        << at;
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

TEST_F(ObjectDataOnDevice, VertexBufferHoldsThe36ByteLayout) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  D3DVERTEXBUFFER_DESC desc{};
  ASSERT_EQ(mesh.VertexBuffer->GetDesc(&desc), S_OK);
  EXPECT_EQ(desc.Size, 4u * 36u);
  EXPECT_EQ(desc.FVF,
            static_cast<DWORD>(D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1));
  const std::vector<std::uint8_t> bytes = ReadBuffer(mesh.VertexBuffer, desc.Size);
  for (std::size_t v = 0; v < 4; ++v) {
    const float f = static_cast<float>(v);
    const float expected[9] = {f, f + 0.5f, -f, 0, 1, 0, 0, f / 8.0f, 1.0f - f / 8.0f};
    for (std::size_t k : {0, 1, 2, 3, 4, 5, 7, 8})
      EXPECT_EQ(ValueAt<float>(bytes, v * 36 + k * 4), expected[k]) << v << " " << k;
    EXPECT_EQ(ValueAt<std::uint32_t>(bytes, v * 36 + 24), 0xFF000000u | v);
  }
}

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
    const std::vector<std::uint8_t> bytes = ReadBuffer(mesh.GetIndexBuffer(), 6 * size);
    for (std::size_t i = 0; i < 6; ++i) {
      std::uint32_t value = 0;
      std::memcpy(&value, bytes.data() + i * size, size);
      EXPECT_EQ(value, wanted[i]) << vertices << " " << i;
    }
  }
}

TEST_F(ObjectDataOnDevice, FailedBuildsLeaveNoBuffersAndDrawNothing) {
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
    device_->ClearCalls();
    mesh.StreamVertexData();
    EXPECT_TRUE(device_->Calls().empty());
  }
}

// The base's states: unlit, stage 0 colour = texture x diffuse. The draw: the buffers as built,
// however the lists changed since.
TEST_F(ObjectDataOnDevice, PreRenderStatesAndTheDrawMakeTheseCallsExactly) {
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
  mesh.SetIndexCount(0);
  ASSERT_TRUE(mesh.CreateVertexBuffer());  // vertices without indices draw nothing
  device_->ClearCalls();
  mesh.StreamVertexData();
  EXPECT_TRUE(device_->Calls().empty());
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

}  // namespace
