// A contact sheet: a grid of evenly spaced frames of a render in one picture.
#pragma once

#include <vector>

#include "tools/scene/image.h"

namespace aperender {

// The frames (from 1) that a sheet of at most `cells` pictures shows out of `frames`: evenly
// spaced, the last frame last, none twice.
std::vector<int> ContactSheetFrames(int frames, int cells);

// Pictures of equal size, left to right and top to bottom, `columns` to a row, with a gap of
// `gap` pixels of `gap_color` around and between them.
apescene::Image BuildContactSheet(const std::vector<apescene::Image>& pictures, int columns,
                                  int gap, std::uint32_t gap_color);

}  // namespace aperender
