#include "plugin/link_reading.h"

#include <cmath>
#include <limits>

std::int32_t TruncateToInt(float value) {
  if (std::isnan(value)) return 0;
  // 2^31 is exact in float; every float below it truncates into range.
  constexpr float kTwoPow31 = 2147483648.0f;
  if (value >= kTwoPow31) return std::numeric_limits<std::int32_t>::max();
  if (value < -kTwoPow31) return std::numeric_limits<std::int32_t>::min();
  return static_cast<std::int32_t>(value);
}

std::int32_t ColorComponent(float value) {
  const std::int32_t c = TruncateToInt(value);
  return c > 255 ? 255 : c;
}
