// An animated GIF written frame by frame (giflib), looping forever. Colours are reduced to a
// fixed 6 x 7 x 6 colour cube with 4 x 4 ordered dithering: the same palette for every frame and
// every run, so previews of the same render are byte for byte the same.
#pragma once

#include <string>

#include "tools/scene/image.h"

typedef struct GifFileType GifFileType;

namespace aperender {

class GifWriter {
 public:
  GifWriter() = default;
  ~GifWriter();  // closes an open file (the file is then incomplete unless Close succeeded)
  GifWriter(const GifWriter&) = delete;
  GifWriter& operator=(const GifWriter&) = delete;

  // Every frame must be width x height; each shows for delay_cs hundredths of a second.
  bool Open(const std::string& path, int width, int height, int delay_cs, std::string* error);
  bool AddFrame(const apescene::Image& image, std::string* error);
  bool Close(std::string* error);

  // The palette index of a colour at pixel (x, y), with the dither of that position.
  static int PaletteIndex(std::uint32_t argb, int x, int y);

 private:
  GifFileType* gif_ = nullptr;
  std::string path_;
  int width_ = 0;
  int height_ = 0;
  int delay_cs_ = 4;
};

}  // namespace aperender
