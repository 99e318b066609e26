// The files of a render in its output folder:
//   frame_0001.png ...   every frame (only when the device draws pixels)
//   contact_sheet.png    up to 12 evenly spaced frames in a grid, each at most 320 pixels wide
//                        and captioned with its frame number and time
//   preview.gif          the frames at most 320 pixels wide, at most about 25 frames a second
//   stats.csv            one row per frame (stats_table.h)
// Frames are written as they come; the sheet, the GIF (kept as preview.gif.partial until then)
// and stats.csv only once the last frame is done, so a folder with stats.csv holds a finished
// render.
#pragma once

#include <string>
#include <vector>

#include "tools/render/gif_writer.h"
#include "tools/render/stats_table.h"

namespace aperender {

class RenderOutput {
 public:
  static constexpr int kSheetCells = 12;
  static constexpr int kSheetColumns = 4;
  static constexpr int kPreviewWidth = 320;
  static constexpr double kPreviewFps = 25.0;
  static constexpr int kCaptionScale = 2;  // screen pixels per font pixel

  // Creates the folder and removes the files an earlier render left in it. With `only_frame`
  // above 0 that frame is the one picture written (no sheet, no preview).
  bool Open(const std::string& folder, int frames, double fps, bool pictures, std::string* error,
            int only_frame = 0);
  bool AddFrame(const FrameResult& frame, std::string* error);
  bool Finish(std::string* error);

  const StatsTable& Stats() const { return stats_; }
  const std::string& Folder() const { return folder_; }
  int FramesWritten() const { return frames_written_; }
  // "frame_0007.png", wide enough for `frames`.
  static std::string FrameFileName(int frame, int frames);

 private:
  std::string Path(const std::string& name) const;

  std::string folder_;
  int frames_ = 0;
  double fps_ = 30.0;
  bool pictures_ = false;
  int only_frame_ = 0;
  int frames_written_ = 0;
  int preview_step_ = 1;
  GifWriter gif_;
  bool gif_open_ = false;
  std::vector<int> sheet_frames_;
  std::vector<apescene::Image> sheet_pictures_;
  StatsTable stats_;
};

}  // namespace aperender
