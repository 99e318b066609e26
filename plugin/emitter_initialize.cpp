// Initialize: (re)builds the pool, the clock, the drawing buffers of the chosen path, the
// collision objects and the composite texture from the links that shape them.
#include <string>

#include "host/multi_collision_manager.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"
#include "simulation/particle_pool.h"

namespace {

// Pool size from "ParticleCount": 0 without the link.
void SizePool(Tev_AdvancedParticleEmitter& emitter) {
  std::int32_t count = 0;
  if (Qen_ValueChannel* link = ValueLink(emitter, kLinkParticleCount)) {
    const sim::PoolRequest request = sim::PoolSizeFor(link->GetValue());
    count = request.Count;
    if (request.Capped) {
      const std::string text = "APE: ParticleCount capped at " +
                               std::to_string(Tev_AdvancedParticleEmitter::kMaximumParticleCount);
      emitter.ShowDebug(text.c_str());
    }
  }
  emitter.RequestedParticleCount = count;
  if (!sim::BuildPool(emitter.Particles, count)) {
    const std::string text =
        "APE: not enough memory for " + std::to_string(count) + " particles; the pool is empty";
    emitter.ShowDebug(text.c_str());
    count = 0;
  }
  emitter.ParticleCount = count;
}

void BuildDrawingBuffers(Tev_AdvancedParticleEmitter& emitter) {
  if (emitter.HardwareParticles) {
    emitter.InitializePointSpriteVertexBuffer();
    emitter.UpdatePointSpriteVertexBuffer();
  } else {
    emitter.InitializeLocalVertexBuffer();
    emitter.UpdateLocalVertexBuffer();
    emitter.InitializeBaseClassBuffers();
  }
}

}  // namespace

void Tev_AdvancedParticleEmitter::Initialize() {
  ReleaseDrawingResources();
  Particles.clear();

  Paused = false;
  ActiveTimerOn = false;
  PlacedBySmokeCollision = false;
  VerticesDirty = true;
  BirthAccumulator = 0.0f;
  SizeOffsetMax = 0.0f;
  SpinStart = 0.0f;
  AttachedSlidingHeight = 0.0f;

  // The first working frame measures its elapsed time from here.
  LARGE_INTEGER frequency{};
  QueryPerformanceFrequency(&frequency);
  CounterFrequency = static_cast<float>(frequency.QuadPart);
  QueryPerformanceCounter(&LastCounter);

  SizePool(*this);

  Qen_ValueChannel* hardware = ValueLink(*this, kLinkHardwareParticles);
  HardwareParticles = hardware && IsYes(hardware->GetValue());

  try {
    BuildDrawingBuffers(*this);
  } catch (...) {
    // Buffers for a pool this size cannot be had: go on with an empty pool rather than fail.
    ShowDebug("APE: could not build the drawing buffers; the pool is empty");
    ReleaseDrawingResources();
    sim::BuildPool(Particles, 0);
    ParticleCount = 0;
    BuildDrawingBuffers(*this);
  }

  if (auto* manager = LinkAs<Tev_MultiCollisionManager>(*this, kLinkMultiCollisionManager))
    manager->RebuildAllCollisionObjects();

  HasCompositeTexture = false;
  if (GetChild(kLinkParticleTexture) && GetChild(kLinkAttachedTexture)) {
    HasCompositeTexture = true;
    BuildCompositeTexture();
  }

  Initialized = true;
}
