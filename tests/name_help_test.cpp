// Name help: what an unknown link, channel or type name is taken to mean.
#include <gtest/gtest.h>

#include "tests/scene_test_host.h"
#include "tools/scene/name_suggestions.h"

namespace scenetest {
namespace {

struct SuggestionCase {
  const char* Wanted;
  std::vector<std::string> Candidates;
  const char* Expected;  // empty: no suggestion
};

TEST(NameSuggestions, NearSpellingThenSharedWords) {
  const std::vector<std::string> emitter_links = {
      "Births Per Second",
      "Sliding Size Offset Envelope",
      "Size Envelope",
      "Mulitplicative Size Offset Max (a multiplier between 1 and this is generated)",
      "Attached Size Offset Envelope",
      "Lifespan_Min",
      "Lifespan_Max"};
  const SuggestionCase cases[] = {
      {"Births per second", emitter_links, "Births Per Second"},
      {"Multiplicative Size Offset Max", emitter_links,
       "Mulitplicative Size Offset Max (a multiplier between 1 and this is generated)"},
      {"Size Offset Max", emitter_links,
       "Mulitplicative Size Offset Max (a multiplier between 1 and this is generated)"},
      {"Lifespan Minimum", emitter_links, "Lifespan_Min"},
      {"Size", emitter_links, "Size Envelope"},
      {"Gravity", emitter_links, ""},
      {"Emiter",
       {"Texture", "AdvancedParticleEmitter", "EnvelopeStorage"},
       "AdvancedParticleEmitter"},
      {"Envelope", {"Texture", "AdvancedParticleEmitter", "EnvelopeStorage"}, "EnvelopeStorage"},
      {"", emitter_links, ""},
  };
  for (const SuggestionCase& c : cases)
    EXPECT_EQ(apescene::SuggestName(c.Wanted, c.Candidates), c.Expected) << c.Wanted;
}

struct MessageCase {
  const char* Name;
  std::string Scene;
  const char* Excerpt;
};

TEST(NameHelp, LoaderMessagesSuggest) {
  const MessageCase cases[] = {
      {"LinkByItsWords", WithEmitterLinks(R"({"Multiplicative Size Offset Max": 2})"),
       "(did you mean \"Mulitplicative Size Offset Max (a multiplier between 1 and this is "
       "generated)\"?)"},
      {"ChannelByItsWords",
       WithEmitterLinks(R"({"Particle Texture": "glow"})",
                        R"("glow dot": {"type": "Texture", "image": "dot"})"),
       "no channel is named \"glow\" (did you mean \"glow dot\"?)"},
      {"BuiltInImageAsAChannel", WithEmitterLinks(R"({"Particle Texture": "spark"})"),
       "\"spark\" is a built-in image: make a Texture channel of it, e.g. \"spark\": {\"type\": "
       "\"Texture\", \"image\": \"spark\"}, or write {\"image\": \"spark\"} here"},
      {"SiblingLink",
       WithChannel(R"({"type": "AdvPE_SmokeSettings", "links": {"Strength Envelope": [[0, 1]]}})"),
       "unknown link name for AdvPE_SmokeSettings (did you mean \"Force Strength Envelope\"?)"},
      {"TypeByItsWords", WithChannel(R"({"type": "Smoke Settings"})"),
       "did you mean \"AdvPE_SmokeSettings\"?"},
  };
  TestHost host;
  for (const MessageCase& c : cases) {
    const std::string error = host.ErrorOf(c.Scene);
    EXPECT_NE(error.find(c.Excerpt), std::string::npos) << c.Name << ": " << error;
  }
}

}  // namespace
}  // namespace scenetest
