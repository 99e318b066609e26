#include "tools/studio/jpeg_encoder.h"

#include <turbojpeg.h>

namespace apestudio {

JpegEncoder::JpegEncoder() : handle_(tjInitCompress()) {}

JpegEncoder::~JpegEncoder() {
  if (handle_ != nullptr) tjDestroy(handle_);
}

bool JpegEncoder::Encode(const apescene::Image& image, int quality, std::string* jpeg,
                         std::string* error) {
  if (handle_ == nullptr) {
    *error = "the JPEG compressor could not be made";
    return false;
  }
  if (image.Width <= 0 || image.Height <= 0 ||
      image.Argb.size() != static_cast<std::size_t>(image.Width) * image.Height) {
    *error = "no picture to compress";
    return false;
  }
  unsigned char* out = nullptr;
  unsigned long size = 0;
  // A8R8G8B8 words lie in memory as B, G, R, A bytes.
  const int status = tjCompress2(handle_, reinterpret_cast<const unsigned char*>(image.Argb.data()),
                                 image.Width, image.Width * 4, image.Height, TJPF_BGRA, &out, &size,
                                 TJSAMP_420, quality, TJFLAG_FASTDCT);
  if (status != 0) {
    *error = std::string("JPEG compression failed: ") + tjGetErrorStr2(handle_);
    tjFree(out);
    return false;
  }
  jpeg->assign(reinterpret_cast<const char*>(out), size);
  tjFree(out);
  return true;
}

}  // namespace apestudio
