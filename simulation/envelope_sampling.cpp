#include "simulation/envelope_sampling.h"

#include <algorithm>

#include "host/envelope_storage.h"
#include "plugin/advanced_particle_emitter.h"
#include "plugin/link_reading.h"
#include "plugin/link_table.h"

namespace sim {

void HoldMainEnvelopes(Tev_AdvancedParticleEmitter& e) {
  e.SizeEnvelope = LinkAs<Tev_EnvelopeStorage>(e, kLinkSizeEnvelope);
  e.AlphaEnvelope = LinkAs<Tev_EnvelopeStorage>(e, kLinkVertexAlphaEnvelope);
  e.RedEnvelope = LinkAs<Tev_EnvelopeStorage>(e, kLinkRedColorEnvelope);
  e.GreenEnvelope = LinkAs<Tev_EnvelopeStorage>(e, kLinkGreenColorEnvelope);
  e.BlueEnvelope = LinkAs<Tev_EnvelopeStorage>(e, kLinkBlueColorEnvelope);
}

std::int32_t ColorByteAt(Tev_EnvelopeStorage* envelope, float x) {
  return envelope ? ColorComponent(envelope->GetEnvelopeValue(x)) : 0;
}

std::uint32_t PackColorLowBits(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue) {
  const auto low = [](std::int32_t c) { return static_cast<std::uint32_t>(c) & 255u; };
  return (low(alpha) << 24) | (low(red) << 16) | (low(green) << 8) | low(blue);
}

std::uint32_t PackColorClamped(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue) {
  const auto clamp = [](std::int32_t c) { return std::clamp(c, 0, 255); };
  return PackColorLowBits(clamp(alpha), clamp(red), clamp(green), clamp(blue));
}

}  // namespace sim
