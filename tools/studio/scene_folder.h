// The one folder the studio reads and writes: the scene's own. A name given by the page is
// accepted only as a plain relative path that stays inside it, also after following links.
#pragma once

#include <filesystem>
#include <string>

namespace apestudio {

class SceneFolder {
 public:
  explicit SceneFolder(const std::filesystem::path& folder);

  // The full path of `relative` inside the folder, or empty with the reason in *error: empty
  // names, absolute paths, "..", backslashes, control characters, and names whose existing part
  // leads out of the folder through a symbolic link are refused.
  std::filesystem::path Resolve(const std::string& relative, std::string* error) const;

  const std::filesystem::path& Path() const { return folder_; }

 private:
  std::filesystem::path folder_;  // canonical
};

}  // namespace apestudio
