// The scene check: each likely mistake gives its one warning at the right place, a scene
// without mistakes (and every example scene) gives none.
#include <gtest/gtest.h>

#include <filesystem>

#include "tests/scene_test_host.h"
#include "tools/scene/json_values.h"
#include "tools/scene/scene_check.h"

namespace scenetest {
namespace {

// An emitter that is fine as it is; each case below spoils it in one way.
const char* const kSoundLinks = R"({
  "Emitter": {"shape": "disc", "radius": 0.1},
  "Emitter_Active?": 1,
  "ParticleCount": 200,
  "Logic Updates Per Second": 60,
  "Births Per Second": 50,
  "Lifespan_Min": 1,
  "Lifespan_Max": 2,
  "InitialForce_Strength": 0.05,
  "GlobalForce": [0, -0.0027, 0],
  "LookAt": "camera.eye",
  "Size Envelope": [[0, 0.1], [1, 0.05]],
  "Use Vertex Alpha Fading?": 1,
  "Vertex Alpha Envelope": [[0, 255], [1, 0]],
  "Red Color Envelope": [[0, 255], [1, 255]],
  "Green Color Envelope": [[0, 200], [1, 100]],
  "Blue Color Envelope": [[0, 100], [1, 50]]
})";

const char* const kFloor =
    R"({"colliders": [{"shape": "plane", "point": [0, 0, 0], "normal": [0, 1, 0]}]})";

struct Expected {
  std::string Path;     // as the warning gives it
  std::string Excerpt;  // a piece of the message
};

struct CheckCase {
  const char* Name;
  std::vector<std::string> Remove;  // links taken out of the sound emitter
  std::string Set;                  // links put in or replaced (a JSON object)
  std::vector<Expected> Warnings;   // exactly these, in this order
  std::string ExtraChannels = "";
};

void PrintTo(const CheckCase& c, std::ostream* out) {
  *out << c.Name;
}

const std::string kFx = "channels.fx";
std::string AtLink(const std::string& name) {
  return kFx + ".links." +
         (name.find_first_of(" ?:") == std::string::npos ? name : "\"" + name + "\"");
}

std::vector<CheckCase> Cases() {
  const std::string floor = std::string("\"MultiCollisionManager\": ") + kFloor;
  return {
      {"Sound", {}, "{}", {}},
      {"AnimatedActivityCanBeYes",
       {},
       R"({"Emitter_Active?": {"keys": [[0, 0], [1, 1]], "interpolation": "hold"}})",
       {}},
      {"NoColourEnvelopes",
       {"Red Color Envelope", "Green Color Envelope", "Blue Color Envelope"},
       "{}",
       {{kFx, "every particle is black"}}},
      {"ColourEnvelopeInZeroToOne",
       {},
       R"({"Red Color Envelope": [[0, 1], [1, 0.5]]})",
       {{AtLink("Red Color Envelope"), "run 0..255"}}},
      {"AlphaEnvelopeInZeroToOne",
       {},
       R"({"Vertex Alpha Envelope": [[0, 1], [1, 0]]})",
       {{AtLink("Vertex Alpha Envelope"), "run 0..255"}}},
      {"NoEmitterMesh", {"Emitter"}, "{}", {{kFx, "no \"Emitter\" link"}}},
      {"LifespanMinAboveMax",
       {},
       R"({"Lifespan_Min": 3, "Lifespan_Max": 1})",
       {{AtLink("Lifespan_Min"), "3 s is above \"Lifespan_Max\" (1 s)"}}},
      {"NegativeLifespans",
       {},
       R"({"Lifespan_Min": -2, "Lifespan_Max": -1})",
       {{AtLink("Lifespan_Min"), "0 s or less"}}},
      {"NegativeMinimumLifespan",
       {},
       R"({"Lifespan_Min": -1, "Lifespan_Max": 2})",
       {{AtLink("Lifespan_Min"), "negative"}}},
      {"NoLifespans",
       {"Lifespan_Min", "Lifespan_Max"},
       "{}",
       {{kFx, "dies in its first logic step"}}},
      {"NoLogicSteps",
       {},
       R"({"Logic Updates Per Second": 0})",
       {{AtLink("Logic Updates Per Second"), "frozen"}}},
      {"SimulationLinkMissing",
       {"Births Per Second"},
       "{}",
       {{kFx, "\"Births Per Second\" not linked"}}},
      {"AlwaysPaused",
       {},
       R"({"Simulation Scaler": 0})",
       {{AtLink("Simulation Scaler"), "paused for the whole shot"}}},
      {"ScalerAboveItsRange",
       {},
       R"({"Simulation Scaler": 5})",
       {{AtLink("Simulation Scaler"), "runs at 1"}}},
      {"NeverActive", {}, R"({"Emitter_Active?": 0})", {{AtLink("Emitter_Active?"), "never"}}},
      {"NoPool", {"ParticleCount"}, "{}", {{kFx, "the pool is empty"}}},
      {"PoolFarLargerThanBirthsFill",
       {},
       R"({"ParticleCount": 1000000})",
       {{AtLink("ParticleCount"), "births fill at most about 100 (50 a second for 2 s"}}},
      {"MoreBirthsAFrameThanAllowed",
       {},
       R"({"Births Per Second": 40000, "ParticleCount": 100000})",
       {{AtLink("Births Per Second"), "1001 births"}}},
      {"AttachRateWithoutCollisionManager",
       {},
       R"({"Attach Rate": 0.5, "Attached Lifespan": 1})",
       {{AtLink("Attach Rate"), "without a \"MultiCollisionManager\""},
        {AtLink("Attached Lifespan"), "no particle ever attaches"}}},
      {"CollisionManagerWithoutRates",
       {},
       "{" + floor + "}",
       {{AtLink("MultiCollisionManager"), "pass through"}}},
      {"RateAboveOne",
       {},
       "{" + floor + R"(, "Bounce Rate": 50})",
       {{AtLink("Bounce Rate"), "50 acts as 1"}}},
      {"StuckParticlesNeverEnd",
       {},
       "{" + floor + R"(, "Attach Rate": 1})",
       {{AtLink("Attach Rate"), "never end"}}},
      {"SlidingWithoutSlidingSizeEnvelope",
       {},
       "{" + floor + R"(, "Attach Rate": 1, "Attached_SlideRate": 1})",
       {{AtLink("Attached_SlideRate"), "about 1.1 world units against 0.1 in flight"}}},
      {"SlidingWithItsEnvelope",
       {},
       "{" + floor +
           R"(, "Attach Rate": 1, "Attached_SlideRate": 1,
              "Sliding Size Offset Envelope": [[0, -1], [1, -1]]})",
       {}},
      {"SmokeWithoutSettings", {}, R"({"Smoke?": 1})", {{AtLink("Smoke?"), "SmokeSettings"}}},
      {"SmokeSettingsWithoutSmoke",
       {},
       R"({"SmokeSettings": {"links": {"Drag": 0.9}}})",
       {{AtLink("SmokeSettings"), "not on"}}},
      {"SmokeForcesWithoutStrength",
       {},
       R"({"Smoke?": 1, "SmokeSettings": {"links": {"Repulsion Envelope": [[0, 0.001], [1, 0]]}}})",
       {{AtLink("SmokeSettings"), "multiplied by 0"}}},
      {"AlphaEnvelopeWithoutFading",
       {"Use Vertex Alpha Fading?"},
       "{}",
       {{AtLink("Vertex Alpha Envelope"), "does nothing"}}},
      {"FadingWithoutAlphaEnvelope",
       {"Vertex Alpha Envelope"},
       "{}",
       {{AtLink("Use Vertex Alpha Fading?"), "invisible"}}},
      {"TextureWithoutFading",
       {"Use Vertex Alpha Fading?", "Vertex Alpha Envelope"},
       R"({"Particle Texture": {"image": "dot"}})",
       {{AtLink("Particle Texture"), "opaque squares"}}},
      {"NoSizeEnvelope", {"Size Envelope"}, "{}", {{kFx, "1 world unit wide"}}},
      {"NoLookAt", {"LookAt"}, "{}", {{kFx, "camera.eye"}}},
      {"GravityPerSecondWrittenPerStep",
       {},
       R"({"GlobalForce": [0, -9.8, 0]})",
       {{AtLink("GlobalForce"), "35280 units/s^2"}}},
      {"SpeedPerSecondWrittenPerStep",
       {},
       R"({"InitialForce_Strength": 5})",
       {{AtLink("InitialForce_Strength"), "300 units/s"}}},
      {"SpinWithOneSpeed", {}, R"({"SpinSpeed_Min": 0.1})", {{AtLink("SpinSpeed_Min"), "both"}}},
      {"EnvelopeKeysInSeconds",
       {},
       R"({"Size Envelope": [[0, 0.1], [5, 0.05]]})",
       {{AtLink("Size Envelope"), "keys reach x = 5"}}},
      {"EnvelopeKeysOutOfOrder",
       {},
       R"({"Size Envelope": [[1, 0.05], [0, 0.1]]})",
       {{AtLink("Size Envelope") + "[1]", "comes after x = 1"}}},
      {"EnvelopeKeyRepeated",
       {},
       R"({"Size Envelope": [[0, 0.1], [0, 0.1], [1, 0.05]]})",
       {{AtLink("Size Envelope") + "[1]", "given twice"}}},
      {"EnvelopeJumpIsFine", {}, R"({"Size Envelope": [[0, 0.1], [0.5, 0.1], [0.5, 0.05]]})", {}},
      {"ThreeKeysAtOneX",
       {},
       R"({"Size Envelope": [[0, 0.1], [0, 0.2], [0, 0.3], [1, 0]]})",
       {{AtLink("Size Envelope") + "[1]", "never read"}}},
      {"ChannelLinkedNowhere",
       {},
       "{}",
       {{"channels.glow", "linked nowhere"}},
       R"("glow": {"type": "Texture", "image": "dot"})"},
  };
}

class SceneCheckTest : public ::testing::TestWithParam<CheckCase> {};

TEST_P(SceneCheckTest, GivesExactlyTheExpectedWarnings) {
  const CheckCase& c = GetParam();
  apescene::Json links = apescene::Json::parse(kSoundLinks);
  for (const std::string& name : c.Remove) ASSERT_EQ(links.erase(name), 1u) << name;
  const apescene::Json set = apescene::Json::parse(c.Set);
  for (const auto& item : set.items()) links[item.key()] = item.value();
  TestHost host;
  std::string error;
  const auto scene = host.Load(WithEmitterLinks(links.dump(2), c.ExtraChannels), &error);
  ASSERT_NE(scene, nullptr) << error;
  std::string all;
  for (const apescene::SceneWarning& w : scene->Warnings)
    all += FormatWarning("test.json", w) + "\n";
  ASSERT_EQ(scene->Warnings.size(), c.Warnings.size()) << all;
  for (std::size_t i = 0; i < c.Warnings.size(); ++i) {
    EXPECT_EQ(scene->Warnings[i].Path.Text(), c.Warnings[i].Path) << all;
    EXPECT_NE(scene->Warnings[i].Message.find(c.Warnings[i].Excerpt), std::string::npos) << all;
    EXPECT_GT(scene->Warnings[i].Line, 0) << all;
  }
  // The check gives the same again when called on the loaded scene.
  EXPECT_EQ(apescene::CheckScene(*scene).size(), scene->Warnings.size());
}

INSTANTIATE_TEST_SUITE_P(Mistakes, SceneCheckTest, ::testing::ValuesIn(Cases()),
                         [](const ::testing::TestParamInfo<CheckCase>& info) {
                           return std::string(info.param.Name);
                         });

TEST(SceneCheck, WarningsAreLocatedLikeErrors) {
  TestHost host;
  std::string error;
  const auto scene = host.Load("{\"channels\": {\n}}", &error);
  ASSERT_NE(scene, nullptr) << error;
  ASSERT_EQ(scene->Warnings.size(), 1u);
  EXPECT_EQ(FormatWarning("test.json", scene->Warnings[0]),
            "test.json: warning: the scene has no \"AdvancedParticleEmitter\" channel: no "
            "particle will be drawn");
  const auto wrong = host.Load(WithEmitterLinks(R"({"Emitter_Active?": 1,
  "Births Per Second": 10})"),
                               &error);
  ASSERT_NE(wrong, nullptr) << error;
  ASSERT_EQ(wrong->Warnings.size(), 1u);
  EXPECT_EQ(FormatWarning("test.json", wrong->Warnings[0]),
            "test.json:1: channels.fx: warning: \"Logic Updates Per Second\" not linked: without "
            "\"Emitter_Active?\", \"Births Per Second\" and \"Logic Updates Per Second\" the "
            "emitter does not simulate (nothing is born, moves or ages)");
}

TEST(SceneCheck, EveryExampleSceneLoadsWithoutWarnings) {
  int scenes = 0;
  for (const auto& entry :
       std::filesystem::directory_iterator(std::string(APE_SOURCE_DIR) + "/scenes")) {
    if (entry.path().extension() != ".json") continue;
    ++scenes;
    TestHost host;
    std::string error;
    const auto scene = apescene::LoadSceneFile(entry.path().string(), host.Loader, &error);
    ASSERT_NE(scene, nullptr) << error;
    for (const apescene::SceneWarning& w : scene->Warnings)
      ADD_FAILURE() << FormatWarning(scene->SourceName, w);
  }
  EXPECT_GE(scenes, 6);
}

}  // namespace
}  // namespace scenetest
