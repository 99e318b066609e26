// Reads a JSON scene into a host graph. See docs/scene-format.md for the format.
//
// The host context current at the call must already hold the device channel: textures are made
// on its device. Channels are created through `loader`, which must outlive the scene.
#pragma once

#include <memory>
#include <string>

#include "tools/scene/scene.h"

class PluginLoader;

namespace apescene {

struct SceneSource {
  std::string Text;           // the JSON text
  std::string DisplayName;    // used in messages: the file name, or e.g. "<built-in fountain>"
  std::string BaseDirectory;  // files named in the scene are relative to it
};

// The scene, or null with one line in *error: "<name>:<line>: <path>: <what is wrong>" (the
// line when known, the path when the fault lies inside the document).
std::unique_ptr<Scene> LoadScene(const SceneSource& source, PluginLoader& loader,
                                 std::string* error);
// Reads the file first; a file that cannot be read is reported the same way.
std::unique_ptr<Scene> LoadSceneFile(const std::string& path, PluginLoader& loader,
                                     std::string* error);

// A scene file's text, with its name and folder. False with "<path>: cannot open ...".
bool ReadSceneFile(const std::string& path, SceneSource* source, std::string* error);
// Only the render settings (resolution, fps, duration or frames, seed, background), so that a
// device of the right size exists before the scene's textures are made on it. Reports faults
// as LoadScene does, but only those of the settings and of the document's syntax.
bool ReadSceneSettings(const SceneSource& source, RenderSettings* settings, std::string* error);

}  // namespace apescene
