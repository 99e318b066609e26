// A small caption burnt into a picture's top-left corner, so that every tile of a contact sheet
// says which frame and which moment it shows.
#pragma once

#include <string>

#include "tools/scene/image.h"

namespace aperender {

// "frame 12  0.40 s"
std::string TileCaption(int frame, double seconds);

// Writes `text` (digits, '.', ' ' and the letters of TileCaption; others stay blank) in white on
// a dark box at the top-left corner, each font pixel `scale` pixels wide; clipped to the picture.
void DrawCaption(apescene::Image* picture, const std::string& text, int scale);

}  // namespace aperender
