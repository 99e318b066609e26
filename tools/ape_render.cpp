// ape-render: renders a scene file (or the built-in fountain) with the particle emitter through a
// real device, and leaves numbered frames, a contact sheet, a GIF preview and per-frame
// statistics in a folder.
//
// Exit status: 0 done; 1 the device or the output failed; 2 a bad command line or scene file
// (then nothing is written).
#include <unistd.h>
#include <CLI/CLI.hpp>

#include <algorithm>
#include <chrono>
#include <cmath>
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
#include "tools/scene/link_reference.h"
#include "tools/scene/link_reference_text.h"
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
  bool check = false;                     // load and check only
  std::optional<std::string> list_links;  // a channel type, or empty for every type
  std::optional<double> at;               // seconds: render only the frame shown then
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

int ListLinks(const std::string& type) {
  std::string text;
  for (std::string_view known : apescene::KnownChannelTypes())
    if (type.empty() || type == known)
      text += (text.empty() ? "" : "\n") + apescene::LinkListing(known);
  if (text.empty()) {
    std::string known;
    for (std::string_view name : apescene::KnownChannelTypes())
      known += (known.empty() ? "" : ", ") + std::string(name);
    return Fail(kExitBadInput,
                "--list-links: no links known for \"" + type + "\" (known: " + known + ")");
  }
  std::fputs(text.c_str(), stdout);
  return 0;
}

// --check: the warnings on stdout, one a line, then how many.
int ReportCheck(const apescene::Scene& scene) {
  for (const apescene::SceneWarning& warning : scene.Warnings)
    std::printf("%s\n", apescene::FormatWarning(scene.SourceName, warning).c_str());
  const std::size_t count = scene.Warnings.size();
  std::printf("%s: %s\n", scene.SourceName.c_str(),
              count == 0
                  ? "no warnings"
                  : (std::to_string(count) + (count == 1 ? " warning" : " warnings")).c_str());
  return 0;
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
  // The frame that shows the moment asked for; the frames before it run all the same.
  if (options.at)
    settings.Frames = std::max(1, static_cast<int>(std::lround(*options.at * settings.Fps)));
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

  const std::string device_kind = options.check ? "null" : options.device;
  std::unique_ptr<aperender::RenderDevice> device =
      aperender::RenderDevice::Create(device_kind, settings.Width, settings.Height, &error);
  if (device == nullptr)
    return Fail(
        kExitFailure,
        "no device: " + error +
            (options.device == "gl" ? " (--device null renders statistics without pixels)" : ""));
  Tev_DX8_DeviceChannel device_channel(device->Device());

  PluginLoader loader;
  std::unique_ptr<apescene::Scene> scene = apescene::LoadScene(source, loader, &error);
  if (scene == nullptr) return Fail(kExitBadInput, error);
  if (options.check) return ReportCheck(*scene);
  if (!options.quiet)
    for (const apescene::SceneWarning& warning : scene->Warnings)
      std::fprintf(stderr, "ape-render: %s\n",
                   apescene::FormatWarning(scene->SourceName, warning).c_str());

  aperender::RenderOutput output;
  const std::string folder = options.out.empty() ? DefaultOutFolder(options.scene) : options.out;
  if (!output.Open(folder, frames, settings.Fps, options.device == "gl", &error,
                   options.at ? frames : 0))
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
  if (options.at) facts.OnlyFrameFile = aperender::RenderOutput::FrameFileName(frames, frames);
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
      "Scene format: docs/scene-format.md; every link: docs/links.md or --list-links.");
  app.add_option("SCENE", options.scene, "scene file (JSON)");
  app.add_option("--frames", options.frames, "number of frames (default: the scene's)")
      ->check(CLI::Range(1, 1'000'000));
  app.add_option("--fps", options.fps, "frames per second of scene time (default: the scene's)")
      ->check(CLI::Range(0.001, 1000.0));
  app.add_option("--size", options.size, "picture size WIDTHxHEIGHT (default: the scene's)");
  app.add_option("--out", options.out, "output folder (default: out/<scene name>)");
  app.add_option("--device", options.device, "gl or null")->check(CLI::IsMember({"gl", "null"}));
  app.add_option("--seed", options.seed, "seed for rand (default: the scene's)");
  app.add_flag("--quiet", options.quiet,
               "no progress, no scene warnings and no emitter messages on stderr");
  app.add_flag("--check", options.check,
               "only load SCENE and print its warnings (likely mistakes), one a line: exit 0 "
               "with or without warnings, 2 when the scene does not load");
  app.add_option("--list-links", options.list_links,
                 "print every link of a channel type (AdvancedParticleEmitter, "
                 "MultiCollisionManager, AdvPE_Attractor, AdvPE_SmokeSettings; all without "
                 "TYPE): index, type, unit, default and meaning")
      ->expected(0, 1)
      ->type_name("[TYPE]");
  app.add_option("--at", options.at,
                 "render only the frame that shows this moment (frame_NNNN.png and stats.csv; "
                 "the frames before it are simulated)")
      ->check(CLI::Range(0.0, 3600.0));
  try {
    app.parse(argc, argv);
  } catch (const CLI::Success& e) {
    return app.exit(e);
  } catch (const CLI::ParseError& e) {
    app.exit(e);
    return kExitBadInput;
  }
  try {
    if (options.list_links) return ListLinks(*options.list_links);
    return Render(options);
  } catch (const std::exception& e) {
    return Fail(kExitFailure, e.what());
  }
}
