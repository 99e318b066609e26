// The emitter, driven frame by frame as a host drives it, issues the same device calls on
// GlDevice as on MemoryDevice, and on GlDevice leaves particles in the picture.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <tuple>
#include <vector>

#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/object_data_channel.h"
#include "platform/gl/gl_device.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

constexpr UINT kSide = 96;  // pixels
constexpr D3DCOLOR kBackground = 0xFF101020;
constexpr int kFrames = 12;
constexpr double kFrameMs = 40.0;

struct Path {
  const char* name;
  bool hardware;  // point sprites rather than quads
  bool fading;    // the blended pass
};

// A round white dot with soft alpha, as a particle image.
IDirect3DTexture9* DotTexture(IDirect3DDevice9* device) {
  constexpr UINT kDot = 8;
  IDirect3DTexture9* texture = nullptr;
  if (FAILED(device->CreateTexture(kDot, kDot, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &texture,
                                   nullptr)))
    return nullptr;
  D3DLOCKED_RECT locked{};
  texture->LockRect(0, &locked, nullptr, 0);
  for (UINT y = 0; y < kDot; ++y) {
    for (UINT x = 0; x < kDot; ++x) {
      const int dx = 2 * int(x) - int(kDot) + 1, dy = 2 * int(y) - int(kDot) + 1;
      const int alpha = std::max(0, 255 - (dx * dx + dy * dy) * 4);
      const std::uint32_t texel = (std::uint32_t(alpha) << 24) | 0x00FFFFFFu;
      std::memcpy(static_cast<BYTE*>(locked.pBits) + y * locked.Pitch + x * 4, &texel, 4);
    }
  }
  texture->UnlockRect(0);
  return texture;
}

// Runs the frames on `device` with rand seeded and time driven by a test clock.
template <typename Device>
void DrawFrames(Device* device, const Path& path) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_DeviceChannel device_channel(device);
  TestClock clock;
  std::srand(1234);

  D3DXMATRIX view, projection;
  const D3DXVECTOR3 eye(0.0f, 1.5f, -6.0f), at(0.0f, 1.0f, 0.0f), up(0.0f, 1.0f, 0.0f);
  D3DXMatrixLookAtLH(&view, &eye, &at, &up);
  D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 3.0f, 1.0f, 0.5f, 100.0f);
  device->SetTransform(D3DTS_VIEW, &view);
  device->SetTransform(D3DTS_PROJECTION, &projection);
  // A host without lights draws unlit; the fading passes leave lighting as they find it.
  device->SetRenderState(D3DRS_LIGHTING, FALSE);

  Tev_DX8_ObjectDataChannel mesh;
  mesh.BuildDisc(0.5f, 12);
  IDirect3DTexture9* dot = DotTexture(device);
  IDirect3DTexture9* attached_dot = DotTexture(device);
  Qen_TextureChannel particle_texture(dot), attached_texture(attached_dot);
  // The channels hold their own references.
  if (dot != nullptr) dot->Release();
  if (attached_dot != nullptr) attached_dot->Release();
  std::vector<std::unique_ptr<Qen_ValueChannel>> values;
  Qen_ValueVectorChannel look_at(eye);
  Qen_ValueVectorChannel gravity(D3DXVECTOR3(0.0f, -0.002f, 0.0f));
  // Orange sparks, fading out over their lives (colour envelopes run 0 to 255).
  Tev_EnvelopeStorage alpha, red, green, blue;
  for (auto [envelope, start, end] : {std::tuple{&alpha, 230.0f, 40.0f},
                                      {&red, 255.0f, 255.0f},
                                      {&green, 170.0f, 90.0f},
                                      {&blue, 40.0f, 20.0f}}) {
    envelope->AddKey(0.0f, start);
    envelope->AddKey(1.0f, end);
  }

  auto emitter = std::make_unique<Tev_AdvancedParticleEmitter>();
  auto link_value = [&](int link, float value) {
    values.push_back(std::make_unique<Qen_ValueChannel>(value));
    EXPECT_TRUE(emitter->SetChild(link, values.back().get()));
  };
  EXPECT_TRUE(emitter->SetChild(kLinkEmitter, &mesh));
  link_value(kLinkParticleCount, 40.0f);
  link_value(kLinkHardwareParticles, path.hardware ? 1.0f : 0.0f);
  link_value(kLinkUseVertexAlphaFading, path.fading ? 1.0f : 0.0f);
  link_value(kLinkEmitterActive, 1.0f);
  link_value(kLinkLogicUpdatesPerSecond, 50.0f);
  link_value(kLinkBirthsPerSecond, 120.0f);
  link_value(kLinkLifespanMin, 1.0f);
  link_value(kLinkLifespanMax, 2.0f);
  link_value(kLinkInitialForceStrength, 0.05f);
  link_value(kLinkSizeOffsetMax, 1.5f);
  EXPECT_TRUE(emitter->SetChild(kLinkLookAt, &look_at));
  EXPECT_TRUE(emitter->SetChild(kLinkGlobalForce, &gravity));
  EXPECT_TRUE(emitter->SetChild(kLinkVertexAlphaEnvelope, &alpha));
  EXPECT_TRUE(emitter->SetChild(kLinkRedColorEnvelope, &red));
  EXPECT_TRUE(emitter->SetChild(kLinkGreenColorEnvelope, &green));
  EXPECT_TRUE(emitter->SetChild(kLinkBlueColorEnvelope, &blue));
  EXPECT_TRUE(emitter->SetChild(kLinkParticleTexture, &particle_texture));
  EXPECT_TRUE(emitter->SetChild(kLinkAttachedTexture, &attached_texture));

  for (int frame = 0; frame < kFrames; ++frame) {
    context.AdvanceFrame();
    device->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, kBackground, 1.0f, 0);
    device->BeginScene();
    emitter->CallChannel();
    device->EndScene();
    clock.AdvanceMs(kFrameMs);
  }
  emitter.reset();
}

class GlEmitterFrameTest : public ::testing::TestWithParam<Path> {};

TEST_P(GlEmitterFrameTest, SameFramesGiveTheSameCallsOnBothDevicesAndPixelsOnGl) {
  std::string error;
  GlDevice* gl = GlDevice::Create(kSide, kSide, &error);
  if (gl == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  MemoryDevice* reference = MemoryDevice::Create();

  DrawFrames(reference, GetParam());
  DrawFrames(gl, GetParam());
  EXPECT_EQ(gl->CallStrings(), reference->CallStrings());
  EXPECT_GT(gl->Calls().size(), std::size_t{kFrames} * 5);
  EXPECT_EQ(gl->LiveObjectCount(), 0);

  std::vector<std::uint32_t> pixels;
  gl->ReadPixels(&pixels);
  int particle_pixels = 0;
  for (std::uint32_t p : pixels) particle_pixels += p != kBackground ? 1 : 0;
  EXPECT_GT(particle_pixels, 20) << "the particles left no mark";
  // Unlit, the sparks are orange: red over green over blue wherever they are drawn.
  int orange_pixels = 0;
  for (std::uint32_t p : pixels) {
    const int r = (p >> 16) & 0xFF, g = (p >> 8) & 0xFF, b = p & 0xFF;
    orange_pixels += r > 2 * b && r > g && g > b ? 1 : 0;
  }
  EXPECT_GT(orange_pixels, particle_pixels / 2);
  EXPECT_LT(particle_pixels, int(kSide * kSide) / 2);

  reference->Release();
  gl->Release();
}

INSTANTIATE_TEST_SUITE_P(Paths, GlEmitterFrameTest,
                         ::testing::Values(Path{"Quads", false, false},
                                           Path{"FadingQuads", false, true},
                                           Path{"PointSprites", true, false},
                                           Path{"FadingPointSprites", true, true}),
                         [](const auto& info) { return std::string(info.param.name); });

}  // namespace
