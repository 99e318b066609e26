// The particle pool and its four public queries.
#include "simulation/particle_pool.h"

#include <exception>

#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "simulation/vector_math.h"

namespace sim {

PoolRequest PoolSizeFor(float particleCountValue) {
  const std::int32_t asked = TruncateToInt(particleCountValue);
  if (asked > Tev_AdvancedParticleEmitter::kMaximumParticleCount)
    return {Tev_AdvancedParticleEmitter::kMaximumParticleCount, true};
  return {asked < 1 ? 1 : asked, false};
}

bool BuildPool(std::vector<Particle>& pool, std::int32_t count) noexcept {
  // Give the old records' memory back first, so that a smaller pool never keeps a larger one's.
  std::vector<Particle>().swap(pool);
  if (count <= 0) return true;
  try {
    pool.assign(static_cast<std::size_t>(count), Particle{});
    return true;
  } catch (const std::exception&) {
    std::vector<Particle>().swap(pool);
    return false;
  }
}

int FirstInactive(const std::vector<Particle>& pool, int count, int from) {
  for (int i = from < 0 ? 0 : from; i < count; ++i)
    if (!pool[i].Active) return i;
  return -1;
}

}  // namespace sim

int Tev_AdvancedParticleEmitter::GetInactiveParticle() {
  return sim::FirstInactive(Particles, ParticleCount, 0);
}

int Tev_AdvancedParticleEmitter::GetOldestParticle() {
  // Ties keep the lowest index; records stuck to a surface are never replaced.
  float best = -1.0f;
  int oldest = 0;
  for (int i = 0; i < ParticleCount; ++i) {
    const Particle& p = Particles[i];
    if (!p.Attached && p.NormalizedAge > best) {
      best = p.NormalizedAge;
      oldest = i;
    }
  }
  return oldest;
}

bool Tev_AdvancedParticleEmitter::GetIfParticleActive(int index) {
  try {
    if (!Initialized) {
      Initialize();
      return false;
    }
    if (index < 0 || index >= ParticleCount) return false;
    return Particles[index].Active;
  } catch (...) {
    ShowDebug("APE: GetIfParticleActive failed");
    return false;
  }
}

D3DXVECTOR3 Tev_AdvancedParticleEmitter::GetParticlePosition(int index) {
  try {
    if (!Initialized) {
      Initialize();
      return sim::kZeroVector;
    }
    if (index < 0 || index >= ParticleCount) return sim::kZeroVector;
    return Particles[index].RenderPosition;
  } catch (...) {
    ShowDebug("APE: GetParticlePosition failed");
    return sim::kZeroVector;
  }
}
