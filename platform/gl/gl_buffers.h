// Vertex and index buffers of GlDevice. Each keeps a CPU copy that Lock hands out and mirrors it
// into a GL buffer object when its last lock is released; D3DLOCK_DISCARD orphans the GL storage
// first so that a draw still reading the old contents never stalls the update.
#pragma once

#include "platform/gl/gl_api.h"

#include <memory>
#include <vector>

#include "platform/d3d9_interfaces.h"
#include "platform/gl/gl_context.h"
#include "platform/memory_journal.h"

// Each answers S_OK and a new buffer with a reference count of 1, D3DERR_INVALIDCALL for
// arguments Direct3D refuses, or E_OUTOFMEMORY / D3DERR_OUTOFVIDEOMEMORY; *out is null on
// failure. The buffer logs its locks to the journal and is counted live there.
HRESULT CreateGlVertexBuffer(const std::shared_ptr<GlContext>& context,
                             const std::shared_ptr<DeviceJournal>& journal, UINT length,
                             DWORD usage, DWORD fvf, D3DPOOL pool, IDirect3DVertexBuffer9** out);
HRESULT CreateGlIndexBuffer(const std::shared_ptr<GlContext>& context,
                            const std::shared_ptr<DeviceJournal>& journal, UINT length, DWORD usage,
                            D3DFORMAT format, D3DPOOL pool, IDirect3DIndexBuffer9** out);

// What a draw needs of a buffer made by the functions above (and only such a buffer).
struct GlBufferView {
  GLuint name = 0;
  const std::vector<BYTE>* bytes = nullptr;  // the CPU copy, equal to the GL contents
};
GlBufferView ViewOfGlBuffer(IDirect3DVertexBuffer9* buffer);
GlBufferView ViewOfGlBuffer(IDirect3DIndexBuffer9* buffer);
