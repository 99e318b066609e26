// A8R8G8B8 (and X8R8G8B8) textures of GlDevice: a CPU copy per level that LockRect hands out,
// uploaded to a GL texture (GL_BGRA, GL_UNSIGNED_INT_8_8_8_8_REV: the same bytes) on UnlockRect.
// Rows are padded as MemoryDevice pads them, so callers must honour the pitch on both devices.
#pragma once

#include "platform/gl/gl_api.h"

#include <memory>

#include "platform/d3d9_interfaces.h"
#include "platform/gl/gl_context.h"
#include "platform/memory_journal.h"

// S_OK and a new texture with a reference count of 1; D3DERR_INVALIDCALL for a size of 0 or
// over 8192, a format other than A8R8G8B8 / X8R8G8B8 or more levels than the mip chain has
// (0 asks for the whole chain); E_OUTOFMEMORY / D3DERR_OUTOFVIDEOMEMORY. *out is null on failure.
HRESULT CreateGlTexture(const std::shared_ptr<GlContext>& context,
                        const std::shared_ptr<DeviceJournal>& journal, UINT width, UINT height,
                        UINT levels, DWORD usage, D3DFORMAT format, D3DPOOL pool,
                        IDirect3DTexture9** out);

// The GL texture of a texture made by CreateGlTexture (and only such a texture).
GLuint GlTextureName(IDirect3DTexture9* texture);
