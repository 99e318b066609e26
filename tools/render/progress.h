// Progress of a render on stderr: a bar redrawn in place when stderr is a terminal, one line
// every few seconds otherwise (logs, CI), nothing when quiet.
#pragma once

#include <cstdio>
#include <functional>
#include <string>

namespace aperender {

class Progress {
 public:
  enum class Mode { Bar, Lines, Silent };
  // Bar when stderr is a terminal, Lines otherwise, Silent when quiet.
  static Mode ChooseMode(bool quiet);

  static constexpr double kLineIntervalSeconds = 5.0;

  // `now_seconds` is a wall clock (steady); tests give their own.
  Progress(Mode mode, int total_frames, std::FILE* out,
           std::function<double()> now_seconds = SteadySeconds);

  void FrameDone(int done);
  // Ends the bar's line.
  void Finish();

  // "[##########----------]  60/120 frames   9.5 fps   6 s left"
  static std::string BarText(int done, int total, double fps, double seconds_left);
  // "ape-render: 60/120 frames, 9.5 fps, 6 s left"
  static std::string LineText(int done, int total, double fps, double seconds_left);

 private:
  static double SteadySeconds();

  Mode mode_;
  int total_;
  std::FILE* out_;
  std::function<double()> now_;
  double start_;
  double last_line_;
};

}  // namespace aperender
