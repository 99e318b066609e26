// Each example scene rendered small on the OpenGL device and compared with its checked-in
// golden picture (tests/golden/<scene>.png): four evenly spaced frames of the first two seconds
// in a 2 x 2 sheet. `make update-golden` (APE_UPDATE_GOLDEN=1) writes the pictures afresh
// instead, after a deliberate change of the picture. Skipped where no GL context can be made.
#include <gtest/gtest.h>
#include <ostream>

#include <cstdlib>
#include <filesystem>
#include <optional>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/plugin_loader.h"
#include "platform/windows_types.h"
#include "tests/image_compare.h"
#include "tools/render/contact_sheet.h"
#include "tools/render/render_device.h"
#include "tools/render/scene_renderer.h"
#include "tools/scene/png_io.h"
#include "tools/scene/scene_loader.h"

namespace scenetest {
namespace {

// Mesa's shader disk cache runs a thread of its own that LeakSanitizer's check at exit can trip
// over (the check itself then crashes), and it would write into the user's cache folder; these
// small renders need no cache. Set before any GL driver is loaded; a value given outside stands.
[[maybe_unused]] const bool kNoShaderCache = [] {
  setenv("MESA_SHADER_CACHE_DISABLE", "true", 0);
  return true;
}();

constexpr int kWidth = 160;
constexpr int kHeight = 90;
constexpr int kFrames = 60;

std::string SceneFile(const std::string& name) {
  return std::string(APE_SOURCE_DIR) + "/scenes/" + name + ".json";
}
std::string GoldenFile(const std::string& name) {
  return std::string(APE_SOURCE_DIR) + "/tests/golden/" + name + ".png";
}
bool UpdatingGolden() {
  const char* update = std::getenv("APE_UPDATE_GOLDEN");
  return update != nullptr && std::string(update) == "1";
}

// The sheet of frames 15, 30, 45 and 60 of the scene, or nothing with the reason in *problem
// (*skip when the reason is that this machine has no GL).
std::optional<apescene::Image> RenderSheet(const apescene::SceneSource& source,
                                           std::string* problem, bool* skip) {
  *skip = false;
  apescene::RenderSettings settings;
  if (!apescene::ReadSceneSettings(source, &settings, problem)) return std::nullopt;
  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  context.DebugMessages.SetSink([](const char*) {});
  context.OverloadMessages.SetSink([](const char*) {});
  TestClock clock;
  std::unique_ptr<aperender::RenderDevice> device =
      aperender::RenderDevice::Create("gl", kWidth, kHeight, problem);
  if (device == nullptr) {
    *skip = true;
    return std::nullopt;
  }
  Tev_DX8_DeviceChannel device_channel(device->Device());
  PluginLoader loader;
  std::unique_ptr<apescene::Scene> scene = apescene::LoadScene(source, loader, problem);
  if (scene == nullptr) return std::nullopt;
  aperender::SceneRenderer renderer(*scene, *device, context, clock, kWidth, kHeight, settings.Fps,
                                    settings.Seed);
  renderer.Prime();
  const std::vector<int> shown = aperender::ContactSheetFrames(kFrames, 4);
  std::vector<apescene::Image> pictures;
  for (int frame = 1; frame <= kFrames; ++frame) {
    aperender::FrameResult result = renderer.RenderFrame(frame);
    if (std::find(shown.begin(), shown.end(), frame) != shown.end())
      pictures.push_back(std::move(result.Picture));
  }
  scene.reset();
  return aperender::BuildContactSheet(pictures, 2, 2, 0xFF000000u);
}

class VisualRegressionTest : public ::testing::TestWithParam<std::string> {};

TEST_P(VisualRegressionTest, MatchesTheGoldenPicture) {
  const std::string& name = GetParam();
  apescene::SceneSource source;
  std::string problem;
  ASSERT_TRUE(apescene::ReadSceneFile(SceneFile(name), &source, &problem)) << problem;
  bool skip = false;
  const std::optional<apescene::Image> sheet = RenderSheet(source, &problem, &skip);
  if (skip) GTEST_SKIP() << "no OpenGL context: " << problem;
  ASSERT_TRUE(sheet.has_value()) << problem;

  if (UpdatingGolden()) {
    ASSERT_TRUE(apescene::WritePng(GoldenFile(name), *sheet, false, &problem)) << problem;
    std::printf("wrote %s\n", GoldenFile(name).c_str());
    return;
  }
  apescene::Image golden;
  ASSERT_TRUE(apescene::ReadPng(GoldenFile(name), &golden, &problem))
      << problem << " (make update-golden writes it)";
  const ImageDifference difference = CompareImages(golden, *sheet);
  if (!difference.Matches()) {
    // Kept beside the test program for a look.
    const std::string actual = "visual_actual_" + name + ".png";
    apescene::WritePng(actual, *sheet, false, &problem);
    ADD_FAILURE() << name << ": " << difference.Describe() << "; this render is in "
                  << std::filesystem::absolute(actual).string()
                  << " (make update-golden accepts it)";
  }
}

INSTANTIATE_TEST_SUITE_P(Scenes, VisualRegressionTest,
                         ::testing::Values("fountain", "point_sprites", "wall_sparks",
                                           "smoke_ceiling", "attractor_swirl", "torus_emitter"));

// The comparison must catch real changes: the fountain with one setting changed no longer
// matches its golden picture, while the unchanged fountain matches it (above).
struct AlterationCase {
  const char* Name;
  const char* From;
  const char* To;
  // Failures name the case, not its bytes.
  friend void PrintTo(const AlterationCase& c, std::ostream* os) { *os << c.Name; }
};

class AlteredSceneTest : public ::testing::TestWithParam<AlterationCase> {};

TEST_P(AlteredSceneTest, FailsTheComparison) {
  if (UpdatingGolden()) GTEST_SKIP() << "updating the golden pictures";
  apescene::SceneSource source;
  std::string problem;
  ASSERT_TRUE(apescene::ReadSceneFile(SceneFile("fountain"), &source, &problem)) << problem;
  const std::size_t at = source.Text.find(GetParam().From);
  ASSERT_NE(at, std::string::npos) << "the fountain no longer has " << GetParam().From;
  source.Text.replace(at, std::string(GetParam().From).size(), GetParam().To);
  bool skip = false;
  const std::optional<apescene::Image> sheet = RenderSheet(source, &problem, &skip);
  if (skip) GTEST_SKIP() << "no OpenGL context: " << problem;
  ASSERT_TRUE(sheet.has_value()) << problem;
  apescene::Image golden;
  ASSERT_TRUE(apescene::ReadPng(GoldenFile("fountain"), &golden, &problem)) << problem;
  const ImageDifference difference = CompareImages(golden, *sheet);
  EXPECT_FALSE(difference.Matches()) << difference.Describe();
}

INSTANTIATE_TEST_SUITE_P(
    Fountain, AlteredSceneTest,
    ::testing::Values(AlterationCase{"FewerBirths", R"("Births Per Second": 450)",
                                     R"("Births Per Second": 300)"},
                      AlterationCase{"GreenerSparks",
                                     R"("Green Color Envelope": [[0, 240], [0.5, 160], [1, 70]])",
                                     R"("Green Color Envelope": [[0, 240], [0.5, 240], [1, 240]])"},
                      AlterationCase{"AnotherSeed", R"("seed": 1)", R"("seed": 2)"}),
    [](const ::testing::TestParamInfo<AlterationCase>& info) { return info.param.Name; });

TEST(ImageCompareTest, ThresholdsSeparateNoiseFromChange) {
  apescene::Image a{100, 100, std::vector<std::uint32_t>(10000, 0xFF202020u)};
  apescene::Image b = a;
  for (int i = 0; i < 50; ++i) b.Argb[static_cast<std::size_t>(i)] = 0xFFFFFFFFu;     // 0.5%
  for (int i = 50; i < 5000; ++i) b.Argb[static_cast<std::size_t>(i)] = 0xFF202038u;  // within 24
  EXPECT_TRUE(CompareImages(a, b).Matches());
  EXPECT_EQ(CompareImages(a, b).DifferingPixels, 50);
  b.Argb[60] = 0xFF202039u;  // one more, 25 away
  EXPECT_FALSE(CompareImages(a, b).Matches());
  EXPECT_FALSE(CompareImages(a, apescene::Image{100, 99, {}}).Matches());
}

}  // namespace
}  // namespace scenetest
