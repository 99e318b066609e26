// The link reference against the links the channels really declare, and docs/links.md against
// the reference.
#include <gtest/gtest.h>

#include <cstring>
#include <fstream>
#include <sstream>

#include "tests/scene_test_host.h"
#include "tools/scene/link_reference.h"
#include "tools/scene/link_reference_text.h"
#include "tools/scene/plugin_types.h"

namespace scenetest {
namespace {

std::string Text(const char* field, std::size_t size) {
  return std::string(field, strnlen(field, size));
}

// Every type that declares links is described, link for link: index, name and accepted type as
// the plug-in declares them.
TEST(LinkReference, MatchesTheLinksEveryChannelTypeDeclares) {
  TestHost host;
  const apescene::PluginTypeReport types = apescene::LoadPluginTypes(host.Loader);
  ASSERT_TRUE(types.Problems.empty()) << types.Problems.front();
  int described_types = 0;
  for (const std::string& type : types.TypeNames) {
    std::string error;
    std::unique_ptr<Qen_Channel> channel(host.Loader.CreateChannelByName(type, &error));
    ASSERT_NE(channel, nullptr) << type << ": " << error;
    const auto reference = apescene::LinkReferences(type);
    ASSERT_EQ(static_cast<int>(reference.size()), channel->GetChildCreationCount()) << type;
    described_types += reference.empty() ? 0 : 1;
    for (int i = 0; i < channel->GetChildCreationCount(); ++i) {
      const ChildCreation* declared = channel->GetChildCreation(i);
      ASSERT_NE(declared, nullptr) << type << " link " << i;
      const apescene::LinkReference& link = reference[static_cast<std::size_t>(i)];
      EXPECT_EQ(link.ChannelType, type);
      EXPECT_EQ(link.Index, i) << type;
      EXPECT_EQ(link.Name, Text(declared->LinkName, sizeof declared->LinkName)) << type << " " << i;
      EXPECT_EQ(link.Type, Text(declared->Type.TypeName, sizeof declared->Type.TypeName))
          << type << " \"" << link.Name << "\"";
    }
  }
  EXPECT_EQ(described_types, static_cast<int>(apescene::KnownChannelTypes().size()));
  EXPECT_EQ(apescene::LinkReferences("AdvancedParticleEmitter").size(), 54u);
  EXPECT_TRUE(apescene::LinkReferences("Spark").empty());
}

// What the converter and the docs rely on: every field filled, and the step power agreeing with
// the unit, since a per-second value is divided by the logic rate that many times.
TEST(LinkReference, EveryLinkHasUnitDefaultMeaningGroupAndAConsistentStepPower) {
  for (std::string_view type : apescene::KnownChannelTypes()) {
    for (const apescene::LinkReference& link : apescene::LinkReferences(type)) {
      SCOPED_TRACE(std::string(type) + " \"" + std::string(link.Name) + "\"");
      EXPECT_FALSE(link.Unit.empty());
      EXPECT_FALSE(link.Default.empty());
      EXPECT_FALSE(link.Group.empty());
      EXPECT_EQ(link.Meaning.back(), '.');
      const bool squared = link.Unit.find("per logic step per logic step") != std::string::npos;
      const bool per_step = link.Unit.find("per logic step") != std::string::npos;
      EXPECT_EQ(link.StepPower, squared ? 2 : per_step ? 1 : 0);
    }
  }
  const apescene::LinkReference* gravity =
      apescene::FindLinkReference("AdvancedParticleEmitter", "GlobalForce");
  ASSERT_NE(gravity, nullptr);
  EXPECT_EQ(gravity->Index, 16);
  EXPECT_EQ(apescene::FindLinkReference("AdvancedParticleEmitter", "Gravity"), nullptr);
}

TEST(LinkReference, DocsLinksMdIsTheGeneratedText) {
  std::ifstream file(std::string(APE_SOURCE_DIR) + "/docs/links.md", std::ios::binary);
  ASSERT_TRUE(file) << "docs/links.md is missing: build the links-doc target";
  std::ostringstream text;
  text << file.rdbuf();
  EXPECT_TRUE(text.str() == apescene::LinkReferenceMarkdown())
      << "docs/links.md differs from the link reference: build the links-doc target";
}

TEST(LinkReference, ListingGroupsEveryLinkOnce) {
  const std::string listing = apescene::LinkListing("AdvPE_Attractor");
  for (const apescene::LinkReference& link : apescene::LinkReferences("AdvPE_Attractor")) {
    const std::string quoted = "\"" + std::string(link.Name) + "\" (";
    const std::size_t at = listing.find(quoted);
    ASSERT_NE(at, std::string::npos) << link.Name;
    EXPECT_EQ(listing.find(quoted, at + 1), std::string::npos) << link.Name;
  }
  EXPECT_NE(listing.find("per_second"), std::string::npos);
  EXPECT_EQ(apescene::LinkListing("Texture"), "");
}

}  // namespace
}  // namespace scenetest
