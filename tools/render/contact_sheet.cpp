#include "tools/render/contact_sheet.h"

#include <algorithm>
#include <cmath>

namespace aperender {

std::vector<int> ContactSheetFrames(int frames, int cells) {
  std::vector<int> chosen;
  const int count = std::min(frames, cells);
  for (int i = 1; i <= count; ++i) {
    const int frame =
        static_cast<int>(std::lround(static_cast<double>(i) * frames / static_cast<double>(count)));
    if (chosen.empty() || frame > chosen.back()) chosen.push_back(frame);
  }
  return chosen;
}

apescene::Image BuildContactSheet(const std::vector<apescene::Image>& pictures, int columns,
                                  int gap, std::uint32_t gap_color) {
  apescene::Image sheet;
  if (pictures.empty() || columns <= 0) return sheet;
  const int cell_w = pictures.front().Width, cell_h = pictures.front().Height;
  const int count = static_cast<int>(pictures.size());
  const int cols = std::min(columns, count);
  const int rows = (count + cols - 1) / cols;
  sheet.Width = cols * cell_w + (cols + 1) * gap;
  sheet.Height = rows * cell_h + (rows + 1) * gap;
  sheet.Argb.assign(static_cast<std::size_t>(sheet.Width) * static_cast<std::size_t>(sheet.Height),
                    gap_color);
  for (int i = 0; i < count; ++i) {
    const apescene::Image& picture = pictures[static_cast<std::size_t>(i)];
    const int left = gap + (i % cols) * (cell_w + gap);
    const int top = gap + (i / cols) * (cell_h + gap);
    for (int y = 0; y < std::min(cell_h, picture.Height); ++y)
      std::copy_n(&picture.Argb[static_cast<std::size_t>(y) * picture.Width],
                  std::min(cell_w, picture.Width),
                  &sheet.Argb[static_cast<std::size_t>(top + y) * sheet.Width + left]);
  }
  return sheet;
}

}  // namespace aperender
