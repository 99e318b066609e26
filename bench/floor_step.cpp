#include "bench/floor_step.h"

#include <cstdint>
#include <limits>

namespace bench {

namespace {

// The colour byte's low eight bits without branches: held within [-2^31, 255] first.
std::uint32_t LowByte(float value) {
  float held = value > -2147483648.0f ? value : -2147483648.0f;
  held = held < 255.0f ? held : 255.0f;
  return static_cast<std::uint32_t>(static_cast<std::int32_t>(held)) & 255u;
}

}  // namespace

FloorEnvelope::FloorEnvelope(const Tev_EnvelopeStorage& envelope) {
  const std::vector<Tev_EnvelopeStorage::Key>& keys = envelope.GetKeys();
  const int count = keys.size() < kSlots ? static_cast<int>(keys.size()) : kSlots;
  for (int i = 0; i < kSlots; ++i) {
    x_[i] = std::numeric_limits<float>::infinity();
    y_[i] = 0.0f;
    slope_[i] = 0.0f;
  }
  for (int i = 0; i < count; ++i) {
    x_[i] = keys[i].X;
    y_[i] = keys[i].Y;
  }
  for (int i = 0; i + 1 < count; ++i)
    slope_[i] = (keys[i + 1].Y - keys[i].Y) / (keys[i + 1].X - keys[i].X);
  if (count > 0) {
    first_ = keys.front().X;
    last_ = keys[count - 1].X;
  }
}

void FloorStep(std::vector<Particle>& pool, const FloorEffect& effect) {
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
    p.Color = LowByte(effect.Alpha.At(x)) << 24 | LowByte(effect.Red.At(x)) << 16 |
              LowByte(effect.Green.At(x)) << 8 | LowByte(effect.Blue.At(x));
  }
}

}  // namespace bench
