#include "fuzz/channel_factory.h"

#include <memory>
#include <vector>

#include "fuzz/host_script.h"
#include "host/attractor.h"
#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "host/smoke_settings.h"
#include "host/type_guids.h"
#include "plugin/link_table.h"

namespace apefuzz {

namespace {

// Small enough that every shape stays cheap, large enough for partial triangles and indices
// past the vertices.
constexpr int kMaximumMeshVertices = 9;
constexpr int kMaximumMeshIndices = 13;
constexpr int kMaximumEnvelopeKeys = 8;
constexpr int kMaximumTextureEdge = 70;  // pixels
constexpr int kMaximumShapeSegments = 40;

enum TextureKind : std::uint8_t {
  kTextureEmpty = 0,
  kTextureCreated,  // the channel's own CreateTexture, width and height
  kTextureOdd,      // a format, a level count, width and height, made on the device directly
  kTextureKindCount,
};

constexpr D3DFORMAT kTextureFormats[] = {D3DFMT_A8R8G8B8, D3DFMT_X8R8G8B8, D3DFMT_R8G8B8,
                                         D3DFMT_R5G6B5,   D3DFMT_A8,       D3DFMT_UNKNOWN};

Tev_EnvelopeStorage::Key ReadKey(ByteReader& in) {
  Tev_EnvelopeStorage::Key key{in.Value(), in.Value()};
  key.Mode = static_cast<Tev_EnvelopeStorage::Interpolation>(in.Below(3));
  return key;
}

void FillEnvelope(Tev_EnvelopeStorage& envelope, ByteReader& in) {
  const int count = in.Below(kMaximumEnvelopeKeys + 1);
  if (in.Flag()) {
    std::vector<Tev_EnvelopeStorage::Key> keys;
    for (int k = 0; k < count; ++k) keys.push_back(ReadKey(in));
    envelope.SetKeys(keys);
  } else {
    for (int k = 0; k < count; ++k) {
      const Tev_EnvelopeStorage::Key key = ReadKey(in);
      envelope.AddKey(key.X, key.Y, key.Mode);
    }
  }
}

void FillMeshLists(Tev_DX8_ObjectDataChannel& mesh, ByteReader& in) {
  // -1 included: a host may ask for a negative count.
  const int vertices = in.Below(kMaximumMeshVertices + 2) - 1;
  mesh.SetVertexCount(vertices);
  const bool normals = in.Flag();
  for (int v = 0; v < vertices; ++v) {
    mesh.SetVertexPosition(ReadVector(in), v);
    if (normals) mesh.SetVertexNormal(ReadVector(in), v);
  }
  const int indices = in.Below(kMaximumMeshIndices + 2) - 1;
  mesh.SetIndexCount(indices);
  for (int i = 0; i < indices; ++i) {
    const std::uint8_t entry = in.Byte();
    mesh.SetIndex(entry == 0xFF ? 0xFFFFFFFFu : entry % 16u, i);
  }
  if (in.Flag()) mesh.SetWorldMatrix(ReadMatrix(in));
}

void FillMesh(Tev_DX8_ObjectDataChannel& mesh, ByteReader& in) {
  switch (in.Below(kMeshKindCount)) {
    case kMeshLists:
      FillMeshLists(mesh, in);
      break;
    case kMeshQuad: {
      const float width = in.Value();
      mesh.BuildQuad(width, in.Value());
      break;
    }
    case kMeshBox:
      mesh.BuildBox(ReadVector(in));
      break;
    case kMeshSphere: {
      const float radius = in.Value();
      const int slices = in.Below(kMaximumShapeSegments);
      mesh.BuildUvSphere(radius, slices, in.Below(kMaximumShapeSegments));
      break;
    }
    default: {
      const float radius = in.Value();
      mesh.BuildDisc(radius, in.Below(kMaximumShapeSegments));
      break;
    }
  }
}

void FillTexture(Qen_TextureChannel& texture, ByteReader& in) {
  switch (in.Below(kTextureKindCount)) {
    case kTextureEmpty:
      texture.ReleaseTexture();
      break;
    case kTextureCreated: {
      const auto width = static_cast<UINT>(in.Below(kMaximumTextureEdge));
      texture.CreateTexture(width, static_cast<UINT>(in.Below(kMaximumTextureEdge)));
      break;
    }
    default: {
      const D3DFORMAT format = kTextureFormats[in.Below(std::size(kTextureFormats))];
      const auto levels = static_cast<UINT>(in.Below(4));
      const auto width = static_cast<UINT>(in.Below(kMaximumTextureEdge));
      const auto height = static_cast<UINT>(in.Below(kMaximumTextureEdge));
      IDirect3DDevice9* device = FindDevice(texture.GetHostContext());
      IDirect3DTexture9* made = nullptr;
      if (device != nullptr && SUCCEEDED(device->CreateTexture(width, height, levels, 0, format,
                                                               D3DPOOL_MANAGED, &made, nullptr))) {
        texture.SetTexture(made);
        made->Release();
      }
      break;
    }
  }
}

Tev_DX8_ObjectDataChannel* MakeMesh(ByteReader& in, ChannelPool& pool, bool pinned) {
  if (pool.Full()) return nullptr;
  auto* mesh = pool.Add(std::make_unique<Tev_DX8_ObjectDataChannel>(), pinned);
  FillMesh(*mesh, in);
  return mesh;
}

enum CollisionChange : std::uint8_t {
  kCollisionPlane = 0,
  kCollisionSphere,
  kCollisionBox,
  kCollisionLinkedMesh,
  kCollisionAddedMesh,
  kCollisionClear,
  kCollisionRebuild,
  kCollisionChangeCount,
};

void ChangeCollision(Tev_MultiCollisionManager& manager, ByteReader& in, ChannelPool& pool) {
  switch (in.Below(kCollisionChangeCount)) {
    case kCollisionPlane: {
      const D3DXVECTOR3 point = ReadVector(in);
      manager.AddPlane(point, ReadVector(in));
      break;
    }
    case kCollisionSphere: {
      const D3DXVECTOR3 centre = ReadVector(in);
      manager.AddSphere(centre, in.Value());
      break;
    }
    case kCollisionBox: {
      const D3DXMATRIX world = ReadMatrix(in);
      manager.AddBox(world, ReadVector(in));
      break;
    }
    case kCollisionLinkedMesh:
      if (auto* mesh = MakeMesh(in, pool, false))
        manager.AddChild(Tev_MultiCollisionManager::kLinkCollisionObjects, mesh);
      break;
    case kCollisionAddedMesh:
      // The host keeps an added mesh alive for the manager's life: pinned.
      if (auto* mesh = MakeMesh(in, pool, true)) manager.AddMesh(mesh);
      break;
    case kCollisionClear:
      manager.ClearObjects();
      break;
    default:
      manager.RebuildAllCollisionObjects();
      break;
  }
}

// A value or envelope at one of the sibling's links, or the link emptied.
template <typename Sibling>
void ChangeSiblingLink(Sibling& sibling, int link, bool envelope_link, ByteReader& in,
                       ChannelPool& pool) {
  if (in.Below(8) == 0 || pool.Full()) {
    sibling.ClearChild(link);
    return;
  }
  if (envelope_link) {
    auto* envelope = pool.Add(std::make_unique<Tev_EnvelopeStorage>());
    FillEnvelope(*envelope, in);
    sibling.SetChild(link, envelope);
    return;
  }
  if (auto* value = dynamic_cast<Qen_ValueChannel*>(sibling.GetChild(link))) {
    value->SetValue(in.Value());
    return;
  }
  sibling.SetChild(link, pool.Add(std::make_unique<Qen_ValueChannel>(in.Value())));
}

void ChangeSmoke(Tev_AdvPE_SmokeSettings& smoke, ByteReader& in, ChannelPool& pool) {
  const int link = in.Below(Tev_AdvPE_SmokeSettings::kLinkCount);
  ChangeSiblingLink(smoke, link, link <= Tev_AdvPE_SmokeSettings::kLinkForceStrengthEnvelope, in,
                    pool);
}

enum AttractorChange : std::uint8_t {
  kAttractorFields = 0,  // every public field
  kAttractorPositionLink,
  kAttractorAxisLink,
  kAttractorValueLink,  // one of the value links
  kAttractorChangeCount,
};

void SetVectorLink(Qen_Channel& owner, int link, ByteReader& in, ChannelPool& pool) {
  if (auto* vector = dynamic_cast<Qen_ValueVectorChannel*>(owner.GetChild(link))) {
    vector->SetVector(ReadVector(in));
  } else if (!pool.Full()) {
    owner.SetChild(link, pool.Add(std::make_unique<Qen_ValueVectorChannel>(ReadVector(in))));
  }
}

void ChangeAttractor(Tev_AdvPE_Attractor& attractor, ByteReader& in, ChannelPool& pool) {
  switch (in.Below(kAttractorChangeCount)) {
    case kAttractorFields:
      attractor.Position = ReadVector(in);
      attractor.Strength = in.Value();
      attractor.FalloffMode = in.Flag() ? Tev_AdvPE_Attractor::Falloff::Linear
                                        : Tev_AdvPE_Attractor::Falloff::InverseSquare;
      attractor.MinimumRadius = in.Value();
      attractor.Radius = in.Value();
      attractor.VortexStrength = in.Value();
      attractor.VortexAxis = ReadVector(in);
      break;
    case kAttractorPositionLink:
      SetVectorLink(attractor, Tev_AdvPE_Attractor::kLinkPosition, in, pool);
      break;
    case kAttractorAxisLink:
      SetVectorLink(attractor, Tev_AdvPE_Attractor::kLinkVortexAxis, in, pool);
      break;
    default: {
      constexpr int kValueLinks[] = {
          Tev_AdvPE_Attractor::kLinkStrength, Tev_AdvPE_Attractor::kLinkLinearFalloff,
          Tev_AdvPE_Attractor::kLinkMinimumRadius, Tev_AdvPE_Attractor::kLinkRadius,
          Tev_AdvPE_Attractor::kLinkVortexStrength};
      ChangeSiblingLink(attractor, kValueLinks[in.Below(std::size(kValueLinks))], false, in, pool);
      break;
    }
  }
}

enum EnvelopeChange : std::uint8_t {
  kEnvelopeRefill = 0,
  kEnvelopeAddKey,
  kEnvelopeRemoveKey,
  kEnvelopeReplaceKey,
  kEnvelopeClear,
  kEnvelopeChangeCount,
};

void ChangeEnvelope(Tev_EnvelopeStorage& envelope, ByteReader& in) {
  switch (in.Below(kEnvelopeChangeCount)) {
    case kEnvelopeRefill:
      envelope.ClearKeys();
      FillEnvelope(envelope, in);
      break;
    case kEnvelopeAddKey: {
      const Tev_EnvelopeStorage::Key key = ReadKey(in);
      envelope.AddKey(key.X, key.Y, key.Mode);
      break;
    }
    case kEnvelopeRemoveKey:
      envelope.RemoveKey(in.Index());
      break;
    case kEnvelopeReplaceKey: {
      const int index = in.Index();
      envelope.ReplaceKey(index, ReadKey(in));
      break;
    }
    default:
      envelope.ClearKeys();
      break;
  }
}

enum MeshChange : std::uint8_t {
  kMeshRefill = 0,
  kMeshVertexCount,
  kMeshIndexCount,
  kMeshVertexPosition,
  kMeshIndex,
  kMeshRelease,
  kMeshWorldMatrix,
  kMeshChangeCount,
};

void ChangeMesh(Tev_DX8_ObjectDataChannel& mesh, ByteReader& in) {
  switch (in.Below(kMeshChangeCount)) {
    case kMeshRefill:
      FillMesh(mesh, in);
      break;
    case kMeshVertexCount:
      mesh.SetVertexCount(in.Below(kMaximumMeshVertices + 2) - 1);
      break;
    case kMeshIndexCount:
      mesh.SetIndexCount(in.Below(kMaximumMeshIndices + 2) - 1);
      break;
    case kMeshVertexPosition: {
      const D3DXVECTOR3 position = ReadVector(in);
      mesh.SetVertexPosition(position, in.Index());
      break;
    }
    case kMeshIndex: {
      const DWORD vertex = in.Dword();
      mesh.SetIndex(vertex, in.Index());
      break;
    }
    case kMeshRelease:
      mesh.Release();
      break;
    default:
      mesh.SetWorldMatrix(ReadMatrix(in));
      break;
  }
}

}  // namespace

D3DXVECTOR3 ReadVector(ByteReader& in) {
  const float x = in.Value();
  const float y = in.Value();
  return D3DXVECTOR3(x, y, in.Value());
}

D3DXMATRIX ReadMatrix(ByteReader& in) {
  D3DXMATRIX matrix;
  D3DXMatrixIdentity(&matrix);
  switch (in.Below(kMatrixKindCount)) {
    case kMatrixIdentity:
      break;
    case kMatrixTranslation: {
      const D3DXVECTOR3 t = ReadVector(in);
      D3DXMatrixTranslation(&matrix, t.x, t.y, t.z);
      break;
    }
    case kMatrixScale: {
      const D3DXVECTOR3 s = ReadVector(in);
      D3DXMatrixScaling(&matrix, s.x, s.y, s.z);
      break;
    }
    default:
      for (auto& row : matrix.m)
        for (float& element : row) element = in.Value();
      break;
  }
  return matrix;
}

Qen_Channel* MakeChannelForLink(int link, ByteReader& in, ChannelPool& pool) {
  if (pool.Full()) return nullptr;
  const GUID type = GetEmitterLinkSpec(link).TypeGuid;
  if (type == kValueGuid) return pool.Add(std::make_unique<Qen_ValueChannel>(in.Value()));
  if (type == kValueVectorGuid)
    return pool.Add(std::make_unique<Qen_ValueVectorChannel>(ReadVector(in)));
  if (type == kMatrixGuid) return pool.Add(std::make_unique<Qen_MatrixChannel>(ReadMatrix(in)));
  if (type == kEnvelopeStorageGuid) {
    auto* envelope = pool.Add(std::make_unique<Tev_EnvelopeStorage>());
    FillEnvelope(*envelope, in);
    return envelope;
  }
  if (type == kObjectDataGuid) return MakeMesh(in, pool, false);
  if (type == kTextureGuid) {
    auto* texture = pool.Add(std::make_unique<Qen_TextureChannel>());
    FillTexture(*texture, in);
    return texture;
  }
  if (type == kMultiCollisionManagerGuid) {
    auto* manager = pool.Add(std::make_unique<Tev_MultiCollisionManager>());
    for (int k = in.Below(4); k > 0; --k) ChangeCollision(*manager, in, pool);
    return manager;
  }
  if (type == kSmokeSettingsGuid) {
    auto* smoke = pool.Add(std::make_unique<Tev_AdvPE_SmokeSettings>());
    for (int k = in.Below(6); k > 0; --k) ChangeSmoke(*smoke, in, pool);
    return smoke;
  }
  auto* attractor = pool.Add(std::make_unique<Tev_AdvPE_Attractor>());
  for (int k = in.Below(3); k > 0; --k) ChangeAttractor(*attractor, in, pool);
  return attractor;
}

void MutateChannel(Qen_Channel& channel, ByteReader& in, ChannelPool& pool) {
  if (auto* value = dynamic_cast<Qen_ValueChannel*>(&channel)) {
    value->SetValue(in.Value());
  } else if (auto* vector = dynamic_cast<Qen_ValueVectorChannel*>(&channel)) {
    vector->SetVector(ReadVector(in));
  } else if (auto* matrix = dynamic_cast<Qen_MatrixChannel*>(&channel)) {
    matrix->SetMatrix(ReadMatrix(in));
  } else if (auto* envelope = dynamic_cast<Tev_EnvelopeStorage*>(&channel)) {
    ChangeEnvelope(*envelope, in);
  } else if (auto* texture = dynamic_cast<Qen_TextureChannel*>(&channel)) {
    FillTexture(*texture, in);
  } else if (auto* manager = dynamic_cast<Tev_MultiCollisionManager*>(&channel)) {
    ChangeCollision(*manager, in, pool);
  } else if (auto* smoke = dynamic_cast<Tev_AdvPE_SmokeSettings*>(&channel)) {
    ChangeSmoke(*smoke, in, pool);
  } else if (auto* attractor = dynamic_cast<Tev_AdvPE_Attractor*>(&channel)) {
    ChangeAttractor(*attractor, in, pool);
  } else if (auto* mesh = dynamic_cast<Tev_DX8_ObjectDataChannel*>(&channel)) {
    ChangeMesh(*mesh, in);
  }
}

}  // namespace apefuzz
