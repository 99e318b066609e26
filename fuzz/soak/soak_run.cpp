#include "fuzz/soak/soak_run.h"

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <vector>

#include "fuzz/invariants.h"
#include "fuzz/soak/memory_use.h"
#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/plugin_loader.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"
#include "tools/scene/scene_loader.h"

namespace apefuzz {

namespace {

// The heap is sampled this often (frames), and counted as settled after this share of the run.
constexpr int kSampleEvery = 100;
constexpr int kWarmUpDivisor = 10;
constexpr int kMinimumWarmUpFrames = 300;

std::vector<Tev_AdvancedParticleEmitter*> EmittersOf(const apescene::Scene& scene) {
  std::vector<Tev_AdvancedParticleEmitter*> emitters;
  for (const auto& channel : scene.Channels)
    if (auto* emitter = dynamic_cast<Tev_AdvancedParticleEmitter*>(channel.get()))
      emitters.push_back(emitter);
  return emitters;
}

std::string RunFrames(apescene::Scene& scene, Qen_HostContext& context, TestClock& clock,
                      MemoryDevice& device, const MessageWatch& messages, int frames,
                      SoakResult& result) {
  const std::vector<Tev_AdvancedParticleEmitter*> emitters = EmittersOf(scene);
  result.Emitters = static_cast<int>(emitters.size());
  const int warm_up = std::min(frames, std::max(kMinimumWarmUpFrames, frames / kWarmUpDivisor));
  const double fps = scene.Settings.Fps;
  const std::int64_t start = clock.Now();
  std::srand(scene.Settings.Seed);
  scene.Animate(0.0);
  for (const auto& channel : scene.Channels) channel->CallChannel();

  for (int frame = 1; frame <= frames; ++frame) {
    // Whole ticks from the start, so that rounding never accumulates.
    const auto target = start + static_cast<std::int64_t>(
                                    frame * static_cast<double>(TestClock::kTicksPerSecond) / fps);
    clock.Advance(target - clock.Now());
    context.AdvanceFrame();
    // Animations loop over the scene's length, as a host replays an effect.
    const double seconds = frame / fps;
    const double length = scene.Settings.FrameCount() / fps;
    scene.Animate(seconds - length * static_cast<int>(seconds / length));
    for (const auto& channel : scene.Channels) channel->CallChannel();
    // The reference device logs every call; a long run keeps none of them.
    device.ClearCalls();

    for (Tev_AdvancedParticleEmitter* emitter : emitters) {
      std::string fault = CheckEmitter(*emitter);
      if (!fault.empty()) return "frame " + std::to_string(frame) + ": " + fault;
    }
    if (!messages.Fault().empty())
      return "frame " + std::to_string(frame) + ": " + messages.Fault();
    result.Frames = frame;
    if (frame % kSampleEvery == 0 || frame == warm_up || frame == frames) {
      const std::size_t heap = LiveHeapBytes();
      result.HeapPeak = std::max(result.HeapPeak, heap);
      if (frame == warm_up) result.HeapAfterWarmUp = heap;
      if (frame == frames) result.HeapAtEnd = heap;
    }
  }
  if (result.HeapAtEnd > result.HeapAfterWarmUp + kAllowedHeapGrowth)
    return "the live heap grew from " + std::to_string(result.HeapAfterWarmUp) + " to " +
           std::to_string(result.HeapAtEnd) + " bytes";
  return "";
}

}  // namespace

SoakResult SoakScene(const std::string& path, int frames) {
  static PluginLoader loader;
  SoakResult result;
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  TestClock clock;
  MemoryDevice* device = MemoryDevice::Create();
  {
    MessageWatch messages(context);
    Tev_DX8_DeviceChannel device_channel(device);
    std::string error;
    std::unique_ptr<apescene::Scene> scene = apescene::LoadSceneFile(path, loader, &error);
    if (scene == nullptr)
      result.Fault = error;
    else
      result.Fault = RunFrames(*scene, context, clock, *device, messages, frames, result);
    result.Messages = messages.Count();
  }
  if (result.Fault.empty() && device->LiveObjectCount() != 0)
    result.Fault = std::to_string(device->LiveObjectCount()) + " device objects outlive the scene";
  device->Release();
  return result;
}

}  // namespace apefuzz
