// The scene check: likely mistakes in a scene that loads but would render something other than
// what its author meant (black or invisible particles, no births, frozen particles, links that
// do nothing, sizes and units that surprise). LoadScene runs it on every load (Scene::Warnings);
// `ape-render --check` runs the load alone; the studio calls it again after an edit.
#pragma once

#include <vector>

#include "tools/scene/scene.h"
#include "tools/scene/scene_warning.h"

namespace apescene {

// One warning per mistake, in document order (by line), including what the loader noticed while
// reading (Scene::LoadWarnings). Value links are judged over the whole shot when their values
// are animated, by their present values otherwise.
std::vector<SceneWarning> CheckScene(const Scene& scene);

}  // namespace apescene
