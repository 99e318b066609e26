// The four sibling plug-ins load from the plug-in folder by their type GUID file names and make
// working channels of their classes.
#include <gtest/gtest.h>

#include <memory>
#include <ostream>
#include <string>

#include "host/attractor.h"
#include "host/envelope_storage.h"
#include "host/host_context.h"
#include "host/multi_collision_manager.h"
#include "host/plugin_loader.h"
#include "host/smoke_settings.h"
#include "host/type_guids.h"

namespace {

struct PluginCase {
  const char* TypeName;
  GUID Type;
};

void PrintTo(const PluginCase& c, std::ostream* os) {
  *os << c.TypeName;
}

class SiblingPluginTest : public ::testing::TestWithParam<PluginCase> {
 protected:
  Qen_HostContext context_;
  Qen_HostContext::ScopedCurrent current_{&context_};
  PluginLoader loader_;
};

TEST_P(SiblingPluginTest, LoadsByGuidAndCreatesItsChannel) {
  std::string error;
  std::unique_ptr<Qen_Channel> channel(loader_.CreateChannel(GetParam().Type, &error));
  ASSERT_NE(channel, nullptr) << error;
  const ChannelType record = channel->GetChannelType();
  EXPECT_EQ(std::string(record.TypeName), GetParam().TypeName);
  EXPECT_TRUE(record.TypeGuid == GetParam().Type);
  const ChannelType* loaded = loader_.GetTypeRecord(GetParam().Type);
  ASSERT_NE(loaded, nullptr);
  EXPECT_EQ(std::string(loaded->TypeName), GetParam().TypeName);
}

INSTANTIATE_TEST_SUITE_P(Siblings, SiblingPluginTest,
                         ::testing::Values(PluginCase{"EnvelopeStorage", kEnvelopeStorageGuid},
                                           PluginCase{"MultiCollisionManager",
                                                      kMultiCollisionManagerGuid},
                                           PluginCase{"AdvPE_Attractor", kAttractorGuid},
                                           PluginCase{"AdvPE_SmokeSettings", kSmokeSettingsGuid}),
                         [](const auto& info) { return std::string(info.param.TypeName); });

// Channels made by the loaded libraries do their work: the classes behind the GUIDs are the ones
// the emitter codes against.
TEST(SiblingPluginWork, LoadedChannelsWork) {
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  PluginLoader loader;
  std::string error;
  std::unique_ptr<Qen_Channel> envelope(loader.CreateChannel(kEnvelopeStorageGuid, &error));
  std::unique_ptr<Qen_Channel> manager(loader.CreateChannel(kMultiCollisionManagerGuid, &error));
  std::unique_ptr<Qen_Channel> attractor(loader.CreateChannel(kAttractorGuid, &error));
  std::unique_ptr<Qen_Channel> smoke(loader.CreateChannel(kSmokeSettingsGuid, &error));
  ASSERT_TRUE(envelope && manager && attractor && smoke) << error;

  auto* curve = dynamic_cast<Tev_EnvelopeStorage*>(envelope.get());
  ASSERT_NE(curve, nullptr);
  curve->AddKey(0.0f, 0.0f);
  curve->AddKey(1.0f, 4.0f);
  EXPECT_EQ(curve->GetEnvelopeValue(0.5f), 2.0f);

  auto* collisions = dynamic_cast<Tev_MultiCollisionManager*>(manager.get());
  ASSERT_NE(collisions, nullptr);
  collisions->AddPlane({0, 0, 0}, {0, 1, 0});
  D3DXVECTOR3 origin{0, 1, 0}, ray{0, -2, 0}, point, normal;
  float cosine;
  EXPECT_EQ(collisions->GetClosestFrontFaceCollision(&origin, &ray, &point, &normal, &cosine), 0);

  auto* field = dynamic_cast<Tev_AdvPE_Attractor*>(attractor.get());
  ASSERT_NE(field, nullptr);
  EXPECT_EQ(field->GetForceAtPosition({0, 0, 2}), D3DXVECTOR3(0, 0, -0.25f));

  auto* settings = dynamic_cast<Tev_AdvPE_SmokeSettings*>(smoke.get());
  ASSERT_NE(settings, nullptr);
  ASSERT_TRUE(settings->SetChild(Tev_AdvPE_SmokeSettings::kLinkRepulsionEnvelope, curve));
  settings->FetchAllSettings();
  EXPECT_EQ(settings->RepulsionEnvelope, curve);
}

}  // namespace
