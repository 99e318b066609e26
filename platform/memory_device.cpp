#include "platform/memory_device.h"

#include <cstdint>
#include <memory>

#include "platform/d3d9_defaults.h"
#include "platform/memory_journal.h"
#include "platform/memory_resources.h"

namespace {

// The viewport of the notional 640 x 480 back buffer.
constexpr D3DVIEWPORT9 kDefaultViewport{0, 0, 640, 480, 0.0f, 1.0f};

// Slots of the transform table: view, projection, eight texture matrices, 256 world matrices.
constexpr std::size_t kTextureTransformSlot = 2;
constexpr std::size_t kWorldTransformSlot = kTextureTransformSlot + kD3DTextureStageCount;
constexpr std::size_t kTransformSlotCount = kWorldTransformSlot + 256;
constexpr std::size_t kNoTransformSlot = kTransformSlotCount;

std::size_t TransformSlot(std::uint32_t state) {
  if (state == D3DTS_VIEW) return 0;
  if (state == D3DTS_PROJECTION) return 1;
  if (state >= D3DTS_TEXTURE0 && state < D3DTS_TEXTURE0 + kD3DTextureStageCount)
    return kTextureTransformSlot + (state - D3DTS_TEXTURE0);
  if (state >= D3DTS_WORLD && state < D3DTS_WORLD + 256)
    return kWorldTransformSlot + (state - D3DTS_WORLD);
  return kNoTransformSlot;
}

D3DMATRIX IdentityMatrix() {
  D3DMATRIX m{};
  for (int i = 0; i < 4; ++i) m.m[i][i] = 1.0f;
  return m;
}

// Vertices a draw of this many primitives reads; 0 for an unknown primitive type.
std::uint64_t VerticesOf(D3DPRIMITIVETYPE type, UINT primitive_count) {
  const std::uint64_t n = primitive_count;
  switch (type) {
    case D3DPT_POINTLIST:
      return n;
    case D3DPT_LINELIST:
      return 2 * n;
    case D3DPT_LINESTRIP:
      return n + 1;
    case D3DPT_TRIANGLELIST:
      return 3 * n;
    case D3DPT_TRIANGLESTRIP:
    case D3DPT_TRIANGLEFAN:
      return n + 2;
  }
  return 0;
}

}  // namespace

struct MemoryDevice::State {
  std::shared_ptr<DeviceJournal> journal = std::make_shared<DeviceJournal>();
  ULONG refs = 1;
  DWORD render_states[kD3DRenderStateCount] = {};
  DWORD stage_states[kD3DTextureStageCount][kD3DTextureStageStateCount] = {};
  D3DMATRIX transforms[kTransformSlotCount];
  D3DVIEWPORT9 viewport = kDefaultViewport;
  DWORD fvf = 0;
  bool in_scene = false;
};

std::string DeviceCall::ToString() const {
  std::string text = Name + "(";
  for (std::size_t i = 0; i < Args.size(); ++i) {
    if (i != 0) text += ", ";
    text += std::to_string(Args[i]);
  }
  return text + ")";
}

MemoryDevice* MemoryDevice::Create() {
  return new MemoryDevice();
}

MemoryDevice::MemoryDevice() : state_(new State) {
  for (std::uint32_t rs = 0; rs < kD3DRenderStateCount; ++rs)
    state_->render_states[rs] = D3D9DefaultRenderState(static_cast<D3DRENDERSTATETYPE>(rs));
  for (DWORD stage = 0; stage < kD3DTextureStageCount; ++stage)
    for (std::uint32_t type = 0; type < kD3DTextureStageStateCount; ++type)
      state_->stage_states[stage][type] =
          D3D9DefaultTextureStageState(stage, static_cast<D3DTEXTURESTAGESTATETYPE>(type));
  for (D3DMATRIX& m : state_->transforms) m = IdentityMatrix();
}

MemoryDevice::~MemoryDevice() {
  delete state_;
}

ULONG MemoryDevice::AddRef() {
  return ++state_->refs;
}

ULONG MemoryDevice::Release() {
  const ULONG left = --state_->refs;
  if (left == 0) delete this;
  return left;
}

HRESULT MemoryDevice::CreateVertexBuffer(UINT length, DWORD usage, DWORD fvf, D3DPOOL pool,
                                         IDirect3DVertexBuffer9** buffer, HANDLE* /*shared*/) {
  DeviceJournal& j = *state_->journal;
  j.Record("CreateVertexBuffer", {length, usage, fvf, pool});
  if (buffer != nullptr) *buffer = nullptr;
  if (DeviceJournal::TakeFailure(j.fail_create_vertex_buffer)) return D3DERR_INVALIDCALL;
  return CreateMemoryVertexBuffer(state_->journal, length, usage, fvf, pool, buffer);
}

HRESULT MemoryDevice::CreateIndexBuffer(UINT length, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                                        IDirect3DIndexBuffer9** buffer, HANDLE* /*shared*/) {
  DeviceJournal& j = *state_->journal;
  j.Record("CreateIndexBuffer", {length, usage, format, pool});
  if (buffer != nullptr) *buffer = nullptr;
  if (DeviceJournal::TakeFailure(j.fail_create_index_buffer)) return D3DERR_INVALIDCALL;
  return CreateMemoryIndexBuffer(state_->journal, length, usage, format, pool, buffer);
}

HRESULT MemoryDevice::CreateTexture(UINT width, UINT height, UINT levels, DWORD usage,
                                    D3DFORMAT format, D3DPOOL pool, IDirect3DTexture9** texture,
                                    HANDLE* /*shared*/) {
  DeviceJournal& j = *state_->journal;
  j.Record("CreateTexture", {width, height, levels, usage, format, pool});
  if (texture != nullptr) *texture = nullptr;
  if (DeviceJournal::TakeFailure(j.fail_create_texture)) return D3DERR_INVALIDCALL;
  return CreateMemoryTexture(state_->journal, width, height, levels, usage, format, pool, texture);
}

HRESULT MemoryDevice::SetStreamSource(UINT stream, IDirect3DVertexBuffer9* buffer, UINT offset,
                                      UINT stride) {
  DeviceJournal& j = *state_->journal;
  j.Record("SetStreamSource", {stream, j.IdOf(buffer), offset, stride});
  // One stream is all the callers use; a buffer of another device cannot be bound.
  if (stream != 0 || (buffer != nullptr && !j.Owns(buffer))) return D3DERR_INVALIDCALL;
  j.stream = buffer;
  j.stream_offset = buffer != nullptr ? offset : 0;
  j.stream_stride = buffer != nullptr ? stride : 0;
  return S_OK;
}

HRESULT MemoryDevice::SetIndices(IDirect3DIndexBuffer9* buffer) {
  DeviceJournal& j = *state_->journal;
  j.Record("SetIndices", {j.IdOf(buffer)});
  if (buffer != nullptr && !j.Owns(buffer)) return D3DERR_INVALIDCALL;
  j.indices = buffer;
  return S_OK;
}

HRESULT MemoryDevice::SetFVF(DWORD fvf) {
  state_->journal->Record("SetFVF", {fvf});
  state_->fvf = fvf;
  return S_OK;
}

HRESULT MemoryDevice::DrawPrimitive(D3DPRIMITIVETYPE type, UINT start_vertex,
                                    UINT primitive_count) {
  DeviceJournal& j = *state_->journal;
  j.Record("DrawPrimitive", {type, start_vertex, primitive_count});
  const std::uint64_t vertices = VerticesOf(type, primitive_count);
  if (vertices == 0 || j.stream == nullptr || j.stream_stride == 0) return D3DERR_INVALIDCALL;
  D3DVERTEXBUFFER_DESC desc{};
  j.stream->GetDesc(&desc);
  // A draw that would read past the end of the bound buffer is refused.
  const std::uint64_t end =
      j.stream_offset + (std::uint64_t{start_vertex} + vertices) * j.stream_stride;
  return end <= desc.Size ? S_OK : D3DERR_INVALIDCALL;
}

HRESULT MemoryDevice::DrawIndexedPrimitive(D3DPRIMITIVETYPE type, INT base_vertex_index,
                                           UINT min_vertex_index, UINT num_vertices,
                                           UINT start_index, UINT primitive_count) {
  DeviceJournal& j = *state_->journal;
  j.Record("DrawIndexedPrimitive", {type, SignedArg(base_vertex_index), min_vertex_index,
                                    num_vertices, start_index, primitive_count});
  const std::uint64_t indices = VerticesOf(type, primitive_count);
  if (indices == 0 || j.stream == nullptr || j.stream_stride == 0 || j.indices == nullptr)
    return D3DERR_INVALIDCALL;
  D3DINDEXBUFFER_DESC desc{};
  j.indices->GetDesc(&desc);
  const std::uint64_t index_size = desc.Format == D3DFMT_INDEX32 ? 4 : 2;
  return (std::uint64_t{start_index} + indices) * index_size <= desc.Size ? S_OK
                                                                          : D3DERR_INVALIDCALL;
}

HRESULT MemoryDevice::SetRenderState(D3DRENDERSTATETYPE state, DWORD value) {
  state_->journal->Record("SetRenderState", {state, value});
  if (state >= kD3DRenderStateCount) return D3DERR_INVALIDCALL;
  state_->render_states[state] = value;
  return S_OK;
}

HRESULT MemoryDevice::GetRenderState(D3DRENDERSTATETYPE state, DWORD* value) {
  state_->journal->Record("GetRenderState", {state});
  if (value == nullptr || state >= kD3DRenderStateCount) return D3DERR_INVALIDCALL;
  *value = state_->render_states[state];
  return S_OK;
}

HRESULT MemoryDevice::SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                           DWORD value) {
  state_->journal->Record("SetTextureStageState", {stage, type, value});
  if (stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount)
    return D3DERR_INVALIDCALL;
  state_->stage_states[stage][type] = value;
  return S_OK;
}

HRESULT MemoryDevice::GetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                           DWORD* value) {
  state_->journal->Record("GetTextureStageState", {stage, type});
  if (value == nullptr || stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount)
    return D3DERR_INVALIDCALL;
  *value = state_->stage_states[stage][type];
  return S_OK;
}

HRESULT MemoryDevice::SetTexture(DWORD stage, IDirect3DTexture9* texture) {
  DeviceJournal& j = *state_->journal;
  j.Record("SetTexture", {stage, j.IdOf(texture)});
  if (stage >= kD3DTextureStageCount || (texture != nullptr && !j.Owns(texture)))
    return D3DERR_INVALIDCALL;
  j.textures[stage] = texture;
  return S_OK;
}

HRESULT MemoryDevice::SetTransform(D3DTRANSFORMSTATETYPE state, const D3DMATRIX* matrix) {
  state_->journal->RecordSetTransform(state, matrix);
  const std::size_t slot = TransformSlot(state);
  if (matrix == nullptr || slot == kNoTransformSlot) return D3DERR_INVALIDCALL;
  state_->transforms[slot] = *matrix;
  return S_OK;
}

HRESULT MemoryDevice::GetTransform(D3DTRANSFORMSTATETYPE state, D3DMATRIX* matrix) {
  state_->journal->Record("GetTransform", {state});
  const std::size_t slot = TransformSlot(state);
  if (matrix == nullptr || slot == kNoTransformSlot) return D3DERR_INVALIDCALL;
  *matrix = state_->transforms[slot];
  return S_OK;
}

HRESULT MemoryDevice::SetViewport(const D3DVIEWPORT9* viewport) {
  state_->journal->RecordSetViewport(viewport);
  if (viewport == nullptr) return D3DERR_INVALIDCALL;
  state_->viewport = *viewport;
  return S_OK;
}

HRESULT MemoryDevice::GetViewport(D3DVIEWPORT9* viewport) {
  state_->journal->Record("GetViewport", {});
  if (viewport == nullptr) return D3DERR_INVALIDCALL;
  *viewport = state_->viewport;
  return S_OK;
}

HRESULT MemoryDevice::Clear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color, float z,
                            DWORD stencil) {
  state_->journal->RecordClear(count, rects, flags, color, z, stencil);
  return count != 0 && rects == nullptr ? D3DERR_INVALIDCALL : S_OK;
}

HRESULT MemoryDevice::BeginScene() {
  state_->journal->Record("BeginScene", {});
  if (state_->in_scene) return D3DERR_INVALIDCALL;
  state_->in_scene = true;
  return S_OK;
}

HRESULT MemoryDevice::EndScene() {
  state_->journal->Record("EndScene", {});
  if (!state_->in_scene) return D3DERR_INVALIDCALL;
  state_->in_scene = false;
  return S_OK;
}

const std::vector<DeviceCall>& MemoryDevice::Calls() const {
  return state_->journal->calls;
}

std::vector<std::string> MemoryDevice::CallStrings() const {
  std::vector<std::string> lines;
  lines.reserve(state_->journal->calls.size());
  for (const DeviceCall& call : state_->journal->calls) lines.push_back(call.ToString());
  return lines;
}

void MemoryDevice::ClearCalls() {
  state_->journal->calls.clear();
}

DWORD MemoryDevice::RenderState(D3DRENDERSTATETYPE state) const {
  return state < kD3DRenderStateCount ? state_->render_states[state] : 0;
}

DWORD MemoryDevice::TextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type) const {
  if (stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount) return 0;
  return state_->stage_states[stage][type];
}

IDirect3DTexture9* MemoryDevice::BoundTexture(DWORD stage) const {
  return stage < kD3DTextureStageCount ? state_->journal->textures[stage] : nullptr;
}

IDirect3DVertexBuffer9* MemoryDevice::BoundStream() const {
  return state_->journal->stream;
}

UINT MemoryDevice::BoundStreamStride() const {
  return state_->journal->stream_stride;
}

IDirect3DIndexBuffer9* MemoryDevice::BoundIndices() const {
  return state_->journal->indices;
}

DWORD MemoryDevice::BoundFvf() const {
  return state_->fvf;
}

D3DMATRIX MemoryDevice::Transform(D3DTRANSFORMSTATETYPE state) const {
  const std::size_t slot = TransformSlot(state);
  return slot == kNoTransformSlot ? IdentityMatrix() : state_->transforms[slot];
}

std::uint64_t MemoryDevice::ObjectId(const void* object) const {
  const std::uint64_t id = state_->journal->IdOf(object);
  return id == kForeignObjectId ? 0 : id;
}

int MemoryDevice::LiveObjectCount() const {
  return state_->journal->live_objects;
}

void MemoryDevice::FailNextCreateVertexBuffer() {
  state_->journal->fail_create_vertex_buffer = true;
}
void MemoryDevice::FailNextCreateIndexBuffer() {
  state_->journal->fail_create_index_buffer = true;
}
void MemoryDevice::FailNextCreateTexture() {
  state_->journal->fail_create_texture = true;
}
void MemoryDevice::FailNextBufferLock() {
  state_->journal->fail_buffer_lock = true;
}
void MemoryDevice::FailNextTextureLock() {
  state_->journal->fail_texture_lock = true;
}
