// What a logic step takes from the links once, at its start, instead of in every particle's
// update: the attractor list and the smoke pair grid. Nothing in the emitter changes a link
// during a step, so every update sees exactly what it would have fetched itself.
#pragma once

#include <vector>

#include "simulation/smoke_pairs.h"

class Tev_AdvPE_Attractor;

namespace sim {

struct LogicStepState {
  // The non-null channels of "Attractors", in link order; valid while AttractorsTaken.
  std::vector<Tev_AdvPE_Attractor*> Attractors;
  bool AttractorsTaken = false;
  // Smoke pair forces of the step; prepared only while smoke pair envelopes are linked.
  SmokePairGrid SmokePairs;
};

}  // namespace sim
