// The ape-render program as a user meets it: exit statuses, messages, and what it leaves in the
// output folder (nothing at all when the scene is broken).
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <sstream>

#include "tests/scene_test_host.h"
#include "tools/scene/png_io.h"

namespace scenetest {
namespace {

struct RunResult {
  int Status;
  std::string Out;
  std::string Err;
};

std::string ReadFile(const std::string& path) {
  std::ostringstream text;
  text << std::ifstream(path).rdbuf();
  return text.str();
}

class ApeRenderTest : public ::testing::Test {
 protected:
  RunResult Render(const std::string& arguments, const std::string& environment = "") {
    const std::string command = environment + " " + std::string(APE_RENDER_PROGRAM) + " " +
                                arguments + " --out " + Out() + " >" + folder_.File("stdout") +
                                " 2>" + folder_.File("stderr") + " </dev/null";
    const int status = std::system(command.c_str());
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, ReadFile(folder_.File("stdout")),
            ReadFile(folder_.File("stderr"))};
  }
  std::string Scene(const std::string& text) {
    std::ofstream(folder_.File("scene.json")) << text;
    return folder_.File("scene.json");
  }
  std::string Out() const { return folder_.File("out"); }

  TempFolder folder_;
};

TEST_F(ApeRenderTest, BrokenSceneFailsWithStatusTwoAndWritesNothing) {
  const std::string scene = Scene(
      "{\"channels\": {\n  \"fx\": {\"type\": \"AdvancedParticleEmitter\",\n"
      "    \"links\": {\"Births Per Second\": \"lots\"}}}}");
  const RunResult run = Render(scene + " --device null");
  EXPECT_EQ(run.Status, 2);
  EXPECT_EQ(run.Err, "ape-render: " + scene +
                         ":3: channels.fx.links.\"Births Per Second\": expected a number, got a "
                         "string (\"lots\" names no channel)\n");
  EXPECT_EQ(run.Out, "");
  EXPECT_FALSE(std::filesystem::exists(Out()));
}

TEST_F(ApeRenderTest, BadCommandLineFailsWithStatusTwo) {
  for (const char* arguments : {"--size 640by360 --device null", "--device vulkan", "--frames 0",
                                "/nonexistent/scene.json --device null"})
    EXPECT_EQ(Render(arguments).Status, 2) << arguments;
  EXPECT_FALSE(std::filesystem::exists(Out()));
}

TEST_F(ApeRenderTest, OptionsOverrideTheSceneAndTheNullDeviceWritesStatsOnly) {
  const std::string scene =
      Scene(R"({"resolution": [100, 50], "fps": 10, "frames": 2, "seed": 3})");
  const RunResult run =
      Render(scene + " --device null --quiet --fps 20 --frames 4 --seed 9 --size 64x32");
  ASSERT_EQ(run.Status, 0) << run.Err;
  EXPECT_EQ(run.Err, "");  // quiet
  EXPECT_EQ(run.Out.rfind("Rendered 4 frames of " + scene +
                              " (0.20 s of scene time at 20 fps, seed 9) at 64x32 on the "
                              "reference device (no pixels)",
                          0),
            0u)
      << run.Out;
  const std::string stats = ReadFile(Out() + "/stats.csv");
  EXPECT_EQ(std::count(stats.begin(), stats.end(), '\n'), 5);  // header and four frames
  EXPECT_FALSE(std::filesystem::exists(Out() + "/frame_0001.png"));
  EXPECT_FALSE(std::filesystem::exists(Out() + "/preview.gif"));
}

TEST_F(ApeRenderTest, GlDeviceWritesFramesSheetPreviewAndStats) {
  // No shader cache: see visual_regression_test.cpp.
  const RunResult run =
      Render("--frames 3 --size 64x36 --quiet --device gl", "MESA_SHADER_CACHE_DISABLE=true");
  if (run.Status == 1 && run.Err.find("no device") != std::string::npos)
    GTEST_SKIP() << "no OpenGL context: " << run.Err;
  ASSERT_EQ(run.Status, 0) << run.Err;
  for (const char* name : {"frame_0001.png", "frame_0002.png", "frame_0003.png",
                           "contact_sheet.png", "preview.gif", "stats.csv"})
    EXPECT_TRUE(std::filesystem::exists(Out() + "/" + name)) << name;
  EXPECT_FALSE(std::filesystem::exists(Out() + "/frame_0004.png"));
  apescene::Image frame;
  std::string error;
  ASSERT_TRUE(apescene::ReadPng(Out() + "/frame_0003.png", &frame, &error)) << error;
  EXPECT_EQ(std::make_pair(frame.Width, frame.Height), std::make_pair(64, 36));
  EXPECT_NE(run.Out.find("Written to " + Out() + ": 3 frames"), std::string::npos) << run.Out;
}

TEST_F(ApeRenderTest, AtRendersTheOneFrameShowingThatMoment) {
  const RunResult run = Render("--at 0.1 --fps 30 --size 64x36 --quiet --device gl",
                               "MESA_SHADER_CACHE_DISABLE=true");
  if (run.Status == 1 && run.Err.find("no device") != std::string::npos)
    GTEST_SKIP() << "no OpenGL context: " << run.Err;
  ASSERT_EQ(run.Status, 0) << run.Err;
  // 0.1 s at 30 fps is frame 3; the frames before it run but are not written.
  EXPECT_TRUE(std::filesystem::exists(Out() + "/frame_0003.png"));
  for (const char* name : {"frame_0001.png", "frame_0002.png", "contact_sheet.png", "preview.gif"})
    EXPECT_FALSE(std::filesystem::exists(Out() + "/" + name)) << name;
  const std::string stats = ReadFile(Out() + "/stats.csv");
  EXPECT_EQ(std::count(stats.begin(), stats.end(), '\n'), 4);
  EXPECT_NE(run.Out.find("Written to " + Out() + ": frame_0003.png and stats.csv."),
            std::string::npos)
      << run.Out;
}

TEST_F(ApeRenderTest, CheckPrintsWarningsOnlyAndExitsZero) {
  const std::string scene = Scene(
      "{\"channels\": {\"fx\": {\"type\": \"AdvancedParticleEmitter\", \"links\": {\n"
      "  \"Emitter_Active?\": 1, \"Births Per Second\": 10, \"Logic Updates Per Second\": 60,\n"
      "  \"ParticleCount\": 10, \"Lifespan_Min\": 3, \"Lifespan_Max\": 1,\n"
      "  \"Emitter\": {\"shape\": \"disc\"}, \"LookAt\": \"camera.eye\",\n"
      "  \"Size Envelope\": [[0, 0.1]], \"Red Color Envelope\": [[0, 255]]}}}}");
  const RunResult run = Render(scene + " --check");
  EXPECT_EQ(run.Status, 0) << run.Err;
  EXPECT_EQ(run.Out, scene +
                         ":3: channels.fx.links.Lifespan_Min: warning: 3 s is above "
                         "\"Lifespan_Max\" (1 s): every particle lives Lifespan_Min and the "
                         "maximum is ignored\n" +
                         scene + ": 1 warning\n");
  EXPECT_FALSE(std::filesystem::exists(Out()));  // nothing rendered
  // Rendering prints the same warning on stderr.
  const RunResult rendered = Render(scene + " --device null --frames 1");
  ASSERT_EQ(rendered.Status, 0) << rendered.Err;
  EXPECT_NE(
      rendered.Err.find("ape-render: " + scene + ":3: channels.fx.links.Lifespan_Min: warning:"),
      std::string::npos)
      << rendered.Err;
  // A scene that does not load: its error, status 2.
  EXPECT_EQ(Render(Scene(R"({"fps": "fast"})") + " --check").Status, 2);
}

TEST_F(ApeRenderTest, ListLinksPrintsTheReference) {
  const RunResult one = Render("--list-links AdvPE_SmokeSettings");
  ASSERT_EQ(one.Status, 0) << one.Err;
  EXPECT_EQ(one.Out.rfind("AdvPE_SmokeSettings: 14 links, by group\n", 0), 0u) << one.Out;
  EXPECT_NE(one.Out.find("  3 \"Force Strength Envelope\" (EnvelopeStorage)"), std::string::npos);
  const RunResult all = Render("--list-links");
  ASSERT_EQ(all.Status, 0) << all.Err;
  for (const char* type : {"AdvancedParticleEmitter: 54 links", "MultiCollisionManager: 1 link",
                           "AdvPE_Attractor: 7 links", "AdvPE_SmokeSettings: 14 links"})
    EXPECT_NE(all.Out.find(type), std::string::npos) << type;
  const RunResult unknown = Render("--list-links Sparks");
  EXPECT_EQ(unknown.Status, 2);
  EXPECT_NE(unknown.Err.find("known: AdvancedParticleEmitter"), std::string::npos) << unknown.Err;
}

}  // namespace
}  // namespace scenetest
