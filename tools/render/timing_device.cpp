#include "tools/render/timing_device.h"

namespace aperender {
namespace {

using Clock = std::chrono::steady_clock;

double MsSince(Clock::time_point start) {
  return std::chrono::duration<double, std::milli>(Clock::now() - start).count();
}

}  // namespace

TimingDevice* TimingDevice::Create(IDirect3DDevice9* inner) {
  return new TimingDevice(inner);
}

TimingDevice::TimingDevice(IDirect3DDevice9* inner) : inner_(inner) {
  inner_->AddRef();
}
TimingDevice::~TimingDevice() {
  inner_->Release();
}

ULONG TimingDevice::AddRef() {
  return ++references_;
}

ULONG TimingDevice::Release() {
  const ULONG left = --references_;
  if (left == 0) delete this;
  return left;
}

HRESULT TimingDevice::CreateVertexBuffer(UINT length, DWORD usage, DWORD fvf, D3DPOOL pool,
                                         IDirect3DVertexBuffer9** buffer, HANDLE* shared) {
  return inner_->CreateVertexBuffer(length, usage, fvf, pool, buffer, shared);
}
HRESULT TimingDevice::CreateIndexBuffer(UINT length, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                                        IDirect3DIndexBuffer9** buffer, HANDLE* shared) {
  return inner_->CreateIndexBuffer(length, usage, format, pool, buffer, shared);
}
HRESULT TimingDevice::CreateTexture(UINT width, UINT height, UINT levels, DWORD usage,
                                    D3DFORMAT format, D3DPOOL pool, IDirect3DTexture9** texture,
                                    HANDLE* shared) {
  return inner_->CreateTexture(width, height, levels, usage, format, pool, texture, shared);
}
HRESULT TimingDevice::SetStreamSource(UINT stream, IDirect3DVertexBuffer9* buffer, UINT offset,
                                      UINT stride) {
  return inner_->SetStreamSource(stream, buffer, offset, stride);
}
HRESULT TimingDevice::SetIndices(IDirect3DIndexBuffer9* buffer) {
  return inner_->SetIndices(buffer);
}
HRESULT TimingDevice::SetFVF(DWORD fvf) {
  return inner_->SetFVF(fvf);
}

HRESULT TimingDevice::DrawPrimitive(D3DPRIMITIVETYPE type, UINT start_vertex,
                                    UINT primitive_count) {
  const Clock::time_point start = Clock::now();
  const HRESULT result = inner_->DrawPrimitive(type, start_vertex, primitive_count);
  draw_ms_ += MsSince(start);
  ++draw_calls_;
  return result;
}

HRESULT TimingDevice::DrawIndexedPrimitive(D3DPRIMITIVETYPE type, INT base_vertex_index,
                                           UINT min_vertex_index, UINT num_vertices,
                                           UINT start_index, UINT primitive_count) {
  const Clock::time_point start = Clock::now();
  const HRESULT result = inner_->DrawIndexedPrimitive(type, base_vertex_index, min_vertex_index,
                                                      num_vertices, start_index, primitive_count);
  draw_ms_ += MsSince(start);
  ++draw_calls_;
  return result;
}

HRESULT TimingDevice::SetRenderState(D3DRENDERSTATETYPE state, DWORD value) {
  return inner_->SetRenderState(state, value);
}
HRESULT TimingDevice::GetRenderState(D3DRENDERSTATETYPE state, DWORD* value) {
  return inner_->GetRenderState(state, value);
}
HRESULT TimingDevice::SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                           DWORD value) {
  return inner_->SetTextureStageState(stage, type, value);
}
HRESULT TimingDevice::GetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type,
                                           DWORD* value) {
  return inner_->GetTextureStageState(stage, type, value);
}
HRESULT TimingDevice::SetTexture(DWORD stage, IDirect3DTexture9* texture) {
  return inner_->SetTexture(stage, texture);
}
HRESULT TimingDevice::SetTransform(D3DTRANSFORMSTATETYPE state, const D3DMATRIX* matrix) {
  return inner_->SetTransform(state, matrix);
}
HRESULT TimingDevice::GetTransform(D3DTRANSFORMSTATETYPE state, D3DMATRIX* matrix) {
  return inner_->GetTransform(state, matrix);
}
HRESULT TimingDevice::SetViewport(const D3DVIEWPORT9* viewport) {
  return inner_->SetViewport(viewport);
}
HRESULT TimingDevice::GetViewport(D3DVIEWPORT9* viewport) {
  return inner_->GetViewport(viewport);
}
HRESULT TimingDevice::Clear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color, float z,
                            DWORD stencil) {
  return inner_->Clear(count, rects, flags, color, z, stencil);
}
HRESULT TimingDevice::BeginScene() {
  return inner_->BeginScene();
}
HRESULT TimingDevice::EndScene() {
  return inner_->EndScene();
}

}  // namespace aperender
