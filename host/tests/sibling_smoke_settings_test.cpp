// The smoke settings: every field read from its link, the defaults without links, and the
// reading rules for yes/no and unusable numbers.
#include <gtest/gtest.h>

#include <limits>
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

TEST_F(SmokeSettings, MissingLinksGiveTheDefaultsWhateverWasFetchedBefore) {
  Settings settings;
  Tev_EnvelopeStorage envelope;
  settings.RepulsionEnvelope = settings.ForceStrengthEnvelope = &envelope;
  settings.CollisionProbeMinimum = settings.ApproachSpeedFactor = settings.Drag = 3.0f;
  settings.ContactSpeedFactor = settings.DragFadesWithAge = settings.MaxSpeedFadesWithAge = 3.0f;
  settings.GlobalForceFadesWithAge = 3.0f;
  settings.CollisionEnabled = settings.RecheckCollision = settings.DebugColours = true;
  settings.FetchAllSettings();
  EXPECT_EQ(Read(settings), Fields(nullptr, nullptr, nullptr, nullptr, 0.0f, 1.0f, false, 1.0f,
                                   false, 1.0f, 0.0f, 0.0f, 0.0f, false));
}

// Yes/no links are yes exactly above 0; a number that is not finite would spread through every
// particle, so its default stands in.
TEST_F(SmokeSettings, EveryFieldComesFromItsLink) {
  Settings settings;
  Tev_EnvelopeStorage envelopes[4];
  for (int i = 0; i < 4; ++i) ASSERT_TRUE(settings.SetChild(i, &envelopes[i]));
  Qen_ValueChannel values[Settings::kLinkCount - 4];
  for (int i = 4; i < Settings::kLinkCount; ++i) ASSERT_TRUE(settings.SetChild(i, &values[i - 4]));
  auto fetch = [&](std::initializer_list<float> linked) {
    const float* value = linked.begin();
    for (Qen_ValueChannel& channel : values) channel.SetValue(*value++);
    settings.FetchAllSettings();
    return Read(settings);
  };
  Envelope e0 = &envelopes[0], e1 = &envelopes[1], e2 = &envelopes[2], e3 = &envelopes[3];
  EXPECT_EQ(fetch({2.5f, 0.25f, 1, 0.75f, 0.5f, 0.9f, 3, 0.001f, 1, 1}),
            Fields(e0, e1, e2, e3, 2.5f, 0.25f, true, 0.75f, true, 0.9f, 1, 1, 1, true));
  const float nan = std::numeric_limits<float>::quiet_NaN();
  const float inf = std::numeric_limits<float>::infinity();
  EXPECT_EQ(fetch({nan, inf, nan, -inf, -0.0f, nan, 0, -1, nan, -inf}),
            Fields(e0, e1, e2, e3, 0, 1, false, 1, false, 1, 0, 0, 0, false));
  EXPECT_EQ(fetch({-2, 0, 0, 0, 0, 0, 0, 0, 0, 0}),
            Fields(e0, e1, e2, e3, -2, 0, false, 0, false, 0, 0, 0, 0, false));
}

}  // namespace
