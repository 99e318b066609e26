// Sizing and building the particle pool.
#pragma once

#include <cstdint>
#include <vector>

#include "simulation/particle.h"

namespace sim {

struct PoolRequest {
  std::int32_t Count;  // records to build
  bool Capped;         // the value asked for more than the maximum pool
};

// The pool a "ParticleCount" value asks for: truncated toward zero, raised to 1 when below 1,
// lowered to the emitter's maximum pool when above it.
PoolRequest PoolSizeFor(float particleCountValue);

// Replaces the pool with `count` new records. When the memory cannot be had the pool is left
// empty and the answer is false; nothing is thrown.
bool BuildPool(std::vector<Particle>& pool, std::int32_t count) noexcept;

// The lowest index from `from` on, below `count`, whose record is inactive; -1 when none is.
int FirstInactive(const std::vector<Particle>& pool, int count, int from);

}  // namespace sim
