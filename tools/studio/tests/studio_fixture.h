// A studio on a copy of an example scene in a folder of its own, so that saves and exports land
// there, on the reference device (fast, no pictures) or the OpenGL one.
#pragma once

#include <filesystem>
#include <memory>
#include <string>

#include "tools/studio/studio_engine.h"

namespace studiotest {

class ScratchFolder {
 public:
  ScratchFolder();
  ~ScratchFolder();
  const std::filesystem::path& Path() const { return path_; }

 private:
  std::filesystem::path path_;
};

// An engine opened on a copy of scenes/<scene> (paused on frame 1), or a failed test.
std::unique_ptr<apestudio::StudioEngine> OpenStudio(const ScratchFolder& folder,
                                                    const std::string& scene,
                                                    const std::string& device);

// Runs the engine's own work (frames, export) until `done` or `limit` ticks have passed.
template <typename Done>
bool TickUntil(apestudio::StudioEngine& engine, Done done, int limit) {
  for (int i = 0; i < limit && !done(); ++i) engine.Tick();
  return done();
}

}  // namespace studiotest
