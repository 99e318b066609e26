// A host for scene tests: its own context (current while it lives), the test clock, the
// reference device behind a device channel, and a plug-in loader.
#pragma once

#include <memory>
#include <string>

#include "host/device_channel.h"
#include "host/host_context.h"
#include "host/plugin_loader.h"
#include "platform/memory_device.h"
#include "platform/windows_types.h"
#include "tools/scene/scene_loader.h"

namespace scenetest {

class TestHost {
 public:
  TestHost();
  ~TestHost();

  // Loads `text` as "test.json" from `base_directory`; null with *error on failure.
  std::unique_ptr<apescene::Scene> Load(const std::string& text, std::string* error,
                                        const std::string& base_directory = "");
  // The one-line message LoadScene gives for `text` (empty when it loads).
  std::string ErrorOf(const std::string& text, const std::string& base_directory = "");

  Qen_HostContext Context;
  Qen_HostContext::ScopedCurrent Current{&Context};
  TestClock Clock;
  MemoryDevice* Device;
  std::unique_ptr<Tev_DX8_DeviceChannel> DeviceChannel;
  PluginLoader Loader;
};

// A scene with one channel definition, "thing", given as JSON text, e.g. R"({"type": "Value",
// "value": 3})".
std::string WithChannel(const std::string& definition);
// A scene with an emitter "fx" whose links are `links` (JSON object text) and extra channels
// (JSON members text, may be empty).
std::string WithEmitterLinks(const std::string& links, const std::string& extra_channels = "");

// A fresh empty folder under the system's temporary folder, removed with the object.
class TempFolder {
 public:
  TempFolder();
  ~TempFolder();
  const std::string& Path() const { return path_; }
  std::string File(const std::string& name) const { return path_ + "/" + name; }

 private:
  std::string path_;
};

}  // namespace scenetest
