#include "tools/scene/image.h"

namespace apescene {

Image ShrinkToWidth(const Image& image, int max_width) {
  if (image.Width <= max_width || max_width <= 0) return image;
  const int factor = (image.Width + max_width - 1) / max_width;
  Image out;
  out.Width = image.Width / factor;
  out.Height = image.Height / factor;
  out.Argb.resize(static_cast<std::size_t>(out.Width) * static_cast<std::size_t>(out.Height));
  const std::uint32_t count = static_cast<std::uint32_t>(factor * factor);
  for (int y = 0; y < out.Height; ++y) {
    for (int x = 0; x < out.Width; ++x) {
      std::uint32_t sum[4] = {0, 0, 0, 0};
      for (int dy = 0; dy < factor; ++dy) {
        for (int dx = 0; dx < factor; ++dx) {
          const std::uint32_t p =
              image.Argb[static_cast<std::size_t>(y * factor + dy) * image.Width +
                         static_cast<std::size_t>(x * factor + dx)];
          for (int c = 0; c < 4; ++c) sum[c] += (p >> (8 * c)) & 0xFFu;
        }
      }
      std::uint32_t p = 0;
      for (int c = 0; c < 4; ++c) p |= ((sum[c] + count / 2) / count) << (8 * c);
      out.Argb[static_cast<std::size_t>(y) * out.Width + static_cast<std::size_t>(x)] = p;
    }
  }
  return out;
}

}  // namespace apescene
