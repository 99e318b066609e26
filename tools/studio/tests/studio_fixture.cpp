#include "tools/studio/tests/studio_fixture.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>

namespace studiotest {

ScratchFolder::ScratchFolder() {
  std::string pattern = (std::filesystem::temp_directory_path() / "ape-studio-XXXXXX").string();
  const char* made = mkdtemp(pattern.data());
  if (made == nullptr) ADD_FAILURE() << "cannot make a scratch folder";
  path_ = std::filesystem::canonical(pattern);
}

ScratchFolder::~ScratchFolder() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

std::unique_ptr<apestudio::StudioEngine> OpenStudio(const ScratchFolder& folder,
                                                    const std::string& scene,
                                                    const std::string& device) {
  const std::filesystem::path copy = folder.Path() / scene;
  std::filesystem::copy_file(std::filesystem::path(APE_SCENE_DIR) / scene, copy,
                             std::filesystem::copy_options::overwrite_existing);
  apestudio::StudioOptions options;
  std::string error;
  if (!apescene::ReadSceneFile(copy.string(), &options.Source, &error)) {
    ADD_FAILURE() << error;
    return nullptr;
  }
  options.Folder = folder.Path().string();
  options.SaveName = scene;
  options.DeviceKind = device;
  auto engine = std::make_unique<apestudio::StudioEngine>(options);
  if (!engine->Open(&error)) {
    ADD_FAILURE() << error;
    return nullptr;
  }
  engine->SetPlaying(false);
  return engine;
}

}  // namespace studiotest
