// The drawing device: IDirect3DDevice9 over OpenGL, headless through EGL, into an offscreen
// framebuffer that ReadPixels gives back as A8R8G8B8 pixels. It keeps the same call log as
// MemoryDevice (same names, arguments and object ids), so a sequence of calls can be checked on
// either device and seen on this one. Limits and choices: platform/gl/README.md.
//
// One thread at a time: the device makes its GL context current on the calling thread.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/d3d9_interfaces.h"
#include "platform/memory_device.h"

class GlDevice final : public IDirect3DDevice9 {
 public:
  // A device drawing into a width x height framebuffer, with a reference count of 1; null, with
  // the reason in *error, when no OpenGL 4.5 compatibility context can be made.
  static GlDevice* Create(UINT width, UINT height, std::string* error);

  // --- IUnknown / IDirect3DDevice9 ---
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

  // --- The picture ---
  UINT Width() const;   // pixels
  UINT Height() const;  // pixels
  // Width x Height A8R8G8B8 pixels, top row first.
  void ReadPixels(std::vector<std::uint32_t>* argb);
  // The GL renderer ("llvmpipe (LLVM ...)" without a GPU) and the EGL platform that gave it.
  const std::string& Renderer() const;
  const std::string& Platform() const;
  // The driver's largest point, in pixels; point sprites are clamped to it.
  float MaxPointSizePx() const;
  // Direct3D 9 samples textures by nearest texel unless told otherwise, and this interface has
  // no sampler states; a tool that wants smoother sprites can ask for bilinear filtering here.
  void SetLinearFiltering(bool linear);

  // --- Inspection, as MemoryDevice ---
  const std::vector<DeviceCall>& Calls() const;
  std::vector<std::string> CallStrings() const;
  void ClearCalls();
  // The id the log uses for a buffer or texture of this device (0 for null or foreign ones).
  std::uint64_t ObjectId(const void* object) const;
  // Buffers and textures created on this device and not yet released to zero.
  int LiveObjectCount() const;

  struct State;  // defined in gl_device_state.h

 private:
  GlDevice();
  ~GlDevice() override;
  State* state_;
};
