#include "tools/render/summary.h"

#include <cstdio>

namespace aperender {

std::string RenderSummary(const SummaryFacts& facts, const StatsTable::Totals& totals) {
  char text[2048];
  const double shown = totals.Frames / facts.Fps;
  const double rate = facts.WallSeconds > 0.0 ? totals.Frames / facts.WallSeconds : 0.0;
  std::snprintf(
      text, sizeof text,
      "Rendered %d frames of %s (%.2f s of scene time at %g fps, seed %u) at %dx%d on %s in "
      "%.1f s, %.1f frames per second. The emitters peaked at %d live particles (%d attached, "
      "%d sliding), with %lld births and %lld deaths in %lld logic steps; the channels took %.2f "
      "ms a frame on "
      "average (%.2f ms at most), %.2f ms of it in draw calls, and finishing and reading back "
      "each picture %.2f ms.",
      totals.Frames, facts.SceneName.c_str(), shown, facts.Fps, facts.Seed, facts.Width,
      facts.Height, facts.Device.c_str(), facts.WallSeconds, rate, totals.PeakLive,
      totals.PeakAttached, totals.PeakSliding, totals.Births, totals.Deaths, totals.LogicSteps,
      totals.MeanChannelMs, totals.MaxChannelMs, totals.MeanDrawMs, totals.MeanReadbackMs);
  std::string summary = text;
  if (facts.Messages > 0)
    summary += " The emitters sent " + std::to_string(facts.Messages) + " debug message" +
               (facts.Messages == 1 ? "" : "s") + ".";
  if (facts.FramesWritten > 0 && !facts.OnlyFrameFile.empty())
    summary += " Written to " + facts.Folder + ": " + facts.OnlyFrameFile + " and stats.csv.";
  else if (facts.FramesWritten > 0)
    summary += " Written to " + facts.Folder + ": " + std::to_string(facts.FramesWritten) +
               " frames, contact_sheet.png, preview.gif and stats.csv.";
  else
    summary += " Written to " + facts.Folder + ": stats.csv only (this device draws no pixels).";
  return summary;
}

}  // namespace aperender
