// An emitter on the reference device, for checking its drawing byte by byte and call by call.
// The pool is set directly (the class is exported whole) and the drawing operations are called
// one at a time, as Initialize and the frame driver would call them.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

using Calls = std::vector<std::string>;

// A live particle drawn at `position`, facing `look_at`.
Particle LiveParticle(D3DXVECTOR3 position, D3DXVECTOR3 look_at, float size, std::uint32_t color);

class RenderTest : public ::testing::Test {
 protected:
  RenderTest();
  ~RenderTest() override;

  Tev_AdvancedParticleEmitter& Emitter() { return *emitter_; }
  // Replaces the pool, as Initialize leaves it sized.
  void SetPool(std::vector<Particle> particles);
  // The device log since the last call, as "Name(a, b)" lines; starts it afresh.
  Calls TakeCalls();
  // A width x height texture of `format` on `device` (4-byte formats filled with pixel(x, y)),
  // linked at `link` ("Particle Texture" or "Attached Texture").
  Qen_TextureChannel& LinkTexture(int link, MemoryDevice& device, UINT width, UINT height,
                                  std::uint32_t (*pixel)(UINT x, UINT y),
                                  D3DFORMAT format = D3DFMT_A8R8G8B8);
  // "Name(a, b)" of one call, for building expected logs.
  static std::string Call(const std::string& name, std::vector<std::uint64_t> args) {
    return DeviceCall{name, std::move(args)}.ToString();
  }
  std::uint64_t IdOf(const void* object) const { return device_->ObjectId(object); }

  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  MemoryDevice* device_;
  std::unique_ptr<Tev_DX8_DeviceChannel> device_channel_;
  std::vector<std::unique_ptr<Qen_TextureChannel>> textures_;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter_;
  std::vector<std::string> messages_;
};

// The bytes of a vertex buffer, or of level 0 of a texture row by row through its own pitch.
std::vector<BYTE> BufferBytes(IDirect3DVertexBuffer9* buffer);
std::vector<std::uint32_t> TexturePixels(IDirect3DTexture9* texture);
