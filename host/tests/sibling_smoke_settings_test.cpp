// The smoke settings: every field read from its link, the defaults without links, and the
// reading rules for yes/no and unusable numbers.
#include <tuple>

#include "host/envelope_storage.h"
#include "host/link_channels.h"
#include "host/smoke_settings.h"
#include "host/tests/test_channels.h"

namespace {

using Settings = Tev_AdvPE_SmokeSettings;
using Envelope = Tev_EnvelopeStorage*;
// Every field, in link order.
using Fields = std::tuple<Envelope, Envelope, Envelope, Envelope, float, float, bool, float, bool,
                          float, float, float, float, bool>;

Fields Read(const Settings& s) {
  return {s.RepulsionEnvelope,        s.AttractionEnvelope,
          s.SurfaceRepulsionEnvelope, s.ForceStrengthEnvelope,
          s.CollisionProbeMinimum,    s.ApproachSpeedFactor,
          s.CollisionEnabled,         s.ContactSpeedFactor,
          s.RecheckCollision,         s.Drag,
          s.DragFadesWithAge,         s.MaxSpeedFadesWithAge,
          s.GlobalForceFadesWithAge,  s.DebugColours};
}

using SmokeSettings = HostContextTest;

// Yes/no links are yes exactly above 0; a number that is not finite would spread through every
// particle, so its default stands in, as it does for a missing link.
TEST_F(SmokeSettings, EveryFieldComesFromItsLinkOrItsDefault) {
  Settings settings;
  Tev_EnvelopeStorage envelopes[4];
  Qen_ValueChannel values[Settings::kLinkCount - 4];
  auto fetch = [&](std::initializer_list<float> linked) {
    const float* value = linked.begin();
    for (Qen_ValueChannel& channel : values) channel.SetValue(*value++);
    settings.FetchAllSettings();
    return Read(settings);
  };
  for (int i = 0; i < Settings::kLinkCount; ++i)
    ASSERT_TRUE(i < 4 ? settings.SetChild(i, &envelopes[i]) : settings.SetChild(i, &values[i - 4]));
  Envelope e0 = &envelopes[0], e1 = &envelopes[1], e2 = &envelopes[2], e3 = &envelopes[3];
  EXPECT_EQ(fetch({kNaN, kInf, kNaN, -kInf, -0.0f, kNaN, 0, -1, kNaN, -kInf}),
            Fields(e0, e1, e2, e3, 0, 1, false, 1, false, 1, 0, 0, 0, false));
  EXPECT_EQ(fetch({2.5f, 0.25f, 1, 0.75f, 0.5f, 0.9f, 3, 0.001f, 1, 1}),
            Fields(e0, e1, e2, e3, 2.5f, 0.25f, true, 0.75f, true, 0.9f, 1, 1, 1, true));
  for (int i = 0; i < Settings::kLinkCount; ++i) settings.ClearChild(i);
  settings.FetchAllSettings();  // what the links gave before must not stay
  EXPECT_EQ(Read(settings),
            Fields(nullptr, nullptr, nullptr, nullptr, 0, 1, false, 1, false, 1, 0, 0, 0, false));
}

}  // namespace
