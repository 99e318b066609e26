#include "tests/scene_test_host.h"

#include <filesystem>
#include <random>

namespace scenetest {

TestHost::TestHost() : Device(MemoryDevice::Create()) {
  DeviceChannel = std::make_unique<Tev_DX8_DeviceChannel>(Device);
  Context.DebugMessages.SetSink([](const char*) {});
  Context.OverloadMessages.SetSink([](const char*) {});
}

TestHost::~TestHost() {
  DeviceChannel.reset();
  Device->Release();
}

std::unique_ptr<apescene::Scene> TestHost::Load(const std::string& text, std::string* error,
                                                const std::string& base_directory) {
  apescene::SceneSource source;
  source.Text = text;
  source.DisplayName = "test.json";
  source.BaseDirectory = base_directory;
  return apescene::LoadScene(source, Loader, error);
}

std::string TestHost::ErrorOf(const std::string& text, const std::string& base_directory) {
  std::string error;
  const std::unique_ptr<apescene::Scene> scene = Load(text, &error, base_directory);
  return scene == nullptr ? error : std::string();
}

std::string WithChannel(const std::string& definition) {
  return "{\"channels\": {\"thing\": " + definition + "}}";
}

std::string WithEmitterLinks(const std::string& links, const std::string& extra_channels) {
  return "{\"channels\": {" + (extra_channels.empty() ? "" : extra_channels + ", ") +
         "\"fx\": {\"type\": \"AdvancedParticleEmitter\", \"links\": " + links + "}}}";
}

TempFolder::TempFolder() {
  std::random_device random;
  path_ = (std::filesystem::temp_directory_path() /
           ("ape-scene-test-" + std::to_string(random()) + std::to_string(random())))
              .string();
  std::filesystem::create_directories(path_);
}

TempFolder::~TempFolder() {
  std::error_code ec;
  std::filesystem::remove_all(path_, ec);
}

}  // namespace scenetest
