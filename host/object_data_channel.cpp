// The renderable mesh channel: vertex and index lists, their Direct3D buffers and the draw.
#include "host/object_data_channel.h"

#include <cstring>
#include <exception>
#include <limits>

#include "host/device_channel.h"
#include "host/host_context.h"

namespace {

constexpr UINT kVertexStride = sizeof(ObjectVertex);
constexpr DWORD kBufferUsage = D3DUSAGE_WRITEONLY | D3DUSAGE_DYNAMIC;
// Direct3D refuses dynamic buffers in the managed pool.
constexpr D3DPOOL kBufferPool = D3DPOOL_DEFAULT;
// A vertex nobody has written yet draws opaque white, as Direct3D's default diffuse colour.
constexpr D3DCOLOR kDefaultVertexColor = 0xFFFFFFFFu;

template <typename Interface>
void ReleaseInterface(Interface*& object) {
  if (object != nullptr) object->Release();
  object = nullptr;
}

// True when `index` (an int or a DWORD from the caller) names an element of a list of `size`.
bool InRange(long long index, std::size_t size) {
  return index >= 0 && static_cast<unsigned long long>(index) < size;
}

IDirect3DDevice9* DeviceOf(const Tev_DX8_D3DDeviceUse& channel) {
  Tev_DX8_DeviceChannel* device_channel = channel.FindDeviceChannel();
  return device_channel != nullptr ? device_channel->GetDevice() : nullptr;
}

// Resizes a list, leaving it empty when the memory cannot be had: no exception reaches the
// host through a virtual operation.
template <typename List>
void ResizeOrEmpty(List& list, int count, const typename List::value_type& fill) {
  try {
    list.resize(static_cast<std::size_t>(count > 0 ? count : 0), fill);
  } catch (const std::exception&) {
    List().swap(list);
  }
}

}  // namespace

// --- Device-use layer ---

Tev_DX8_D3DDeviceUse::Tev_DX8_D3DDeviceUse() = default;
void Tev_DX8_D3DDeviceUse::InvalidateDeviceObjects() {}
void Tev_DX8_D3DDeviceUse::InvalidateDirectGraphics() {}
Tev_DX8_DeviceChannel* Tev_DX8_D3DDeviceUse::FindDeviceChannel() const {
  return ::FindDeviceChannel(HostContext);
}

// --- Life cycle ---

Tev_DX8_ObjectDataChannel::Tev_DX8_ObjectDataChannel() {
  D3DXMatrixIdentity(&WorldMatrix);
}

// The copy starts without Direct3D buffers: each object releases only its own.
Tev_DX8_ObjectDataChannel::Tev_DX8_ObjectDataChannel(const Tev_DX8_ObjectDataChannel& other)
    : Tev_DX8_D3DDeviceUse(other) {
  CopyMeshFrom(other);
}

Tev_DX8_ObjectDataChannel& Tev_DX8_ObjectDataChannel::operator=(
    const Tev_DX8_ObjectDataChannel& other) {
  if (this == &other) return *this;
  Tev_DX8_D3DDeviceUse::operator=(other);
  ReleaseBuffers();
  CopyMeshFrom(other);
  return *this;
}

Tev_DX8_ObjectDataChannel::~Tev_DX8_ObjectDataChannel() {
  Tev_DX8_ObjectDataChannel::Release();
}

void Tev_DX8_ObjectDataChannel::CopyMeshFrom(const Tev_DX8_ObjectDataChannel& other) {
  Vertices = other.Vertices;
  Indices = other.Indices;
  WorldMatrix = other.WorldMatrix;
  BoundingBoxMin = other.BoundingBoxMin;
  BoundingBoxMax = other.BoundingBoxMax;
  TransformedBoxMin = other.TransformedBoxMin;
  TransformedBoxMax = other.TransformedBoxMax;
  TuvOffset = other.TuvOffset;
  PolygonType = other.PolygonType;
  TextureTransform = other.TextureTransform;
  TextureMapping = other.TextureMapping;
  CustomDataChannels = other.CustomDataChannels;
}

// The mesh has no file format beyond what the channel base keeps.
bool Tev_DX8_ObjectDataChannel::SaveChannel(QenFileSaver& saver) {
  return Qen_Channel::SaveChannel(saver);
}
bool Tev_DX8_ObjectDataChannel::LoadChannel(QenFileLoader& loader, Qen_ChannelGroup* group) {
  return Qen_Channel::LoadChannel(loader, group);
}

void Tev_DX8_ObjectDataChannel::Release() {
  std::vector<ObjectVertex>().swap(Vertices);
  std::vector<std::uint32_t>().swap(Indices);
  ReleaseBuffers();
}

// The lists stay; CreateVertexBuffer builds the buffers again.
void Tev_DX8_ObjectDataChannel::ReleaseVertexData() {
  ReleaseBuffers();
}

void Tev_DX8_ObjectDataChannel::ReleaseBuffers() {
  ReleaseInterface(VertexBuffer);
  ReleaseInterface(IndexBuffer);
  IndexBuffer32 = false;
  BufferVertexCount = 0;
  BufferIndexCount = 0;
}

void Tev_DX8_ObjectDataChannel::UpdateData() {
  CreateVertexBuffer();
}

// --- Direct3D buffers and drawing ---

bool Tev_DX8_ObjectDataChannel::CreateVertexBuffer() {
  ReleaseBuffers();
  IDirect3DDevice9* device = DeviceOf(*this);
  if (device == nullptr || Vertices.empty()) return false;
  // Sizes must fit the device's 32-bit lengths, and no index may point past the vertices.
  if (Vertices.size() > std::numeric_limits<UINT>::max() / kVertexStride) return false;
  if (Indices.size() > std::numeric_limits<UINT>::max() / sizeof(std::uint32_t)) return false;
  for (std::uint32_t index : Indices)
    if (index >= Vertices.size()) return false;

  IndexBuffer32 = Vertices.size() > k16BitVertexLimit;
  if (!FillVertexBuffer(device) || (!Indices.empty() && !FillIndexBuffer(device))) {
    ReleaseBuffers();
    return false;
  }
  BufferVertexCount = static_cast<UINT>(Vertices.size());
  BufferIndexCount = static_cast<UINT>(Indices.size());
  return true;
}

bool Tev_DX8_ObjectDataChannel::FillVertexBuffer(IDirect3DDevice9* device) {
  const UINT length = static_cast<UINT>(Vertices.size()) * kVertexStride;
  if (FAILED(device->CreateVertexBuffer(length, kBufferUsage, kFvf, kBufferPool, &VertexBuffer,
                                        nullptr)) ||
      VertexBuffer == nullptr)
    return false;
  void* data = nullptr;
  if (FAILED(VertexBuffer->Lock(0, length, &data, 0)) || data == nullptr) return false;
  std::memcpy(data, Vertices.data(), length);
  VertexBuffer->Unlock();
  return true;
}

bool Tev_DX8_ObjectDataChannel::FillIndexBuffer(IDirect3DDevice9* device) {
  const UINT index_size = IndexBuffer32 ? sizeof(std::uint32_t) : sizeof(std::uint16_t);
  const UINT length = static_cast<UINT>(Indices.size()) * index_size;
  const D3DFORMAT format = IndexBuffer32 ? D3DFMT_INDEX32 : D3DFMT_INDEX16;
  if (FAILED(device->CreateIndexBuffer(length, kBufferUsage, format, kBufferPool, &IndexBuffer,
                                       nullptr)) ||
      IndexBuffer == nullptr)
    return false;
  void* data = nullptr;
  if (FAILED(IndexBuffer->Lock(0, length, &data, 0)) || data == nullptr) return false;
  if (IndexBuffer32) {
    std::memcpy(data, Indices.data(), length);
  } else {
    // Every index is below the vertex count, which fits 16 bits here.
    auto* out = static_cast<std::uint16_t*>(data);
    for (std::size_t i = 0; i < Indices.size(); ++i)
      out[i] = static_cast<std::uint16_t>(Indices[i]);
  }
  IndexBuffer->Unlock();
  return true;
}

void Tev_DX8_ObjectDataChannel::StreamVertexData() {
  IDirect3DDevice9* device = DeviceOf(*this);
  const UINT triangles = BufferIndexCount / 3;
  if (device == nullptr || VertexBuffer == nullptr || IndexBuffer == nullptr || triangles == 0)
    return;
  device->SetTransform(D3DTS_WORLD, &WorldMatrix);
  device->SetStreamSource(0, VertexBuffer, 0, kVertexStride);
  device->SetFVF(kFvf);
  device->SetIndices(IndexBuffer);
  device->DrawIndexedPrimitive(D3DPT_TRIANGLELIST, 0, 0, BufferVertexCount, 0, triangles);
}

// A texture transform other than 0 (disabled) scrolls stage 0's coordinates by the offset:
// for two-coordinate sets Direct3D takes the translation from the matrix's third row.
void Tev_DX8_ObjectDataChannel::StreamTextureMatrices() {
  IDirect3DDevice9* device = DeviceOf(*this);
  if (device == nullptr || TextureTransform == 0) return;
  D3DXMATRIX matrix;
  D3DXMatrixIdentity(&matrix);
  matrix._31 = TuvOffset.Tu;
  matrix._32 = TuvOffset.Tv;
  device->SetTransform(D3DTS_TEXTURE0, &matrix);
  device->SetTextureStageState(0, D3DTSS_TEXTURETRANSFORMFLAGS,
                               static_cast<DWORD>(TextureTransform));
}

void Tev_DX8_ObjectDataChannel::SetDataToStream(int stream) {
  IDirect3DDevice9* device = DeviceOf(*this);
  if (device == nullptr || VertexBuffer == nullptr || stream < 0) return;
  device->SetStreamSource(static_cast<UINT>(stream), VertexBuffer, 0, kVertexStride);
}

// The base's states before a draw: unlit vertices, stage 0 colour = texture x diffuse.
void Tev_DX8_ObjectDataChannel::DoCustomPreRenderStates() {
  Tev_DX8_DeviceChannel* device = FindDeviceChannel();
  if (device == nullptr) return;
  device->SetRenderState(D3DRS_LIGHTING, FALSE);
  device->SetTextureStageState(0, D3DTSS_COLOROP, D3DTOP_MODULATE);
  device->SetTextureStageState(0, D3DTSS_COLORARG1, D3DTA_TEXTURE);
  device->SetTextureStageState(0, D3DTSS_COLORARG2, D3DTA_DIFFUSE);
}

void Tev_DX8_ObjectDataChannel::RenderForShader() {
  StreamVertexData();
}

IDirect3DVertexBuffer9* Tev_DX8_ObjectDataChannel::GetVertexBuffer() {
  return VertexBuffer;
}
IDirect3DIndexBuffer9* Tev_DX8_ObjectDataChannel::GetIndexBuffer() {
  return IndexBuffer;
}

// --- Lists ---

void Tev_DX8_ObjectDataChannel::SetVertexCount(int count) {
  ObjectVertex fresh{};
  fresh.Color = kDefaultVertexColor;
  ResizeOrEmpty(Vertices, count, fresh);
}
int Tev_DX8_ObjectDataChannel::GetVertexCount() {
  return static_cast<int>(Vertices.size());
}

void Tev_DX8_ObjectDataChannel::SetIndexCount(int count) {
  ResizeOrEmpty(Indices, count, 0u);
}
int Tev_DX8_ObjectDataChannel::GetIndexCount() {
  return static_cast<int>(Indices.size());
}

bool Tev_DX8_ObjectDataChannel::SetIndex(DWORD vertex, int position) {
  if (!InRange(position, Indices.size())) return false;
  Indices[static_cast<std::size_t>(position)] = vertex;
  return true;
}
DWORD Tev_DX8_ObjectDataChannel::GetIndexes(DWORD position) {
  return InRange(position, Indices.size()) ? Indices[position] : 0;
}

bool Tev_DX8_ObjectDataChannel::SetVertexPosition(D3DXVECTOR3 position, int vertex) {
  if (!InRange(vertex, Vertices.size())) return false;
  Vertices[static_cast<std::size_t>(vertex)].Position = position;
  return true;
}
D3DXVECTOR3 Tev_DX8_ObjectDataChannel::GetVertexPosition(DWORD vertex) {
  return InRange(vertex, Vertices.size()) ? Vertices[vertex].Position : D3DXVECTOR3(0, 0, 0);
}

bool Tev_DX8_ObjectDataChannel::SetVertexNormal(D3DXVECTOR3 normal, int vertex) {
  if (!InRange(vertex, Vertices.size())) return false;
  Vertices[static_cast<std::size_t>(vertex)].Normal = normal;
  return true;
}
D3DXVECTOR3 Tev_DX8_ObjectDataChannel::GetVertexNormals(DWORD vertex) {
  return InRange(vertex, Vertices.size()) ? Vertices[vertex].Normal : D3DXVECTOR3(0, 0, 0);
}

bool Tev_DX8_ObjectDataChannel::SetVertexTUCoord(int set, D3DXVECTOR2 uv, int vertex) {
  if (!InRange(set, kTextureSets) || !InRange(vertex, Vertices.size())) return false;
  ObjectVertex& target = Vertices[static_cast<std::size_t>(vertex)];
  target.Tu = uv.x;
  target.Tv = uv.y;
  return true;
}
D3DXVECTOR2 Tev_DX8_ObjectDataChannel::GetVertexTUV(int set, DWORD vertex) {
  if (!InRange(set, kTextureSets) || !InRange(vertex, Vertices.size())) return {0.0f, 0.0f};
  return {Vertices[vertex].Tu, Vertices[vertex].Tv};
}

bool Tev_DX8_ObjectDataChannel::SetVertexColor(DWORD color, int vertex) {
  if (!InRange(vertex, Vertices.size())) return false;
  Vertices[static_cast<std::size_t>(vertex)].Color = color;
  return true;
}
DWORD Tev_DX8_ObjectDataChannel::GetVertexColor(DWORD vertex) {
  return InRange(vertex, Vertices.size()) ? Vertices[vertex].Color : 0;
}

// --- Settings kept for hosts and derived channels ---

void Tev_DX8_ObjectDataChannel::SetPolygonType(int type) {
  PolygonType = type;
}
int Tev_DX8_ObjectDataChannel::GetPolygonType() {
  return PolygonType;
}

bool Tev_DX8_ObjectDataChannel::GetVertexPositionUse() {
  return true;
}
bool Tev_DX8_ObjectDataChannel::GetVertexNormalUse() {
  return true;
}
bool Tev_DX8_ObjectDataChannel::GetVertexTUUse(int set) {
  return InRange(set, kTextureSets);
}
bool Tev_DX8_ObjectDataChannel::GetVertexColorUse() {
  return true;
}
DWORD Tev_DX8_ObjectDataChannel::GetFVFlags() {
  return kFvf;
}
int Tev_DX8_ObjectDataChannel::GetVertexSize() {
  return static_cast<int>(kVertexStride);
}

VertTUVOffset Tev_DX8_ObjectDataChannel::GetTUVOffSet(int set) {
  return InRange(set, kTextureSets) ? TuvOffset : VertTUVOffset{0.0f, 0.0f};
}
void Tev_DX8_ObjectDataChannel::SetTUVOffSet(int set, VertTUVOffset offset) {
  if (InRange(set, kTextureSets)) TuvOffset = offset;
}

void Tev_DX8_ObjectDataChannel::SetWorldMatrix(D3DXMATRIX matrix) {
  WorldMatrix = matrix;
}
D3DXMATRIX Tev_DX8_ObjectDataChannel::GetWorldMatrix() {
  return WorldMatrix;
}

void Tev_DX8_ObjectDataChannel::SetTextureTransform(int set, int transform) {
  if (InRange(set, kTextureSets)) TextureTransform = transform;
}
int Tev_DX8_ObjectDataChannel::GetTextureTransform(int set) {
  return InRange(set, kTextureSets) ? TextureTransform : 0;
}

void Tev_DX8_ObjectDataChannel::AddCustomDataChannel(Qen_Channel* channel) {
  if (channel == nullptr) return;
  try {
    CustomDataChannels.push_back(channel);
  } catch (const std::exception&) {
  }
}
Qen_Channel* Tev_DX8_ObjectDataChannel::GetCustomDataChannel(int index) {
  return InRange(index, CustomDataChannels.size())
             ? CustomDataChannels[static_cast<std::size_t>(index)]
             : nullptr;
}
int Tev_DX8_ObjectDataChannel::GetCustomDataChannelCount() {
  return static_cast<int>(CustomDataChannels.size());
}
