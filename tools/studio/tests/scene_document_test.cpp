// Edits of the scene document, its history, and writing it back as a scene file.
#include <gtest/gtest.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "tools/scene/scene_writer.h"
#include "tools/studio/scene_document.h"

namespace apestudio {
namespace {

using apescene::Json;

const Json kScene = Json::parse(R"({
  "fps": 30,
  "channels": {"fx": {"type": "AdvancedParticleEmitter",
                      "links": {"Births Per Second": 450, "Size Envelope": [[0, 1], [1, 0]]}}}
})");

TEST(SceneDocument, EditsReplaceAddAppendAndRemove) {
  struct Case {
    const char* What;
    Json Path;
    Json Value;
    const char* Pointer;  // where the value must now be (JSON pointer)
  };
  const Case cases[] = {
      {"replace a link",
       {"channels", "fx", "links", "Births Per Second"},
       600,
       "/channels/fx/links/Births Per Second"},
      {"add a link",
       {"channels", "fx", "links", "Lifespan_Max"},
       2.5,
       "/channels/fx/links/Lifespan_Max"},
      {"add a channel", {"channels", "dot", "type"}, "Texture", "/channels/dot/type"},
      {"replace a key",
       {"channels", "fx", "links", "Size Envelope", 1},
       Json::array({1, 0.5}),
       "/channels/fx/links/Size Envelope/1"},
      {"append a key",
       {"channels", "fx", "links", "Size Envelope", 2},
       Json::array({2, 0}),
       "/channels/fx/links/Size Envelope/2"},
      {"a top-level setting", {"fps"}, 60, "/fps"},
  };
  for (const Case& c : cases) {
    const SceneDocument document(kScene);
    Json result;
    std::string error;
    ASSERT_TRUE(document.WithEdit(c.Path, c.Value, &result, &error)) << c.What << ": " << error;
    EXPECT_EQ(result.at(Json::json_pointer(c.Pointer)), c.Value) << c.What;
    EXPECT_EQ(document.Root(), kScene) << c.What << ": the document itself changed";
  }

  const SceneDocument document(kScene);
  Json result;
  std::string error;
  ASSERT_TRUE(document.WithEdit({"channels", "fx", "links", "Births Per Second"}, nullptr, &result,
                                &error));
  EXPECT_FALSE(result["channels"]["fx"]["links"].contains("Births Per Second"));
  ASSERT_TRUE(
      document.WithEdit({"channels", "fx", "links", "Size Envelope", 0}, nullptr, &result, &error));
  EXPECT_EQ(result["channels"]["fx"]["links"]["Size Envelope"], Json::parse("[[1, 0]]"));
}

TEST(SceneDocument, PathsThatLeadNowhereAreRefused) {
  const Json paths[] = {
      Json::array(),
      "channels",
      Json::array({"channels", -1}),
      Json::array({"channels", 1.5}),
      Json::array({"fps", "x"}),                                        // through a number
      Json::array({"channels", "fx", "links", "Size Envelope", 5}),     // past the end
      Json::array({"channels", "fx", "links", "Size Envelope", "a"}),   // a key into a list
      Json::array({"channels", "fx", "links", "Size Envelope", 9, 0}),  // beyond, deeper
      Json::array({std::string(201, 'k')}),
      Json(Json::array(
          {"a", "b", "c", "d", "e", "f", "g", "h", "i", "j", "k", "l", "m", "n", "o", "p", "q"})),
  };
  for (const Json& path : paths) {
    const SceneDocument document(kScene);
    Json result = "untouched";
    std::string error;
    EXPECT_FALSE(document.WithEdit(path, 1, &result, &error)) << path.dump();
    EXPECT_FALSE(error.empty()) << path.dump();
    EXPECT_EQ(result, "untouched") << path.dump();
  }
}

TEST(SceneDocument, UndoAndRedoWalkTheHistory) {
  SceneDocument document(Json::object({{"v", 0}}));
  EXPECT_FALSE(document.Undo());
  for (int i = 1; i <= 3; ++i) document.Commit(Json::object({{"v", i}}));
  ASSERT_TRUE(document.Undo());
  ASSERT_TRUE(document.Undo());
  EXPECT_EQ(document.Root()["v"], 1);
  ASSERT_TRUE(document.Redo());
  EXPECT_EQ(document.Root()["v"], 2);
  // A new edit drops what could have been redone.
  document.Commit(Json::object({{"v", 9}}));
  EXPECT_FALSE(document.Redo());
  EXPECT_EQ(document.UndoDepth(), 3u);
  while (document.Undo()) {
  }
  EXPECT_EQ(document.Root()["v"], 0);

  SceneDocument long_history(Json::object({{"v", 0}}));
  for (std::size_t i = 1; i <= SceneDocument::kHistoryLimit + 5; ++i)
    long_history.Commit(Json::object({{"v", i}}));
  EXPECT_EQ(long_history.UndoDepth(), SceneDocument::kHistoryLimit);
}

// Every example scene reads back from what the writer makes as the same document, keys in their
// order and every number with its bits.
TEST(SceneWriter, ExampleScenesReadBackTheSame) {
  int scenes = 0;
  for (const auto& entry : std::filesystem::directory_iterator(APE_SCENE_DIR)) {
    if (entry.path().extension() != ".json") continue;
    std::ifstream file(entry.path());
    std::stringstream text;
    text << file.rdbuf();
    const Json root = Json::parse(text.str(), nullptr, true, true);
    const std::string written = apescene::WriteSceneText(root);
    const Json back = Json::parse(written);
    EXPECT_EQ(back, root) << entry.path();
    EXPECT_EQ(back.dump(), root.dump()) << entry.path() << ": key order or number form changed";
    // Laid out as people write scenes: short lists on one line.
    if (root.contains("resolution")) {
      const std::string resolution =
          "\"resolution\": [" + std::to_string(root["resolution"][0].get<int>()) + ", ";
      EXPECT_NE(written.find(resolution), std::string::npos) << written;
    }
    ++scenes;
  }
  EXPECT_GE(scenes, 5);

  // Numbers that have no short decimal form keep every bit.
  const double awkward[] = {0.1 + 0.2, 1.0 / 3.0, 0.11f, -2.8e-3f, 1e-300, 123456789.123456789};
  for (const double number : awkward) {
    const Json back = Json::parse(apescene::WriteSceneText(Json::object({{"x", number}})));
    const double read = back["x"].get<double>();
    EXPECT_EQ(std::memcmp(&read, &number, sizeof read), 0) << number;
  }
}

}  // namespace
}  // namespace apestudio
