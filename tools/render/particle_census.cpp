#include "tools/render/particle_census.h"

#include <algorithm>

#include "host/link_channels.h"
#include "host/object_data_channel.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"

namespace aperender {
namespace {

using Emitter = Tev_AdvancedParticleEmitter;

// The elapsed time the emitter measured this frame, in its own float arithmetic.
float ElapsedMs(const Emitter& e, std::int64_t counter_before) {
  if (e.Paused) return 0.0f;
  const auto ticks = static_cast<std::int64_t>(static_cast<std::uint64_t>(e.LastCounter.QuadPart) -
                                               static_cast<std::uint64_t>(counter_before));
  const float seconds = static_cast<float>(ticks) / e.CounterFrequency;
  return seconds * 1000.0f;
}

bool Simulates(const Emitter& e) {
  return e.GetChild(kLinkEmitterActive) && e.GetChild(kLinkLogicUpdatesPerSecond) &&
         e.GetChild(kLinkBirthsPerSecond);
}

// Whether the "Emitter" mesh can give a birth point at all.
bool HasBirthPoints(const Emitter& e) {
  auto* mesh = LinkAs<Tev_DX8_ObjectDataChannel>(e, kLinkEmitter);
  if (mesh == nullptr) return false;
  return e.VertexEmissions ? mesh->GetVertexCount() > 0 : mesh->GetIndexCount() >= 3;
}

}  // namespace

int CountBankLoop(float bank_ms, float interval_ms, int cap, float* left) {
  int n = 0;
  while (bank_ms > interval_ms) {
    bank_ms -= interval_ms;
    if (++n > cap) {
      bank_ms = 0.0f;
      break;
    }
  }
  *left = bank_ms;
  return n;
}

void ParticleCensus::Before(const Emitter& emitter) {
  initialized_ = emitter.Initialized;
  live_ = free_ = 0;
  any_free_flying_ = false;
  for (const Particle& p : emitter.Particles) {
    live_ += p.Active;
    free_ += !p.Active;
    any_free_flying_ = any_free_flying_ || (p.Active && !p.Attached);
  }
  birth_bank_ms_ = emitter.BirthAccumulator;
  logic_bank_ms_ = emitter.LogicAccumulator;
  counter_ = emitter.LastCounter.QuadPart;
}

ParticleCounts ParticleCensus::After(const Emitter& emitter) const {
  ParticleCounts counts;
  for (const Particle& p : emitter.Particles) {
    if (!p.Active) continue;
    ++counts.Live;
    counts.Attached += p.Attached;
    counts.Sliding += p.Sliding;
  }
  if (initialized_ && Simulates(emitter)) {
    const float ms = ElapsedMs(emitter, counter_);
    const bool active =
        IsYes(ValueLink(emitter, kLinkEmitterActive)->GetValue()) || emitter.ActiveTimerOn;
    if (emitter.BirthsPerSecond > 0.0f && active) {
      float left = 0.0f;
      const int asked = CountBankLoop(birth_bank_ms_ + ms, emitter.BirthInterval,
                                      Emitter::kMaximumBirthsPerFrame, &left);
      int born = 0;
      if (left == emitter.BirthAccumulator && HasBirthPoints(emitter) &&
          emitter.ParticleCount > 0) {
        // Past the free records a replacing birth takes a free-flying record, if there is one.
        const bool replaces = emitter.ReplaceOldParticles && (free_ > 0 || any_free_flying_);
        born = replaces ? asked : std::min(asked, free_);
      } else if (left != emitter.BirthAccumulator) {
        born = std::max(0, counts.Live - live_);
      }
      counts.Births = born;
    }
    if (emitter.LogicUpdatesPerSecond > 0.0f) {
      float left = 0.0f;
      counts.LogicSteps = std::min(CountBankLoop(logic_bank_ms_ + ms, emitter.LogicInterval,
                                                 Emitter::kMaximumLogicStepsPerFrame, &left),
                                   Emitter::kMaximumLogicStepsPerFrame);
    }
  }
  counts.Deaths = std::max(0, live_ + counts.Births - counts.Live);
  return counts;
}

}  // namespace aperender
