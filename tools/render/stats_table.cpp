#include "tools/render/stats_table.h"

#include <algorithm>
#include <cstdio>
#include <fstream>

namespace aperender {

void StatsTable::Add(const FrameResult& frame) {
  rows_.push_back({frame.Frame, frame.Seconds, frame.Particles, frame.ChannelMs, frame.DrawMs,
                   frame.ReadbackMs});
}

std::string StatsTable::Csv() const {
  std::string text =
      "frame,seconds,live,attached,sliding,births,deaths,logic_steps,channel_ms,draw_ms,"
      "simulation_and_vertex_ms,readback_ms\n";
  char line[256];
  for (const Row& r : rows_) {
    std::snprintf(line, sizeof line, "%d,%.4f,%d,%d,%d,%d,%d,%d,%.3f,%.3f,%.3f,%.3f\n", r.Frame,
                  r.Seconds, r.Particles.Live, r.Particles.Attached, r.Particles.Sliding,
                  r.Particles.Births, r.Particles.Deaths, r.Particles.LogicSteps, r.ChannelMs,
                  r.DrawMs, std::max(0.0, r.ChannelMs - r.DrawMs), r.ReadbackMs);
    text += line;
  }
  return text;
}

bool StatsTable::Write(const std::string& path, std::string* error) const {
  std::ofstream file(path, std::ios::binary);
  file << Csv();
  file.close();
  if (!file) {
    *error = "cannot write \"" + path + "\"";
    return false;
  }
  return true;
}

StatsTable::Totals StatsTable::Summarise() const {
  Totals totals;
  totals.Frames = static_cast<int>(rows_.size());
  for (const Row& r : rows_) {
    totals.PeakLive = std::max(totals.PeakLive, r.Particles.Live);
    totals.PeakAttached = std::max(totals.PeakAttached, r.Particles.Attached);
    totals.PeakSliding = std::max(totals.PeakSliding, r.Particles.Sliding);
    totals.Births += r.Particles.Births;
    totals.Deaths += r.Particles.Deaths;
    totals.LogicSteps += r.Particles.LogicSteps;
    totals.MeanChannelMs += r.ChannelMs;
    totals.MaxChannelMs = std::max(totals.MaxChannelMs, r.ChannelMs);
    totals.MeanDrawMs += r.DrawMs;
    totals.MeanReadbackMs += r.ReadbackMs;
  }
  if (totals.Frames > 0) {
    totals.MeanChannelMs /= totals.Frames;
    totals.MeanDrawMs /= totals.Frames;
    totals.MeanReadbackMs /= totals.Frames;
  }
  return totals;
}

}  // namespace aperender
