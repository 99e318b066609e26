#include "tests/image_compare.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

namespace scenetest {

std::string ImageDifference::Describe() const {
  if (!SameSize) return "the pictures differ in size";
  char text[160];
  std::snprintf(text, sizeof text,
                "%ld pixels (%.3f%%) differ by more than %d, the largest difference is %d",
                DifferingPixels, DifferingShare * 100.0, kPixelTolerance, LargestDifference);
  return text;
}

ImageDifference CompareImages(const apescene::Image& expected, const apescene::Image& actual) {
  ImageDifference result;
  result.SameSize = expected.Width == actual.Width && expected.Height == actual.Height &&
                    expected.Argb.size() == actual.Argb.size() && !expected.Argb.empty();
  if (!result.SameSize) return result;
  result.LargestDifference = 0;
  for (std::size_t i = 0; i < expected.Argb.size(); ++i) {
    int largest = 0;
    for (int shift = 0; shift < 24; shift += 8) {
      const int a = static_cast<int>((expected.Argb[i] >> shift) & 0xFF);
      const int b = static_cast<int>((actual.Argb[i] >> shift) & 0xFF);
      largest = std::max(largest, std::abs(a - b));
    }
    result.LargestDifference = std::max(result.LargestDifference, largest);
    result.DifferingPixels += largest > kPixelTolerance;
  }
  result.DifferingShare =
      static_cast<double>(result.DifferingPixels) / static_cast<double>(expected.Argb.size());
  return result;
}

}  // namespace scenetest
