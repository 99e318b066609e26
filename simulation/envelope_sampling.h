// How envelope samples become colour bytes and packed A8R8G8B8 colours.
#pragma once

#include <cstdint>

#include "host/envelope_storage.h"
#include "plugin/link_reading.h"

class Tev_AdvancedParticleEmitter;

namespace sim {

// Sets SizeEnvelope, AlphaEnvelope, RedEnvelope, GreenEnvelope and BlueEnvelope to the channels
// linked now (null where nothing is). The members are not owned: between frames a host may
// destroy a linked envelope, so an operation a host calls directly takes them afresh.
void HoldMainEnvelopes(Tev_AdvancedParticleEmitter& e);

// The envelope's value at x as a colour byte (truncated, capped at 255, no lower bound), or 0
// when the envelope is absent. Inline: four of these run per particle and logic step.
inline std::int32_t ColorByteAt(Tev_EnvelopeStorage* envelope, float x) {
  return envelope ? ColorComponent(envelope->GetEnvelopeValue(x)) : 0;
}

// Only the low eight bits of each component enter the colour (free particles: a component of -1
// becomes 0xFF).
inline std::uint32_t PackColorLowBits(std::int32_t alpha, std::int32_t red, std::int32_t green,
                                      std::int32_t blue) {
  const auto low = [](std::int32_t c) { return static_cast<std::uint32_t>(c) & 255u; };
  return (low(alpha) << 24) | (low(red) << 16) | (low(green) << 8) | low(blue);
}

// Each component clamped to 0..255 first (attached particles).
std::uint32_t PackColorClamped(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue);

}  // namespace sim
