// A likely mistake in a scene that still loads: a message for people, tied to the place in the
// document it is about, written like a loader error with "warning:" before the message.
#pragma once

#include <string>

#include "tools/scene/doc_path.h"

namespace apescene {

struct SceneWarning {
  DocPath Path;  // the root when the warning is about the whole scene
  int Line = 0;  // 1-based; 0 when unknown
  std::string Message;
};

// "<source>:<line>: <path>: warning: <message>", the line and the path left out when unknown.
std::string FormatWarning(const std::string& source_name, const SceneWarning& warning);

}  // namespace apescene
