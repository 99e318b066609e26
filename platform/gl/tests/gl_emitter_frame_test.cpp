// The emitter, driven frame by frame as a host drives it, issues the same device calls on
// GlDevice as on MemoryDevice (so it takes the same paths on both), and on GlDevice leaves
// particles in the picture.
#include <gtest/gtest.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
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

struct Path {
  const char* name;
  bool hardware;  // point sprites rather than quads
  bool fading;    // the blended pass
};

// Twelve 40 ms frames with rand seeded and time driven by a test clock.
template <typename Device>
void DrawFrames(Device* device, const Path& path) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  Tev_DX8_DeviceChannel device_channel(device);
  TestClock clock;
  std::srand(1234);
  D3DXMATRIX view, projection;
  const D3DXVECTOR3 eye(0.0f, 1.5f, -6.0f), at(0.0f, 1.0f, 0.0f), up(0.0f, 1.0f, 0.0f);
  device->SetTransform(D3DTS_VIEW, D3DXMatrixLookAtLH(&view, &eye, &at, &up));
  device->SetTransform(D3DTS_PROJECTION, D3DXMatrixPerspectiveFovLH(&projection, 3.14159265f / 3.0f,
                                                                    1.0f, 0.5f, 100.0f));
  device->SetRenderState(D3DRS_LIGHTING, FALSE);  // a host without lights draws unlit

  IDirect3DTexture9* white = nullptr;  // the particle image
  D3DXCreateTexture(device, 4, 4, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED, &white);
  D3DLOCKED_RECT locked{};
  white->LockRect(0, &locked, nullptr, 0);
  std::memset(locked.pBits, 0xFF, 4 * std::size_t(locked.Pitch));
  white->UnlockRect(0);
  Qen_TextureChannel texture(white);  // holds a reference of its own
  white->Release();
  Tev_DX8_ObjectDataChannel mesh;
  mesh.BuildDisc(0.5f, 12);
  Qen_ValueVectorChannel look_at(eye);
  Tev_EnvelopeStorage alpha;  // fading out over their lives (envelopes run 0 to 255)
  alpha.AddKey(0.0f, 230.0f);
  alpha.AddKey(1.0f, 40.0f);
  auto emitter = std::make_unique<Tev_AdvancedParticleEmitter>();
  EXPECT_TRUE(emitter->SetChild(kLinkEmitter, &mesh));
  EXPECT_TRUE(emitter->SetChild(kLinkLookAt, &look_at));
  EXPECT_TRUE(emitter->SetChild(kLinkParticleTexture, &texture));
  EXPECT_TRUE(emitter->SetChild(kLinkVertexAlphaEnvelope, &alpha));
  std::vector<std::unique_ptr<Qen_ValueChannel>> values;
  for (const auto& [link, value] : std::initializer_list<std::pair<int, float>>{
           {kLinkParticleCount, 40.0f},
           {kLinkHardwareParticles, path.hardware ? 1.0f : 0.0f},
           {kLinkUseVertexAlphaFading, path.fading ? 1.0f : 0.0f},
           {kLinkEmitterActive, 1.0f},
           {kLinkLogicUpdatesPerSecond, 50.0f},
           {kLinkBirthsPerSecond, 120.0f},
           {kLinkLifespanMin, 1.0f},
           {kLinkLifespanMax, 2.0f},
           {kLinkInitialForceStrength, 0.05f},
           {kLinkSizeOffsetMax, 1.5f}}) {
    values.push_back(std::make_unique<Qen_ValueChannel>(value));
    EXPECT_TRUE(emitter->SetChild(link, values.back().get())) << link;
  }
  for (int frame = 0; frame < 12; ++frame) {
    context.AdvanceFrame();
    device->Clear(0, nullptr, D3DCLEAR_TARGET | D3DCLEAR_ZBUFFER, kBackground, 1.0f, 0);
    device->BeginScene();
    emitter->CallChannel();
    device->EndScene();
    clock.AdvanceMs(40.0);
  }
}

class GlEmitterFrameTest : public ::testing::TestWithParam<Path> {};

TEST_P(GlEmitterFrameTest, SameFramesGiveTheSameCallsOnBothDevicesAndParticlesOnGl) {
  std::string error;
  GlDevice* gl = GlDevice::Create(kSide, kSide, &error);
  if (gl == nullptr) GTEST_SKIP() << "no OpenGL context on this machine: " << error;
  MemoryDevice* reference = MemoryDevice::Create();
  DrawFrames(reference, GetParam());
  DrawFrames(gl, GetParam());
  EXPECT_EQ(gl->CallStrings(), reference->CallStrings());
  EXPECT_GT(gl->Calls().size(), 100u);
  EXPECT_EQ(gl->LiveObjectCount(), 0);
  std::vector<std::uint32_t> pixels;
  gl->ReadPixels(&pixels);
  int particle_pixels = 0;
  for (std::uint32_t p : pixels) particle_pixels += p != kBackground ? 1 : 0;
  EXPECT_GT(particle_pixels, 20) << "the particles left no mark";
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
