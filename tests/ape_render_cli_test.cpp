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

}  // namespace
}  // namespace scenetest
