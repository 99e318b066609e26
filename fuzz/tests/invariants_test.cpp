// The invariant checks themselves: each must notice the fault it stands for.
#include <memory>
#include <ostream>
#include <vector>

#include <gtest/gtest.h>

#include "fuzz/invariants.h"
#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

using apefuzz::CheckEmitter;
using apefuzz::MessageWatch;

class InvariantTest : public testing::Test {
 protected:
  InvariantTest() : device(MemoryDevice::Create()), deviceChannel(device) {
    emitter = std::make_unique<Tev_AdvancedParticleEmitter>();
  }
  ~InvariantTest() override {
    emitter.reset();
    device->Release();
  }
  // A working emitter of `count` records on the quad or point-sprite path.
  void Start(float count, bool pointSprites) {
    countLink.SetValue(count);
    hardwareLink.SetValue(pointSprites ? 1.0f : 0.0f);
    ASSERT_TRUE(emitter->SetChild(kLinkParticleCount, &countLink));
    ASSERT_TRUE(emitter->SetChild(kLinkHardwareParticles, &hardwareLink));
    emitter->CallChannel();
    ASSERT_TRUE(emitter->Initialized);
  }

  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current{&context};
  MessageWatch messages{context};
  MemoryDevice* device;
  Tev_DX8_DeviceChannel deviceChannel;
  Qen_ValueChannel countLink;
  Qen_ValueChannel hardwareLink;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter;
};

TEST_F(InvariantTest, SoundEmittersPass) {
  EXPECT_EQ(CheckEmitter(*emitter), "");  // never initialized: no arrays at all
  Start(10, false);
  EXPECT_EQ(CheckEmitter(*emitter), "");
  emitter->Initialized = false;
  Start(7, true);
  EXPECT_EQ(CheckEmitter(*emitter), "");
}

TEST_F(InvariantTest, PoolOfAnotherSizeIsCaught) {
  Start(10, false);
  emitter->Particles.pop_back();
  EXPECT_NE(CheckEmitter(*emitter).find("Particles.size() is 9, ParticleCount is 10"),
            std::string::npos);
  emitter->Particles.clear();
  emitter->ParticleCount = -1;
  EXPECT_NE(CheckEmitter(*emitter), "");
}

struct ShortArrayCase {
  const char* Name;
  bool PointSprites;
  // Failures name the case, not its bytes.
  friend void PrintTo(const ShortArrayCase& c, std::ostream* os) { *os << c.Name; }
};

class ShortArray : public InvariantTest, public testing::WithParamInterface<ShortArrayCase> {};

TEST_P(ShortArray, IsCaught) {
  Start(10, GetParam().PointSprites);
  // One record short of what ten particles need.
  if (GetParam().PointSprites) {
    delete[] emitter->PointSpriteVertices;
    emitter->PointSpriteVertices = new PointSpriteVertex[9]();
  } else {
    delete[] emitter->LocalVertices;
    emitter->LocalVertices = new LocalVertex[39]();
  }
  EXPECT_NE(CheckEmitter(*emitter).find(GetParam().Name), std::string::npos);
}

INSTANTIATE_TEST_SUITE_P(Paths, ShortArray,
                         testing::Values(ShortArrayCase{"LocalVertices", false},
                                         ShortArrayCase{"PointSpriteVertices", true}),
                         [](const auto& info) { return std::string(info.param.Name); });

TEST_F(InvariantTest, WorkingEmitterWithoutItsArrayIsCaught) {
  Start(10, false);
  delete[] emitter->LocalVertices;
  emitter->LocalVertices = nullptr;
  EXPECT_NE(CheckEmitter(*emitter).find("no LocalVertices"), std::string::npos);
}

TEST_F(InvariantTest, MessagesWithoutThePrefixAreCaught) {
  context.DebugMessages("APE: fine");
  context.OverloadMessages("APE: also fine");
  EXPECT_EQ(messages.Fault(), "");
  context.OverloadMessages("Too many particles");
  context.DebugMessages("APE: later ones do not hide it");
  EXPECT_NE(messages.Fault().find("\"Too many particles\""), std::string::npos);
  EXPECT_EQ(messages.Count(), 4);
}

}  // namespace
