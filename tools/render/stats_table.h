// The per-frame statistics of a render, written as stats.csv. Columns:
//   frame, seconds                  frame number (from 1) and the scene time it shows
//   live, attached, sliding         particles after the frame, over all emitters
//   births, deaths, logic_steps     in the frame, exact (see particle_census.h)
//   channel_ms                      wall time inside every channel's CallChannel
//   draw_ms                         of which inside the device's draw calls
//   simulation_and_vertex_ms        channel_ms - draw_ms: the emitter does simulation and vertex
//                                   building in one call and exposes no split of the two
//   readback_ms                     EndScene and reading the picture back (where a GL device
//                                   does the drawing work it was handed)
#pragma once

#include <string>
#include <vector>

#include "tools/render/scene_renderer.h"

namespace aperender {

class StatsTable {
 public:
  void Add(const FrameResult& frame);
  // The whole table as CSV text with a header line.
  std::string Csv() const;
  bool Write(const std::string& path, std::string* error) const;

  struct Totals {
    int Frames = 0;
    int PeakLive = 0;
    int PeakAttached = 0;
    int PeakSliding = 0;
    long long Births = 0;
    long long Deaths = 0;
    long long LogicSteps = 0;
    double MeanChannelMs = 0.0;
    double MaxChannelMs = 0.0;
    double MeanDrawMs = 0.0;
    double MeanReadbackMs = 0.0;
  };
  Totals Summarise() const;

 private:
  struct Row {
    int Frame;
    double Seconds;
    ParticleCounts Particles;
    double ChannelMs, DrawMs, ReadbackMs;
  };
  std::vector<Row> rows_;
};

}  // namespace aperender
