#include "tools/scene/scene_warning.h"

namespace apescene {

std::string FormatWarning(const std::string& source_name, const SceneWarning& warning) {
  std::string text = source_name;
  if (warning.Line > 0) text += ":" + std::to_string(warning.Line);
  text += ": ";
  if (!warning.Path.IsRoot()) text += warning.Path.Text() + ": ";
  return text + "warning: " + warning.Message;
}

}  // namespace apescene
