// A host with one emitter on the reference device, the channels linked to it owned here, and the
// particle layouts the benchmarks start from. Every layout is drawn from a fixed seed.
#pragma once

#include <memory>
#include <vector>

#include "host/device_channel.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "platform/memory_device.h"
#include "plugin/advanced_particle_emitter.h"

namespace bench {

class Scene {
 public:
  // A pool of `count` records drawn as point sprites or as quads; running, with no births.
  explicit Scene(int count, bool pointSprites = true);
  ~Scene();
  Scene(const Scene&) = delete;
  Scene& operator=(const Scene&) = delete;

  Tev_AdvancedParticleEmitter& Emitter() { return *emitter_; }
  MemoryDevice& Device() { return *device_; }

  template <typename T>
  T* Own(std::unique_ptr<T> channel) {
    T* raw = channel.get();
    owned_.push_back(std::move(channel));
    return raw;
  }
  void Value(int link, float value);
  void Vector(int link, D3DXVECTOR3 value);
  // Keys at 0, 0.5 and 1 from `start` through their mean to `end`; linked unless `link` is -1.
  Tev_EnvelopeStorage* Envelope(int link, float start, float end);
  // Gravity and the five main envelopes: the basic effect.
  void LinkBasicEffect();
  // A flat two-triangle emitter `size` across at height `height`, emitting from its triangles.
  void LinkEmitterSquare(float size, float height);

  // Initializes, then runs one working frame of no time, which reads every link.
  void Start();
  // One host frame of `ms` real milliseconds; the device's call log is emptied now and then.
  void RunFrame(double ms);

  // Every record alive at an assorted point of its life (the ages stay put: logic steps do not
  // age), spread uniformly over a cube `size` across whose lowest corner is `low`.
  void FillCloud(D3DXVECTOR3 low, float size, D3DXVECTOR3 velocity);

 private:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  TestClock clock_;
  MemoryDevice* device_;
  Tev_DX8_DeviceChannel deviceChannel_;
  std::vector<std::unique_ptr<Qen_Channel>> owned_;
  std::unique_ptr<Tev_AdvancedParticleEmitter> emitter_;
  int frames_ = 0;
};

// A float in [low, high) from the C library's generator (seeded by the caller).
float RandomBetween(float low, float high);

}  // namespace bench
