// ape-render: renders a scene file (or the built-in fountain) with the particle emitter through a
// real device, and leaves numbered frames, a contact sheet, a GIF preview and per-frame
// statistics in a folder.
//
// Exit status: 0 done; 1 the device or the output failed; 2 a bad command line or scene file
// (then nothing is written).
#include <unistd.h>
#include <CLI/CLI.hpp>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <map>
#include <memory>
#include <optional>
#include <regex>
#include <string>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/plugin_loader.h"
#include "platform/windows_types.h"
#include "tools/render/default_scene.h"
#include "tools/render/progress.h"
#include "tools/render/render_device.h"
#include "tools/render/render_output.h"
#include "tools/render/scene_renderer.h"
#include "tools/render/summary.h"
#include "tools/scene/scene_loader.h"

namespace {

constexpr int kExitFailure = 1;
constexpr int kExitBadInput = 2;

struct Options {
  std::string scene;
  std::optional<int> frames;
  std::optional<double> fps;
  std::string size;
  std::string out;
  std::string device = "gl";
  std::optional<unsigned> seed;
  bool quiet = false;
};

int Fail(int status, const std::string& message) {
  std::fprintf(stderr, "ape-render: %s\n", message.c_str());
  return status;
}

// "WxH" into width and height.
bool ParseSize(const std::string& text, int* width, int* height) {
  static const std::regex kSize(R"((\d{1,5})x(\d{1,5}))");
  std::smatch match;
  if (!std::regex_match(text, match, kSize)) return false;
  *width = std::stoi(match[1]);
  *height = std::stoi(match[2]);
  return *width >= 1 && *height >= 1 && *width <= 8192 && *height <= 8192;
}

std::string DefaultOutFolder(const std::string& scene) {
  if (scene.empty()) return "out/fountain";
  return "out/" + std::filesystem::path(scene).stem().string();
}

int Render(const Options& options) {
  // The scene's settings first, so that the device is made at the right size.
  apescene::SceneSource source;
  std::string error;
  if (options.scene.empty()) {
    source.Text = aperender::DefaultSceneText();
    source.DisplayName = aperender::kDefaultSceneName;
  } else if (!apescene::ReadSceneFile(options.scene, &source, &error)) {
    return Fail(kExitBadInput, error);
  }
  apescene::RenderSettings settings;
  if (!apescene::ReadSceneSettings(source, &settings, &error)) return Fail(kExitBadInput, error);
  if (options.frames) settings.Frames = *options.frames;
  if (options.fps) settings.Fps = *options.fps;
  if (options.seed) settings.Seed = *options.seed;
  if (!options.size.empty() && !ParseSize(options.size, &settings.Width, &settings.Height))
    return Fail(kExitBadInput,
                "--size: expected WIDTHxHEIGHT (1 to 8192 each), got \"" + options.size + "\"");
  const int frames = settings.FrameCount();

  Qen_HostContext context;
  Qen_HostContext::ScopedCurrent current(&context);
  std::map<std::string, int> messages;
  int message_count = 0;
  // Each distinct message once; on a terminal it starts below the progress bar.
  const char* line_start = isatty(STDERR_FILENO) ? "\n" : "";
  auto collect = [&](const char* text) {
    ++message_count;
    if (messages[text]++ == 0 && !options.quiet)
      std::fprintf(stderr, "%sape-render: emitter message: %s\n", line_start, text);
  };
  context.DebugMessages.SetSink(collect);
  context.OverloadMessages.SetSink(collect);
  TestClock clock;

  std::unique_ptr<aperender::RenderDevice> device =
      aperender::RenderDevice::Create(options.device, settings.Width, settings.Height, &error);
  if (device == nullptr)
    return Fail(
        kExitFailure,
        "no device: " + error +
            (options.device == "gl" ? " (--device null renders statistics without pixels)" : ""));
  Tev_DX8_DeviceChannel device_channel(device->Device());

  PluginLoader loader;
  std::unique_ptr<apescene::Scene> scene = apescene::LoadScene(source, loader, &error);
  if (scene == nullptr) return Fail(kExitBadInput, error);

  aperender::RenderOutput output;
  const std::string folder = options.out.empty() ? DefaultOutFolder(options.scene) : options.out;
  if (!output.Open(folder, frames, settings.Fps, options.device == "gl", &error))
    return Fail(kExitFailure, error);

  aperender::SceneRenderer renderer(*scene, *device, context, clock, settings.Width,
                                    settings.Height, settings.Fps, settings.Seed);
  aperender::Progress progress(aperender::Progress::ChooseMode(options.quiet), frames, stderr);
  const auto start = std::chrono::steady_clock::now();
  renderer.Prime();
  for (int frame = 1; frame <= frames; ++frame) {
    if (!output.AddFrame(renderer.RenderFrame(frame), &error)) {
      progress.Finish();
      return Fail(kExitFailure, error);
    }
    progress.FrameDone(frame);
  }
  progress.Finish();
  if (!output.Finish(&error)) return Fail(kExitFailure, error);

  aperender::SummaryFacts facts;
  facts.SceneName = scene->SourceName;
  facts.Width = settings.Width;
  facts.Height = settings.Height;
  facts.Fps = settings.Fps;
  facts.Seed = settings.Seed;
  facts.Device = device->Description();
  facts.WallSeconds =
      std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
  facts.Messages = message_count;
  facts.Folder = folder;
  facts.FramesWritten = output.FramesWritten();
  std::printf("%s\n", aperender::RenderSummary(facts, output.Stats().Summarise()).c_str());
  scene.reset();  // its channels go before the loader unloads their libraries
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  Options options;
  CLI::App app{
      "Renders a particle scene with the Advanced Particle Emitter and writes numbered frames "
      "(frame_0001.png...), contact_sheet.png, preview.gif and stats.csv into a folder."};
  app.footer(
      "Without SCENE the built-in fountain is rendered. Options given here override the "
      "scene's own settings.\n"
      "--device gl draws real pixels through OpenGL (headless EGL; llvmpipe without a GPU).\n"
      "--device null uses the reference device, which draws nothing: no frames, contact sheet "
      "or preview are written, only stats.csv and the summary.\n"
      "Exit status: 0 done, 1 device or output failure, 2 bad command line or scene file.\n"
      "Scene format: docs/scene-format.md");
  app.add_option("SCENE", options.scene, "scene file (JSON)");
  app.add_option("--frames", options.frames, "number of frames (default: the scene's)")
      ->check(CLI::Range(1, 1'000'000));
  app.add_option("--fps", options.fps, "frames per second of scene time (default: the scene's)")
      ->check(CLI::Range(0.001, 1000.0));
  app.add_option("--size", options.size, "picture size WIDTHxHEIGHT (default: the scene's)");
  app.add_option("--out", options.out, "output folder (default: out/<scene name>)");
  app.add_option("--device", options.device, "gl or null")->check(CLI::IsMember({"gl", "null"}));
  app.add_option("--seed", options.seed, "seed for rand (default: the scene's)");
  app.add_flag("--quiet", options.quiet, "no progress and no emitter messages on stderr");
  try {
    app.parse(argc, argv);
  } catch (const CLI::Success& e) {
    return app.exit(e);
  } catch (const CLI::ParseError& e) {
    app.exit(e);
    return kExitBadInput;
  }
  try {
    return Render(options);
  } catch (const std::exception& e) {
    return Fail(kExitFailure, e.what());
  }
}
