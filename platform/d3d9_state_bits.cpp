// Float render states (point sizes, scale factors) travel through DWORD slots bit for bit.
#include <cstring>

#include "platform/d3d9_types.h"

static_assert(sizeof(float) == sizeof(DWORD));

DWORD FloatToStateBits(float value) {
  DWORD bits;
  std::memcpy(&bits, &value, sizeof bits);
  return bits;
}

float StateBitsToFloat(DWORD bits) {
  float value;
  std::memcpy(&value, &bits, sizeof value);
  return value;
}
