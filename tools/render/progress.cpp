#include "tools/render/progress.h"

#include <unistd.h>

#include <chrono>
#include <cmath>

namespace aperender {
namespace {

std::string SecondsLeft(double seconds) {
  // Beyond a year the estimate means nothing (and would not fit a long).
  if (!std::isfinite(seconds) || seconds > 3.2e7) return "? s left";
  char text[64];
  const long s = std::lround(seconds);
  if (s >= 60)
    std::snprintf(text, sizeof text, "%ld min %02ld s left", s / 60, s % 60);
  else
    std::snprintf(text, sizeof text, "%ld s left", s);
  return text;
}

}  // namespace

Progress::Mode Progress::ChooseMode(bool quiet) {
  if (quiet) return Mode::Silent;
  return isatty(STDERR_FILENO) ? Mode::Bar : Mode::Lines;
}

double Progress::SteadySeconds() {
  return std::chrono::duration<double>(std::chrono::steady_clock::now().time_since_epoch()).count();
}

Progress::Progress(Mode mode, int total_frames, std::FILE* out, std::function<double()> now_seconds)
    : mode_(mode),
      total_(total_frames),
      out_(out),
      now_(std::move(now_seconds)),
      start_(now_()),
      last_line_(start_) {}

std::string Progress::BarText(int done, int total, double fps, double seconds_left) {
  constexpr int kWidth = 30;
  const int filled = total > 0 ? done * kWidth / total : kWidth;
  std::string bar = "[" + std::string(static_cast<std::size_t>(filled), '#') +
                    std::string(static_cast<std::size_t>(kWidth - filled), '-') + "]";
  char text[128];
  std::snprintf(text, sizeof text, " %d/%d frames  %.1f fps  %s", done, total, fps,
                SecondsLeft(seconds_left).c_str());
  return bar + text;
}

std::string Progress::LineText(int done, int total, double fps, double seconds_left) {
  char text[128];
  std::snprintf(text, sizeof text, "ape-render: %d/%d frames, %.1f fps, %s", done, total, fps,
                SecondsLeft(seconds_left).c_str());
  return text;
}

void Progress::FrameDone(int done) {
  if (mode_ == Mode::Silent) return;
  const double now = now_();
  const double elapsed = now - start_;
  const double fps = elapsed > 0.0 ? done / elapsed : 0.0;
  const double left = fps > 0.0 ? (total_ - done) / fps : INFINITY;
  if (mode_ == Mode::Bar) {
    std::fprintf(out_, "\r%s", BarText(done, total_, fps, left).c_str());
    std::fflush(out_);
  } else if (now - last_line_ >= kLineIntervalSeconds || done == total_) {
    last_line_ = now;
    std::fprintf(out_, "%s\n", LineText(done, total_, fps, left).c_str());
    std::fflush(out_);
  }
}

void Progress::Finish() {
  if (mode_ == Mode::Bar) {
    std::fputc('\n', out_);
    std::fflush(out_);
  }
}

}  // namespace aperender
