// The rules by which the emitter reads its links, each written once.
#pragma once

#include <cstdint>

#include "host/link_channels.h"
#include "host/qen_channel.h"

// A yes/no value: yes exactly when greater than 0 (NaN is no).
inline bool IsYes(float value) { return value > 0.0f; }

// Float to int32 truncated toward zero, saturating: NaN gives 0, values beyond the int32 range
// give the nearest end. Every float-to-int conversion of the emitter goes through it.
std::int32_t TruncateToInt(float value);

// An envelope value used as a colour byte: truncated, then capped at 255 (no lower bound).
std::int32_t ColorComponent(float value);

// The channel linked at `index`, as the type the link declares (the host refuses channels of
// other types), or null.
template <typename T>
T* LinkAs(const Qen_Channel& owner, int index) {
  return static_cast<T*>(owner.GetChild(index));
}

// Reads of the "Value" links; `present` (when given) tells whether the link was there.
inline Qen_ValueChannel* ValueLink(const Qen_Channel& owner, int index) {
  return LinkAs<Qen_ValueChannel>(owner, index);
}
inline Qen_ValueVectorChannel* VectorLink(const Qen_Channel& owner, int index) {
  return LinkAs<Qen_ValueVectorChannel>(owner, index);
}
