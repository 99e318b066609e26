// The buffers and textures of MemoryDevice: real bytes behind Lock/LockRect, every lock logged
// to the device's journal. The device validates nothing about them; these factories do.
#pragma once

#include <memory>

#include "platform/d3d9_interfaces.h"
#include "platform/memory_journal.h"

// Bytes per pixel of a texture format; 0 for a format no texture can have.
UINT TextureBytesPerPixel(D3DFORMAT format);
// Bytes from one row to the next: the row's bytes rounded up to 16, so a level's rows are
// padded whenever the row is not already a multiple of 16 bytes.
UINT TextureRowPitch(UINT width, UINT bytes_per_pixel);
// Number of levels from width x height down to 1 x 1.
UINT FullMipChainLength(UINT width, UINT height);

// Each answers S_OK and a new object with a reference count of 1, D3DERR_INVALIDCALL for
// arguments Direct3D refuses, or E_OUTOFMEMORY; on failure *out is null.
HRESULT CreateMemoryVertexBuffer(const std::shared_ptr<DeviceJournal>& journal, UINT length,
                                 DWORD usage, DWORD fvf, D3DPOOL pool,
                                 IDirect3DVertexBuffer9** out);
HRESULT CreateMemoryIndexBuffer(const std::shared_ptr<DeviceJournal>& journal, UINT length,
                                DWORD usage, D3DFORMAT format, D3DPOOL pool,
                                IDirect3DIndexBuffer9** out);
// levels 0 asks for the full mip chain; more levels than the chain has is refused.
HRESULT CreateMemoryTexture(const std::shared_ptr<DeviceJournal>& journal, UINT width, UINT height,
                            UINT levels, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                            IDirect3DTexture9** out);
