// The object-data channel: lists and their bounds, the Direct3D buffers on the MemoryDevice,
// the draw's exact device calls, pre-draw states and copies that never share buffers.
#include <gtest/gtest.h>

#include <climits>
#include <cstring>
#include <memory>
#include <vector>

#include "host/device_channel.h"
#include "host/object_data_channel.h"
#include "host/tests/test_channels.h"
#include "host/type_guids.h"
#include "platform/memory_device.h"

namespace {

std::uint64_t FloatBits(float value) {
  std::uint32_t bits;
  std::memcpy(&bits, &value, sizeof(bits));
  return bits;
}

float FloatAt(const std::vector<std::uint8_t>& bytes, std::size_t offset) {
  float value;
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

TEST_F(ObjectData, FreshChannelIsEmptyWithIdentityWorld) {
  Tev_DX8_ObjectDataChannel mesh;
  const ChannelType type = mesh.GetChannelType();
  EXPECT_STREQ(type.TypeName, "3D ObjectData");
  EXPECT_EQ(type.TypeGuid, kObjectDataGuid);
  EXPECT_EQ(type.BaseTypeGuid, GUID{});
  EXPECT_EQ(type.TypeWord, 0u);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  EXPECT_EQ(mesh.GetIndexCount(), 0);
  EXPECT_EQ(mesh.VertexBuffer, nullptr);
  EXPECT_EQ(mesh.GetIndexBuffer(), nullptr);
  D3DXMATRIX identity;
  D3DXMatrixIdentity(&identity);
  EXPECT_EQ(mesh.GetWorldMatrix(), identity);
  EXPECT_EQ(mesh.GetFVFlags(), D3DFVF_XYZ | D3DFVF_NORMAL | D3DFVF_DIFFUSE | D3DFVF_TEX1);
  EXPECT_EQ(mesh.GetVertexSize(), 36);
}

TEST_F(ObjectData, SettersStoreWhatGettersAnswer) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(3);
  mesh.SetIndexCount(3);
  EXPECT_EQ(mesh.GetVertexCount(), 3);
  EXPECT_EQ(mesh.GetIndexCount(), 3);
  EXPECT_EQ(mesh.GetVertexColor(2), 0xFFFFFFFFu);  // unwritten vertices are opaque white

  EXPECT_TRUE(mesh.SetVertexPosition({1, 2, 3}, 2));
  EXPECT_TRUE(mesh.SetVertexNormal({0, 0, -1}, 2));
  EXPECT_TRUE(mesh.SetVertexTUCoord(0, {0.25f, 0.75f}, 2));
  EXPECT_TRUE(mesh.SetVertexColor(0x80112233u, 2));
  EXPECT_TRUE(mesh.SetIndex(2, 0));
  EXPECT_EQ(mesh.GetVertexPosition(2), D3DXVECTOR3(1, 2, 3));
  EXPECT_EQ(mesh.GetVertexNormals(2), D3DXVECTOR3(0, 0, -1));
  EXPECT_EQ(mesh.GetVertexTUV(0, 2), D3DXVECTOR2(0.25f, 0.75f));
  EXPECT_EQ(mesh.GetVertexColor(2), 0x80112233u);
  EXPECT_EQ(mesh.GetIndexes(0), 2u);

  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 1, 2, 3);
  mesh.SetWorldMatrix(world);
  EXPECT_EQ(mesh.GetWorldMatrix(), world);
}

TEST_F(ObjectData, OutOfRangeSettersAnswerFalseAndGettersZero) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(2);
  mesh.SetIndexCount(2);
  for (int vertex : {-1, 2, INT_MAX, INT_MIN}) {
    EXPECT_FALSE(mesh.SetVertexPosition({1, 1, 1}, vertex)) << vertex;
    EXPECT_FALSE(mesh.SetVertexNormal({1, 1, 1}, vertex)) << vertex;
    EXPECT_FALSE(mesh.SetVertexTUCoord(0, {1, 1}, vertex)) << vertex;
    EXPECT_FALSE(mesh.SetVertexColor(1, vertex)) << vertex;
    EXPECT_FALSE(mesh.SetIndex(1, vertex)) << vertex;
  }
  for (DWORD vertex : {2u, 0xFFFFFFFFu}) {
    EXPECT_EQ(mesh.GetVertexPosition(vertex), D3DXVECTOR3(0, 0, 0));
    EXPECT_EQ(mesh.GetVertexNormals(vertex), D3DXVECTOR3(0, 0, 0));
    EXPECT_EQ(mesh.GetVertexTUV(0, vertex), D3DXVECTOR2(0, 0));
    EXPECT_EQ(mesh.GetVertexColor(vertex), 0u);
    EXPECT_EQ(mesh.GetIndexes(vertex), 0u);
  }
  // Only texture set 0 exists.
  EXPECT_FALSE(mesh.SetVertexTUCoord(1, {1, 1}, 0));
  EXPECT_FALSE(mesh.SetVertexTUCoord(-1, {1, 1}, 0));
  EXPECT_EQ(mesh.GetVertexTUV(1, 0), D3DXVECTOR2(0, 0));
}

TEST_F(ObjectData, NegativeCountsEmptyTheLists) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(4);
  mesh.SetVertexCount(-3);
  mesh.SetIndexCount(INT_MIN);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  EXPECT_EQ(mesh.GetIndexCount(), 0);
}

TEST_F(ObjectData, BoundingBoxesFollowTheVertices) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(3);
  mesh.SetVertexPosition({-1, 5, 2}, 0);
  mesh.SetVertexPosition({3, -2, 0}, 1);
  mesh.SetVertexPosition({0, 0, 7}, 2);
  mesh.CalculateBoundingBox();
  EXPECT_EQ(mesh.GetBoundingBoxMin(), D3DXVECTOR3(-1, -2, 0));
  EXPECT_EQ(mesh.GetBoundingBoxMax(), D3DXVECTOR3(3, 5, 7));

  D3DXMATRIX moved;
  D3DXMatrixTranslation(&moved, 10, 0, -10);
  mesh.SetWorldMatrix(moved);
  mesh.GetObjectTransformedMinMaxBox();
  EXPECT_EQ(mesh.GetTransformedBoxMin(), D3DXVECTOR3(9, -2, -10));
  EXPECT_EQ(mesh.GetTransformedBoxMax(), D3DXVECTOR3(13, 5, -3));
}

TEST_F(ObjectData, PlanarMappingSpansTheBox) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(3);
  mesh.SetVertexPosition({-2, -1, 0}, 0);
  mesh.SetVertexPosition({2, -1, 0}, 1);
  mesh.SetVertexPosition({0, 1, 0}, 2);
  mesh.MapTexture(0, Tev_DX8_ObjectDataChannel::kMappingPlanar, false);
  EXPECT_EQ(mesh.GetTextureMapping(0), Tev_DX8_ObjectDataChannel::kMappingPlanar);
  EXPECT_EQ(mesh.GetVertexTUV(0, 0), D3DXVECTOR2(0.0f, 1.0f));  // bottom left
  EXPECT_EQ(mesh.GetVertexTUV(0, 1), D3DXVECTOR2(1.0f, 1.0f));
  EXPECT_EQ(mesh.GetVertexTUV(0, 2), D3DXVECTOR2(0.5f, 0.0f));  // top middle

  mesh.SetVertexTUCoord(0, {3, -1}, 0);
  mesh.SetVertexTUCoord(0, {5, 1}, 1);
  mesh.SetVertexTUCoord(0, {4, 0}, 2);
  mesh.NormalizeTexture(0);
  EXPECT_EQ(mesh.GetVertexTUV(0, 0), D3DXVECTOR2(0.0f, 0.0f));
  EXPECT_EQ(mesh.GetVertexTUV(0, 1), D3DXVECTOR2(1.0f, 1.0f));
  EXPECT_EQ(mesh.GetVertexTUV(0, 2), D3DXVECTOR2(0.5f, 0.5f));
}

TEST_F(ObjectData, SphereMappingStaysInTheUnitSquare) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.BuildUvSphere(2.0f, 12, 6);
  mesh.MapTexture(0, Tev_DX8_ObjectDataChannel::kMappingSphere, false);
  for (DWORD v = 0; v < static_cast<DWORD>(mesh.GetVertexCount()); ++v) {
    const D3DXVECTOR2 uv = mesh.GetVertexTUV(0, v);
    EXPECT_GE(uv.x, 0.0f);
    EXPECT_LE(uv.x, 1.0f);
    EXPECT_GE(uv.y, 0.0f);
    EXPECT_LE(uv.y, 1.0f);
  }
  EXPECT_NEAR(mesh.GetVertexTUV(0, 0).y, 0.0f, 1e-6f);  // the top pole
}

// A mesh on the host's MemoryDevice.
class ObjectDataOnDevice : public HostContextTest {
 protected:
  ObjectDataOnDevice() : device_(MemoryDevice::Create()), device_channel_(device_) {}
  ~ObjectDataOnDevice() override { device_->Release(); }

  // A triangle list of `triangles` triangles over `vertices` vertices, every vertex distinct.
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

  MemoryDevice* device_;
  Tev_DX8_DeviceChannel device_channel_;
};

TEST_F(ObjectDataOnDevice, VertexBufferHoldsThe36ByteLayout) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  ASSERT_NE(mesh.VertexBuffer, nullptr);
  EXPECT_EQ(mesh.GetVertexBuffer(), mesh.VertexBuffer);

  D3DVERTEXBUFFER_DESC desc{};
  ASSERT_EQ(mesh.VertexBuffer->GetDesc(&desc), S_OK);
  EXPECT_EQ(desc.Size, 4u * 36u);
  EXPECT_EQ(desc.FVF, Tev_DX8_ObjectDataChannel::kFvf);
  EXPECT_EQ(desc.Usage, D3DUSAGE_WRITEONLY | D3DUSAGE_DYNAMIC);

  const std::vector<std::uint8_t> bytes = ReadBuffer(mesh.VertexBuffer, desc.Size);
  for (std::size_t v = 0; v < 4; ++v) {
    const std::size_t at = v * 36;
    const float f = static_cast<float>(v);
    EXPECT_EQ(FloatAt(bytes, at + 0), f);
    EXPECT_EQ(FloatAt(bytes, at + 4), f + 0.5f);
    EXPECT_EQ(FloatAt(bytes, at + 8), -f);
    EXPECT_EQ(FloatAt(bytes, at + 12), 0.0f);
    EXPECT_EQ(FloatAt(bytes, at + 16), 1.0f);
    EXPECT_EQ(FloatAt(bytes, at + 20), 0.0f);
    std::uint32_t color;
    std::memcpy(&color, bytes.data() + at + 24, 4);
    EXPECT_EQ(color, 0xFF000000u | static_cast<std::uint32_t>(v));
    EXPECT_EQ(FloatAt(bytes, at + 28), f / 8.0f);
    EXPECT_EQ(FloatAt(bytes, at + 32), 1.0f - f / 8.0f);
  }
}

struct IndexWidthCase {
  int vertices;
  D3DFORMAT format;
  std::size_t index_size;
};

class IndexWidth : public ObjectDataOnDevice,
                   public ::testing::WithParamInterface<IndexWidthCase> {};

TEST_P(IndexWidth, SixteenBitsUntilTheVerticesNeedMore) {
  const IndexWidthCase& c = GetParam();
  Tev_DX8_ObjectDataChannel mesh;
  mesh.SetVertexCount(c.vertices);
  mesh.SetIndexCount(6);
  const DWORD last = static_cast<DWORD>(c.vertices - 1);
  const DWORD wanted[6] = {0, 1, last, last, 1, 2};
  for (int i = 0; i < 6; ++i) mesh.SetIndex(wanted[i], i);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  ASSERT_NE(mesh.GetIndexBuffer(), nullptr);
  EXPECT_EQ(mesh.UsesIndexBuffer32(), c.index_size == 4);

  D3DINDEXBUFFER_DESC desc{};
  ASSERT_EQ(mesh.GetIndexBuffer()->GetDesc(&desc), S_OK);
  EXPECT_EQ(desc.Format, c.format);
  EXPECT_EQ(desc.Size, 6 * c.index_size);
  const std::vector<std::uint8_t> bytes = ReadBuffer(mesh.GetIndexBuffer(), desc.Size);
  for (int i = 0; i < 6; ++i) {
    std::uint32_t value = 0;
    std::memcpy(&value, bytes.data() + i * c.index_size, c.index_size);
    EXPECT_EQ(value, wanted[i]) << i;
  }
}

INSTANTIATE_TEST_SUITE_P(Boundary, IndexWidth,
                         ::testing::Values(IndexWidthCase{3, D3DFMT_INDEX16, 2},
                                           IndexWidthCase{65536, D3DFMT_INDEX16, 2},
                                           IndexWidthCase{65537, D3DFMT_INDEX32, 4}));

TEST_F(ObjectDataOnDevice, IndexPastTheVerticesBuildsNothing) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 3, 1);
  mesh.SetIndex(3, 2);
  EXPECT_FALSE(mesh.CreateVertexBuffer());
  EXPECT_EQ(mesh.VertexBuffer, nullptr);
  EXPECT_EQ(mesh.GetIndexBuffer(), nullptr);
}

TEST_F(ObjectDataOnDevice, RebuildingReleasesThePreviousBuffers) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  EXPECT_EQ(device_->LiveObjectCount(), 2);
  mesh.Release();
  EXPECT_EQ(device_->LiveObjectCount(), 0);
  EXPECT_EQ(mesh.VertexBuffer, nullptr);
  EXPECT_EQ(mesh.GetVertexCount(), 0);
  EXPECT_EQ(mesh.GetIndexCount(), 0);
}

enum class FailingCall { CreateVertexBuffer, CreateIndexBuffer, BufferLock };

class DeviceFailure : public ObjectDataOnDevice, public ::testing::WithParamInterface<FailingCall> {
 protected:
  void FailNext(FailingCall call) {
    switch (call) {
      case FailingCall::CreateVertexBuffer:
        return device_->FailNextCreateVertexBuffer();
      case FailingCall::CreateIndexBuffer:
        return device_->FailNextCreateIndexBuffer();
      case FailingCall::BufferLock:
        return device_->FailNextBufferLock();
    }
  }
};

TEST_P(DeviceFailure, LeavesNoBuffersBehind) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  ASSERT_TRUE(mesh.CreateVertexBuffer());  // the failed rebuild must drop these too
  FailNext(GetParam());
  EXPECT_FALSE(mesh.CreateVertexBuffer());
  EXPECT_EQ(mesh.VertexBuffer, nullptr);
  EXPECT_EQ(mesh.GetIndexBuffer(), nullptr);
  EXPECT_EQ(device_->LiveObjectCount(), 0);
  device_->ClearCalls();
  mesh.StreamVertexData();
  EXPECT_TRUE(device_->Calls().empty());
  EXPECT_TRUE(mesh.CreateVertexBuffer());  // the device works again
}

INSTANTIATE_TEST_SUITE_P(Calls, DeviceFailure,
                         ::testing::Values(FailingCall::CreateVertexBuffer,
                                           FailingCall::CreateIndexBuffer,
                                           FailingCall::BufferLock));

TEST(ObjectDataWithoutDevice, CreateVertexBufferFails) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_ObjectDataChannel mesh;
  mesh.BuildQuad(1, 1);
  EXPECT_FALSE(mesh.CreateVertexBuffer());
  Tev_DX8_DeviceChannel no_device;
  EXPECT_FALSE(mesh.CreateVertexBuffer());
  mesh.StreamVertexData();  // nothing to draw on: must simply return
  mesh.DoCustomPreRenderStates();
  EXPECT_EQ(mesh.VertexBuffer, nullptr);
}

TEST_F(ObjectDataOnDevice, StreamVertexDataMakesTheseCallsExactly) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 5, 3);
  D3DXMATRIX world;
  D3DXMatrixTranslation(&world, 1.5f, -2.0f, 3.0f);
  mesh.SetWorldMatrix(world);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  device_->ClearCalls();
  mesh.StreamVertexData();

  std::vector<std::uint64_t> transform_args = {D3DTS_WORLD};
  for (const auto& row : world.m)
    for (float v : row) transform_args.push_back(FloatBits(v));
  const std::vector<DeviceCall> expected = {
      {"SetTransform", transform_args},
      {"SetStreamSource", {0, device_->ObjectId(mesh.VertexBuffer), 0, 36}},
      {"SetFVF", {Tev_DX8_ObjectDataChannel::kFvf}},
      {"SetIndices", {device_->ObjectId(mesh.GetIndexBuffer())}},
      {"DrawIndexedPrimitive", {D3DPT_TRIANGLELIST, 0, 0, 5, 0, 3}},
  };
  EXPECT_EQ(device_->Calls(), expected) << ::testing::PrintToString(device_->CallStrings());
  EXPECT_EQ(device_->BoundStream(), mesh.VertexBuffer);
  EXPECT_EQ(device_->BoundIndices(), mesh.GetIndexBuffer());
  const D3DMATRIX bound = device_->Transform(D3DTS_WORLD);
  EXPECT_EQ(std::memcmp(&bound, &world, sizeof(bound)), 0);
}

TEST_F(ObjectDataOnDevice, DrawUsesTheCountsTheBuffersWereBuiltWith) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  ASSERT_TRUE(mesh.CreateVertexBuffer());
  mesh.SetVertexCount(400);  // not rebuilt: the draw must not reach past the buffers
  mesh.SetIndexCount(900);
  device_->ClearCalls();
  mesh.StreamVertexData();
  ASSERT_FALSE(device_->Calls().empty());
  EXPECT_EQ(device_->Calls().back(),
            (DeviceCall{"DrawIndexedPrimitive", {D3DPT_TRIANGLELIST, 0, 0, 4, 0, 2}}));
}

TEST_F(ObjectDataOnDevice, NothingIsDrawnWithoutBuffers) {
  Tev_DX8_ObjectDataChannel mesh;
  Fill(mesh, 4, 2);
  device_->ClearCalls();
  mesh.StreamVertexData();
  EXPECT_TRUE(device_->Calls().empty());
  mesh.SetIndexCount(0);
  ASSERT_TRUE(mesh.CreateVertexBuffer());  // a vertex buffer without indices
  EXPECT_EQ(mesh.GetIndexBuffer(), nullptr);
  device_->ClearCalls();
  mesh.StreamVertexData();
  EXPECT_TRUE(device_->Calls().empty());
}

TEST_F(ObjectDataOnDevice, PreRenderStatesTurnLightingOffAndModulate) {
  Tev_DX8_ObjectDataChannel mesh;
  mesh.DoCustomPreRenderStates();
  EXPECT_EQ(device_->RenderState(D3DRS_LIGHTING), static_cast<DWORD>(FALSE));
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLOROP), static_cast<DWORD>(D3DTOP_MODULATE));
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLORARG1), D3DTA_TEXTURE);
  EXPECT_EQ(device_->TextureStageState(0, D3DTSS_COLORARG2), D3DTA_DIFFUSE);
}

TEST_F(ObjectDataOnDevice, CopiesNeverShareBuffers) {
  auto original = std::make_unique<Tev_DX8_ObjectDataChannel>();
  Fill(*original, 4, 2);
  D3DXMATRIX world;
  D3DXMatrixScaling(&world, 2, 2, 2);
  original->SetWorldMatrix(world);
  ASSERT_TRUE(original->CreateVertexBuffer());

  auto copy = std::make_unique<Tev_DX8_ObjectDataChannel>(*original);
  EXPECT_EQ(copy->VertexBuffer, nullptr);
  EXPECT_EQ(copy->GetIndexBuffer(), nullptr);
  EXPECT_EQ(copy->GetVertexCount(), 4);
  EXPECT_EQ(copy->GetIndexes(5), original->GetIndexes(5));
  EXPECT_EQ(copy->GetVertexPosition(3), original->GetVertexPosition(3));
  EXPECT_EQ(copy->GetWorldMatrix(), world);

  Tev_DX8_ObjectDataChannel assigned;
  Fill(assigned, 3, 1);
  ASSERT_TRUE(assigned.CreateVertexBuffer());
  assigned = *original;  // gives back its own buffers, takes none
  EXPECT_EQ(assigned.VertexBuffer, nullptr);
  EXPECT_EQ(assigned.GetVertexCount(), 4);
  EXPECT_EQ(device_->LiveObjectCount(), 2);

  original.reset();  // releases its buffers once; the copies hold none
  EXPECT_EQ(device_->LiveObjectCount(), 0);
  ASSERT_TRUE(copy->CreateVertexBuffer());
  copy.reset();
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

TEST_F(ObjectDataOnDevice, CustomDataChannelsAreListed) {
  Tev_DX8_ObjectDataChannel mesh;
  TypedChannel extra(kTypeA);
  mesh.AddCustomDataChannel(&extra);
  mesh.AddCustomDataChannel(nullptr);
  EXPECT_EQ(mesh.GetCustomDataChannelCount(), 1);
  EXPECT_EQ(mesh.GetCustomDataChannel(0), &extra);
  EXPECT_EQ(mesh.GetCustomDataChannel(1), nullptr);
  EXPECT_EQ(mesh.GetCustomDataChannel(-1), nullptr);
}

TEST_F(ObjectDataOnDevice, FoundAsTheHostsObjectDataChannel) {
  Tev_DX8_ObjectDataChannel mesh;
  EXPECT_EQ(context_.GetChannelByType(kObjectDataGuid, 0), &mesh);
  EXPECT_EQ(mesh.FindDeviceChannel(), &device_channel_);
}

}  // namespace
