// Emitter links written per second, converted with the emitter's logic rate.
#include <gtest/gtest.h>

#include "host/link_channels.h"
#include "plugin/link_table.h"
#include "tests/scene_test_host.h"

namespace scenetest {
namespace {

struct ConversionCase {
  const char* Links;
  int Index;
  D3DXVECTOR3 Expected;  // a number link's value in x
};

TEST(PerSecondTest, ConvertedWithTheLogicRate) {
  const ConversionCase cases[] = {
      {R"({"Logic Updates Per Second": 60, "GlobalForce": {"per_second_squared": [0, -9.8, 0]}})",
       kLinkGlobalForce,
       {0.0f, -9.8f / 3600.0f, 0.0f}},
      {R"({"InitialForce_Strength": {"per_second": 3}, "Logic Updates Per Second": 60})",
       kLinkInitialForceStrength,
       {0.05f, 0.0f, 0.0f}},
      {R"({"5": 50, "SpinSpeed_Max": {"per_second": 6}})", kLinkSpinSpeedMax, {0.12f, 0.0f, 0.0f}},
      {R"({"Logic Updates Per Second": "rate", "Maximum Speed": {"per_second": 10}})",
       kLinkMaximumSpeed,
       {0.25f, 0.0f, 0.0f}},
      {R"({"Logic Updates Per Second": 60, "InitialForce_Override": {"per_second": [0, 6, 0]}})",
       kLinkInitialForceOverride,
       {0.0f, 0.1f, 0.0f}},
  };
  for (const ConversionCase& c : cases) {
    TestHost host;
    std::string error;
    const auto scene =
        host.Load(WithEmitterLinks(c.Links, R"("rate": {"type": "Value", "value": 40})"), &error);
    ASSERT_NE(scene, nullptr) << error;
    Qen_Channel* link = scene->Find("fx")->GetChild(c.Index);
    ASSERT_NE(link, nullptr) << c.Links;
    D3DXVECTOR3 got{0.0f, 0.0f, 0.0f};
    if (auto* value = dynamic_cast<Qen_ValueChannel*>(link)) got.x = value->GetValue();
    if (auto* vector = dynamic_cast<Qen_ValueVectorChannel*>(link)) got = vector->GetVector();
    EXPECT_NEAR(got.x, c.Expected.x, 1e-7) << c.Links;
    EXPECT_NEAR(got.y, c.Expected.y, 1e-7) << c.Links;
    EXPECT_NEAR(got.z, c.Expected.z, 1e-7) << c.Links;
  }
}

TEST(PerSecondTest, AnimatedValuesAreConvertedAtEveryKey) {
  TestHost host;
  std::string error;
  const auto scene = host.Load(WithEmitterLinks(R"({"Logic Updates Per Second": 100,
          "InitialForce_Strength": {"per_second": {"keys": [[0, 1], [2, 3]]}}})"),
                               &error);
  ASSERT_NE(scene, nullptr) << error;
  auto* strength =
      static_cast<Qen_ValueChannel*>(scene->Find("fx")->GetChild(kLinkInitialForceStrength));
  scene->Animate(1.0);
  EXPECT_FLOAT_EQ(strength->GetValue(), 0.02f);
  scene->Animate(2.0);
  EXPECT_FLOAT_EQ(strength->GetValue(), 0.03f);
}

TEST(PerSecondTest, RefusedWhereItCannotBeConverted) {
  struct Case {
    const char* Links;
    const char* Excerpt;
  };
  const Case cases[] = {
      {R"({"Logic Updates Per Second": 60, "GlobalForce": {"per_second": [0, -9.8, 0]}})",
       "write {\"per_second_squared\": ...}"},
      {R"({"GlobalForce": {"per_second_squared": [0, -9.8, 0]}})",
       "needs the emitter's \"Logic Updates Per Second\""},
      {R"({"Logic Updates Per Second": {"keys": [[0, 30], [1, 60]]},
           "InitialForce_Strength": {"per_second": 1}})",
       "not animated"},
      {R"({"Logic Updates Per Second": 0, "InitialForce_Strength": {"per_second": 1}})", "above 0"},
      {R"({"Logic Updates Per Second": 60, "Lifespan_Min": {"per_second": 1}})",
       "only the emitter's per-logic-step"},
      {R"({"Logic Updates Per Second": 1e-30, "GlobalForce": {"per_second_squared": [0, 1e30, 0]}})",
       "beyond the range of a float"},
  };
  TestHost host;
  for (const Case& c : cases) {
    const std::string error = host.ErrorOf(WithEmitterLinks(c.Links));
    EXPECT_NE(error.find(c.Excerpt), std::string::npos) << c.Links << ": " << error;
  }
  EXPECT_NE(host.ErrorOf(WithChannel(R"({"type": "AdvPE_Attractor",
                                         "links": {"Strength": {"per_second_squared": 1}}})"))
                .find("only the emitter's"),
            std::string::npos);
}

}  // namespace
}  // namespace scenetest
