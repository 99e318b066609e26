// The basic logic step as this machine's floor: the reference loop's records and stages, with
// every curve sampled inline and without branches from slopes prepared once (three or four keys,
// float arithmetic). Nothing the emitter must honour beyond that (key modes, other stages, the
// rules for unusual keys) costs it anything, so no general step can be expected to beat it.
#pragma once

#include <vector>

#include "host/envelope_storage.h"
#include "simulation/particle.h"

namespace bench {

// A linear curve of at most four keys: the span is found by counting the key x's at or below x
// (unused slots hold +inf and are never counted below it), its start and slope come from tables.
class FloorEnvelope {
 public:
  static constexpr int kSlots = 4;
  explicit FloorEnvelope(const Tev_EnvelopeStorage& envelope);
  float At(float x) const {
    // Held to the key range; NaN to the first key.
    const float held = x > first_ ? (x < last_ ? x : last_) : first_;
    int k = 0;
    for (int i = 1; i < kSlots; ++i) k += held >= x_[i];
    return y_[k] + (held - x_[k]) * slope_[k];
  }

 private:
  float x_[kSlots];
  float y_[kSlots];
  float slope_[kSlots];
  float first_ = 0.0f;
  float last_ = 0.0f;
};

struct FloorEffect {
  D3DXVECTOR3 GlobalForce;
  float SimulationScaler;
  D3DXVECTOR3 LookAt;
  FloorEnvelope Size, Alpha, Red, Green, Blue;
};

void FloorStep(std::vector<Particle>& pool, const FloorEffect& effect);

}  // namespace bench
