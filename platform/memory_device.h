// The reference device: IDirect3DDevice9 over CPU memory. Buffers and textures hold real bytes;
// render-state and texture-stage-state tables start at Direct3D 9's documented defaults; every
// call is appended to a log that tests read to check exact call sequences. It draws nothing.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "platform/d3d9_interfaces.h"

// One logged device call: the operation's name and its arguments as integers (enumerations and
// DWORDs as they are, signed values sign-extended, floats by bit pattern, pointers as the object's
// id or 0 for null; output pointers are left out). Structures passed in are logged by value:
// SetTransform(state, 16 matrix elements row by row), SetViewport(X, Y, Width, Height, MinZ,
// MaxZ), Clear(count, each rectangle's x1 y1 x2 y2, flags, colour, z, stencil). Buffer and texture
// calls are named after their object: "VertexBuffer.Lock(id, offset, size, flags)",
// "IndexBuffer.Unlock(id)", "Texture.LockRect(id, level, left, top, right, bottom, flags)" (a null
// rect as the whole level), "Texture.UnlockRect(id, level)". AddRef/Release are not logged.
struct DeviceCall {
  std::string Name;
  std::vector<std::uint64_t> Args;

  // "SetRenderState(27, 1)"
  std::string ToString() const;
  friend bool operator==(const DeviceCall&, const DeviceCall&) = default;
};

// Textures: 4 bytes per pixel for the 32-bit formats (3, 2, 1 for R8G8B8, R5G6B5, A8), rows
// padded to a multiple of 16 bytes (honour the pitch); levels 0 gives the full mip chain, more
// levels than the chain has is D3DERR_INVALIDCALL. Binding a buffer or texture takes no
// reference; releasing a bound object unbinds it. Objects of another device cannot be bound.
// Draws that would read past the bound buffers answer D3DERR_INVALIDCALL.
class MemoryDevice final : public IDirect3DDevice9 {
 public:
  // Starts with a reference count of 1; Release() destroys it.
  static MemoryDevice* Create();

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

  // --- Inspection for tests and tools ---
  const std::vector<DeviceCall>& Calls() const;
  // The log as "Name(a, b)" lines.
  std::vector<std::string> CallStrings() const;
  void ClearCalls();
  DWORD RenderState(D3DRENDERSTATETYPE state) const;
  DWORD TextureStageState(DWORD stage, D3DTEXTURESTAGESTATETYPE type) const;
  IDirect3DTexture9* BoundTexture(DWORD stage) const;
  IDirect3DVertexBuffer9* BoundStream() const;
  UINT BoundStreamStride() const;
  IDirect3DIndexBuffer9* BoundIndices() const;
  DWORD BoundFvf() const;
  D3DMATRIX Transform(D3DTRANSFORMSTATETYPE state) const;
  // The id the log uses for a buffer or texture of this device (0 for null).
  std::uint64_t ObjectId(const void* object) const;
  // Buffers and textures created on this device and not yet released to zero.
  int LiveObjectCount() const;

  // --- Failure injection: the next call of that kind fails once, with D3DERR_INVALIDCALL ---
  void FailNextCreateVertexBuffer();
  void FailNextCreateIndexBuffer();
  void FailNextCreateTexture();
  void FailNextBufferLock();   // vertex or index buffer Lock
  void FailNextTextureLock();  // texture LockRect

  struct State;  // defined in the source

 private:
  MemoryDevice();
  ~MemoryDevice() override;
  State* state_;
};
