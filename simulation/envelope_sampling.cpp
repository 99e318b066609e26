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

std::uint32_t PackColorClamped(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue) {
  const auto clamp = [](std::int32_t c) { return std::clamp(c, 0, 255); };
  return PackColorLowBits(clamp(alpha), clamp(red), clamp(green), clamp(blue));
}

}  // namespace sim
