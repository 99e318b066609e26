// The smoke settings: every field read from its link, the documented defaults without links, and
// the reading rules for yes/no and unusable numbers.
#include <gtest/gtest.h>

#include <limits>
#include <memory>
#include <string>
#include <vector>

#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/link_channels.h"
#include "host/smoke_settings.h"

namespace {

using Settings = Tev_AdvPE_SmokeSettings;

class SmokeSettingsTest : public ::testing::Test {
 protected:
  Qen_ValueChannel* LinkValue(int index, float value) {
    values_.push_back(std::make_unique<Qen_ValueChannel>(value));
    EXPECT_TRUE(settings_.SetChild(index, values_.back().get())) << index;
    return values_.back().get();
  }

  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  Settings settings_;
  std::vector<std::unique_ptr<Qen_ValueChannel>> values_;
};

TEST_F(SmokeSettingsTest, DefaultsWithoutLinks) {
  // Values left from an earlier fetch must not survive the links going away.
  Tev_EnvelopeStorage envelope;
  settings_.RepulsionEnvelope = &envelope;
  settings_.ForceStrengthEnvelope = &envelope;
  settings_.Drag = 0.5f;
  settings_.CollisionEnabled = true;
  settings_.ApproachSpeedFactor = 3.0f;
  settings_.ContactSpeedFactor = 3.0f;
  settings_.CollisionProbeMinimum = 3.0f;
  settings_.RecheckCollision = true;
  settings_.DragFadesWithAge = 1.0f;
  settings_.MaxSpeedFadesWithAge = 1.0f;
  settings_.GlobalForceFadesWithAge = 1.0f;
  settings_.DebugColours = true;

  settings_.FetchAllSettings();
  EXPECT_EQ(settings_.RepulsionEnvelope, nullptr);
  EXPECT_EQ(settings_.AttractionEnvelope, nullptr);
  EXPECT_EQ(settings_.SurfaceRepulsionEnvelope, nullptr);
  EXPECT_EQ(settings_.ForceStrengthEnvelope, nullptr);
  EXPECT_EQ(settings_.Drag, 1.0f);
  EXPECT_FALSE(settings_.CollisionEnabled);
  EXPECT_EQ(settings_.ApproachSpeedFactor, 1.0f);
  EXPECT_EQ(settings_.ContactSpeedFactor, 1.0f);
  EXPECT_EQ(settings_.CollisionProbeMinimum, 0.0f);
  EXPECT_FALSE(settings_.RecheckCollision);
  EXPECT_EQ(settings_.DragFadesWithAge, 0.0f);
  EXPECT_EQ(settings_.MaxSpeedFadesWithAge, 0.0f);
  EXPECT_EQ(settings_.GlobalForceFadesWithAge, 0.0f);
  EXPECT_FALSE(settings_.DebugColours);
}

TEST_F(SmokeSettingsTest, EveryFieldFromItsLink) {
  Tev_EnvelopeStorage repulsion, attraction, surface, strength;
  ASSERT_TRUE(settings_.SetChild(Settings::kLinkRepulsionEnvelope, &repulsion));
  ASSERT_TRUE(settings_.SetChild(Settings::kLinkAttractionEnvelope, &attraction));
  ASSERT_TRUE(settings_.SetChild(Settings::kLinkSurfaceRepulsionEnvelope, &surface));
  ASSERT_TRUE(settings_.SetChild(Settings::kLinkForceStrengthEnvelope, &strength));
  LinkValue(Settings::kLinkCollisionProbeMinimum, 2.5f);
  LinkValue(Settings::kLinkApproachSpeedFactor, 0.25f);
  LinkValue(Settings::kLinkCollisionEnabled, 1.0f);
  LinkValue(Settings::kLinkContactSpeedFactor, 0.75f);
  LinkValue(Settings::kLinkRecheckCollision, 0.5f);
  LinkValue(Settings::kLinkDrag, 0.9f);
  LinkValue(Settings::kLinkDragFadesWithAge, 3.0f);
  LinkValue(Settings::kLinkMaxSpeedFadesWithAge, 0.001f);
  LinkValue(Settings::kLinkGlobalForceFadesWithAge, 1.0f);
  LinkValue(Settings::kLinkDebugColours, 1.0f);

  settings_.FetchAllSettings();
  EXPECT_EQ(settings_.RepulsionEnvelope, &repulsion);
  EXPECT_EQ(settings_.AttractionEnvelope, &attraction);
  EXPECT_EQ(settings_.SurfaceRepulsionEnvelope, &surface);
  EXPECT_EQ(settings_.ForceStrengthEnvelope, &strength);
  EXPECT_EQ(settings_.CollisionProbeMinimum, 2.5f);
  EXPECT_EQ(settings_.ApproachSpeedFactor, 0.25f);
  EXPECT_TRUE(settings_.CollisionEnabled);
  EXPECT_EQ(settings_.ContactSpeedFactor, 0.75f);
  EXPECT_TRUE(settings_.RecheckCollision);
  EXPECT_EQ(settings_.Drag, 0.9f);
  EXPECT_EQ(settings_.DragFadesWithAge, 1.0f);
  EXPECT_EQ(settings_.MaxSpeedFadesWithAge, 1.0f);
  EXPECT_EQ(settings_.GlobalForceFadesWithAge, 1.0f);
  EXPECT_TRUE(settings_.DebugColours);
}

// Yes exactly when greater than 0: zero, negatives and NaN are no.
TEST_F(SmokeSettingsTest, YesNoLinksAreYesOnlyAboveZero) {
  Qen_ValueChannel* collision = LinkValue(Settings::kLinkCollisionEnabled, 0.0f);
  Qen_ValueChannel* fades = LinkValue(Settings::kLinkDragFadesWithAge, 0.0f);
  for (float no : {0.0f, -0.0f, -1.0f, std::numeric_limits<float>::quiet_NaN()}) {
    collision->SetValue(no);
    fades->SetValue(no);
    settings_.FetchAllSettings();
    EXPECT_FALSE(settings_.CollisionEnabled) << no;
    EXPECT_EQ(settings_.DragFadesWithAge, 0.0f) << no;
  }
}

// A number that is not finite would spread through every particle; the default stands in.
TEST_F(SmokeSettingsTest, NonFiniteNumbersGiveTheDefaults) {
  const float nan = std::numeric_limits<float>::quiet_NaN();
  const float inf = std::numeric_limits<float>::infinity();
  LinkValue(Settings::kLinkDrag, nan);
  LinkValue(Settings::kLinkApproachSpeedFactor, inf);
  LinkValue(Settings::kLinkContactSpeedFactor, -inf);
  LinkValue(Settings::kLinkCollisionProbeMinimum, nan);
  settings_.FetchAllSettings();
  EXPECT_EQ(settings_.Drag, 1.0f);
  EXPECT_EQ(settings_.ApproachSpeedFactor, 1.0f);
  EXPECT_EQ(settings_.ContactSpeedFactor, 1.0f);
  EXPECT_EQ(settings_.CollisionProbeMinimum, 0.0f);
}

TEST_F(SmokeSettingsTest, DeclaresTypedLinksWithYesNoNamesEndingInQuestionMarks) {
  ASSERT_EQ(settings_.GetChildCreationCount(), Settings::kLinkCount);
  for (int index = 0; index < Settings::kLinkCount; ++index) {
    const ChildCreation* link = settings_.GetChildCreation(index);
    ASSERT_NE(link, nullptr);
    EXPECT_EQ(link->LinkPosition, index);
    const std::string type = link->Type.TypeName;
    EXPECT_EQ(type, index <= Settings::kLinkForceStrengthEnvelope ? "EnvelopeStorage" : "Value");
  }
  for (int yes_no : {Settings::kLinkCollisionEnabled, Settings::kLinkRecheckCollision,
                     Settings::kLinkDragFadesWithAge, Settings::kLinkMaxSpeedFadesWithAge,
                     Settings::kLinkGlobalForceFadesWithAge, Settings::kLinkDebugColours}) {
    const std::string name = settings_.GetChildCreation(yes_no)->LinkName;
    EXPECT_EQ(name.back(), '?') << name;
  }
  // An envelope link refuses a value channel.
  Qen_ValueChannel value(1.0f);
  EXPECT_FALSE(settings_.SetChild(Settings::kLinkRepulsionEnvelope, &value));
}

}  // namespace
