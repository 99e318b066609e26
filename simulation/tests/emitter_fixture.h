// A linked emitter on a fresh host context, with a recording device, a test clock and owned link
// channels, driven frame by frame through CallChannel.
#pragma once

#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "host/attractor.h"
#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "host/smoke_settings.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

using Keys = std::vector<std::pair<float, float>>;
using Smoke = Tev_AdvPE_SmokeSettings;
inline constexpr D3DXVECTOR3 kZero{0.0f, 0.0f, 0.0f};

class EmitterTest : public ::testing::Test {
 protected:
  EmitterTest();
  ~EmitterTest() override;

  // A channel the fixture owns for the test's length.
  template <typename T, typename... Args>
  T* Make(Args&&... args) {
    channels_.push_back(std::make_unique<T>(std::forward<Args>(args)...));
    return static_cast<T*>(channels_.back().get());
  }

  // Links `child` at `owner`'s link.
  template <typename T>
  T* Link(Qen_Channel& owner, int link, T* child) {
    EXPECT_TRUE(owner.SetChild(link, child)) << "link " << link;
    return child;
  }
  // Links a channel of the link's type at the emitter (or `owner`), or sets the one already
  // linked there.
  Qen_ValueChannel* SetValue(int link, float value, Qen_Channel* owner = nullptr);
  Qen_ValueVectorChannel* SetVector(int link, D3DXVECTOR3 vector);
  // A new envelope through (x, y) keys, linked at the emitter's (or `owner`'s) link.
  Tev_EnvelopeStorage* SetEnvelope(int link, const Keys& keys, Qen_Channel* owner = nullptr);
  void Unlink(int link) { emitter->ClearChild(link); }
  // A mesh linked as the "Emitter"; normals default to (0, 1, 0).
  Tev_DX8_ObjectDataChannel* SetEmitterMesh(const std::vector<D3DXVECTOR3>& vertices,
                                            const std::vector<DWORD>& indices,
                                            const std::vector<D3DXVECTOR3>& normals = {});
  // A running emitter: `count` records, logic steps and births per second, active, with one
  // emitter vertex at the origin, vertex emission and a lifespan of 100 s.
  void LinkBasics(float count, float logicPerSecond, float birthsPerSecond);

  // The first call, which only initializes.
  void Start() { emitter->CallChannel(); }
  // One host frame of `ms` milliseconds of real time.
  void RunFrame(double ms);
  void RunFrames(int frames, double ms) {
    for (int i = 0; i < frames; ++i) RunFrame(ms);
  }
  // One frame that runs exactly one logic step at 50 steps per second (20 ms).
  void StepOnce() { RunFrame(1000.0 * StepSeconds()); }
  float StepSeconds() const { return (21.0f - emitter->LogicAccumulator) / 1000.0f; }

  // A smoke settings channel linked at "SmokeSettings" with "Smoke?" on, and its own links.
  Smoke* LinkSmoke();
  void SetSmokeValue(int link, float value) { SetValue(link, value, Settings()); }
  void SetSmokeEnvelope(int link, const Keys& keys) { SetEnvelope(link, keys, Settings()); }
  Qen_Channel* Settings() { return emitter->GetChild(kLinkSmokeSettings); }

  Particle& P(int index) { return emitter->Particles.at(static_cast<std::size_t>(index)); }
  int ActiveCount() const;
  // A live record placed by hand (for stage tests that start from a known state).
  Particle& PlaceParticle(int index, D3DXVECTOR3 position, D3DXVECTOR3 velocity,
                          float lifespan = 100.0f);

  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current{&context};
  TestClock clock;
  MemoryDevice* device;
  std::unique_ptr<Tev_DX8_DeviceChannel> deviceChannel;
  std::vector<std::string> debugMessages;
  std::vector<std::string> overloadMessages;

 private:
  std::vector<std::unique_ptr<Qen_Channel>> channels_;

 public:
  // Declared last: destroyed first, while everything it links still lives.
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter;
};

// Each component within `tolerance`.
void ExpectNear(const D3DXVECTOR3& actual, const D3DXVECTOR3& expected, float tolerance = 1e-5f);

// The first `count` values rand() gives after srand(seed); srand(seed) is called again afterwards
// so that the code under test sees the same sequence.
std::vector<int> RandSequence(unsigned seed, int count);
// How many rand() values were drawn since the sequence restarted: the position of the next value
// in `sequence` (consumes one value). -1 when it is not among them.
int DrawsTaken(const std::vector<int>& sequence);
