// Counts of an emitter's particles in a frame: how many live after it, and how many were born,
// how many ended and how many logic steps ran in it, all exact.
//
// The emitter keeps no counts of its own, and the tools do not change it, so the census works
// them out from what the emitter exposes before and after its frame:
//  - births: the frame driver's birth loop is replayed on the emitter's own float values (the
//    banked birth time before the frame, the elapsed time its performance counter measured, the
//    birth interval and the "Emitter_Active?" gate), which gives the births it asked for; of
//    those, the ones that found a record and a point happened: all, or with a full pool and no
//    "ReplaceOldParticles?", as many as there were free records before the frame (deaths come
//    only after the births). A replay that does not end on the emitter's own banked time falls
//    back to the free records that were taken.
//  - deaths (particles that ended: their life or attached life ran out, a collision killed
//    them, a birth replaced them or the pool was rebuilt): the live count before, plus the
//    births, minus the live count after. A particle born and killed within one frame is
//    counted both times.
//  - logic steps: the logic loop replayed the same way.
#pragma once

#include <cstdint>

class Tev_AdvancedParticleEmitter;

namespace aperender {

struct ParticleCounts {
  int Live = 0;
  int Attached = 0;
  int Sliding = 0;
  int Births = 0;
  int Deaths = 0;
  int LogicSteps = 0;
};

class ParticleCensus {
 public:
  // Remembers what the frame starts from.
  void Before(const Tev_AdvancedParticleEmitter& emitter);
  // The counts after the frame.
  ParticleCounts After(const Tev_AdvancedParticleEmitter& emitter) const;

 private:
  bool initialized_ = false;  // false: the frame only (re)builds the emitter
  int live_ = 0;
  int free_ = 0;
  bool any_free_flying_ = false;  // a live record a replacing birth may take
  float birth_bank_ms_ = 0.0f;
  float logic_bank_ms_ = 0.0f;
  std::int64_t counter_ = 0;
};

// How many times the frame driver's loop `while (bank > interval) { bank -= interval; ...;
// if (++n > cap) { bank = 0; break; } }` goes round, in float as the driver computes it; the
// bank it leaves in *left.
int CountBankLoop(float bank_ms, float interval_ms, int cap, float* left);

}  // namespace aperender
