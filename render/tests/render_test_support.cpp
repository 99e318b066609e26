#include "render/tests/render_test_support.h"

#include <cstring>
#include <utility>

#include "plugin/link_table.h"

void PrintTo(const D3DXVECTOR3& v, std::ostream* os) {
  *os << "(" << v.x << ", " << v.y << ", " << v.z << ")";
}

Particle LiveParticle(D3DXVECTOR3 position, D3DXVECTOR3 look_at, float size, std::uint32_t color) {
  Particle particle;
  particle.Active = true;
  particle.RenderPosition = position;
  particle.Position = position;
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
  for (MemoryDevice* device : other_devices_) device->Release();
  device_->Release();
}

void RenderTest::SetPool(std::vector<Particle> particles) {
  emitter_->ParticleCount = static_cast<std::int32_t>(particles.size());
  emitter_->Particles = std::move(particles);
}

std::vector<std::string> RenderTest::TakeCalls() {
  std::vector<std::string> calls = device_->CallStrings();
  device_->ClearCalls();
  return calls;
}

Qen_TextureChannel& RenderTest::MakeTexture(MemoryDevice& device, UINT width, UINT height,
                                            D3DFORMAT format,
                                            std::uint32_t (*pixel)(UINT x, UINT y)) {
  IDirect3DTexture9* texture = nullptr;
  EXPECT_TRUE(SUCCEEDED(
      device.CreateTexture(width, height, 1, 0, format, D3DPOOL_MANAGED, &texture, nullptr)));
  if (format == D3DFMT_A8R8G8B8 || format == D3DFMT_X8R8G8B8) {
    D3DLOCKED_RECT locked{};
    EXPECT_TRUE(SUCCEEDED(texture->LockRect(0, &locked, nullptr, 0)));
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
  return *textures_.back();
}

void RenderTest::LinkTexture(int link, Qen_TextureChannel& texture) {
  ASSERT_TRUE(emitter_->SetChild(link, &texture));
}

MemoryDevice& RenderTest::OtherDevice() {
  other_devices_.push_back(MemoryDevice::Create());
  return *other_devices_.back();
}

std::string RenderTest::Call(const std::string& name, std::vector<std::uint64_t> args) {
  return DeviceCall{name, std::move(args)}.ToString();
}

TexturePixels ReadPixels(IDirect3DTexture9& texture) {
  TexturePixels result;
  D3DSURFACE_DESC desc{};
  D3DLOCKED_RECT locked{};
  if (FAILED(texture.GetLevelDesc(0, &desc)) ||
      FAILED(texture.LockRect(0, &locked, nullptr, D3DLOCK_READONLY))) {
    ADD_FAILURE() << "texture cannot be read";
    return result;
  }
  result.Width = desc.Width;
  result.Height = desc.Height;
  result.Pixels.resize(std::size_t{desc.Width} * desc.Height);
  for (UINT y = 0; y < desc.Height; ++y) {
    std::memcpy(&result.Pixels[std::size_t{y} * desc.Width],
                static_cast<const BYTE*>(locked.pBits) + std::size_t{y} * locked.Pitch,
                std::size_t{desc.Width} * 4);
  }
  texture.UnlockRect(0);
  return result;
}
