// The paragraph ape-render prints on stdout when a render is done.
#pragma once

#include <string>

#include "tools/render/stats_table.h"

namespace aperender {

struct SummaryFacts {
  std::string SceneName;
  int Width = 0;
  int Height = 0;
  double Fps = 0.0;
  unsigned Seed = 0;
  std::string Device;
  double WallSeconds = 0.0;
  int Messages = 0;
  std::string Folder;
  int FramesWritten = 0;      // PNG frames; 0 on a device without pixels
  std::string OnlyFrameFile;  // with --at: the one frame written
};

std::string RenderSummary(const SummaryFacts& facts, const StatsTable::Totals& totals);

}  // namespace aperender
