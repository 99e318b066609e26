// The emitter as a channel: links, dependencies, construction, copying and destruction.
#include <memory>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "host/attractor.h"
#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/type_guids.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

class EmitterFrameTest : public ::testing::Test {
 protected:
  EmitterFrameTest() : device_(MemoryDevice::Create()), device_channel_(device_) {}
  ~EmitterFrameTest() override { device_->Release(); }

  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  MemoryDevice* device_;
  Tev_DX8_DeviceChannel device_channel_;
};

TEST_F(EmitterFrameTest, FreshEmitterHasNoChildAndTakesTheHostsDeviceChannel) {
  Tev_AdvancedParticleEmitter emitter;
  for (int i = -2; i < kEmitterLinkCount + 2; ++i) EXPECT_EQ(emitter.GetChild(i), nullptr) << i;
  EXPECT_EQ(emitter.GetChildLinkPositionCount(kLinkAttractors), 0);
  EXPECT_EQ(emitter.DeviceChannel, &device_channel_);
  EXPECT_FALSE(emitter.Initialized);
  EXPECT_TRUE(emitter.Particles.empty());
}

TEST_F(EmitterFrameTest, AttractorsLinkKeepsOrderAndCountsNullEntries) {
  Tev_AdvancedParticleEmitter emitter;
  Tev_AdvPE_Attractor a, b, c;
  ASSERT_TRUE(emitter.AddChild(kLinkAttractors, &a));
  ASSERT_TRUE(emitter.AddChild(kLinkAttractors, &b));
  ASSERT_TRUE(emitter.AddChild(kLinkAttractors, &c));
  ASSERT_EQ(emitter.GetChildLinkPositionCount(kLinkAttractors), 3);
  EXPECT_EQ(emitter.GetChildFromLinkPosition(kLinkAttractors, 0), &a);
  EXPECT_EQ(emitter.GetChildFromLinkPosition(kLinkAttractors, 1), &b);
  EXPECT_EQ(emitter.GetChildFromLinkPosition(kLinkAttractors, 2), &c);

  // A channel that goes away leaves its link; readers skip what is null.
  {
    Tev_AdvPE_Attractor gone;
    ASSERT_TRUE(emitter.AddChild(kLinkAttractors, &gone));
  }
  int non_null = 0;
  for (int k = 0; k < emitter.GetChildLinkPositionCount(kLinkAttractors); ++k)
    non_null += emitter.GetChildFromLinkPosition(kLinkAttractors, k) != nullptr;
  EXPECT_EQ(non_null, 3);
}

TEST_F(EmitterFrameTest, LinkingAChannelOfTheWrongTypeIsRefused) {
  Tev_AdvancedParticleEmitter emitter;
  Tev_EnvelopeStorage envelope;
  Qen_ValueChannel value(1.0f);
  EXPECT_FALSE(emitter.SetChild(kLinkParticleCount, &envelope));
  EXPECT_EQ(emitter.GetChild(kLinkParticleCount), nullptr);
  EXPECT_FALSE(emitter.SetChild(kLinkSizeEnvelope, &value));
  EXPECT_FALSE(emitter.AddChild(kLinkAttractors, &value));
  EXPECT_TRUE(emitter.SetChild(kLinkParticleCount, &value));
  EXPECT_EQ(emitter.GetChild(kLinkParticleCount), &value);
  // Another emitter is an object-data channel and so may serve as the "Emitter" mesh.
  Tev_AdvancedParticleEmitter mesh_like;
  EXPECT_TRUE(emitter.SetChild(kLinkEmitter, &mesh_like));
}

TEST_F(EmitterFrameTest, DependencyDeclarationIsTheSameSevenCallsEveryTime) {
  Tev_AdvancedParticleEmitter emitter;
  Qen_List list;
  emitter.DoDependencyInit(&list);
  emitter.DoDependencyInit(&list);
  ASSERT_EQ(list.Entries.size(), 14u);
  const GUID types[] = {kDeviceChannelGuid, kAttractorGuid, kEnvelopeStorageGuid,
                        kSmokeSettingsGuid, kMultiCollisionManagerGuid};
  for (int round = 0; round < 2; ++round) {
    const Qen_Dependency* d = &list.Entries[static_cast<size_t>(round * 7)];
    EXPECT_EQ(d[0].DependencyKind, Qen_Dependency::Kind::Library);
    EXPECT_EQ(d[0].LibraryName, "libc.so.6");
    EXPECT_EQ(d[1].DependencyKind, Qen_Dependency::Kind::Library);
    EXPECT_EQ(d[1].LibraryName, "libstdc++.so.6");
    for (int k = 0; k < 5; ++k) {
      EXPECT_EQ(d[2 + k].DependencyKind, Qen_Dependency::Kind::ChannelType);
      EXPECT_EQ(d[2 + k].TypeGuid, types[k]) << k;
    }
  }
}

// Gives the emitter drawing resources as an initialization would, without running one.
void GiveDrawingResources(Tev_AdvancedParticleEmitter& e, IDirect3DDevice9* device) {
  e.ParticleCount = 4;
  e.Particles.assign(4, Particle{});
  e.Particles[2].Active = true;
  e.LocalVertices = new LocalVertex[16]();
  e.PointSpriteVertices = new PointSpriteVertex[4]();
  ASSERT_TRUE(
      SUCCEEDED(device->CreateVertexBuffer(80, D3DUSAGE_WRITEONLY, kPointSpriteFvf, D3DPOOL_DEFAULT,
                                           &e.PointSpriteVertexBuffer, nullptr)));
  ASSERT_TRUE(SUCCEEDED(D3DXCreateTexture(device, 4, 8, 1, 0, D3DFMT_A8R8G8B8, D3DPOOL_MANAGED,
                                          &e.CompositeTexture)));
  e.HasCompositeTexture = true;
  e.Initialized = true;
}

TEST_F(EmitterFrameTest, CopyOwnsAPoolButNoDrawingResources) {
  {
    Tev_AdvancedParticleEmitter source;
    GiveDrawingResources(source, device_);
    source.BirthsPerSecond = 12.5f;
    Qen_ValueChannel count(4.0f);
    ASSERT_TRUE(source.SetChild(kLinkParticleCount, &count));

    Tev_AdvancedParticleEmitter copy(source);
    EXPECT_EQ(copy.LocalVertices, nullptr);
    EXPECT_EQ(copy.PointSpriteVertices, nullptr);
    EXPECT_EQ(copy.PointSpriteVertexBuffer, nullptr);
    EXPECT_EQ(copy.CompositeTexture, nullptr);
    EXPECT_FALSE(copy.Initialized);
    EXPECT_EQ(copy.BirthsPerSecond, 12.5f);
    ASSERT_EQ(copy.Particles.size(), 4u);
    EXPECT_TRUE(copy.Particles[2].Active);
    EXPECT_NE(copy.Particles.data(), source.Particles.data());
    EXPECT_EQ(copy.GetChild(kLinkParticleCount), &count);
    copy.Particles[2].Active = false;
    EXPECT_TRUE(source.Particles[2].Active);
    // Both destroyed here: each gives back only what it owns (checked by the sanitizers and
    // the device's object count below).
  }
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

TEST_F(EmitterFrameTest, AssignmentGivesBackTheTargetsOwnResources) {
  {
    Tev_AdvancedParticleEmitter source;
    GiveDrawingResources(source, device_);
    Tev_AdvancedParticleEmitter target;
    GiveDrawingResources(target, device_);
    EXPECT_EQ(device_->LiveObjectCount(), 4);
    target = source;
    EXPECT_EQ(device_->LiveObjectCount(), 2);
    EXPECT_EQ(target.CompositeTexture, nullptr);
    EXPECT_FALSE(target.Initialized);
    target = target;
    EXPECT_EQ(target.Particles.size(), 4u);
  }
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

TEST_F(EmitterFrameTest, DestroyingAnEmitterThatNeverRanIsSafe) {
  auto emitter = std::make_unique<Tev_AdvancedParticleEmitter>();
  Qen_Channel* as_channel = emitter.release();
  delete as_channel;  // through the virtual destructor, as the host does
  EXPECT_EQ(device_->LiveObjectCount(), 0);
}

}  // namespace
