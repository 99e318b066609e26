// Faults the fuzzers found, each pinned down directly on an emitter.
#include <climits>
#include <memory>
#include <vector>

#include <gtest/gtest.h>

#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

class Finding : public testing::Test {
 protected:
  Finding() : device(MemoryDevice::Create()), deviceChannel(device) {
    emitter = std::make_unique<Tev_AdvancedParticleEmitter>();
  }
  ~Finding() override {
    emitter.reset();
    channels.clear();
    device->Release();
  }
  void SetValue(int link, float value) {
    channels.push_back(std::make_unique<Qen_ValueChannel>(value));
    ASSERT_TRUE(emitter->SetChild(link, channels.back().get()));
  }
  // An emitter of `count` records with one emitter vertex at the origin, after its first working
  // frame (which reads the links).
  void Start(float count) {
    SetValue(kLinkParticleCount, count);
    SetValue(kLinkVertexEmissions, 1.0f);
    auto mesh = std::make_unique<Tev_DX8_ObjectDataChannel>();
    mesh->SetVertexCount(1);
    mesh->SetVertexPosition(D3DXVECTOR3(0.0f, 0.0f, 0.0f), 0);
    ASSERT_TRUE(emitter->SetChild(kLinkEmitter, mesh.get()));
    channels.push_back(std::move(mesh));
    emitter->CallChannel();
    ASSERT_TRUE(emitter->Initialized);
    context.AdvanceFrame();
    emitter->CallChannel();
    ASSERT_TRUE(emitter->VertexEmissions);
  }

  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current{&context};
  MemoryDevice* device;
  Tev_DX8_DeviceChannel deviceChannel;
  std::vector<std::unique_ptr<Qen_Channel>> channels;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter;
};

// A birth number from a direct call beyond what one frame can number left the particle with
// INT_MAX updates to run in the next logic step: the host hung.
TEST_F(Finding, BirthNumberBeyondOneFrameIsCapped) {
  Start(4);
  const int last = Tev_AdvancedParticleEmitter::kMaximumBirthsPerFrame;
  const struct {
    int BirthIndex;
    int PendingSteps;
  } cases[] = {
      {0, 1}, {last - 1, last}, {last, last + 1}, {last + 1, last + 1}, {INT_MAX, last + 1}};
  for (const auto& c : cases) {
    emitter->Particles[0].Active = false;
    emitter->BirthParticle(c.BirthIndex);
    EXPECT_EQ(emitter->Particles[0].PendingSteps, c.PendingSteps) << c.BirthIndex;
  }
}

// The envelopes a frame held are destroyed; a direct birth before the next frame then read them.
TEST_F(Finding, BirthAfterEnvelopesWentAwayReadsNone) {
  Start(4);
  auto size = std::make_unique<Tev_EnvelopeStorage>();
  size->AddKey(0.0f, 0.25f);
  auto alpha = std::make_unique<Tev_EnvelopeStorage>();
  alpha->AddKey(0.0f, 200.0f);
  ASSERT_TRUE(emitter->SetChild(kLinkSizeEnvelope, size.get()));
  ASSERT_TRUE(emitter->SetChild(kLinkVertexAlphaEnvelope, alpha.get()));
  context.AdvanceFrame();
  emitter->CallChannel();
  ASSERT_EQ(emitter->SizeEnvelope, size.get());

  size.reset();
  alpha.reset();
  emitter->BirthParticle(0);
  // Born as without envelopes: size 1, alpha 0.
  EXPECT_EQ(emitter->Particles[0].Size, 1.0f);
  EXPECT_EQ(emitter->Particles[0].Color >> 24, 0u);
  EXPECT_EQ(emitter->SizeEnvelope, nullptr);
}

// A particle flung far (a coordinate beyond 1.8e18) sent Embree a ray it refuses with an
// assertion, which aborted the host. Such segments are now searched without Embree, with the
// answers the search gives closer in.
TEST(CollisionFinding, FarSegmentsAgainstAMeshAreAnswered) {
  Tev_DX8_ObjectDataChannel quad;
  quad.BuildQuad(2.0f, 2.0f);  // y = 0, facing +y
  Tev_MultiCollisionManager manager;
  ASSERT_EQ(manager.AddMesh(&quad), 0);
  manager.RebuildAllCollisionObjects();

  const struct {
    const char* Name;
    D3DXVECTOR3 Origin;
    D3DXVECTOR3 Ray;
    int Id;
  } cases[] = {
      {"near, down through the quad", {0.0f, 1.0f, 0.0f}, {0.0f, -2.0f, 0.0f}, 0},
      {"far above, down through it", {0.0f, 1e20f, 0.0f}, {0.0f, -2e20f, 0.0f}, 0},
      {"far above, short of it", {0.0f, 1e20f, 0.0f}, {0.0f, -1e19f, 0.0f}, -1},
      {"near, a huge ray down", {0.0f, 1.0f, 0.0f}, {0.0f, -3e38f, 0.0f}, 0},
      {"far to the side", {3e38f, 1.0f, 0.0f}, {0.0f, -2.0f, 0.0f}, -1},
  };
  for (const auto& c : cases) {
    D3DXVECTOR3 origin = c.Origin, ray = c.Ray, point, normal;
    float cosine = 0.0f;
    EXPECT_EQ(manager.GetClosestFrontFaceCollision(&origin, &ray, &point, &normal, &cosine), c.Id)
        << c.Name;
    if (c.Id == 0) {
      EXPECT_NEAR(point.y, 0.0f, 1e-3f) << c.Name;
      EXPECT_EQ(normal, D3DXVECTOR3(0.0f, 1.0f, 0.0f)) << c.Name;
    }
  }
}

}  // namespace
