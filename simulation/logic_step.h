// What a logic step takes from the links once, at its start, instead of in every particle's
// update: the main envelopes' sampling views, the attractors' fields and the smoke pair grid.
// Nothing in the emitter changes a link during a step, so every update sees exactly what it would
// have fetched itself.
#pragma once

#include <vector>

#include "host/attractor.h"
#include "host/envelope_sampler.h"
#include "simulation/smoke_pairs.h"

namespace sim {

// The five main envelopes as sampling views.
struct MainEnvelopeViews {
  EnvelopeSampler Size;
  EnvelopeSampler Alpha;
  EnvelopeSampler Red;
  EnvelopeSampler Green;
  EnvelopeSampler Blue;
  // Red, green and blue each find their segment as the colour before them does (their key x's
  // are the same), so one lookup serves them.
  bool RedSharesAlpha = false;
  bool GreenSharesRed = false;
  bool BlueSharesGreen = false;
};

struct LogicStepState {
  // Valid while EnvelopesTaken; an update outside a step takes its own.
  MainEnvelopeViews Envelopes;
  bool EnvelopesTaken = false;
  // The fields of the non-null channels of "Attractors", in link order; valid while
  // AttractorsTaken.
  std::vector<Tev_AdvPE_Attractor::Field> Attractors;
  bool AttractorsTaken = false;
  // The frame's ageing, left by the frame driver to the next logic step: it adds AgeSeconds to
  // each record's age as it reaches the record, sparing the frame a pass over the pool.
  bool AgeingPending = false;
  float AgeSeconds = 0.0f;
  // Smoke pair forces of the step; prepared only while smoke pair envelopes are linked.
  SmokePairGrid SmokePairs;
};

}  // namespace sim
