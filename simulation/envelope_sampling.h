// How envelope samples become colour bytes and packed A8R8G8B8 colours.
#pragma once

#include <cstdint>

#include "host/envelope_sampler.h"
#include "host/envelope_storage.h"
#include "plugin/link_reading.h"
#include "simulation/logic_step.h"
#include "simulation/particle.h"

class Tev_AdvancedParticleEmitter;

namespace sim {

// Sets SizeEnvelope, AlphaEnvelope, RedEnvelope, GreenEnvelope and BlueEnvelope to the channels
// linked now (null where nothing is). The members are not owned: between frames a host may
// destroy a linked envelope, so an operation a host calls directly takes them afresh.
void HoldMainEnvelopes(Tev_AdvancedParticleEmitter& e);

// The main envelopes' views, taken once per logic step (nothing edits or relinks a curve inside a
// step); absent envelopes answer what their stage uses without one: size 1, colour 0.
MainEnvelopeViews TakeMainEnvelopeViews(const Tev_AdvancedParticleEmitter& e);

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

// The low eight bits of ColorComponent(value), without branches: the value is held within
// [-2^31, 255] (NaN to -2^31, whose low bits are 0, as are those of the 0 NaN gives) before the
// truncation, which leaves every low byte as it was.
inline std::uint32_t ColorLowByte(float value) {
  constexpr float kLowest = -2147483648.0f;
  float held = value > kLowest ? value : kLowest;
  held = held < 255.0f ? held : 255.0f;
  return static_cast<std::uint32_t>(static_cast<std::int32_t>(held)) & 255u;
}

// A free particle's size from its envelope view: never negative.
[[gnu::always_inline]] inline float LiveSize(const MainEnvelopeViews& views, const Particle& p) {
  const float size = views.Size.At(p.NormalizedAge) * p.SizeMultiplier;
  return size < 0.0f ? 0.0f : size;
}

// The colour view's value at x on the segment the previous colour view found, or on its own.
[[gnu::always_inline]] inline float SampleAfter(const EnvelopeSampler& view, bool shares,
                                                int* segment, float x) {
  if (!shares) {
    if (view.GetLookup() == EnvelopeSampler::Lookup::General) return view.At(x);
    *segment = view.SegmentOf(x);
  }
  return view.AtSegment(*segment, x);
}

// A free particle's colour from the four colour views at x, the low eight bits of each byte.
[[gnu::always_inline]] inline std::uint32_t LiveColor(const MainEnvelopeViews& views, float x) {
  int segment = 0;
  const float alpha = SampleAfter(views.Alpha, false, &segment, x);
  const float red = SampleAfter(views.Red, views.RedSharesAlpha, &segment, x);
  const float green = SampleAfter(views.Green, views.GreenSharesRed, &segment, x);
  const float blue = SampleAfter(views.Blue, views.BlueSharesGreen, &segment, x);
  return ColorLowByte(alpha) << 24 | ColorLowByte(red) << 16 | ColorLowByte(green) << 8 |
         ColorLowByte(blue);
}

// Each component clamped to 0..255 first (attached particles).
std::uint32_t PackColorClamped(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue);

}  // namespace sim
