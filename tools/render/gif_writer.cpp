#include "tools/render/gif_writer.h"

#include <fcntl.h>
#include <gif_lib.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <vector>

namespace aperender {
namespace {

constexpr int kLevels[3] = {6, 7, 6};  // red, green, blue steps: 252 colours
// 4 x 4 Bayer matrix, thresholds 0..15.
constexpr int kBayer[4][4] = {{0, 8, 2, 10}, {12, 4, 14, 6}, {3, 11, 1, 9}, {15, 7, 13, 5}};

std::string GifErrorText(int code) {
  const char* text = GifErrorString(code);
  return text != nullptr ? text : "unknown giflib error";
}

}  // namespace

GifWriter::~GifWriter() {
  if (gif_ != nullptr) {
    int code = 0;
    EGifCloseFile(gif_, &code);
  }
}

int GifWriter::PaletteIndex(std::uint32_t argb, int x, int y) {
  const int component[3] = {static_cast<int>((argb >> 16) & 0xFF),
                            static_cast<int>((argb >> 8) & 0xFF), static_cast<int>(argb & 0xFF)};
  // The dither moves a value by up to one step between levels.
  const float threshold = (static_cast<float>(kBayer[y & 3][x & 3]) + 0.5f) / 16.0f;
  int index = 0;
  for (int c = 0; c < 3; ++c) {
    const float scaled =
        static_cast<float>(component[c]) / 255.0f * static_cast<float>(kLevels[c] - 1);
    int level = static_cast<int>(scaled);
    if (scaled - static_cast<float>(level) > threshold) ++level;
    level = std::min(level, kLevels[c] - 1);
    index = index * kLevels[c] + level;
  }
  return index;
}

bool GifWriter::Open(const std::string& path, int width, int height, int delay_cs,
                     std::string* error) {
  // Opened here rather than by giflib, which creates its files readable by their owner only:
  // the preview follows the user's umask like the other outputs.
  const int fd = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
  if (fd < 0) {
    *error = "cannot write GIF file \"" + path + "\": " + std::strerror(errno);
    return false;
  }
  int code = 0;
  gif_ = EGifOpenFileHandle(fd, &code);
  if (gif_ == nullptr) {
    close(fd);
    *error = "cannot write GIF file \"" + path + "\": " + GifErrorText(code);
    return false;
  }
  path_ = path;
  width_ = width;
  height_ = height;
  delay_cs_ = std::max(2, delay_cs);  // browsers slow down anything faster

  std::vector<GifColorType> colors(256, GifColorType{0, 0, 0});
  int i = 0;
  for (int r = 0; r < kLevels[0]; ++r)
    for (int g = 0; g < kLevels[1]; ++g)
      for (int b = 0; b < kLevels[2]; ++b, ++i)
        colors[static_cast<std::size_t>(i)] = {
            static_cast<GifByteType>(r * 255 / (kLevels[0] - 1)),
            static_cast<GifByteType>(g * 255 / (kLevels[1] - 1)),
            static_cast<GifByteType>(b * 255 / (kLevels[2] - 1))};
  ColorMapObject* palette = GifMakeMapObject(256, colors.data());
  EGifSetGifVersion(gif_, true);
  const bool ok =
      palette != nullptr && EGifPutScreenDesc(gif_, width, height, 8, 0, palette) == GIF_OK;
  GifFreeMapObject(palette);
  // NETSCAPE2.0 application block: loop forever.
  static const GifByteType kNetscape[] = "NETSCAPE2.0";
  static const GifByteType kLoop[] = {1, 0, 0};
  if (!ok || EGifPutExtensionLeader(gif_, APPLICATION_EXT_FUNC_CODE) != GIF_OK ||
      EGifPutExtensionBlock(gif_, 11, kNetscape) != GIF_OK ||
      EGifPutExtensionBlock(gif_, 3, kLoop) != GIF_OK || EGifPutExtensionTrailer(gif_) != GIF_OK) {
    *error = "cannot write GIF file \"" + path + "\": " + GifErrorText(gif_->Error);
    return false;
  }
  return true;
}

bool GifWriter::AddFrame(const apescene::Image& image, std::string* error) {
  if (image.Width != width_ || image.Height != height_) {
    *error = "GIF frames must all be " + std::to_string(width_) + "x" + std::to_string(height_);
    return false;
  }
  GraphicsControlBlock control{};
  control.DisposalMode = DISPOSE_DO_NOT;
  control.DelayTime = delay_cs_;
  control.TransparentColor = NO_TRANSPARENT_COLOR;
  GifByteType extension[4];
  EGifGCBToExtension(&control, extension);
  std::vector<GifPixelType> line(static_cast<std::size_t>(width_));
  bool ok = EGifPutExtension(gif_, GRAPHICS_EXT_FUNC_CODE, 4, extension) == GIF_OK &&
            EGifPutImageDesc(gif_, 0, 0, width_, height_, false, nullptr) == GIF_OK;
  for (int y = 0; ok && y < height_; ++y) {
    for (int x = 0; x < width_; ++x)
      line[static_cast<std::size_t>(x)] = static_cast<GifPixelType>(
          PaletteIndex(image.Argb[static_cast<std::size_t>(y) * width_ + x], x, y));
    ok = EGifPutLine(gif_, line.data(), width_) == GIF_OK;
  }
  if (!ok) *error = "cannot write GIF file \"" + path_ + "\": " + GifErrorText(gif_->Error);
  return ok;
}

bool GifWriter::Close(std::string* error) {
  int code = 0;
  const int result = EGifCloseFile(gif_, &code);
  gif_ = nullptr;
  if (result != GIF_OK) {
    *error = "cannot finish GIF file \"" + path_ + "\": " + GifErrorText(code);
    return false;
  }
  return true;
}

}  // namespace aperender
