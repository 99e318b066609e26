// How a channel reads what is linked to it: the typed child and the yes/no rule, shared by the
// emitter and the sibling channels.
#pragma once

#include "host/link_channels.h"
#include "host/qen_channel.h"

// A yes/no value: yes exactly when greater than 0 (NaN is no).
inline bool IsYes(float value) {
  return value > 0.0f;
}

// The channel linked at `index`, as the type the link declares (the host refuses channels of
// other types), or null.
template <typename T>
T* LinkAs(const Qen_Channel& owner, int index) {
  return static_cast<T*>(owner.GetChild(index));
}

// The "Value" and "Value Vector" channel linked at `index`, or null.
inline Qen_ValueChannel* ValueLink(const Qen_Channel& owner, int index) {
  return LinkAs<Qen_ValueChannel>(owner, index);
}
inline Qen_ValueVectorChannel* VectorLink(const Qen_Channel& owner, int index) {
  return LinkAs<Qen_ValueVectorChannel>(owner, index);
}

// The linked value, or `absent` when the link is missing.
inline float ValueOr(const Qen_Channel& owner, int index, float absent) {
  Qen_ValueChannel* link = ValueLink(owner, index);
  return link ? link->GetValue() : absent;
}
inline D3DXVECTOR3 VectorOr(const Qen_Channel& owner, int index, const D3DXVECTOR3& absent) {
  Qen_ValueVectorChannel* link = VectorLink(owner, index);
  return link ? link->GetVector() : absent;
}

// The linked yes/no value; no when the link is missing.
inline bool YesOrNo(const Qen_Channel& owner, int index) {
  Qen_ValueChannel* link = ValueLink(owner, index);
  return link && IsYes(link->GetValue());
}
