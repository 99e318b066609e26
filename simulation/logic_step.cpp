// One logic step over the pool, with what the step takes from the links once at its start.
#include "simulation/logic_step.h"

#include "host/attractor.h"
#include "host/smoke_settings.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_table.h"
#include "simulation/envelope_sampling.h"

namespace {

// The attractors' fields as every update of the step would read them; left to the updates when
// the link reading stage could not reserve room for them (the step allocates nothing).
void TakeAttractors(Tev_AdvancedParticleEmitter& e) {
  sim::LogicStepState& step = e.Step;
  step.Attractors.clear();
  const int count = e.GetChildLinkPositionCount(kLinkAttractors);
  step.AttractorsTaken = static_cast<std::size_t>(count) <= step.Attractors.capacity();
  if (!step.AttractorsTaken) return;
  for (int a = 0; a < count; ++a) {
    auto* attractor =
        static_cast<Tev_AdvPE_Attractor*>(e.GetChildFromLinkPosition(kLinkAttractors, a));
    if (attractor) step.Attractors.push_back(attractor->TakeField());
  }
}

void PrepareSmokePairs(Tev_AdvancedParticleEmitter& e) {
  if (!e.SmokeEnabled) return;
  const sim::PairEnvelopes envelopes(*e.Frame.SmokeSettings);
  if (envelopes.Any()) e.Step.SmokePairs.Build(e.Particles, e.ParticleCount, envelopes);
}

// Drops the step's state however the step ends.
class StepScope {
 public:
  explicit StepScope(Tev_AdvancedParticleEmitter& e) : e_(e) {
    e.Step.Envelopes = sim::TakeMainEnvelopeViews(e);
    e.Step.EnvelopesTaken = true;
    TakeAttractors(e);
    PrepareSmokePairs(e);
  }
  ~StepScope() {
    // A step that ended before its pass over the pool still ages every record in its frame.
    if (e_.Step.AgeingPending) {
      e_.Step.AgeingPending = false;
      for (int i = 0; i < e_.ParticleCount; ++i) e_.Particles[i].Age += e_.Step.AgeSeconds;
    }
    e_.Step.EnvelopesTaken = false;
    e_.Step.AttractorsTaken = false;
    e_.Step.SmokePairs.Clear();
  }
  StepScope(const StepScope&) = delete;
  StepScope& operator=(const StepScope&) = delete;

 private:
  Tev_AdvancedParticleEmitter& e_;
};

}  // namespace

void Tev_AdvancedParticleEmitter::RunLogicStep() {
  const StepScope scope(*this);
  UpdateParticles();
}
