#include "fuzz/scene_input.h"

#include <cmath>
#include <cstdlib>
#include <exception>
#include <memory>

#include "fuzz/invariants.h"
#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/plugin_loader.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"
#include "tools/scene/scene_loader.h"

namespace apefuzz {

namespace {

constexpr int kFramesRun = 3;
// Pools above this are folded below it before the frames run, so that one input stays fast.
constexpr float kPoolLimit = 256.0f;

// Loaded once: plug-in libraries stay loaded for the process, as a host keeps them.
PluginLoader& Loader() {
  static PluginLoader loader;
  return loader;
}

std::string CheckRefusal(const std::string& error) {
  const std::string prefix = std::string(kSceneDisplayName) + ":";
  if (error.compare(0, prefix.size(), prefix) != 0)
    return "a refusal that does not name the file: \"" + error + "\"";
  if (error.find('\n') != std::string::npos)
    return "a refusal of more than one line: \"" + error + "\"";
  if (error.size() <= prefix.size() + 1) return "a refusal that says nothing: \"" + error + "\"";
  return "";
}

void TamePool(Tev_AdvancedParticleEmitter& emitter) {
  auto* count = dynamic_cast<Qen_ValueChannel*>(emitter.GetChild(kLinkParticleCount));
  if (count == nullptr) return;
  const float value = count->GetValue();
  if (value > kPoolLimit)
    count->SetValue(std::isfinite(value) ? std::fmod(value, kPoolLimit) : kPoolLimit);
}

std::string RunFrames(apescene::Scene& scene, Qen_HostContext& context, TestClock& clock) {
  std::srand(scene.Settings.Seed);
  for (int frame = 0; frame < kFramesRun; ++frame) {
    clock.AdvanceSeconds(1.0 / scene.Settings.Fps);
    context.AdvanceFrame();
    scene.Animate(frame / scene.Settings.Fps);
    for (const auto& channel : scene.Channels) {
      auto* emitter = dynamic_cast<Tev_AdvancedParticleEmitter*>(channel.get());
      if (emitter != nullptr) TamePool(*emitter);
      channel->CallChannel();
      if (emitter == nullptr) continue;
      std::string fault = CheckEmitter(*emitter);
      if (!fault.empty()) return fault;
    }
  }
  return "";
}

std::string LoadAndRun(const apescene::SceneSource& source, Qen_HostContext& context,
                       TestClock& clock, SceneOutcome& outcome) {
  std::string error;
  std::unique_ptr<apescene::Scene> scene;
  try {
    scene = apescene::LoadScene(source, Loader(), &error);
  } catch (const std::exception& e) {
    return std::string("an exception escaped the loader: ") + e.what();
  } catch (...) {
    return "an exception of unknown type escaped the loader";
  }
  if (scene == nullptr) {
    outcome.Refusal = error;
    return CheckRefusal(error);
  }
  outcome.Loaded = true;
  try {
    return RunFrames(*scene, context, clock);
  } catch (const std::exception& e) {
    return std::string("an exception escaped a frame: ") + e.what();
  } catch (...) {
    return "an exception of unknown type escaped a frame";
  }
}

}  // namespace

SceneOutcome RunSceneInput(const std::uint8_t* data, std::size_t size,
                           const std::string& base_directory) {
  apescene::SceneSource source;
  source.Text.assign(reinterpret_cast<const char*>(data), size);
  source.DisplayName = kSceneDisplayName;
  source.BaseDirectory = base_directory;

  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  TestClock clock;
  MemoryDevice* device = MemoryDevice::Create();
  SceneOutcome outcome;
  std::string& fault = outcome.Fault;
  {
    MessageWatch messages(context);
    Tev_DX8_DeviceChannel device_channel(device);
    fault = LoadAndRun(source, context, clock, outcome);
    if (fault.empty()) fault = messages.Fault();
  }
  if (fault.empty() && device->LiveObjectCount() != 0)
    fault = std::to_string(device->LiveObjectCount()) + " device objects outlive the scene";
  device->Release();
  return outcome;
}

}  // namespace apefuzz
