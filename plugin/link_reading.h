// The rules by which the emitter reads its links, each written once.
#pragma once

#include <cstdint>

#include "host/link_values.h"

// Float to int32 truncated toward zero, saturating: NaN gives 0, values beyond the int32 range
// give the nearest end. Every float-to-int conversion of the emitter goes through it.
std::int32_t TruncateToInt(float value);

// An envelope value used as a colour byte: truncated, then capped at 255 (no lower bound).
std::int32_t ColorComponent(float value);
