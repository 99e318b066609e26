// CallChannel: once per host frame, read the links, measure real time, give birth at the birth
// rate, run the fixed-rate logic steps, blend for drawing, rebuild the vertex data and draw.
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <limits>

#include "host/host_context.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"
#include "simulation/blend_factor.h"

namespace {

struct ElapsedTime {
  float Seconds;
  float Ms;
};

// The real time since the last working frame; none while paused, but the baseline moves on so
// that the paused time is never made up afterwards.
ElapsedTime MeasureElapsed(Tev_AdvancedParticleEmitter& e) {
  LARGE_INTEGER now{};
  QueryPerformanceCounter(&now);
  ElapsedTime elapsed{0.0f, 0.0f};
  if (!e.Paused) {
    // The signed difference, wrapping instead of overflowing for a counter at its range's end.
    const auto ticks =
        static_cast<std::int64_t>(static_cast<std::uint64_t>(now.QuadPart) -
                                  static_cast<std::uint64_t>(e.LastCounter.QuadPart));
    elapsed.Seconds = static_cast<float>(ticks) / e.CounterFrequency;
    elapsed.Ms = elapsed.Seconds * 1000.0f;
  }
  QueryPerformanceCounter(&e.LastCounter);
  return elapsed;
}

void AdvanceActiveTimer(Tev_AdvancedParticleEmitter& e, float seconds) {
  if (!e.ActiveTimerOn) return;
  e.ActiveTimerElapsed += seconds;
  if (e.ActiveTimerElapsed > e.ActiveTimerDuration) e.ActiveTimerOn = false;
}

// Marks a frame's births for BirthParticle, however they end.
class BirthRunScope {
 public:
  explicit BirthRunScope(Tev_AdvancedParticleEmitter& e) : e_(e) { e.BirthRun = {true, 0, -1}; }
  ~BirthRunScope() { e_.BirthRun.Running = false; }
  BirthRunScope(const BirthRunScope&) = delete;
  BirthRunScope& operator=(const BirthRunScope&) = delete;

 private:
  Tev_AdvancedParticleEmitter& e_;
};

void RunBirths(Tev_AdvancedParticleEmitter& e, float ms) {
  // Not above 0 (NaN included): no births, and the bank neither grows nor resets.
  if (!(e.BirthsPerSecond > 0.0f)) return;
  e.BirthInterval = 1000.0f / e.BirthsPerSecond;
  const bool active = IsYes(ValueLink(e, kLinkEmitterActive)->GetValue());
  if (!active && !e.ActiveTimerOn) return;
  e.BirthAccumulator += ms;
  const BirthRunScope run(e);
  int births = 0;
  while (e.BirthAccumulator > e.BirthInterval) {
    e.BirthAccumulator -= e.BirthInterval;
    e.BirthParticle(births);
    ++births;
    if (births > Tev_AdvancedParticleEmitter::kMaximumBirthsPerFrame) {
      e.ShowOverload("APE: Too many particles created per frame");
      e.BirthAccumulator = 0.0f;
      break;
    }
  }
}

void ReadLogicRate(Tev_AdvancedParticleEmitter& e) {
  const float rate = ValueLink(e, kLinkLogicUpdatesPerSecond)->GetValue();
  if (rate == e.LogicUpdatesPerSecond) return;
  e.LogicUpdatesPerSecond = rate;
  e.LogicInterval =
      sim::LogicRateUsable(rate) ? 1000.0f / rate : std::numeric_limits<float>::infinity();
}

// Whether the banked time runs a logic step now.
bool LogicStepDue(const Tev_AdvancedParticleEmitter& e) {
  return sim::LogicRateUsable(e.LogicUpdatesPerSecond) && e.LogicAccumulator > e.LogicInterval;
}

void RunLogicSteps(Tev_AdvancedParticleEmitter& e) {
  int steps = 0;
  while (LogicStepDue(e)) {
    e.VerticesDirty = false;
    e.LogicAccumulator -= e.LogicInterval;
    ++steps;
    if (steps > Tev_AdvancedParticleEmitter::kMaximumLogicStepsPerFrame) {
      e.ShowOverload("APE: Too many logic updates per frame");
      e.LogicAccumulator = 0.0f;
      break;
    }
    e.RunLogicStep();
  }
}

bool SimulationLinksPresent(const Tev_AdvancedParticleEmitter& e) {
  return e.GetChild(kLinkEmitterActive) && e.GetChild(kLinkLogicUpdatesPerSecond) &&
         e.GetChild(kLinkBirthsPerSecond);
}

// Returns whether the point-sprite vertices were built, with the interpolation.
bool Simulate(Tev_AdvancedParticleEmitter& e) {
  e.BirthsPerSecond = ValueLink(e, kLinkBirthsPerSecond)->GetValue() * e.SimulationScaler;
  const ElapsedTime elapsed = MeasureElapsed(e);
  AdvanceActiveTimer(e, elapsed.Seconds);
  RunBirths(e, elapsed.Ms);

  ReadLogicRate(e);
  e.LogicAccumulator += elapsed.Ms;
  // Ageing is per frame in real seconds, for every record, before any update of the frame. When a
  // logic step runs, its pass over the pool ages each record just before its first update.
  if (LogicStepDue(e)) {
    e.Step.AgeingPending = true;
    e.Step.AgeSeconds = elapsed.Seconds;
  } else {
    for (int i = 0; i < e.ParticleCount; ++i) e.Particles[i].Age += elapsed.Seconds;
  }
  RunLogicSteps(e);

  // Vertices about to be rebuilt from the drawn state are built in the interpolation's pass.
  if (e.VerticesDirty && e.HardwareParticles) {
    e.InterpolateParticlesAndPointSprites(sim::BlendFactor(e));
    return true;
  }
  e.InterpolateParticles(sim::BlendFactor(e));
  return false;
}

void RebuildVerticesAndDraw(Tev_AdvancedParticleEmitter& e, bool pointSpritesBuilt) {
  if (e.VerticesDirty) {
    if (e.HardwareParticles) {
      if (pointSpritesBuilt)
        e.CopyPointSpritesToBuffer();
      else
        e.UpdatePointSpriteVertexBuffer();
    } else {
      e.UpdateLocalVertexBuffer();
      e.WriteLocalVertexBufferToBaseClass();
    }
  }
  if (e.HardwareParticles)
    e.RenderPointSprites();
  else
    e.RenderSprites();
}

}  // namespace

namespace sim {

// Any other rate (0, negative, NaN or infinite) has an infinite interval: an infinite rate would
// otherwise give an interval of 0, a capped frame every frame and a blend of 0 / 0.
bool LogicRateUsable(float logicUpdatesPerSecond) {
  return std::isfinite(logicUpdatesPerSecond) && logicUpdatesPerSecond > 0.0f;
}

// Never below 0 either: only a clock that ran backwards banks negative time, and the drawing must
// not run ahead of the steps.
float BlendFactor(const Tev_AdvancedParticleEmitter& e) {
  if (!LogicRateUsable(e.LogicUpdatesPerSecond)) return 0.0f;
  const float t = e.LogicAccumulator / e.LogicInterval;
  if (!(t > 0.0f)) return 0.0f;
  return t > 1.0f ? 1.0f : t;
}

}  // namespace sim

void Tev_AdvancedParticleEmitter::CallChannel() {
  // A channel whose host context is gone has no frame counter and no host to draw for.
  if (HostContext == nullptr) return;
  try {
    // Created before the host's device channel: take it now, before anything builds or draws.
    if (DeviceChannel == nullptr) DeviceChannel = FindDeviceChannel();
    if (!Initialized) {
      Initialize();
      return;
    }
    NewFrame = HostContext->GetFrameCounter() != LastFrameCounter;
    LastFrameCounter = HostContext->GetFrameCounter();
    if (!NewFrame) return;

    ReadLinks();
    const bool pointSpritesBuilt = SimulationLinksPresent(*this) && Simulate(*this);
    RebuildVerticesAndDraw(*this, pointSpritesBuilt);
  } catch (...) {
    // Nothing may escape into the host; the next frame starts afresh.
    ShowDebug("APE: frame update failed");
  }
}

void Tev_AdvancedParticleEmitter::EnableActiveTimer(float seconds) {
  ActiveTimerOn = true;
  ActiveTimerDuration = seconds;
  ActiveTimerElapsed = 0.0f;
}

int Tev_AdvancedParticleEmitter::RandInt(int low, int high) {
  // The range in 64 bits: high - low may not fit an int.
  const std::int64_t range = static_cast<std::int64_t>(high) - low;
  if (range <= 1) return low;
  return static_cast<int>(std::rand() % range + low);
}
