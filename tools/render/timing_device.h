// A thin IDirect3DDevice9 that forwards every call to another device and adds up the time spent
// in its draw calls, so that a frame's drawing can be told apart from the rest of the work done
// inside an emitter's CallChannel. With a GL device the time is that of submitting the draw;
// the rasterising itself shows when the pixels are read back.
#pragma once

#include <chrono>

#include "platform/d3d9_interfaces.h"

namespace aperender {

class TimingDevice final : public IDirect3DDevice9 {
 public:
  // Takes a reference on `inner`; starts with a reference count of 1.
  static TimingDevice* Create(IDirect3DDevice9* inner);

  double DrawMs() const { return draw_ms_; }
  int DrawCalls() const { return draw_calls_; }
  void ResetTimes() { draw_ms_ = 0.0, draw_calls_ = 0; }

  ULONG AddRef() override;
  ULONG Release() override;
  HRESULT CreateVertexBuffer(UINT length, DWORD usage, DWORD fvf, D3DPOOL pool,
                             IDirect3DVertexBuffer9** buffer, HANDLE* shared) override;
  HRESULT CreateIndexBuffer(UINT length, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                            IDirect3DIndexBuffer9** buffer, HANDLE* shared) override;
  HRESULT CreateTexture(UINT width, UINT height, UINT levels, DWORD usage, D3DFORMAT format,
                        D3DPOOL pool, IDirect3DTexture9** texture, HANDLE* shared) override;
  HRESULT SetStreamSource(UINT stream, IDirect3DVertexBuffer9* buffer, UINT offset,
                          UINT stride) override;
  HRESULT SetIndices(IDirect3DIndexBuffer9* buffer) override;
  HRESULT SetFVF(DWORD fvf) override;
  HRESULT DrawPrimitive(D3DPRIMITIVETYPE type, UINT start_vertex, UINT primitive_count) override;
  HRESULT DrawIndexedPrimitive(D3DPRIMITIVETYPE type, INT base_vertex_index, UINT min_vertex_index,
                               UINT num_vertices, UINT start_index, UINT primitive_count) override;
  HRESULT SetRenderState(D3DRENDERSTATETYPE state, DWORD value) override;
  HRESULT GetRenderState(D3DRENDERSTATETYPE state, DWORD* value) override;
  HRESULT SetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type, DWORD value) override;
  HRESULT GetTextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type, DWORD* value) override;
  HRESULT SetTexture(DWORD stage, IDirect3DTexture9* texture) override;
  HRESULT SetTransform(D3DTRANSFORMSTATETYPE state, const D3DMATRIX* matrix) override;
  HRESULT GetTransform(D3DTRANSFORMSTATETYPE state, D3DMATRIX* matrix) override;
  HRESULT SetViewport(const D3DVIEWPORT9* viewport) override;
  HRESULT GetViewport(D3DVIEWPORT9* viewport) override;
  HRESULT Clear(DWORD count, const D3DRECT* rects, DWORD flags, D3DCOLOR color, float z,
                DWORD stencil) override;
  HRESULT BeginScene() override;
  HRESULT EndScene() override;

 private:
  explicit TimingDevice(IDirect3DDevice9* inner);
  ~TimingDevice() override;

  IDirect3DDevice9* inner_;
  ULONG references_ = 1;
  double draw_ms_ = 0.0;
  int draw_calls_ = 0;
};

}  // namespace aperender
