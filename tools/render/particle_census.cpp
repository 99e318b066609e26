#include "tools/render/particle_census.h"

#include <cmath>

#include "plugin/advanced_particle_emitter.h"

namespace aperender {

void ParticleCensus::Before(const Tev_AdvancedParticleEmitter& emitter) {
  slots_.resize(emitter.Particles.size());
  for (std::size_t i = 0; i < slots_.size(); ++i) {
    const Particle& p = emitter.Particles[i];
    slots_[i] = {p.Active, p.Attached, p.Age};
  }
  logic_accumulator_ms_ = emitter.LogicAccumulator;
}

ParticleCounts ParticleCensus::After(const Tev_AdvancedParticleEmitter& emitter,
                                     double frame_ms) const {
  ParticleCounts counts;
  // A rebuilt pool (new size) has no "before" to compare with.
  const bool same_pool = slots_.size() == emitter.Particles.size();
  for (std::size_t i = 0; i < emitter.Particles.size(); ++i) {
    const Particle& p = emitter.Particles[i];
    if (!p.Active) continue;
    ++counts.Live;
    counts.Attached += p.Attached;
    counts.Sliding += p.Sliding;
    if (!same_pool) continue;
    const Slot& before = slots_[i];
    const bool newly_attached = p.Attached && !before.Attached;
    if (!before.Active || (p.Age < before.Age && !newly_attached)) ++counts.Births;
  }
  const double interval = emitter.LogicInterval;
  if (std::isfinite(interval) && interval > 0.0) {
    const double spent =
        logic_accumulator_ms_ + (emitter.Paused ? 0.0 : frame_ms) - emitter.LogicAccumulator;
    const double steps = std::round(spent / interval);
    counts.LogicSteps = steps > 0.0 && steps < 1e6 ? static_cast<int>(steps) : 0;
  }
  return counts;
}

}  // namespace aperender
