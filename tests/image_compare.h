// A tolerant comparison of two pictures: how many pixels differ by more than a small amount in
// any colour channel. Rendering through a software rasteriser is exact from run to run on one
// machine, but another driver version may move an edge by a pixel or round a blend differently;
// such noise stays under the thresholds, while a changed effect (particles elsewhere, another
// colour, another count) changes far more pixels by far more.
#pragma once

#include <string>

#include "tools/scene/image.h"

namespace scenetest {

// A pixel differs when one of its red, green or blue values differs by more than this (of 255).
inline constexpr int kPixelTolerance = 24;
// Pictures match while at most this share of their pixels differs.
inline constexpr double kMaxDifferingShare = 0.005;

struct ImageDifference {
  bool SameSize = false;
  long DifferingPixels = 0;
  double DifferingShare = 1.0;  // of all pixels
  int LargestDifference = 255;  // over all channels and pixels

  bool Matches() const { return SameSize && DifferingShare <= kMaxDifferingShare; }
  std::string Describe() const;
};

ImageDifference CompareImages(const apescene::Image& expected, const apescene::Image& actual);

}  // namespace scenetest
