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

MainEnvelopeViews TakeMainEnvelopeViews(const Tev_AdvancedParticleEmitter& e) {
  static constexpr EnvelopeSegment kOne{0.0, 1.0, 0.0, 1.0, 1.0};
  static constexpr EnvelopeSegment kZero{};
  const auto view = [](const Tev_EnvelopeStorage* envelope, const EnvelopeSegment& absent) {
    return envelope ? envelope->GetSampler() : EnvelopeSampler(absent);
  };
  MainEnvelopeViews views{view(e.SizeEnvelope, kOne), view(e.AlphaEnvelope, kZero),
                          view(e.RedEnvelope, kZero), view(e.GreenEnvelope, kZero),
                          view(e.BlueEnvelope, kZero)};
  views.RedSharesAlpha = views.Red.SharesLookupWith(views.Alpha);
  views.GreenSharesRed = views.Green.SharesLookupWith(views.Red);
  views.BlueSharesGreen = views.Blue.SharesLookupWith(views.Green);
  return views;
}

std::uint32_t PackColorClamped(std::int32_t alpha, std::int32_t red, std::int32_t green,
                               std::int32_t blue) {
  const auto clamp = [](std::int32_t c) { return std::clamp(c, 0, 255); };
  return PackColorLowBits(clamp(alpha), clamp(red), clamp(green), clamp(blue));
}

}  // namespace sim
