// Built-in particle images, white with the shape in alpha, so that the vertex colour tints them.
#pragma once

#include <string>
#include <vector>

#include "tools/scene/image.h"

namespace apescene {

// The names MakeProceduralImage knows: "dot" (a soft round dot), "spark" (a hot core with four
// rays), "ring" (a soft ring), "puff" (a soft cloudy dot for smoke).
const std::vector<std::string>& ProceduralImageNames();
// A size x size picture; false for an unknown name.
bool MakeProceduralImage(const std::string& name, int size, Image* image);

}  // namespace apescene
