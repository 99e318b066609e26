#include "render/render_sizes.h"

#include <limits>

#include "plugin/advanced_particle_emitter.h"

namespace {
constexpr std::int32_t kLargestPool = Tev_AdvancedParticleEmitter::kMaximumParticleCount;
// Six index positions per quad, counted in int32 by the object-data base.
static_assert(static_cast<std::int64_t>(kLargestPool) * 6 <=
              std::numeric_limits<std::int32_t>::max());
}  // namespace

std::size_t DrawnSlotCount(std::int32_t particle_count) {
  if (particle_count <= 0) return 0;
  return static_cast<std::size_t>(particle_count < kLargestPool ? particle_count : kLargestPool);
}

std::optional<UINT> BufferBytes(std::size_t count, std::size_t stride) {
  constexpr std::size_t kMaximumBytes = std::numeric_limits<UINT>::max();
  if (stride != 0 && count > kMaximumBytes / stride) return std::nullopt;
  return static_cast<UINT>(count * stride);
}
