// Writes a scene document back as a scene file: the same JSON, laid out as the example scenes
// are (short arrays and objects on one line, two-space indents). Numbers keep every bit: a
// float is written with as many digits as it takes to read back the same double.
#pragma once

#include <string>

#include "tools/scene/json_values.h"

namespace apescene {

std::string WriteSceneText(const Json& root);

}  // namespace apescene
