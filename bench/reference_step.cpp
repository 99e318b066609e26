#include "bench/reference_step.h"

#include <cmath>
#include <cstdint>

namespace bench {

namespace {

// Truncated toward zero, saturating at the int32 range (NaN gives 0), then capped at 255.
std::int32_t ColorByte(float value) {
  std::int32_t c = 0;
  if (value >= 2147483648.0f)
    c = 2147483647;
  else if (value < -2147483648.0f)
    c = -2147483647 - 1;
  else if (!std::isnan(value))
    c = static_cast<std::int32_t>(value);
  return c > 255 ? 255 : c;
}

std::uint32_t Pack(std::int32_t a, std::int32_t r, std::int32_t g, std::int32_t b) {
  const auto low = [](std::int32_t c) { return static_cast<std::uint32_t>(c) & 255u; };
  return (low(a) << 24) | (low(r) << 16) | (low(g) << 8) | low(b);
}

}  // namespace

InlineEnvelope::InlineEnvelope(const Tev_EnvelopeStorage& envelope) {
  for (const Tev_EnvelopeStorage::Key& key : envelope.GetKeys()) {
    x_.push_back(key.X);
    y_.push_back(key.Y);
  }
  if (x_.empty()) {
    x_.push_back(0.0f);
    y_.push_back(0.0f);
  }
}

void ReferenceStep(std::vector<Particle>& pool, const ReferenceEffect& effect) {
  const float s = effect.SimulationScaler;
  for (Particle& p : pool) {
    if (!p.Active) continue;
    if (p.Age > p.Lifespan) {
      p.Active = false;
      continue;
    }
    const float x = p.Age / p.Lifespan;
    p.NormalizedAge = x;
    p.Velocity += (effect.GlobalForce + p.SmokeForce + p.AttractorForce) * s * s;
    const float size = effect.Size.At(x) * p.SizeMultiplier;
    p.Size = size < 0.0f ? 0.0f : size;
    p.Position += p.Velocity;
    p.RenderPosition = p.Position;
    p.AttractorForce = {0.0f, 0.0f, 0.0f};
    p.LookAtPoint = effect.LookAt;
    p.Color = Pack(ColorByte(effect.Alpha.At(x)), ColorByte(effect.Red.At(x)),
                   ColorByte(effect.Green.At(x)), ColorByte(effect.Blue.At(x)));
  }
}

}  // namespace bench
