#include "render/tests/render_test_support.h"

#include <cstring>
#include <utility>

Particle LiveParticle(D3DXVECTOR3 position, D3DXVECTOR3 look_at, float size, std::uint32_t color) {
  Particle particle;
  particle.Active = true;
  particle.RenderPosition = particle.Position = position;
  particle.LookAtPoint = look_at;
  particle.Size = size;
  particle.Color = color;
  return particle;
}

RenderTest::RenderTest() : device_(MemoryDevice::Create()) {
  device_channel_ = std::make_unique<Tev_DX8_DeviceChannel>(device_);
  context_.DebugMessages.SetSink([this](const char* text) { messages_.emplace_back(text); });
  emitter_ = std::make_unique<Tev_AdvancedParticleEmitter>();
}

RenderTest::~RenderTest() {
  emitter_.reset();
  textures_.clear();
  device_channel_.reset();
  device_->Release();
}

void RenderTest::SetPool(std::vector<Particle> particles) {
  emitter_->ParticleCount = static_cast<std::int32_t>(particles.size());
  emitter_->Particles = std::move(particles);
}

Calls RenderTest::TakeCalls() {
  Calls calls = device_->CallStrings();
  device_->ClearCalls();
  return calls;
}

Qen_TextureChannel& RenderTest::LinkTexture(int link, MemoryDevice& device, UINT width, UINT height,
                                            std::uint32_t (*pixel)(UINT x, UINT y),
                                            D3DFORMAT format) {
  IDirect3DTexture9* texture = nullptr;
  EXPECT_TRUE(SUCCEEDED(
      device.CreateTexture(width, height, 1, 0, format, D3DPOOL_MANAGED, &texture, nullptr)));
  D3DLOCKED_RECT locked{};
  if (format == D3DFMT_A8R8G8B8 || format == D3DFMT_X8R8G8B8) {
    texture->LockRect(0, &locked, nullptr, 0);
    for (UINT y = 0; y < height; ++y) {
      for (UINT x = 0; x < width; ++x) {
        const std::uint32_t value = pixel(x, y);
        std::memcpy(static_cast<BYTE*>(locked.pBits) + y * locked.Pitch + x * 4, &value, 4);
      }
    }
    texture->UnlockRect(0);
  }
  textures_.push_back(std::make_unique<Qen_TextureChannel>(texture));
  texture->Release();  // the channel holds its own reference
  EXPECT_TRUE(emitter_->SetChild(link, textures_.back().get()));
  return *textures_.back();
}

std::vector<BYTE> BufferBytes(IDirect3DVertexBuffer9* buffer) {
  D3DVERTEXBUFFER_DESC desc{};
  void* data = nullptr;
  if (!buffer || FAILED(buffer->GetDesc(&desc)) ||
      FAILED(buffer->Lock(0, 0, &data, D3DLOCK_READONLY))) {
    ADD_FAILURE() << "vertex buffer cannot be read";
    return {};
  }
  std::vector<BYTE> bytes(static_cast<BYTE*>(data), static_cast<BYTE*>(data) + desc.Size);
  buffer->Unlock();
  return bytes;
}

std::vector<std::uint32_t> TexturePixels(IDirect3DTexture9* texture) {
  D3DSURFACE_DESC desc{};
  D3DLOCKED_RECT locked{};
  if (!texture || FAILED(texture->GetLevelDesc(0, &desc)) ||
      FAILED(texture->LockRect(0, &locked, nullptr, D3DLOCK_READONLY))) {
    ADD_FAILURE() << "texture cannot be read";
    return {};
  }
  std::vector<std::uint32_t> pixels(std::size_t{desc.Width} * desc.Height);
  for (UINT y = 0; y < desc.Height; ++y)
    std::memcpy(&pixels[std::size_t{y} * desc.Width],
                static_cast<BYTE*>(locked.pBits) + std::size_t{y} * locked.Pitch, desc.Width * 4);
  texture->UnlockRect(0);
  return pixels;
}
