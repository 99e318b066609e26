// GlDevice: creation, resources, state tables and the log. Drawing is in gl_device_draw.cpp.
#include "platform/gl/gl_device.h"

#include <new>
#include <utility>

#include "platform/gl/call_recorder.h"
#include "platform/gl/gl_buffers.h"
#include "platform/gl/gl_device_state.h"
#include "platform/gl/gl_pipeline_state.h"
#include "platform/gl/gl_texture.h"

namespace {

D3DMATRIX IdentityMatrix() {
  D3DMATRIX m{};
  for (int i = 0; i < 4; ++i) m.m[i][i] = 1.0f;
  return m;
}

// Both devices start from the reference device's table of Direct3D 9's defaults, so that they
// can never disagree about them.
void LoadDefaultStates(GlDevice::State* s) {
  MemoryDevice* reference = MemoryDevice::Create();
  for (std::uint32_t i = 0; i < kD3DRenderStateCount; ++i)
    s->render_states[i] = reference->RenderState(static_cast<D3DRENDERSTATETYPE>(i));
  for (DWORD stage = 0; stage < kD3DTextureStageCount; ++stage)
    for (std::uint32_t type = 0; type < kD3DTextureStageStateCount; ++type)
      s->stage_states[stage][type] =
          reference->TextureStageState(stage, static_cast<D3DTEXTURESTAGESTATETYPE>(type));
  reference->Release();
}

bool InUnitRange(float v) {
  return v >= 0.0f && v <= 1.0f;  // false for NaN
}

}  // namespace

bool IsTransformState(std::uint32_t state) {
  return state == D3DTS_VIEW || state == D3DTS_PROJECTION ||
         (state >= D3DTS_TEXTURE0 && state < D3DTS_TEXTURE0 + kD3DTextureStageCount) ||
         (state >= D3DTS_WORLD && state < kTransformSlots);
}

GlDevice* GlDevice::Create(UINT width, UINT height, std::string* error) {
  std::string ignored;
  if (error == nullptr) error = &ignored;
  try {
    std::shared_ptr<GlContext> context = GlContext::Create(width, height, error);
    if (!context) return nullptr;
    GlDevice* device = new GlDevice();
    State& s = *device->state_;
    s.context = std::move(context);
    if (!s.points.Build(error)) {
      device->Release();
      return nullptr;
    }
    SetFixedPipelineDefaults();
    if (FAILED(TakeGlErrors())) {
      *error =
          "GlDevice: setting up the fixed-function pipeline failed on " + s.context->Renderer();
      device->Release();
      return nullptr;
    }
    s.viewport = D3DVIEWPORT9{0, 0, width, height, 0.0f, 1.0f};
    return device;
  } catch (const std::bad_alloc&) {
    *error = "GlDevice: out of memory";
    return nullptr;
  }
}

GlDevice::GlDevice() : state_(new State) {
  LoadDefaultStates(state_);
  state_->transforms.fill(IdentityMatrix());
}

GlDevice::~GlDevice() {
  if (state_->context) {
    state_->context->MakeCurrent();
    state_->points.Destroy();
    TakeGlErrors();
  }
  delete state_;
}

ULONG GlDevice::AddRef() {
  return ++state_->refs;
}

ULONG GlDevice::Release() {
  const ULONG left = --state_->refs;
  if (left == 0) delete this;
  return left;
}

HRESULT GlDevice::CreateVertexBuffer(UINT length, DWORD usage, DWORD fvf, D3DPOOL pool,
                                     IDirect3DVertexBuffer9** buffer, HANDLE* /*shared*/) {
  LogCall(*state_->journal, "CreateVertexBuffer", {length, usage, fvf, pool});
  return CreateGlVertexBuffer(state_->context, state_->journal, length, usage, fvf, pool, buffer);
}

HRESULT GlDevice::CreateIndexBuffer(UINT length, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                                    IDirect3DIndexBuffer9** buffer, HANDLE* /*shared*/) {
  LogCall(*state_->journal, "CreateIndexBuffer", {length, usage, format, pool});
  return CreateGlIndexBuffer(state_->context, state_->journal, length, usage, format, pool, buffer);
}

HRESULT GlDevice::CreateTexture(UINT width, UINT height, UINT levels, DWORD usage, D3DFORMAT format,
                                D3DPOOL pool, IDirect3DTexture9** texture, HANDLE* /*shared*/) {
  LogCall(*state_->journal, "CreateTexture", {width, height, levels, usage, format, pool});
  return CreateGlTexture(state_->context, state_->journal, width, height, levels, usage, format,
                         pool, texture);
}

HRESULT GlDevice::SetStreamSource(UINT stream, IDirect3DVertexBuffer9* buffer, UINT offset,
                                  UINT stride) {
  DeviceJournal& j = *state_->journal;
  LogCall(j, "SetStreamSource", {stream, j.IdOf(buffer), offset, stride});
  // One stream is all the callers use; a buffer of another device cannot be bound.
  if (stream != 0 || (buffer != nullptr && !j.Owns(buffer))) return D3DERR_INVALIDCALL;
  j.stream = buffer;
  j.stream_offset = buffer != nullptr ? offset : 0;
  j.stream_stride = buffer != nullptr ? stride : 0;
  return S_OK;
}

HRESULT GlDevice::SetIndices(IDirect3DIndexBuffer9* buffer) {
  DeviceJournal& j = *state_->journal;
  LogCall(j, "SetIndices", {j.IdOf(buffer)});
  if (buffer != nullptr && !j.Owns(buffer)) return D3DERR_INVALIDCALL;
  j.indices = buffer;
  return S_OK;
}

HRESULT GlDevice::SetFVF(DWORD fvf) {
  LogCall(*state_->journal, "SetFVF", {fvf});
  state_->fvf = fvf;
  return S_OK;
}

HRESULT GlDevice::SetRenderState(D3DRENDERSTATETYPE state, DWORD value) {
  LogCall(*state_->journal, "SetRenderState", {state, value});
  if (state >= kD3DRenderStateCount) return D3DERR_INVALIDCALL;
  state_->render_states[state] = value;
  return S_OK;
}

HRESULT GlDevice::GetRenderState(D3DRENDERSTATETYPE state, DWORD* value) {
  LogCall(*state_->journal, "GetRenderState", {state});
  if (value == nullptr || state >= kD3DRenderStateCount) return D3DERR_INVALIDCALL;
  *value = state_->render_states[state];
  return S_OK;
}

HRESULT GlDevice::SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type, DWORD value) {
  LogCall(*state_->journal, "SetTextureStageState", {stage, type, value});
  if (stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount)
    return D3DERR_INVALIDCALL;
  state_->stage_states[stage][type] = value;
  return S_OK;
}

HRESULT GlDevice::GetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type, DWORD* value) {
  LogCall(*state_->journal, "GetTextureStageState", {stage, type});
  if (value == nullptr || stage >= kD3DTextureStageCount || type >= kD3DTextureStageStateCount)
    return D3DERR_INVALIDCALL;
  *value = state_->stage_states[stage][type];
  return S_OK;
}

HRESULT GlDevice::SetTexture(DWORD stage, IDirect3DTexture9* texture) {
  DeviceJournal& j = *state_->journal;
  LogCall(j, "SetTexture", {stage, j.IdOf(texture)});
  if (stage >= kD3DTextureStageCount || (texture != nullptr && !j.Owns(texture)))
    return D3DERR_INVALIDCALL;
  j.textures[stage] = texture;
  return S_OK;
}

HRESULT GlDevice::SetTransform(D3DTRANSFORMSTATETYPE state, const D3DMATRIX* matrix) {
  LogSetTransform(*state_->journal, state, matrix);
  if (matrix == nullptr || !IsTransformState(state)) return D3DERR_INVALIDCALL;
  state_->transforms[state] = *matrix;
  return S_OK;
}

HRESULT GlDevice::GetTransform(D3DTRANSFORMSTATETYPE state, D3DMATRIX* matrix) {
  LogCall(*state_->journal, "GetTransform", {state});
  if (matrix == nullptr || !IsTransformState(state)) return D3DERR_INVALIDCALL;
  *matrix = state_->transforms[state];
  return S_OK;
}

HRESULT GlDevice::SetViewport(const D3DVIEWPORT9* viewport) {
  LogSetViewport(*state_->journal, viewport);
  if (viewport == nullptr) return D3DERR_INVALIDCALL;
  // As Direct3D, a viewport must lie inside the render target and its depth range in [0, 1].
  const D3DVIEWPORT9& v = *viewport;
  const std::uint64_t right = std::uint64_t{v.X} + v.Width;
  const std::uint64_t bottom = std::uint64_t{v.Y} + v.Height;
  if (v.Width == 0 || v.Height == 0 || right > Width() || bottom > Height() ||
      !InUnitRange(v.MinZ) || !InUnitRange(v.MaxZ)) {
    return D3DERR_INVALIDCALL;
  }
  state_->viewport = v;
  return S_OK;
}

HRESULT GlDevice::GetViewport(D3DVIEWPORT9* viewport) {
  LogCall(*state_->journal, "GetViewport", {});
  if (viewport == nullptr) return D3DERR_INVALIDCALL;
  *viewport = state_->viewport;
  return S_OK;
}

HRESULT GlDevice::BeginScene() {
  LogCall(*state_->journal, "BeginScene", {});
  if (state_->in_scene) return D3DERR_INVALIDCALL;
  state_->in_scene = true;
  return S_OK;
}

HRESULT GlDevice::EndScene() {
  LogCall(*state_->journal, "EndScene", {});
  if (!state_->in_scene) return D3DERR_INVALIDCALL;
  state_->in_scene = false;
  state_->context->MakeCurrent();
  glFlush();
  return TakeGlErrors();
}

UINT GlDevice::Width() const {
  return state_->context->Width();
}

UINT GlDevice::Height() const {
  return state_->context->Height();
}

void GlDevice::ReadPixels(std::vector<std::uint32_t>* argb) {
  state_->context->ReadPixels(argb);
}

const std::string& GlDevice::Renderer() const {
  return state_->context->Renderer();
}

const std::string& GlDevice::Platform() const {
  return state_->context->Platform();
}

float GlDevice::MaxPointSizePx() const {
  return state_->context->MaxPointSizePx();
}

void GlDevice::SetLinearFiltering(bool linear) {
  state_->linear_filtering = linear;
}

const std::vector<DeviceCall>& GlDevice::Calls() const {
  return state_->journal->calls;
}

std::vector<std::string> GlDevice::CallStrings() const {
  std::vector<std::string> lines;
  lines.reserve(state_->journal->calls.size());
  for (const DeviceCall& call : state_->journal->calls) lines.push_back(call.ToString());
  return lines;
}

void GlDevice::ClearCalls() {
  state_->journal->calls.clear();
}

std::uint64_t GlDevice::ObjectId(const void* object) const {
  const std::uint64_t id = state_->journal->IdOf(object);
  return id == kForeignObjectId ? 0 : id;
}

int GlDevice::LiveObjectCount() const {
  return state_->journal->live_objects;
}
