// ape-demo: a minimal host around the emitter plug-in. It loads the plug-in through the host's
// loader, builds a fountain (a disc emitter, gravity, a floor to bounce on, size and colour
// envelopes), runs 120 frames at 60 Hz on the reference device and reports what happened.
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/multi_collision_manager.h"
#include "host/object_data_channel.h"
#include "host/plugin_loader.h"
#include "host/type_guids.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"

namespace {

constexpr int kFrames = 120;
constexpr double kFrameMs = 1000.0 / 60.0;

template <typename T>
T* Create(PluginLoader& loader, const GUID& type) {
  std::string error;
  Qen_Channel* channel = loader.CreateChannel(type, &error);
  if (channel == nullptr) {
    std::fprintf(stderr, "ape-demo: %s\n", error.c_str());
    std::exit(1);
  }
  return static_cast<T*>(channel);
}

void Link(Qen_Channel& owner, int index, Qen_Channel* child) {
  if (!owner.SetChild(index, child)) {
    std::fprintf(stderr, "ape-demo: could not link \"%s\"\n", GetEmitterLinkSpec(index).LinkName);
    std::exit(1);
  }
}

}  // namespace

int main() {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  int messages = 0;
  context.DebugMessages.SetSink([&](const char* text) {
    ++messages;
    std::printf("  message: %s\n", text);
  });
  context.OverloadMessages.SetSink([&](const char* text) {
    ++messages;
    std::printf("  overload: %s\n", text);
  });
  TestClock clock;

  MemoryDevice* device = MemoryDevice::Create();
  Tev_DX8_DeviceChannel device_channel(device);
  device->Release();

  PluginLoader loader;
  std::string error;
  if (!loader.LoadType(kAdvancedParticleEmitterGuid, &error)) {
    std::fprintf(stderr, "ape-demo: %s\n", error.c_str());
    return 1;
  }
  std::printf("ape-demo: loaded %s.so from %s\n", kAdvancedParticleEmitterGuidText,
              loader.Folder().c_str());

  std::vector<std::unique_ptr<Qen_Channel>> owned;
  auto keep = [&](Qen_Channel* c) {
    owned.emplace_back(c);
    return c;
  };
  auto* emitter =
      static_cast<Tev_AdvancedParticleEmitter*>(keep(Create<Qen_Channel>(loader, kAdvancedParticleEmitterGuid)));
  auto* disc = static_cast<Tev_DX8_ObjectDataChannel*>(keep(Create<Qen_Channel>(loader, kObjectDataGuid)));
  disc->BuildDisc(0.2f, 16);
  auto* floor = static_cast<Tev_MultiCollisionManager*>(
      keep(Create<Qen_Channel>(loader, kMultiCollisionManagerGuid)));
  floor->AddPlane({0.0f, -1.0f, 0.0f}, {0.0f, 1.0f, 0.0f});
  auto* size = static_cast<Tev_EnvelopeStorage*>(keep(Create<Qen_Channel>(loader, kEnvelopeStorageGuid)));
  size->SetKeys({{0.0f, 0.05f}, {1.0f, 0.01f}});
  auto* white = static_cast<Tev_EnvelopeStorage*>(keep(Create<Qen_Channel>(loader, kEnvelopeStorageGuid)));
  white->SetKeys({{0.0f, 255.0f}, {1.0f, 255.0f}});
  auto* fade = static_cast<Tev_EnvelopeStorage*>(keep(Create<Qen_Channel>(loader, kEnvelopeStorageGuid)));
  fade->SetKeys({{0.0f, 255.0f}, {1.0f, 0.0f}});

  auto value = [&](float v) { return keep(new Qen_ValueChannel(v)); };
  auto vector = [&](D3DXVECTOR3 v) { return keep(new Qen_ValueVectorChannel(v)); };
  Link(*emitter, kLinkEmitter, disc);
  Link(*emitter, kLinkEmitterActive, value(1.0f));
  Link(*emitter, kLinkParticleCount, value(2000.0f));
  Link(*emitter, kLinkLogicUpdatesPerSecond, value(60.0f));
  Link(*emitter, kLinkBirthsPerSecond, value(600.0f));
  Link(*emitter, kLinkLifespanMin, value(1.5f));
  Link(*emitter, kLinkLifespanMax, value(2.5f));
  Link(*emitter, kLinkInitialForceOverride, vector({0.0f, 0.12f, 0.02f}));
  Link(*emitter, kLinkGlobalForce, vector({0.0f, -0.004f, 0.0f}));
  Link(*emitter, kLinkLookAt, vector({0.0f, 0.0f, -10.0f}));
  Link(*emitter, kLinkSizeEnvelope, size);
  Link(*emitter, kLinkVertexAlphaEnvelope, fade);
  Link(*emitter, kLinkRedColorEnvelope, white);
  Link(*emitter, kLinkGreenColorEnvelope, white);
  Link(*emitter, kLinkBlueColorEnvelope, white);
  Link(*emitter, kLinkMultiCollisionManager, floor);
  Link(*emitter, kLinkBounceRate, value(1.0f));

  for (int frame = 0; frame <= kFrames; ++frame) {
    device->ClearCalls();
    emitter->CallChannel();
    int live = 0;
    for (const Particle& p : emitter->Particles) live += p.Active;
    int draws = 0;
    for (const DeviceCall& call : device->Calls())
      draws += call.Name == "DrawIndexedPrimitive" || call.Name == "DrawPrimitive";
    if (frame % 20 == 0)
      std::printf("frame %3d: %4d live particles, %d draw call(s), %zu device calls\n", frame,
                  live, draws, device->Calls().size());
    context.AdvanceFrame();
    clock.AdvanceMs(kFrameMs);
  }
  std::printf("ape-demo: %d frames done, %d message(s)\n", kFrames, messages);
  owned.clear();
  return 0;
}
