#include "tools/studio/scene_folder.h"

namespace apestudio {
namespace {

constexpr std::size_t kMaximumNameLength = 255;

bool Inside(const std::filesystem::path& folder, const std::filesystem::path& path) {
  auto f = folder.begin();
  auto p = path.begin();
  for (; f != folder.end(); ++f, ++p)
    if (p == path.end() || *f != *p) return false;
  return true;
}

}  // namespace

SceneFolder::SceneFolder(const std::filesystem::path& folder) {
  std::error_code ec;
  folder_ = std::filesystem::weakly_canonical(std::filesystem::absolute(folder, ec), ec);
}

std::filesystem::path SceneFolder::Resolve(const std::string& relative, std::string* error) const {
  if (relative.empty() || relative.size() > kMaximumNameLength) {
    *error = "a file name of 1 to 255 characters is needed";
    return {};
  }
  for (const char c : relative) {
    if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F || c == '\\' || c == ':') {
      *error = "the file name holds a character that is not allowed";
      return {};
    }
  }
  const std::filesystem::path path(relative);
  if (path.is_absolute()) {
    *error = "only names inside the scene's folder are allowed, not absolute paths";
    return {};
  }
  for (const auto& part : path) {
    if (part == ".." || part == ".") {
      *error = "\"..\" and \".\" are not allowed in file names";
      return {};
    }
  }
  // Follows every link of the part that exists, so a link pointing out of the folder is seen.
  std::error_code ec;
  const std::filesystem::path full = std::filesystem::weakly_canonical(folder_ / path, ec);
  if (ec || !Inside(folder_, full) || full == folder_) {
    *error = "the name leads out of the scene's folder";
    return {};
  }
  return full;
}

}  // namespace apestudio
