// Compresses the viewport's pictures for the stream (libjpeg-turbo).
#pragma once

#include <string>

#include "tools/scene/image.h"

namespace apestudio {

class JpegEncoder {
 public:
  JpegEncoder();
  ~JpegEncoder();
  JpegEncoder(const JpegEncoder&) = delete;
  JpegEncoder& operator=(const JpegEncoder&) = delete;

  // The picture as a JPEG file of the given quality (1..100); false with *error on failure.
  bool Encode(const apescene::Image& image, int quality, std::string* jpeg, std::string* error);

 private:
  void* handle_;  // tjhandle
};

}  // namespace apestudio
