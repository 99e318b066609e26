// What the inspector shows: every named channel of the scene with its type, its own settings
// from the document, and each link the channel declares, by its own name, with the kind of
// field that fits the link's type, the value the document gives it and the channels that could
// be linked there.
#pragma once

#include "tools/scene/json_values.h"
#include "tools/scene/scene.h"

namespace apestudio {

// {"channels": [{"name", "type", "settings", "links": [{"index", "name", "key", "type", "kind",
// "many", "value", "choices", and from the link reference "group", "unit", "default", "help"}]}]}.
// `kind` is "number", "yesno", "vector", "matrix", "envelope" or "channel".
apescene::Json DescribeChannels(const apescene::Scene& scene, const apescene::Json& document);

}  // namespace apestudio
