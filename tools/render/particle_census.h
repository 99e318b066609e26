// Counts of an emitter's particles, taken from its pool before and after a frame. The emitter
// does not count its own births or logic steps, so they are worked out here:
//  - births: slots that hold a new particle after the frame (free before, or restarted while not
//    newly attached); a particle born and dead within one frame is not seen;
//  - logic steps: the banked logic time spent this frame divided by the logic interval.
#pragma once

#include <cstdint>
#include <vector>

class Tev_AdvancedParticleEmitter;

namespace aperender {

struct ParticleCounts {
  int Live = 0;
  int Attached = 0;
  int Sliding = 0;
  int Births = 0;
  int LogicSteps = 0;
};

class ParticleCensus {
 public:
  // Remembers the pool and the logic bank before the frame.
  void Before(const Tev_AdvancedParticleEmitter& emitter);
  // Counts after a frame of `frame_ms` of (unscaled) time.
  ParticleCounts After(const Tev_AdvancedParticleEmitter& emitter, double frame_ms) const;

 private:
  struct Slot {
    bool Active;
    bool Attached;
    float Age;
  };
  std::vector<Slot> slots_;
  float logic_accumulator_ms_ = 0.0f;
};

}  // namespace aperender
