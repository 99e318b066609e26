// ape-studio: edits a scene live in the browser. Starts a local web server on the scene (or the
// built-in fountain), prints the address to open, and serves until interrupted.
//
// Exit status: 0 stopped by a signal; 1 the device or the server failed; 2 a bad command line or
// scene file.
#include <CLI/CLI.hpp>
#include <csignal>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

#include "tools/render/default_scene.h"
#include "tools/studio/request_guard.h"
#include "tools/studio/studio_api.h"
#include "tools/studio/studio_engine.h"
#include "tools/studio/studio_server.h"

namespace {

constexpr int kExitFailure = 1;
constexpr int kExitBadInput = 2;
constexpr char kChartJs[] = "/usr/share/javascript/chart.js/chart.min.js";

struct Options {
  std::string scene;
  std::string host = "127.0.0.1";
  int port = 0;
  std::string device = "gl";
  bool paused = false;
};

int Fail(int status, const std::string& message) {
  std::fprintf(stderr, "ape-studio: %s\n", message.c_str());
  return status;
}

std::string ReadText(const char* path) {
  std::ifstream file(path, std::ios::binary);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

bool Loopback(const std::string& host) {
  return host == "127.0.0.1" || host == "localhost" || host == "::1";
}

int Serve(const Options& options) {
  apestudio::StudioOptions studio;
  std::string error;
  if (options.scene.empty()) {
    studio.Source.Text = aperender::DefaultSceneText();
    studio.Source.DisplayName = aperender::kDefaultSceneName;
    studio.Folder = std::filesystem::current_path().string();
    studio.SaveName = "my_fountain.json";
  } else {
    if (!apescene::ReadSceneFile(options.scene, &studio.Source, &error))
      return Fail(kExitBadInput, error);
    const std::filesystem::path path(options.scene);
    studio.Folder = std::filesystem::absolute(path).parent_path().string();
    studio.SaveName = path.filename().string();
  }
  studio.DeviceKind = options.device;

  // Signals are taken by one thread of their own, so that the server can be stopped cleanly.
  sigset_t signals;
  sigemptyset(&signals);
  sigaddset(&signals, SIGINT);
  sigaddset(&signals, SIGTERM);
  pthread_sigmask(SIG_BLOCK, &signals, nullptr);

  apestudio::StudioEngine engine(studio);
  if (!engine.Open(&error))
    return Fail(error.rfind("no device", 0) == 0 ? kExitFailure : kExitBadInput, error);
  engine.SetPlaying(!options.paused);

  std::vector<std::string> hosts = {options.host};
  if (options.host == "127.0.0.1") hosts.push_back("localhost");
  apestudio::RequestGuard guard(apestudio::RequestGuard::NewToken(), hosts, 0);
  apestudio::StudioApi api(engine, guard, ReadText(kChartJs));
  apestudio::StudioServer server(engine, api);
  const int port = server.Bind(options.host, options.port, &error);
  if (port < 0) return Fail(kExitFailure, error);
  guard.SetPort(port);
  if (!Loopback(options.host))
    std::fprintf(stderr,
                 "ape-studio: warning: listening on %s, not only this machine: anyone who can "
                 "reach it and learns the address can edit and save files in %s\n",
                 options.host.c_str(), studio.Folder.c_str());

  engine.Start();
  std::thread stopper([&] {
    int signal = 0;
    sigwait(&signals, &signal);
    server.Stop();
  });
  const std::string shown =
      options.host.find(':') != std::string::npos ? "[" + options.host + "]" : options.host;
  std::printf("ape-studio: open http://%s:%d/?token=%s\n", shown.c_str(), port,
              guard.Token().c_str());
  std::printf("ape-studio: editing %s; saves go to %s (Ctrl+C stops)\n",
              studio.Source.DisplayName.c_str(), studio.Folder.c_str());
  std::fflush(stdout);
  server.Serve();
  // Serve returns once stopped by a signal; a failed listen ends it too, and then the stopper is
  // woken by a signal of our own.
  pthread_kill(stopper.native_handle(), SIGTERM);
  stopper.join();
  engine.Stop();
  return 0;
}

}  // namespace

int main(int argc, char** argv) {
  Options options;
  CLI::App app{
      "Edits a particle scene live in the browser: a viewport, the channels' links, "
      "curves, plots, save and export."};
  app.footer(
      "Without SCENE the built-in fountain is opened (saved as my_fountain.json in the current "
      "folder). Files are read and written only in the scene's folder.\n"
      "Open the printed address (it holds a random token) in a browser on this machine.\n"
      "Exit status: 0 stopped, 1 device or server failure, 2 bad command line or scene file.");
  app.add_option("SCENE", options.scene, "scene file (JSON)");
  app.add_option("--host", options.host,
                 "address to listen on (default 127.0.0.1: this machine only)");
  app.add_option("--port", options.port, "port (default 0: any free one)")
      ->check(CLI::Range(0, 65535));
  app.add_option("--device", options.device, "gl or null")->check(CLI::IsMember({"gl", "null"}));
  app.add_flag("--paused", options.paused, "start paused on the first frame");
  try {
    app.parse(argc, argv);
  } catch (const CLI::Success& e) {
    return app.exit(e);
  } catch (const CLI::ParseError& e) {
    app.exit(e);
    return kExitBadInput;
  }
  try {
    return Serve(options);
  } catch (const std::exception& e) {
    return Fail(kExitFailure, e.what());
  }
}
