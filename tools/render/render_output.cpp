#include "tools/render/render_output.h"

#include <cmath>
#include <cstdio>
#include <filesystem>
#include <regex>

#include "tools/render/contact_sheet.h"
#include "tools/render/tile_label.h"
#include "tools/scene/png_io.h"

namespace aperender {
namespace fs = std::filesystem;

std::string RenderOutput::FrameFileName(int frame, int frames) {
  const int digits = std::max(4, static_cast<int>(std::to_string(frames).size()));
  char name[64];
  std::snprintf(name, sizeof name, "frame_%0*d.png", digits, frame);
  return name;
}

std::string RenderOutput::Path(const std::string& name) const {
  return (fs::path(folder_) / name).string();
}

bool RenderOutput::Open(const std::string& folder, int frames, double fps, bool pictures,
                        std::string* error, int only_frame) {
  folder_ = folder;
  only_frame_ = only_frame;
  frames_ = frames;
  fps_ = fps;
  pictures_ = pictures;
  std::error_code ec;
  fs::create_directories(folder_, ec);
  if (ec || !fs::is_directory(folder_)) {
    *error = "cannot make the output folder \"" + folder_ + "\"" +
             (ec ? ": " + ec.message() : std::string());
    return false;
  }
  // Only names this program writes, so that an earlier, longer render leaves no stray frames.
  static const std::regex kOwnFile(
      R"(frame_\d+\.png|contact_sheet\.png|preview\.gif(\.partial)?|stats\.csv)");
  for (const auto& entry : fs::directory_iterator(folder_, ec))
    if (entry.is_regular_file() && std::regex_match(entry.path().filename().string(), kOwnFile))
      fs::remove(entry.path(), ec);

  if (!pictures_) return true;
  sheet_frames_ = ContactSheetFrames(frames_, kSheetCells);
  preview_step_ = std::max(1, static_cast<int>(std::ceil(fps_ / kPreviewFps - 1e-9)));
  return true;
}

bool RenderOutput::AddFrame(const FrameResult& frame, std::string* error) {
  stats_.Add(frame);
  if (!pictures_ || !frame.HasPicture) return true;
  if (only_frame_ > 0 && frame.Frame != only_frame_) return true;
  if (!apescene::WritePng(Path(FrameFileName(frame.Frame, frames_)), frame.Picture, false, error))
    return false;
  ++frames_written_;
  if (only_frame_ > 0) return true;

  const bool in_sheet =
      std::find(sheet_frames_.begin(), sheet_frames_.end(), frame.Frame) != sheet_frames_.end();
  const bool in_preview = (frame.Frame - 1) % preview_step_ == 0;
  if (!in_sheet && !in_preview) return true;
  const apescene::Image small = apescene::ShrinkToWidth(frame.Picture, kPreviewWidth);
  if (in_sheet) {
    apescene::Image tile = small;
    DrawCaption(&tile, TileCaption(frame.Frame, frame.Seconds), kCaptionScale);
    sheet_pictures_.push_back(std::move(tile));
  }
  if (in_preview) {
    if (!gif_open_) {
      const int delay_cs = static_cast<int>(std::lround(100.0 * preview_step_ / fps_));
      if (!gif_.Open(Path("preview.gif.partial"), small.Width, small.Height, delay_cs, error))
        return false;
      gif_open_ = true;
    }
    if (!gif_.AddFrame(small, error)) return false;
  }
  return true;
}

bool RenderOutput::Finish(std::string* error) {
  if (pictures_ && frames_written_ > 0 && only_frame_ == 0) {
    const apescene::Image sheet = BuildContactSheet(sheet_pictures_, kSheetColumns, 4, 0xFF202020u);
    if (!apescene::WritePng(Path("contact_sheet.png"), sheet, false, error)) return false;
    if (gif_open_) {
      gif_open_ = false;
      if (!gif_.Close(error)) return false;
      std::error_code ec;
      fs::rename(Path("preview.gif.partial"), Path("preview.gif"), ec);
      if (ec) {
        *error = "cannot name the preview \"" + Path("preview.gif") + "\": " + ec.message();
        return false;
      }
    }
  }
  return stats_.Write(Path("stats.csv"), error);
}

}  // namespace aperender
