// D3DX's texture helper: a thin forward to the device.
#include "platform/d3d9_interfaces.h"

HRESULT D3DXCreateTexture(IDirect3DDevice9* device, UINT width, UINT height, UINT mip_levels,
                          DWORD usage, D3DFORMAT format, D3DPOOL pool,
                          IDirect3DTexture9** texture) {
  if (device == nullptr) {
    if (texture != nullptr) *texture = nullptr;
    return D3DERR_INVALIDCALL;
  }
  return device->CreateTexture(width, height, mip_levels, usage, format, pool, texture, nullptr);
}
