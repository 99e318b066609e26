// The rules by which the emitter reads its links, each written once.
#pragma once

#include <cmath>
#include <cstdint>
#include <limits>

#include "host/link_values.h"

// Float to int32 truncated toward zero, saturating: NaN gives 0, values beyond the int32 range
// give the nearest end. Every float-to-int conversion of the emitter goes through it. Inline, as
// is ColorComponent: a logic step runs them several times per particle.
inline std::int32_t TruncateToInt(float value) {
  if (std::isnan(value)) return 0;
  // 2^31 is exact in float; every float below it truncates into range.
  constexpr float kTwoPow31 = 2147483648.0f;
  if (value >= kTwoPow31) return std::numeric_limits<std::int32_t>::max();
  if (value < -kTwoPow31) return std::numeric_limits<std::int32_t>::min();
  return static_cast<std::int32_t>(value);
}

// An envelope value used as a colour byte: truncated, then capped at 255 (no lower bound).
inline std::int32_t ColorComponent(float value) {
  const std::int32_t c = TruncateToInt(value);
  return c > 255 ? 255 : c;
}
