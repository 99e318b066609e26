#include "platform/memory_device.h"

#include <cstdint>
#include <map>
#include <memory>
#include <new>

#include "platform/memory_journal.h"
#include "platform/memory_resources.h"

namespace {

// Render states outside the shared enumeration whose defaults the table also carries.
enum ExtraRenderState : std::uint32_t {
  kFogStart = 36,
  kFogEnd = 37,
  kFogDensity = 38,
  kStencilFail = 53,
  kStencilZFail = 54,
  kStencilPass = 55,
  kStencilFunc = 56,
  kStencilMask = 58,
  kStencilWriteMask = 59,
  kTextureFactor = 60,
  kClipping = 136,
  kLocalViewer = 142,
  kDiffuseMaterialSource = 145,
  kSpecularMaterialSource = 146,
  kMultisampleAntialias = 161,
  kMultisampleMask = 162,
  kPositionDegree = 172,
  kNormalDegree = 173,
  kMinTessellationLevel = 178,
  kMaxTessellationLevel = 179,
  kAdaptiveTessZ = 182,
  kCcwStencilFail = 186,
  kCcwStencilZFail = 187,
  kCcwStencilPass = 188,
  kCcwStencilFunc = 189,
  kColorWriteEnable1 = 190,
  kColorWriteEnable2 = 191,
  kColorWriteEnable3 = 192,
  kBlendFactor = 193,
  kSrcBlendAlpha = 207,
  kDestBlendAlpha = 208,
  kBlendOpAlpha = 209,
};

constexpr DWORD kStencilOpKeep = 1;
constexpr DWORD kMaterialColor1 = 1;
constexpr DWORD kMaterialColor2 = 2;
constexpr DWORD kDegreeLinear = 1;
constexpr DWORD kDegreeCubic = 3;
constexpr DWORD kAllBits = 0xFFFFFFFFu;

// Texture stage states outside the shared enumeration.
constexpr std::uint32_t kColorArg0 = 26;
constexpr std::uint32_t kAlphaArg0 = 27;
constexpr std::uint32_t kResultArg = 28;

// The viewport of the notional 640 x 480 back buffer.
constexpr D3DVIEWPORT9 kDefaultViewport{0, 0, 640, 480, 0.0f, 1.0f};

struct RenderStateDefault {
  std::uint32_t state;
  DWORD value;
};

// Direct3D 9's documented defaults; every state not listed starts at 0.
const RenderStateDefault kRenderStateDefaults[] = {
    {D3DRS_ZENABLE, D3DZB_TRUE},
    {D3DRS_FILLMODE, D3DFILL_SOLID},
    {D3DRS_SHADEMODE, D3DSHADE_GOURAUD},
    {D3DRS_ZWRITEENABLE, TRUE},
    {D3DRS_ALPHATESTENABLE, FALSE},
    {D3DRS_LASTPIXEL, TRUE},
    {D3DRS_SRCBLEND, D3DBLEND_ONE},
    {D3DRS_DESTBLEND, D3DBLEND_ZERO},
    {D3DRS_CULLMODE, D3DCULL_CCW},
    {D3DRS_ZFUNC, D3DCMP_LESSEQUAL},
    {D3DRS_ALPHAREF, 0},
    {D3DRS_ALPHAFUNC, D3DCMP_ALWAYS},
    {D3DRS_DITHERENABLE, FALSE},
    {D3DRS_ALPHABLENDENABLE, FALSE},
    {D3DRS_FOGENABLE, FALSE},
    {D3DRS_SPECULARENABLE, FALSE},
    {kFogStart, FloatToStateBits(0.0f)},
    {kFogEnd, FloatToStateBits(1.0f)},
    {kFogDensity, FloatToStateBits(1.0f)},
    {kStencilFail, kStencilOpKeep},
    {kStencilZFail, kStencilOpKeep},
    {kStencilPass, kStencilOpKeep},
    {kStencilFunc, D3DCMP_ALWAYS},
    {kStencilMask, kAllBits},
    {kStencilWriteMask, kAllBits},
    {kTextureFactor, kAllBits},
    {kClipping, TRUE},
    {D3DRS_LIGHTING, TRUE},
    {D3DRS_AMBIENT, 0},
    {D3DRS_COLORVERTEX, TRUE},
    {kLocalViewer, TRUE},
    {D3DRS_NORMALIZENORMALS, FALSE},
    {kDiffuseMaterialSource, kMaterialColor1},
    {kSpecularMaterialSource, kMaterialColor2},
    {D3DRS_POINTSIZE, FloatToStateBits(1.0f)},
    {D3DRS_POINTSIZE_MIN, FloatToStateBits(1.0f)},
    {D3DRS_POINTSPRITEENABLE, FALSE},
    {D3DRS_POINTSCALEENABLE, FALSE},
    {D3DRS_POINTSCALE_A, FloatToStateBits(1.0f)},
    {D3DRS_POINTSCALE_B, FloatToStateBits(0.0f)},
    {D3DRS_POINTSCALE_C, FloatToStateBits(0.0f)},
    {kMultisampleAntialias, TRUE},
    {kMultisampleMask, kAllBits},
    {D3DRS_POINTSIZE_MAX, FloatToStateBits(64.0f)},
    {D3DRS_COLORWRITEENABLE, D3DCOLORWRITEENABLE_ALL},
    {D3DRS_BLENDOP, D3DBLENDOP_ADD},
    {kPositionDegree, kDegreeCubic},
    {kNormalDegree, kDegreeLinear},
    {kMinTessellationLevel, FloatToStateBits(1.0f)},
    {kMaxTessellationLevel, FloatToStateBits(1.0f)},
    {kAdaptiveTessZ, FloatToStateBits(1.0f)},
    {kCcwStencilFail, kStencilOpKeep},
    {kCcwStencilZFail, kStencilOpKeep},
    {kCcwStencilPass, kStencilOpKeep},
    {kCcwStencilFunc, D3DCMP_ALWAYS},
    {kColorWriteEnable1, D3DCOLORWRITEENABLE_ALL},
    {kColorWriteEnable2, D3DCOLORWRITEENABLE_ALL},
    {kColorWriteEnable3, D3DCOLORWRITEENABLE_ALL},
    {kBlendFactor, kAllBits},
    {kSrcBlendAlpha, D3DBLEND_ONE},
    {kDestBlendAlpha, D3DBLEND_ZERO},
    {kBlendOpAlpha, D3DBLENDOP_ADD},
};

bool IsTransformState(std::uint32_t state) {
  return state == D3DTS_VIEW || state == D3DTS_PROJECTION ||
         (state >= D3DTS_TEXTURE0 && state < D3DTS_TEXTURE0 + kD3DTextureStageCount) ||
         (state >= D3DTS_WORLD && state < D3DTS_WORLD + 256);
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

std::uint64_t MatrixArgCount() {
  return 16;
}

}  // namespace

struct MemoryDevice::State {
  std::shared_ptr<DeviceJournal> journal = std::make_shared<DeviceJournal>();
  ULONG refs = 1;
  DWORD render_states[kD3DRenderStateCount] = {};
  DWORD stage_states[kD3DTextureStageCount][kD3DTextureStageStateCount] = {};
  std::map<std::uint32_t, D3DMATRIX> transforms;  // absent = identity
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
  for (const RenderStateDefault& d : kRenderStateDefaults) state_->render_states[d.state] = d.value;
  for (DWORD stage = 0; stage < kD3DTextureStageCount; ++stage) {
    DWORD* s = state_->stage_states[stage];
    s[D3DTSS_COLOROP] = stage == 0 ? D3DTOP_MODULATE : D3DTOP_DISABLE;
    s[D3DTSS_ALPHAOP] = stage == 0 ? D3DTOP_SELECTARG1 : D3DTOP_DISABLE;
    s[D3DTSS_COLORARG1] = D3DTA_TEXTURE;
    s[D3DTSS_COLORARG2] = D3DTA_CURRENT;
    s[D3DTSS_ALPHAARG1] = D3DTA_TEXTURE;
    s[D3DTSS_ALPHAARG2] = D3DTA_CURRENT;
    s[D3DTSS_TEXCOORDINDEX] = stage;
    s[kColorArg0] = D3DTA_CURRENT;
    s[kAlphaArg0] = D3DTA_CURRENT;
    s[kResultArg] = D3DTA_CURRENT;
  }
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
  j.Log("CreateVertexBuffer", {length, usage, fvf, pool});
  if (buffer != nullptr) *buffer = nullptr;
  if (DeviceJournal::TakeFailure(j.fail_create_vertex_buffer)) return D3DERR_INVALIDCALL;
  return CreateMemoryVertexBuffer(state_->journal, length, usage, fvf, pool, buffer);
}

HRESULT MemoryDevice::CreateIndexBuffer(UINT length, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                                        IDirect3DIndexBuffer9** buffer, HANDLE* /*shared*/) {
  DeviceJournal& j = *state_->journal;
  j.Log("CreateIndexBuffer", {length, usage, format, pool});
  if (buffer != nullptr) *buffer = nullptr;
  if (DeviceJournal::TakeFailure(j.fail_create_index_buffer)) return D3DERR_INVALIDCALL;
  return CreateMemoryIndexBuffer(state_->journal, length, usage, format, pool, buffer);
}

HRESULT MemoryDevice::CreateTexture(UINT width, UINT height, UINT levels, DWORD usage,
                                    D3DFORMAT format, D3DPOOL pool, IDirect3DTexture9** texture,
                                    HANDLE* /*shared*/) {
  DeviceJournal& j = *state_->journal;
  j.Log("CreateTexture", {width, height, levels, usage, format, pool});
  if (texture != nullptr) *texture = nullptr;
  if (DeviceJournal::TakeFailure(j.fail_create_texture)) return D3DERR_INVALIDCALL;
  return CreateMemoryTexture(state_->journal, width, height, levels, usage, format, pool, texture);
}

HRESULT MemoryDevice::SetStreamSource(UINT stream, IDirect3DVertexBuffer9* buffer, UINT offset,
                                      UINT stride) {
  DeviceJournal& j = *state_->journal;
  j.Log("SetStreamSource", {stream, j.IdOf(buffer), offset, stride});
  // One stream is all the callers use; a buffer of another device cannot be bound.
  if (stream != 0 || (buffer != nullptr && !j.Owns(buffer))) return D3DERR_INVALIDCALL;
  j.stream = buffer;
  j.stream_offset = buffer != nullptr ? offset : 0;
  j.stream_stride = buffer != nullptr ? stride : 0;
  return S_OK;
}

HRESULT MemoryDevice::SetIndices(IDirect3DIndexBuffer9* buffer) {
  DeviceJournal& j = *state_->journal;
  j.Log("SetIndices", {j.IdOf(buffer)});
  if (buffer != nullptr && !j.Owns(buffer)) return D3DERR_INVALIDCALL;
  j.indices = buffer;
  return S_OK;
}

HRESULT MemoryDevice::SetFVF(DWORD fvf) {
  state_->journal->Log("SetFVF", {fvf});
  state_->fvf = fvf;
  return S_OK;
}

HRESULT MemoryDevice::DrawPrimitive(D3DPRIMITIVETYPE type, UINT start_vertex,
                                    UINT primitive_count) {
  DeviceJournal& j = *state_->journal;
  j.Log("DrawPrimitive", {type, start_vertex, primitive_count});
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
  j.Log("DrawIndexedPrimitive", {type, SignedArg(base_vertex_index), min_vertex_index, num_vertices,
                                 start_index, primitive_count});
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
  state_->journal->Log("SetRenderState", {state, value});
  if (state >= kD3DRenderStateCount) return D3DERR_INVALIDCALL;
  state_->render_states[state] = value;
  return S_OK;
}

HRESULT MemoryDevice::GetRenderState(D3DRENDERSTATETYPE state, DWORD* value) {
  state_->journal->Log("GetRenderState", {state});
  if (value == nullptr || state >= kD3DRenderStateCount) return D3DERR_INVALIDCALL;
  *value = state_->render_states[state];
  return S_OK;
}

HRESULT MemoryDevice::SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                           DWORD value) {
  state_->journal->Log("SetTextureStageState", {stage, type, value});
  if (stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount)
    return D3DERR_INVALIDCALL;
  state_->stage_states[stage][type] = value;
  return S_OK;
}

HRESULT MemoryDevice::GetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                           DWORD* value) {
  state_->journal->Log("GetTextureStageState", {stage, type});
  if (value == nullptr || stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount)
    return D3DERR_INVALIDCALL;
  *value = state_->stage_states[stage][type];
  return S_OK;
}

HRESULT MemoryDevice::SetTexture(DWORD stage, IDirect3DTexture9* texture) {
  DeviceJournal& j = *state_->journal;
  j.Log("SetTexture", {stage, j.IdOf(texture)});
  if (stage >= kD3DTextureStageCount || (texture != nullptr && !j.Owns(texture)))
    return D3DERR_INVALIDCALL;
  j.textures[stage] = texture;
  return S_OK;
}

HRESULT MemoryDevice::SetTransform(D3DTRANSFORMSTATETYPE state, const D3DMATRIX* matrix) {
  // The matrix is logged by value, row by row, as float bit patterns.
  std::vector<std::uint64_t> args{state};
  if (matrix != nullptr) {
    args.reserve(1 + 16);
    for (const auto& row : matrix->m)
      for (float v : row) args.push_back(FloatArg(v));
  }
  state_->journal->Log("SetTransform", std::move(args));
  if (matrix == nullptr || !IsTransformState(state)) return D3DERR_INVALIDCALL;
  state_->transforms[state] = *matrix;
  return S_OK;
}

HRESULT MemoryDevice::GetTransform(D3DTRANSFORMSTATETYPE state, D3DMATRIX* matrix) {
  state_->journal->Log("GetTransform", {state});
  if (matrix == nullptr || !IsTransformState(state)) return D3DERR_INVALIDCALL;
  *matrix = Transform(state);
  return S_OK;
}

HRESULT MemoryDevice::SetViewport(const D3DVIEWPORT9* viewport) {
  if (viewport == nullptr) {
    state_->journal->Log("SetViewport", {});
    return D3DERR_INVALIDCALL;
  }
  const D3DVIEWPORT9& v = *viewport;
  state_->journal->Log("SetViewport",
                       {v.X, v.Y, v.Width, v.Height, FloatArg(v.MinZ), FloatArg(v.MaxZ)});
  state_->viewport = v;
  return S_OK;
}

HRESULT MemoryDevice::GetViewport(D3DVIEWPORT9* viewport) {
  state_->journal->Log("GetViewport", {});
  if (viewport == nullptr) return D3DERR_INVALIDCALL;
  *viewport = state_->viewport;
  return S_OK;
}

HRESULT MemoryDevice::Clear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color, float z,
                            DWORD stencil) {
  // Rectangles are logged by value between the count and the flags.
  std::vector<std::uint64_t> args{count};
  if (rects != nullptr)
    for (DWORD i = 0; i < count; ++i)
      for (std::int32_t c : {rects[i].x1, rects[i].y1, rects[i].x2, rects[i].y2})
        args.push_back(SignedArg(c));
  for (std::uint64_t a :
       {std::uint64_t{flags}, std::uint64_t{color}, FloatArg(z), std::uint64_t{stencil}})
    args.push_back(a);
  state_->journal->Log("Clear", std::move(args));
  return count != 0 && rects == nullptr ? D3DERR_INVALIDCALL : S_OK;
}

HRESULT MemoryDevice::BeginScene() {
  state_->journal->Log("BeginScene", {});
  if (state_->in_scene) return D3DERR_INVALIDCALL;
  state_->in_scene = true;
  return S_OK;
}

HRESULT MemoryDevice::EndScene() {
  state_->journal->Log("EndScene", {});
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
  const auto it = state_->transforms.find(state);
  return it == state_->transforms.end() ? IdentityMatrix() : it->second;
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
