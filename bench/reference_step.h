// The basic logic step as a plain loop: the yardstick for the emitter's own. It does the same
// arithmetic per particle (death at the end of life, normalised age, gravity at the time scale,
// size and colour from the five main envelopes, the move and the facing point) over an array of
// the same records, with the envelopes looked up inline from copies of their keys instead of
// through the envelope channel.
#pragma once

#include <vector>

#include "host/envelope_storage.h"
#include "simulation/particle.h"

namespace bench {

// A linear curve through copied keys, sampled inline: end values outside the keys.
class InlineEnvelope {
 public:
  explicit InlineEnvelope(const Tev_EnvelopeStorage& envelope);
  float At(float x) const {
    const std::size_t last = x_.size() - 1;
    if (!(x > x_[0])) return y_[0];
    if (x >= x_[last]) return y_[last];
    std::size_t k = 1;
    while (x >= x_[k]) ++k;
    const float t = (x - x_[k - 1]) / (x_[k] - x_[k - 1]);
    return y_[k - 1] + (y_[k] - y_[k - 1]) * t;
  }

 private:
  std::vector<float> x_;
  std::vector<float> y_;
};

struct ReferenceEffect {
  D3DXVECTOR3 GlobalForce;
  float SimulationScaler;
  D3DXVECTOR3 LookAt;
  InlineEnvelope Size, Alpha, Red, Green, Blue;
};

void ReferenceStep(std::vector<Particle>& pool, const ReferenceEffect& effect);

}  // namespace bench
