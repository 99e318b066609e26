// A picture in memory: A8R8G8B8 pixels, top row first.
#pragma once

#include <cstdint>
#include <vector>

namespace apescene {

struct Image {
  int Width = 0;
  int Height = 0;
  std::vector<std::uint32_t> Argb;  // Width * Height
};

// A box-filtered copy at most `max_width` wide, shrunk by a whole factor (the picture itself when
// it already fits).
Image ShrinkToWidth(const Image& image, int max_width);

}  // namespace apescene
