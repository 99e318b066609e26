// An emitter on the reference device, for checking its drawing byte by byte and call by call.
// The pool is set directly (the class is exported whole) and the drawing operations are called
// one at a time, as Initialize and the frame driver would call them.
#pragma once

#include <cstdint>
#include <memory>
#include <ostream>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"

void PrintTo(const D3DXVECTOR3& v, std::ostream* os);

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
  std::vector<std::string> TakeCalls();
  // A width x height texture of `format` on `device` whose pixel (x, y) holds pixel(x, y)
  // (4-byte formats only; others are left zero), held by a texture link channel.
  Qen_TextureChannel& MakeTexture(MemoryDevice& device, UINT width, UINT height, D3DFORMAT format,
                                  std::uint32_t (*pixel)(UINT x, UINT y));
  // Links a texture channel at "Particle Texture" or "Attached Texture".
  void LinkTexture(int link, Qen_TextureChannel& texture);
  // A device that is not the emitter's, for sources whose failures are injected separately.
  MemoryDevice& OtherDevice();

  // "Name(a, b)" of one call, for building expected logs.
  static std::string Call(const std::string& name, std::vector<std::uint64_t> args);
  std::uint64_t IdOf(const void* object) const { return device_->ObjectId(object); }

  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  MemoryDevice* device_;
  std::unique_ptr<Tev_DX8_DeviceChannel> device_channel_;
  std::vector<std::unique_ptr<Qen_TextureChannel>> textures_;
  std::vector<MemoryDevice*> other_devices_;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter_;
  std::vector<std::string> messages_;
};

// Level 0 of a 4-byte-per-pixel texture, read row by row through its own pitch.
struct TexturePixels {
  UINT Width = 0;
  UINT Height = 0;
  std::vector<std::uint32_t> Pixels;  // row after row, no padding
  std::uint32_t At(UINT x, UINT y) const { return Pixels[std::size_t{y} * Width + x]; }
};
TexturePixels ReadPixels(IDirect3DTexture9& texture);
