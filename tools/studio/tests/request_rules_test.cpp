// Who may drive the studio (token, Host, Origin), which file names it takes, and which values.
#include <gtest/gtest.h>

#include <cmath>
#include <fstream>

#include "tools/studio/edit_rules.h"
#include "tools/studio/request_guard.h"
#include "tools/studio/scene_folder.h"
#include "tools/studio/tests/studio_fixture.h"

namespace apestudio {
namespace {

using apescene::Json;

TEST(RequestGuard, TokenHostAndOriginMustAllNameThisStudio) {
  const std::string token = "0123456789abcdef0123456789abcdef";
  const RequestGuard guard(token, {"127.0.0.1", "localhost"}, 8123);
  struct Case {
    const char* What;
    std::string Token, Host, Origin;
    bool Allowed;
  };
  const Case cases[] = {
      {"all right", token, "127.0.0.1:8123", "", true},
      {"by name, from its own page", token, "localhost:8123", "http://localhost:8123", true},
      {"no token", "", "127.0.0.1:8123", "", false},
      {"wrong token", "0123456789abcdef0123456789abcdeX", "127.0.0.1:8123", "", false},
      {"token cut short", token.substr(0, 31), "127.0.0.1:8123", "", false},
      {"token with more", token + "0", "127.0.0.1:8123", "", false},
      {"a name rebound to this machine", token, "evil.example:8123", "", false},
      {"another port", token, "127.0.0.1:8124", "", false},
      {"no Host", token, "", "", false},
      {"a page of another site", token, "127.0.0.1:8123", "http://evil.example", false},
      {"another port's page", token, "127.0.0.1:8123", "http://127.0.0.1:9000", false},
      {"another scheme", token, "127.0.0.1:8123", "https://127.0.0.1:8123", false},
      {"an opaque origin", token, "127.0.0.1:8123", "null", false},
  };
  for (const Case& c : cases)
    EXPECT_EQ(guard.Refusal(c.Token, c.Host, c.Origin).empty(), c.Allowed) << c.What;
}

TEST(RequestGuard, NewTokensAreLongAndDiffer) {
  const std::string a = RequestGuard::NewToken(), b = RequestGuard::NewToken();
  EXPECT_EQ(a.size(), 32u);
  EXPECT_NE(a, b);
  // An empty token never matches, even an empty one given.
  EXPECT_FALSE(RequestGuard("", {"h"}, 1).Refusal("", "h:1", "").empty());
}

TEST(SceneFolder, NamesStayInsideTheFolder) {
  const studiotest::ScratchFolder scratch;
  const std::filesystem::path folder = scratch.Path() / "scene";
  std::filesystem::create_directories(folder / "sub");
  std::filesystem::create_directories(scratch.Path() / "outside");
  std::filesystem::create_symlink(scratch.Path() / "outside", folder / "out_link");
  std::filesystem::create_symlink(folder / "sub", folder / "in_link");
  const SceneFolder scene_folder(folder);
  struct Case {
    const char* Name;
    bool Allowed;
  };
  const Case cases[] = {
      {"a.json", true},
      {"sub/a.json", true},
      {"new/a.json", true},
      {"in_link/a.json", true},
      {"", false},
      {"../a.json", false},
      {"sub/../../a.json", false},
      {"./a.json", false},
      {"/etc/passwd", false},
      {"a\\..\\b.json", false},
      {"out_link/a.json", false},
      {"out_link", false},
      {"a\nb.json", false},
      {"c:a.json", false},
  };
  for (const Case& c : cases) {
    std::string error;
    const std::filesystem::path resolved = scene_folder.Resolve(c.Name, &error);
    EXPECT_EQ(!resolved.empty(), c.Allowed) << c.Name << ": " << error;
    if (c.Allowed) {
      EXPECT_EQ(resolved.string().rfind(std::filesystem::canonical(folder).string(), 0), 0u)
          << c.Name;
    } else {
      EXPECT_FALSE(error.empty()) << c.Name;
    }
  }
  std::string error;
  EXPECT_TRUE(scene_folder.Resolve(std::string(300, 'a'), &error).empty());
}

TEST(EditRules, NumbersMustBeFiniteAndInRange) {
  const Json births = Json::array({"channels", "fx", "links", "Births Per Second"});
  const Json count = Json::array({"channels", "fx", "links", "ParticleCount"});
  const Json other = Json::array({"channels", "fx", "links", "Bounce Rate"});
  struct Case {
    const char* What;
    Json Path;
    Json Value;
    const char* Message;  // part of the refusal; empty: accepted
  };
  Json deep = 1;
  for (int i = 0; i < kMaximumValueDepth + 2; ++i) deep = Json::array({deep});
  const Case cases[] = {
      {"a plain rate", births, 450, ""},
      {"a vector", other, Json::array({0, -0.5, 1e5}), ""},
      {"NaN", other, std::nan(""), "finite"},
      {"infinity inside a vector", other, Json::array({0, INFINITY, 0}), "finite"},
      {"beyond the studio's range", other, 2e6, "out of range"},
      {"a key value beyond it", other, Json::array({Json::array({0, -3e6})}), "out of range"},
      {"a negative pool", count, -5, "ParticleCount"},
      {"a pool beyond the emitter's cap", count, 1'000'001, "ParticleCount"},
      {"the largest pool", count, 1'000'000, ""},
      {"too many births", births, 200'000, "Births Per Second"},
      {"too deep", other, deep, "deeply"},
  };
  for (const Case& c : cases) {
    const std::string problem = CheckEditValue(c.Path, c.Value);
    if (std::string(c.Message).empty()) {
      EXPECT_EQ(problem, "") << c.What;
    } else {
      EXPECT_NE(problem.find(c.Message), std::string::npos) << c.What << ": " << problem;
    }
  }
}

TEST(EditRules, ScenesMustSuitTheStudio) {
  struct Case {
    const char* Document;
    bool Allowed;
  };
  const Case cases[] = {
      {R"({"resolution": [1920, 1080]})", true},
      {R"({"resolution": [1921, 1080]})", false},
      {R"({"resolution": [640, 4000]})", false},
      {R"({"frames": 10000})", true},
      {R"({"frames": 10001})", false},
      {R"({"duration": 100, "fps": 100})", true},
      {R"({"duration": 100, "fps": 101})", false},
      {R"({"duration": 400})", false},  // at the default 30 fps
  };
  for (const Case& c : cases)
    EXPECT_EQ(CheckStudioLimits(Json::parse(c.Document)).empty(), c.Allowed) << c.Document;
}

}  // namespace
}  // namespace apestudio
